#pragma once

#include <initializer_list>
#include <string>
#include <utility>

namespace Fn {

/// What a POSIX error code means at one call, in words.
using PosixReasons = std::initializer_list<std::pair<int, const char*>>;

/// `prefix` followed by the reason for `code`, or by the code itself if there are no words for it.
std::string posixErrorText(const std::string& prefix, int code, PosixReasons reasons);

/// What pthread_mutex_lock, pthread_mutex_unlock and their like report.
extern const PosixReasons mutexLockReasons;
extern const PosixReasons mutexUnlockReasons;
/// What making a mutex or a condition variable reports.
extern const PosixReasons mutexInitReasons;
extern const PosixReasons conditionInitReasons;
/// What waiting on and notifying a condition variable reports.
extern const PosixReasons conditionReasons;

} // namespace Fn
