#pragma once

#include "fg/dll_frame_grabber_factory.h"

#include <type_traits>

/// Stand-ins for objects of a plug-in, which forward every operation and keep the library loaded.

namespace FG {

/// What the current exception says, thrown again from here.
[[noreturn]] void rethrowFromHere();

/// Calls into a library.
template <class Call> std::invoke_result_t<Call> callLibrary(Call call) {
    try {
        return call();
    } catch (...) {
        rethrowFromHere();
    }
}

/// An object of a library. The object goes before the library's handle does.
template <class T> class DllObject {
public:
    DllObject(const Fn::Dll& dll, const FNCountedPtr<T>& object) : dll_(dll), object_(object) {}

    const Fn::Dll& dll() const { return dll_; }
    /// Calls a member; an exception that its library threw is replaced by one of the same class from here,
    /// since the library may be gone before the exception is.
    template <class R, class C, class... A, class... Args>
    R call(R (C::*member)(A...), const Args&... args) const {
        return callLibrary([&]() -> R { return (*object_.*member)(args...); });
    }
    template <class R, class C, class... A, class... Args>
    R call(R (C::*member)(A...) const, const Args&... args) const {
        return callLibrary([&]() -> R { return (*object_.*member)(args...); });
    }

private:
    Fn::Dll dll_;
    FNCountedPtr<T> object_;
};

/// The same image, as long as it may be used.
FNImageReference keepLoaded(const Fn::Dll& dll, const FNImageReference& image);
FNCountedPtr<Fn::LiveVideoSource> keepLoaded(const Fn::Dll& dll,
                                             const FNCountedPtr<Fn::LiveVideoSource>& source);
FNCountedPtr<StillImageSource> keepLoaded(const Fn::Dll& dll, const FNCountedPtr<StillImageSource>& source);

} // namespace FG
