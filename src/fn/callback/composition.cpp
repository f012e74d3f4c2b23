#include "fn/callback/composition.h"

#include "fn/message/dialog.h"
#include "fn/thread/event.h"

namespace Fn {

Functor0 tryCatchFunctor(const Functor0& job, const Functor1<std::exception>& handler) {
    return [job, handler] {
        try {
            job();
        } catch (const std::exception& e) {
            handler(e);
        }
    };
}

Functor1<std::exception> errorMessageFunctor(const std::string& text) {
    return [text](const std::exception& e) { FNDialog::error(text + e.what()); };
}

Functor0 syncCallFunctor(const Functor0& job, const Functor1<Functor0>& dispatcher) {
    return [job, dispatcher] {
        const FNEvent done;
        dispatcher([job, done] {
            const AutoFunctor signalInAnyCase([done] { done.signal(); });
            job();
        });
        done.wait();
    };
}

AutoFunctor::Body::~Body() {
    try {
        job_();
    } catch (...) {
        // Nobody is left to tell.
    }
}

} // namespace Fn
