#pragma once

#include "fn/cptr.h"

#include <pthread.h>

class FNMutexLock;

/// The operating system's mutex.
class FNMutexCore {
public:
    /// @throws FNESysError
    explicit FNMutexCore(bool recursive);
    ~FNMutexCore() { pthread_mutex_destroy(&mutex_); }
    FNMutexCore(const FNMutexCore&) = delete;
    FNMutexCore& operator=(const FNMutexCore&) = delete;

    /// @param timeout milliseconds, 0 to wait for ever. @throws FNETimeOut, FNESysError
    void lock(unsigned int timeout);
    /// @throws FNESysError
    void unlock();
    pthread_mutex_t* handle() noexcept { return &mutex_; }

private:
    pthread_mutex_t mutex_;
};

/// A mutex; copies are handles on the same one. It is locked through a lock object:
///
///     const FNMutexLock lock(mutex);     // until the end of the block
class FNMutex {
public:
    enum Recursion { nonRecursive = 0, recursive = 1 };

    explicit FNMutex(Recursion recursion = recursive) : imp_(new FNMutexCore(recursion == recursive)) {}

    /// Takes the lock into `lock`, which must not hold one yet.
    /// @param timeout milliseconds, 0 to wait for ever.
    /// @throws FNEBadFunCall if `lock` holds a mutex; FNETimeOut; FNESysError
    void lock(FNMutexLock& lock, unsigned int timeout = 0) const;

private:
    FNCountedPtr<FNMutexCore> imp_;
};

/// Holds a mutex, or nothing. Belongs to one thread, and does not outlive the mutex.
class FNMutexLock {
public:
    FNMutexLock() = default;
    explicit FNMutexLock(const FNMutex& mutex) { mutex.lock(*this); }
    ~FNMutexLock();
    FNMutexLock(const FNMutexLock&) = delete;
    FNMutexLock& operator=(const FNMutexLock&) = delete;

    /// Unlocks early; does nothing if nothing is held.
    void release();
    /// The core that is held, null if none is.
    FNMutexCore* mutexCore() const noexcept { return core_; }

private:
    friend class FNMutex;
    FNMutexCore* core_ = nullptr;
};
