#include "fn/thread/event.h"

#include "fn/thread/posix_error.h"
#include "fn/thread/thread.h"

namespace {

class Lock {
public:
    Lock(pthread_mutex_t& mutex, const char* prefix) : mutex_(mutex) {
        if (const int code = pthread_mutex_lock(&mutex_))
            FN_THROW(FNESysError, Fn::posixErrorText(std::string(prefix) + "pthread_mutex_lock(): ", code,
                                                     Fn::mutexLockReasons));
    }
    ~Lock() { pthread_mutex_unlock(&mutex_); }
    Lock(const Lock&) = delete;
    Lock& operator=(const Lock&) = delete;

private:
    pthread_mutex_t& mutex_;
};

} // namespace

FNEventImpl::FNEventImpl() {
    if (const int code = pthread_mutex_init(&mutex_, nullptr))
        FN_THROW(FNESysError,
                 Fn::posixErrorText("FNEventImpl: Unable to create mutex: ", code, Fn::mutexInitReasons));
    if (const int code = pthread_cond_init(&condition_, nullptr)) {
        pthread_mutex_destroy(&mutex_);
        FN_THROW(FNESysError, Fn::posixErrorText("FNEventImpl: Unable to create condition variable: ", code,
                                                 Fn::conditionInitReasons));
    }
}

FNEventImpl::~FNEventImpl() {
    pthread_cond_destroy(&condition_);
    pthread_mutex_destroy(&mutex_);
}

void FNEventImpl::signal() {
    const Lock lock(mutex_, "Error in FNEvent::signal: ");
    ++counter_;
    if (const int code = pthread_cond_signal(&condition_))
        FN_THROW(FNESysError, Fn::posixErrorText("Error in FNEvent::signal: pthread_cond_signal(): ", code,
                                                 Fn::conditionReasons));
}

void FNEventImpl::wait() {
    const Lock lock(mutex_, "Error in FNEvent::wait: ");
    if (counter_ == 0) FNThreadSelf::serviceCancel();
    while (counter_ == 0)
        if (const int code = pthread_cond_wait(&condition_, &mutex_))
            FN_THROW(FNESysError, Fn::posixErrorText("Error in FNEvent::wait: pthread_cond_wait(): ", code,
                                                     Fn::conditionReasons));
    --counter_;
}
