#include "fn/thread/semaphore.h"

#include <cerrno>

namespace Fn {
namespace {

[[noreturn]] void fail(const char* text) {
    FN_THROW(FNESysError, text + std::to_string(errno));
}

} // namespace

SemaphoreImpl::SemaphoreImpl() {
    if (sem_init(&semaphore_, 0, 1) != 0) fail("Creating Fn::SemaphoreImpl::SemaphoreImpl() failed: ");
}

void SemaphoreImpl::lock() {
    while (sem_wait(&semaphore_) != 0)
        if (errno != EINTR) fail("Fn::SemaphoreImpl::SemaphoreImpl::lock() failed: ");
}

void SemaphoreImpl::release() {
    if (sem_post(&semaphore_) != 0) fail("Fn::SemaphoreImpl::SemaphoreImpl::release() failed: ");
}

} // namespace Fn
