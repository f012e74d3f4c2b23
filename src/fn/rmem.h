#pragma once

#include "fn/complex.h"
#include "fn/cptr.h"

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <limits>
#include <new>
#include <span>
#include <type_traits>

/// Copy-on-write memory: how pixels, vectors, matrices and serialized bytes are stored.
///
/// An FNRMem<T> is a view of `size()` elements on a counted block. Copies and sub-views share the block, and
/// a writer calls getExclusive() first, which copies the view's elements if anyone else could see the change:
///
///     FNRMem<float> a(1000), b = a;          // one block
///     float* p = b.getExclusive();           // b has a block of its own from here on
///
/// Two threads never use the same view object, and a block that one thread may write is not handed to another
/// at the same moment. Reading through copies on several threads needs no lock.

/// The storage of a block.
class FNRMemCoreBody {
public:
    /// What frees the memory of a body.
    class Dtor {
    public:
        virtual ~Dtor() = default;
        virtual void del(void* memory) const = 0;
    };

    /// For memory that somebody else owns.
    class Preserve final : public Dtor {
    public:
        void del(void*) const override {}
    };
    static const FNCountedPtr<Dtor>& preserve();

    /// Uninitialised bytes; at least one spare byte lies behind them unless `size` is 0.
    /// @throws std::bad_alloc
    explicit FNRMemCoreBody(std::uint64_t size);
    /// Uninitialised bytes at a multiple of `alignment` (rounded up to a power of two).
    /// @throws FNEBadArg for alignment 0 with a size above 0; FNESysError if there is no memory.
    FNRMemCoreBody(std::uint64_t size, std::uint32_t alignment);
    /// Wraps `data`, which `dtor` frees.
    FNRMemCoreBody(void* data, std::uint64_t size, const FNCountedPtr<Dtor>& dtor, bool constant,
                   bool noCopy);
    ~FNRMemCoreBody() { dtor_->del(data_); }
    FNRMemCoreBody(const FNRMemCoreBody&) = delete;
    FNRMemCoreBody& operator=(const FNRMemCoreBody&) = delete;

    std::uint32_t alignment() const noexcept { return alignment_; }
    bool constant() const noexcept { return constant_; }
    bool noCopy() const noexcept { return noCopy_; }
    std::uint64_t size() const noexcept { return size_; }
    /// First byte, null if the size is 0.
    unsigned char* data() const noexcept { return static_cast<unsigned char*>(data_); }

private:
    std::uint32_t alignment_ : 30; ///< 0 for a body made without one
    std::uint32_t constant_ : 1;   ///< may be read but not written in place
    std::uint32_t noCopy_ : 1;     ///< a write access that would need a copy is refused
    std::uint64_t size_;           ///< bytes
    void* data_;
    FNCountedPtr<Dtor> dtor_;
};

/// Untyped counted block; any number of cores share a body.
class FNRMemCore {
public:
    using Dtor = FNRMemCoreBody::Dtor;

    explicit FNRMemCore(std::uint64_t size) : body_(new FNRMemCoreBody(size)) {}
    FNRMemCore(std::uint64_t size, std::uint32_t alignment) : body_(new FNRMemCoreBody(size, alignment)) {}
    /// Wraps memory that `dtor` frees. @throws FNEBadArg if `memory` is null.
    FNRMemCore(void* memory, std::uint64_t size, const FNCountedPtr<Dtor>& dtor);
    /// Wraps memory that is never written in place; with `noCopy` a write access throws instead of copying.
    FNRMemCore(const void* memory, std::uint64_t size, const FNCountedPtr<Dtor>& dtor, bool noCopy);

    std::uint64_t size() const noexcept { return body_.get()->size(); }
    const unsigned char* data() const noexcept { return body_.get()->data(); }
    std::uint32_t alignment() const noexcept { return body_.get()->alignment(); }
    bool sharesBody(const FNRMemCore& other) const noexcept { return body_ == other.body_; }

    /// Equal if the bodies are the same one, or if their sizes are equal and not 0 and all bytes are equal.
    bool operator==(const FNRMemCore& other) const noexcept;

    /// Prepares `size` bytes from `offset` for writing in place: copies them to a body of their own if the
    /// body is shared or constant, and moves them there too if they are a small part of a large block.
    /// @return the offset of the bytes from now on.
    /// @throws FNEBadArg for a range in an empty block; FNESysError for no-copy memory.
    std::uint64_t demandExclusiveUse(std::uint64_t offset, std::uint64_t size);
    /// For writing after demandExclusiveUse.
    unsigned char* writable() noexcept { return body_.get()->data(); }

private:
    void changeOver(std::uint64_t offset, std::uint64_t size, std::uint32_t alignment);

    FNCountedPtr<FNRMemCoreBody> body_;
};

