#include "fn/thread/condition_variable.h"

#include "fn/thread/posix_error.h"

namespace Fn {

CVMutex::CVMutex() {
    if (const int code = pthread_mutex_init(&mutex_, nullptr))
        FN_THROW(FNESysError,
                 posixErrorText("Pthread::Mutex: Unable to create mutex: ", code, mutexInitReasons));
}

CVMutexLock::~CVMutexLock() {
    if (locked_) pthread_mutex_unlock(&mutex_);
}

void CVMutexLock::lock() {
    if (locked_) FN_THROW(FNEBadFunCall, "CVMutexLock::lock(): already locket");
    if (const int code = pthread_mutex_lock(&mutex_))
        FN_THROW(FNESysError, posixErrorText("Error in Pthread::Mutex::lock: pthread_mutex_lock(): ", code,
                                             mutexLockReasons));
    locked_ = true;
}

void CVMutexLock::unlock() {
    if (!locked_) FN_THROW(FNEBadFunCall, "CVMutexLock::unlock(): already unlocked");
    locked_ = false;
    if (const int code = pthread_mutex_unlock(&mutex_))
        FN_THROW(FNESysError, posixErrorText("Error in Pthread::Mutex::unlock: pthread_mutex_unlock(): ",
                                             code, mutexUnlockReasons));
}

ConditionVariable::Imp::Imp() {
    if (const int code = pthread_cond_init(&condition, nullptr))
        FN_THROW(FNESysError,
                 posixErrorText("Pthread::ConditionVariable: Unable to create condition variable: ", code,
                                conditionInitReasons));
}

void ConditionVariable::wait(FNMutexLock& lock) const {
    wait(lock.mutexCore() ? lock.mutexCore()->handle() : nullptr);
}

void ConditionVariable::wait(CVMutexLock& lock) const {
    wait(lock.locked_ ? &lock.mutex_ : nullptr);
}

void ConditionVariable::wait(pthread_mutex_t* mutex) const {
    if (!mutex) FN_THROW(FNEBadFunCall, "ConditionVariable::wait: mutex is not locked.");
    if (const int code = pthread_cond_wait(&imp_->condition, mutex))
        FN_THROW(FNESysError, posixErrorText("Error in ConditionVariable::wait: pthread_cond_wait(): ", code,
                                             conditionReasons));
}

void ConditionVariable::notifyOne() const {
    if (const int code = pthread_cond_signal(&imp_->condition))
        FN_THROW(FNESysError,
                 posixErrorText("Error in Pthread::ConditionVariable::notify_one: pthread_cond_signal(): ",
                                code, conditionReasons));
}

void ConditionVariable::notifyAll() const {
    if (const int code = pthread_cond_broadcast(&imp_->condition))
        FN_THROW(FNESysError,
                 posixErrorText("Error in Pthread::ConditionVariable::notify_all: pthread_cond_broadcast(): ",
                                code, conditionReasons));
}

} // namespace Fn
