#include "fn/rmem.h"

#include <bit>
#include <cstdlib>

namespace {

class GenericMemoryDtor final : public FNRMemCoreBody::Dtor {
public:
    void del(void* memory) const override { delete[] static_cast<unsigned char*>(memory); }

    static const FNCountedPtr<Dtor>& singleton() {
        static const FNCountedPtr<Dtor> instance(new GenericMemoryDtor);
        return instance;
    }
};

class AlignedMemoryDtor final : public FNRMemCoreBody::Dtor {
public:
    void del(void* memory) const override { std::free(memory); }

    static const FNCountedPtr<Dtor>& singleton() {
        static const FNCountedPtr<Dtor> instance(new AlignedMemoryDtor);
        return instance;
    }
};

constexpr std::uint32_t alignmentMask = (1u << 30) - 1;

/// Blocks up to this many bytes never leave a larger block for being small against it.
constexpr std::uint64_t smallestTrimmedView = 1024;

void* allocatePlain(std::uint64_t size) {
    if (size == 0) return nullptr;
    const std::uint64_t padded = size / 8 * 8 + 8;
    if (padded < size) throw std::bad_array_new_length();
    return new unsigned char[padded];
}

void* allocateAligned(std::uint64_t size, std::uint32_t alignment) {
    const std::uint64_t boundary = std::bit_ceil(std::uint64_t{alignment});
    const std::uint64_t padded =
        (size + boundary - 1) / boundary * boundary; // aligned_alloc wants a multiple
    const bool possible = size <= static_cast<std::uint64_t>(std::numeric_limits<std::ptrdiff_t>::max());
    void* const memory = possible ? std::aligned_alloc(boundary, padded) : nullptr;
    if (!memory)
        FN_THROW(FNESysError,
                 "There was insufficient memory to fulfill the allocation request (mkl_malloc).");
    return memory;
}

} // namespace

const FNCountedPtr<FNRMemCoreBody::Dtor>& FNRMemCoreBody::preserve() {
    static const FNCountedPtr<Dtor> instance(new Preserve);
    return instance;
}

FNRMemCoreBody::FNRMemCoreBody(std::uint64_t size)
    : alignment_(0), constant_(0), noCopy_(0), size_(size), data_(allocatePlain(size)),
      dtor_(GenericMemoryDtor::singleton()) {}

FNRMemCoreBody::FNRMemCoreBody(std::uint64_t size, std::uint32_t alignment)
    : alignment_(alignment & alignmentMask), constant_(0), noCopy_(0), size_(size), data_(nullptr),
      dtor_(AlignedMemoryDtor::singleton()) {
    if (size == 0) return;
    if (alignment_ == 0) FN_THROW(FNEBadArg, "FNRMem: Illegal alignment 0 requested!");
    if (alignment_ <= 8) {
        data_ = allocatePlain(size);
        dtor_ = GenericMemoryDtor::singleton();
    } else {
        data_ = allocateAligned(size, alignment_);
    }
}

FNRMemCoreBody::FNRMemCoreBody(void* data, std::uint64_t size, const FNCountedPtr<Dtor>& dtor, bool constant,
                               bool noCopy)
    : alignment_(0), constant_(constant), noCopy_(noCopy), size_(size), data_(data), dtor_(dtor) {}

FNRMemCore::FNRMemCore(void* memory, std::uint64_t size, const FNCountedPtr<Dtor>& dtor) {
    if (!memory) FN_THROW(FNEBadArg, "FNRMemCore::ctor: Zero Pointer passed");
    body_ = FNCountedPtr<FNRMemCoreBody>(new FNRMemCoreBody(memory, size, dtor, false, false));
}

FNRMemCore::FNRMemCore(const void* memory, std::uint64_t size, const FNCountedPtr<Dtor>& dtor, bool noCopy) {
    if (!memory) FN_THROW(FNEBadArg, "FNRMemCore::ctor: Zero Pointer passed");
    body_ =
        FNCountedPtr<FNRMemCoreBody>(new FNRMemCoreBody(const_cast<void*>(memory), size, dtor, true, noCopy));
}

bool FNRMemCore::operator==(const FNRMemCore& other) const noexcept {
    if (body_ == other.body_) return true;
    return size() == other.size() && size() != 0 && std::memcmp(data(), other.data(), size()) == 0;
}

std::uint64_t FNRMemCore::demandExclusiveUse(std::uint64_t offset, std::uint64_t size) {
    const FNRMemCoreBody& body = *body_.get();
    if (body.size() == 0) {
        if (offset == 0 && size == 0) return offset;
        FN_THROW(FNEBadArg, "FNRMem: invalid access to zero sized core");
    }
    if (body_.count() > 1 || body.constant()) {
        if (body.noCopy()) FN_THROW(FNESysError, "FNRmem: try to unshare const memory.");
        changeOver(offset, size, offset == 0 ? body.alignment() : 0);
        return 0;
    }
    // The only owner of a large block that looks at less than a third of it lets the rest go.
    if (size > smallestTrimmedView && size < body.size() / 3) {
        changeOver(offset, size, 0);
        return 0;
    }
    return offset;
}

/// Continues on a body that holds just the given bytes of the present one.
void FNRMemCore::changeOver(std::uint64_t offset, std::uint64_t size, std::uint32_t alignment) {
    const FNCountedPtr<FNRMemCoreBody> fresh(alignment != 0 ? new FNRMemCoreBody(size, alignment)
                                                            : new FNRMemCoreBody(size));
    if (size != 0) std::memcpy(fresh.get()->data(), body_.get()->data() + offset, size);
    body_ = fresh;
}