/// Alignment in bytes of a fresh block of `T`, 0 for plain allocation: numbers are laid out for the vector
/// units.
template <class T>
inline constexpr std::uint32_t FNRMemAlignment =
    std::is_same_v<T, float> || std::is_same_v<T, double> || std::is_same_v<T, FNComplex<float>> ||
            std::is_same_v<T, FNComplex<double>>
        ? 32
        : 0;

/// View of `size()` elements of `T`, from a byte offset, on a counted block.
template <class T> class FNRMem {
    static_assert(std::is_trivially_copyable_v<T>, "blocks are copied byte by byte");

public:
    using Dtor = FNRMemCoreBody::Dtor;

    /// Frees memory that came from `new T[]`.
    class CoreDtor final : public Dtor {
    public:
        void del(void* memory) const override { delete[] static_cast<T*>(memory); }
    };
    static const FNCountedPtr<Dtor>& dtor() {
        static const FNCountedPtr<Dtor> singleton(new CoreDtor);
        return singleton;
    }

    FNRMem() : FNRMem(0) {}

    /// A fresh block of `n` uninitialised elements.
    explicit FNRMem(std::uint64_t n) : core_(freshCore(n)), offset_(0), size_(n) {}

    /// `size` elements of `other`, `offset` elements into it, on the same block.
    /// @throws FNEBadArg if they do not lie within `other`.
    FNRMem(const FNRMem& other, std::uint64_t offset, std::uint64_t size)
        : core_(other.core_), offset_(other.offset_ + offset * sizeof(T)), size_(size) {
        if (size > other.size_ || offset > other.size_ - size) throwInvalidView();
    }

    /// All of `core`, whose size is a multiple of the element's.
    explicit FNRMem(const FNRMemCore& core) : core_(core), offset_(0), size_(core.size() / sizeof(T)) {}

    /// Wraps `n` elements that `dtor` frees. @throws FNEBadArg if `memory` is null.
    FNRMem(T* memory, std::uint64_t n, const FNCountedPtr<Dtor>& dtor)
        : core_(static_cast<void*>(memory), n * sizeof(T), dtor), offset_(0), size_(n) {}
    /// Wraps `n` elements that are never written in place; with `noCopy` a write access throws.
    FNRMem(const T* memory, std::uint64_t n, const FNCountedPtr<Dtor>& dtor, bool noCopy)
        : core_(static_cast<const void*>(memory), n * sizeof(T), dtor, noCopy), offset_(0), size_(n) {}

    /// A fresh block of `n` uninitialised elements in place of the old one.
    void resize(std::uint64_t n) {
        core_ = freshCore(n);
        offset_ = 0;
        size_ = n;
    }

    std::uint64_t size() const noexcept { return size_; }
    bool empty() const noexcept { return size_ == 0; }
    const FNRMemCore& core() const noexcept { return core_; }
    /// Byte offset of the first element in the block.
    std::uint64_t offset() const noexcept { return offset_; }

    /// First element, for reading; null for an empty block.
    const T* data() const noexcept { return reinterpret_cast<const T*>(core_.data() + offset_); }
    const T* begin() const noexcept { return data(); }
    const T* end() const noexcept { return data() + size_; }
    std::span<const T> span() const noexcept { return {data(), size_}; }

    /// First element, for writing: what others see does not change. The pointer holds until the view is
    /// copied.
    T* getExclusive() {
        offset_ = core_.demandExclusiveUse(offset_, size_ * sizeof(T));
        return reinterpret_cast<T*>(core_.writable() + offset_);
    }

    /// Element for writing. @throws FNEOutOfRange
    T& operator[](std::uint64_t i) {
        if (i >= size_) FN_THROW(FNEOutOfRange, nullptr);
        return getExclusive()[i];
    }
    /// Element for reading. @throws FNEOutOfRange
    const T& operator[](std::uint64_t i) const {
        if (i >= size_) FN_THROW(FNEOutOfRange, nullptr);
        return data()[i];
    }

    /// Equal if both are the same view, or if they have the same bytes and at least one. Two empty views on
    /// different blocks are not equal.
    bool operator==(const FNRMem& other) const noexcept {
        if (size_ != other.size_) return false;
        if (core_.sharesBody(other.core_) && offset_ == other.offset_) return true;
        return size_ != 0 && std::memcmp(data(), other.data(), size_ * sizeof(T)) == 0;
    }

private:
    static FNRMemCore freshCore(std::uint64_t n) {
        if (n > std::numeric_limits<std::uint64_t>::max() / sizeof(T)) throw std::bad_array_new_length();
        if constexpr (FNRMemAlignment<T> != 0) return FNRMemCore(n * sizeof(T), FNRMemAlignment<T>);
        return FNRMemCore(n * sizeof(T));
    }
    [[noreturn]] static void throwInvalidView() {
        FN_THROW(FNEBadArg, "FNRMem<T>::FNRMem( rmem): invalid offset or size");
    }

    FNRMemCore core_;
    std::uint64_t offset_; // bytes
    std::uint64_t size_;   // elements
};
