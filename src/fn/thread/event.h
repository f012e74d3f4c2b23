#pragma once

#include "fn/cptr.h"

#include <pthread.h>

/// The body behind FNEvent.
class FNEventImpl {
public:
    /// @throws FNESysError
    FNEventImpl();
    ~FNEventImpl();
    FNEventImpl(const FNEventImpl&) = delete;
    FNEventImpl& operator=(const FNEventImpl&) = delete;

    void signal();
    void wait();

private:
    int counter_ = 0;
    pthread_mutex_t mutex_;
    pthread_cond_t condition_;
};

/// Counted signals: each signal() lets one wait() pass, now or later. Copies are handles on the same event.
class FNEvent {
public:
    FNEvent() : impl_(new FNEventImpl) {}

    void signal() const { impl_->signal(); }
    /// Sleeps until there is a signal, and takes it. A cancellation point if there is none yet.
    void wait() const { impl_->wait(); }

private:
    FNCountedPtr<FNEventImpl> impl_;
};
