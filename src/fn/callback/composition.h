#pragma once

#include "fn/callback/functor.h"

#include <exception>
#include <string>

namespace Fn {

/// Calls `job`; a std::exception from it goes to `handler` and no further. Anything else passes through.
Functor0 tryCatchFunctor(const Functor0& job, const Functor1<std::exception>& handler);

/// Reports `text` followed by the exception's what() as an error message.
Functor1<std::exception> errorMessageFunctor(const std::string& text);

/// Hands `job` to `dispatcher`, to be run elsewhere, and blocks until it has run.
Functor0 syncCallFunctor(const Functor0& job, const Functor1<Functor0>& dispatcher);

/// Returns convert(get()).
template <class A, class B>
Functor0Ret<B> conversionFunctor0Ret(const Functor1Ret<A, B>& convert, const Functor0Ret<A>& get) {
    return [convert, get] { return convert(get()); };
}

/// Runs a job when the last copy goes; what the job throws then is swallowed.
class AutoFunctor {
public:
    explicit AutoFunctor(const Functor0& job) : body_(new Body(job)) {}

private:
    class Body {
    public:
        explicit Body(const Functor0& job) : job_(job) {}
        ~Body();

    private:
        Functor0 job_;
    };

    FNCountedPtr<Body> body_;
};

} // namespace Fn
