#pragma once

#include "fn/thread/mutex.h"

namespace Fn {

/// A plain mutex for condition variables.
class CVMutex {
public:
    /// @throws FNESysError
    CVMutex();
    ~CVMutex() { pthread_mutex_destroy(&mutex_); }
    CVMutex(const CVMutex&) = delete;
    CVMutex& operator=(const CVMutex&) = delete;

private:
    friend class CVMutexLock;
    pthread_mutex_t mutex_;
};

/// Holds a CVMutex from construction to destruction, but for explicit unlock() and lock().
class CVMutexLock {
public:
    explicit CVMutexLock(CVMutex& mutex) : mutex_(mutex.mutex_) { lock(); }
    ~CVMutexLock();
    CVMutexLock(const CVMutexLock&) = delete;
    CVMutexLock& operator=(const CVMutexLock&) = delete;

    /// @throws FNEBadFunCall if it is locked already; FNESysError
    void lock();
    /// @throws FNEBadFunCall if it is not locked; FNESysError
    void unlock();

private:
    friend class ConditionVariable;
    pthread_mutex_t& mutex_;
    bool locked_ = false;
};

/// A condition variable; copies are handles on the same one. Waits can end without a notification, so the
/// condition is tested in a loop.
class ConditionVariable {
public:
    ConditionVariable() : imp_(new Imp) {}

    /// Releases the lock, sleeps until notified, and takes the lock again.
    /// @throws FNEBadFunCall if the lock object holds nothing; FNESysError
    void wait(FNMutexLock& lock) const;
    void wait(CVMutexLock& lock) const;
    void notifyOne() const;
    void notifyAll() const;

private:
    class Imp {
    public:
        /// @throws FNESysError
        Imp();
        ~Imp() { pthread_cond_destroy(&condition); }
        Imp(const Imp&) = delete;
        Imp& operator=(const Imp&) = delete;

        pthread_cond_t condition;
    };

    void wait(pthread_mutex_t* mutex) const;

    FNCountedPtr<Imp> imp_;
};

} // namespace Fn
