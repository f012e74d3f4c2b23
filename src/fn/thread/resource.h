#pragma once

#include "fn/thread/mutex.h"
#include "fn/thread/semaphore.h"

#include <atomic>

namespace Fn {

/// The body behind Resource.
class ResourceImpl {
public:
    explicit ResourceImpl(bool writerPriority) : writerPriority_(writerPriority) {}

    void wantToRead();
    void haveRead();
    void wantToWrite();
    void haveWritten();
    void haveWrittenStillWantToRead();

private:
    void enter();

    const bool writerPriority_;
    std::atomic<std::int32_t> readers_ = 0;
    FNMutex firstReader_{FNMutex::recursive};
    Semaphore writing_;
    Semaphore turnstile_;
};

/// A lock for many readers and one writer; copies are handles on the same one. Each want... is followed by
/// its have... on any thread.
class Resource {
public:
    void wantToRead() const { impl_->wantToRead(); }
    void haveRead() const { impl_->haveRead(); }
    void wantToWrite() const { impl_->wantToWrite(); }
    void haveWritten() const { impl_->haveWritten(); }
    /// The writer becomes a reader with no gap; it ends with haveRead().
    /// @throws FNEBadArg for an ROPriorResource
    void haveWrittenStillWantToRead() const { impl_->haveWrittenStillWantToRead(); }

protected:
    explicit Resource(bool writerPriority) : impl_(new ResourceImpl(writerPriority)) {}

private:
    FNCountedPtr<ResourceImpl> impl_;
};

/// A waiting writer holds up the readers that come after it.
class FairResource : public Resource {
public:
    FairResource() : Resource(false) {}
};

/// Readers pass a waiting writer.
class ROPriorResource : public Resource {
public:
    ROPriorResource() : Resource(true) {}
};

/// Reads for the duration of a block.
class ReadOnlyLock {
public:
    explicit ReadOnlyLock(const Resource& resource) : resource_(resource) { resource_.wantToRead(); }
    ~ReadOnlyLock() { resource_.haveRead(); }
    ReadOnlyLock(const ReadOnlyLock&) = delete;
    ReadOnlyLock& operator=(const ReadOnlyLock&) = delete;

private:
    Resource resource_;
};

/// Writes for the duration of a block.
class ModifierLock {
public:
    explicit ModifierLock(const Resource& resource) : resource_(resource) { resource_.wantToWrite(); }
    ~ModifierLock() { resource_.haveWritten(); }
    ModifierLock(const ModifierLock&) = delete;
    ModifierLock& operator=(const ModifierLock&) = delete;

private:
    Resource resource_;
};

} // namespace Fn
