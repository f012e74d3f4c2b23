#pragma once

#include "fn/exception.h"

#include <atomic>
#include <concepts>
#include <cstdint>

#include <pthread.h>

/// Counted handles: how anything with shared ownership is held.
///
/// Copying a handle shares the pointee; the last handle deletes it. Counts are safe for any number of
/// threads, a single handle object is not: two threads each use a handle of their own.

namespace Fn::CptrImpl {

/// The count that all handles of one pointee share. Each record has a plain mutex of its own, and every
/// change of the count takes it. The creator stores the first count.
class Ref {
public:
    /// @throws FNESysError if the mutex cannot be made.
    explicit Ref(std::int32_t firstCount);
    ~Ref() { pthread_mutex_destroy(&mutex_); }
    Ref(const Ref&) = delete;
    Ref& operator=(const Ref&) = delete;

    void increment() noexcept { add(1); }
    /// @return the count after the decrement.
    std::int32_t decrement() noexcept { return add(-1); }
    /// The count at this moment, read without the mutex. If it is 1, all that former owners did to the
    /// pointee happened before.
    std::int32_t count() const noexcept {
        return std::atomic_ref(const_cast<std::int32_t&>(count_)).load(std::memory_order_acquire);
    }

private:
    std::int32_t add(std::int32_t step) noexcept {
        pthread_mutex_lock(&mutex_);
        const std::int32_t result = count_ + step;
        std::atomic_ref(count_).store(result, std::memory_order_release); // count() reads beside the mutex
        pthread_mutex_unlock(&mutex_);
        return result;
    }

    alignas(std::atomic_ref<std::int32_t>::required_alignment) std::int32_t count_;
    pthread_mutex_t mutex_;
};

} // namespace Fn::CptrImpl

/// Counted handle of a `T`, which is destroyed by `delete` of a `T*`: a `T` that is used through a base class
/// needs a virtual destructor. A handle owns a count record also when its pointer is null.
template <class T> class FNCountedPtr {
public:
    FNCountedPtr() : FNCountedPtr(nullptr) {}

    /// Takes ownership of `pointee`, which may be null; it is deleted if the count record cannot be made.
    explicit FNCountedPtr(T* pointee) try : pointee_(pointee), ref_(new Ref(1)) {
    } catch (...) {
        delete pointee;
    }

    FNCountedPtr(const FNCountedPtr& other) noexcept : pointee_(other.pointee_), ref_(other.ref_) {
        ref_->increment();
    }

    /// Shares the pointee of a handle of a derived class.
    template <class U>
    requires std::convertible_to<U*, T*> FNCountedPtr(const FNCountedPtr<U>& other)
    noexcept : pointee_(other.pointee_), ref_(other.ref_) { ref_->increment(); }

    ~FNCountedPtr() { smartDecr(); }

    /// Does nothing if both handles have the same pointee.
    FNCountedPtr& operator=(const FNCountedPtr& other) noexcept {
        if (pointee_ == other.pointee_) return *this;
        other.ref_->increment(); // first: `other` may live inside the old pointee
        T* const pointee = other.pointee_;
        Ref* const ref = other.ref_;
        smartDecr();
        pointee_ = pointee;
        ref_ = ref;
        return *this;
    }

    T* get() const noexcept { return pointee_; }
    /// @throws FNEBadFunCall on a null handle.
    T* operator->() const { return checked(); }
    /// @throws FNEBadFunCall on a null handle.
    T& operator*() const { return *checked(); }
    explicit operator bool() const noexcept { return pointee_ != nullptr; }

    /// Number of handles that share the pointee at this moment.
    std::int32_t count() const noexcept { return ref_->count(); }

    /// Handles compare by pointer.
    template <class U> bool operator==(const FNCountedPtr<U>& other) const noexcept {
        return pointee_ == other.get();
    }

    /// The same pointee seen as a derived class, a null handle if it is none.
    template <class U> FNCountedPtr<U> dynamicCast() const {
        U* const derived = dynamic_cast<U*>(pointee_);
        return derived ? FNCountedPtr<U>(derived, ref_) : FNCountedPtr<U>();
    }

private:
    using Ref = Fn::CptrImpl::Ref;
    template <class> friend class FNCountedPtr;

    FNCountedPtr(T* pointee, Ref* ref) noexcept : pointee_(pointee), ref_(ref) { ref_->increment(); }

    T* checked() const {
        if (!pointee_) FN_THROW(FNEBadFunCall, "Access through a null handle");
        return pointee_;
    }

    /// Drops this handle's share. The record goes before the pointee, whose destructor may need its memory.
    void smartDecr() noexcept {
        if (ref_->decrement() != 0) return;
        delete ref_;
        delete pointee_;
    }

    T* pointee_;
    Ref* ref_;
};
