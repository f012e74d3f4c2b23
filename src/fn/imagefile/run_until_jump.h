#pragma once

#include <csetjmp>

/// Frame around calls of C libraries that report errors by a jump.

namespace Fn {

/// Runs `step`; a longjmp to `target` from inside ends it.
///
/// Objects with destructors must not live inside `step` or in what it calls, since a jump passes them by; it
/// works on objects of the caller. This function is never inlined, so that the caller's locals keep their
/// values.
/// @return whether `step` came to its end.
template <class Step> [[gnu::noinline]] bool runUntilJump(std::jmp_buf& target, const Step& step) {
    if (setjmp(target) != 0) return false;
    step();
    return true;
}

} // namespace Fn
