#pragma once

/// Counted handles of the public interface. They share their form with the handles inside the library, but
/// show only an opaque count.

namespace Orbek {

/// Makes a count record. @throws std::exception if there is no memory or no mutex for it
[[gnu::visibility("default")]] void* newRefcount(int firstCount);
[[gnu::visibility("default")]] void incRefcount(void* count);
/// @return true if the count reached 0
[[gnu::visibility("default")]] bool decAndTestRefcount(void* count);
/// Does nothing for null.
[[gnu::visibility("default")]] void deleteRefcount(void* count);

/// Handle that shares its pointee with its copies; the last one deletes it. Safe to copy and release from any
/// thread, as long as no two threads use the same handle object at once.
template <class T> class CountedPtr {
public:
    CountedPtr() : CountedPtr(nullptr) {}
    /// Takes ownership.
    explicit CountedPtr(T* pointee) try : pointee_(pointee), count_(newRefcount(1)) {
    } catch (...) {
        delete pointee;
    }
    CountedPtr(const CountedPtr& other) : pointee_(other.pointee_), count_(other.count_) {
        incRefcount(count_);
    }
    ~CountedPtr() { smartDecr(); }

    CountedPtr& operator=(const CountedPtr& other) {
        if (pointee_ == other.pointee_) return *this;
        T* const pointee = other.pointee_;
        void* const count = other.count_;
        incRefcount(count);
        smartDecr();
        pointee_ = pointee;
        count_ = count;
        return *this;
    }

    T* get() const { return pointee_; }
    T* operator->() const { return pointee_; }
    T& operator*() const { return *pointee_; }
    explicit operator bool() const { return pointee_ != nullptr; }
    bool operator==(const CountedPtr& other) const { return pointee_ == other.pointee_; }

private:
    void smartDecr() {
        if (!decAndTestRefcount(count_)) return;
        deleteRefcount(count_);
        delete pointee_;
    }

    T* pointee_;
    void* count_;
};

} // namespace Orbek
