#include "fn/thread/posix_error.h"

#include <cerrno>

namespace Fn {

std::string posixErrorText(const std::string& prefix, int code, PosixReasons reasons) {
    for (const auto& [known, text] : reasons)
        if (known == code) return prefix + text;
    return prefix + std::to_string(code);
}

const PosixReasons mutexLockReasons = {
    {EINVAL, "The value specified by mutex is invalid."},
    {EDEADLK, "A deadlock would occur if the thread blocked waiting for mutex."},
};
const PosixReasons mutexUnlockReasons = {
    {EINVAL, "The value specified by mutex is invalid."},
    {EPERM, "The current thread does not hold a lock on mutex."},
};
const PosixReasons mutexInitReasons = {
    {EAGAIN, "The system temporarily lacks the resources to create another mutex."},
    {ENOMEM, "The process cannot allocate enough memory to create another mutex."},
};
const PosixReasons conditionInitReasons = {
    {EAGAIN, "The system temporarily lacks the resources to create another condition variable."},
    {ENOMEM, "The process cannot allocate enough memory to create another condition variable."},
};
const PosixReasons conditionReasons = {
    {EINVAL, "The value specified by cond or by mutex is invalid."},
    {EPERM, "The current thread does not hold a lock on mutex."},
};

} // namespace Fn
