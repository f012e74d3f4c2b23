#include "fn/thread/mutex.h"

#include "fn/thread/posix_error.h"

#include <cerrno>
#include <ctime>

FNMutexCore::FNMutexCore(bool recursive) {
    pthread_mutexattr_t attributes;
    if (const int code = pthread_mutexattr_init(&attributes))
        FN_THROW(FNESysError, Fn::posixErrorText("FNMutex: Unable to create mutex attribute: ", code,
                                                 Fn::mutexInitReasons));
    pthread_mutexattr_settype(&attributes, recursive ? PTHREAD_MUTEX_RECURSIVE : PTHREAD_MUTEX_ERRORCHECK);
    const int code = pthread_mutex_init(&mutex_, &attributes);
    pthread_mutexattr_destroy(&attributes);
    if (code)
        FN_THROW(FNESysError,
                 Fn::posixErrorText("FNMutex: Unable to create mutex: ", code, Fn::mutexInitReasons));
}

void FNMutexCore::lock(unsigned int timeout) {
    constexpr const char* prefix = "Error in FNMutex::lock: pthread_mutex_lock(): ";
    int code = 0;
    if (timeout == 0) {
        code = pthread_mutex_lock(&mutex_);
    } else {
        timespec deadline;
        clock_gettime(CLOCK_REALTIME, &deadline);
        const long nanoseconds = deadline.tv_nsec + (timeout % 1000) * 1000000L;
        deadline.tv_sec += timeout / 1000 + nanoseconds / 1000000000L;
        deadline.tv_nsec = nanoseconds % 1000000000L;
        code = pthread_mutex_timedlock(&mutex_, &deadline);
        if (code == ETIMEDOUT) FN_THROW(FNETimeOut, std::string(prefix) + "timeout");
    }
    if (code) FN_THROW(FNESysError, Fn::posixErrorText(prefix, code, Fn::mutexLockReasons));
}

void FNMutexCore::unlock() {
    if (const int code = pthread_mutex_unlock(&mutex_))
        FN_THROW(FNESysError, Fn::posixErrorText("Error in FNMutex::unlock:pthread_mutex_unlock(): ", code,
                                                 Fn::mutexUnlockReasons));
}

void FNMutex::lock(FNMutexLock& lock, unsigned int timeout) const {
    if (lock.core_) FN_THROW(FNEBadFunCall, "FNMutex::lock: the lock object already holds a mutex");
    imp_.get()->lock(timeout);
    lock.core_ = imp_.get();
}

FNMutexLock::~FNMutexLock() {
    try {
        release();
    } catch (const FNException&) {
        // Only a lock object that went to another thread gets here; a destructor cannot tell.
    }
}

void FNMutexLock::release() {
    FNMutexCore* const held = core_;
    core_ = nullptr;
    if (held) held->unlock();
}
