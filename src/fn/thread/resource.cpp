#include "fn/thread/resource.h"

namespace Fn {

void ResourceImpl::wantToRead() {
    if (writerPriority_) return enter();
    turnstile_.lock();
    enter();
    turnstile_.release();
}

void ResourceImpl::enter() {
    const FNMutexLock lock(firstReader_); // later readers wait until the first one has got in
    if (++readers_ == 1) writing_.lock();
}

void ResourceImpl::haveRead() {
    if (--readers_ == 0) writing_.release();
}

void ResourceImpl::wantToWrite() {
    if (!writerPriority_) turnstile_.lock();
    writing_.lock();
}

void ResourceImpl::haveWritten() {
    writing_.release();
    if (!writerPriority_) turnstile_.release();
}

void ResourceImpl::haveWrittenStillWantToRead() {
    if (writerPriority_)
        FN_THROW(FNEBadArg, "Releasing ModifierLocks for reading not yet implemented with PriorResources");
    ++readers_;
    turnstile_.release();
}

} // namespace Fn
