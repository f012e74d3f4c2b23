#pragma once

#include "fn/cptr.h"

#include <semaphore.h>

namespace Fn {

/// The body behind Semaphore.
class SemaphoreImpl {
public:
    /// @throws FNESysError
    SemaphoreImpl();
    ~SemaphoreImpl() { sem_destroy(&semaphore_); }
    SemaphoreImpl(const SemaphoreImpl&) = delete;
    SemaphoreImpl& operator=(const SemaphoreImpl&) = delete;

    void lock();
    void release();

private:
    sem_t semaphore_;
};

/// A counting semaphore with the initial count 1: a binary lock that another thread may release. Copies are
/// handles on the same one.
class Semaphore {
public:
    Semaphore() : impl_(new SemaphoreImpl) {}

    void lock() const { impl_->lock(); }
    void release() const { impl_->release(); }

private:
    FNCountedPtr<SemaphoreImpl> impl_;
};

} // namespace Fn
