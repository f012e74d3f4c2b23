#include "large_blocks.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <limits>
#include <new>

namespace {

/// Kept without allocating.
struct Record {
    std::size_t least = std::numeric_limits<std::size_t>::max();
    std::size_t count = 0;
    std::array<std::size_t, 64> sizes{};

    void add(std::size_t size) {
        if (size >= least && count < sizes.size()) sizes[count++] = size;
    }
};

thread_local Record record;

void* allocate(std::size_t size) {
    record.add(size);
    void* const memory = std::malloc(std::max<std::size_t>(size, 1));
    if (!memory) throw std::bad_alloc();
    return memory;
}

} // namespace

void* operator new(std::size_t size) {
    return allocate(size);
}
void* operator new[](std::size_t size) {
    return allocate(size);
}
// The sanitizers' own nothrow forms would not come from here.
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
    record.add(size);
    return std::malloc(std::max<std::size_t>(size, 1));
}
void* operator new[](std::size_t size, const std::nothrow_t& tag) noexcept {
    return operator new(size, tag);
}
void operator delete(void* memory) noexcept {
    std::free(memory);
}
void operator delete[](void* memory) noexcept {
    std::free(memory);
}
void operator delete(void* memory, std::size_t) noexcept {
    std::free(memory);
}
void operator delete[](void* memory, std::size_t) noexcept {
    std::free(memory);
}

extern "C" void* aligned_alloc(std::size_t alignment, std::size_t size) noexcept {
    record.add(size);
    void* memory = nullptr;
    return posix_memalign(&memory, std::max(alignment, sizeof(void*)), size) == 0 ? memory : nullptr;
}

LargeBlocks::LargeBlocks(std::size_t least) {
    record.count = 0;
    record.least = least;
}

LargeBlocks::~LargeBlocks() {
    record.least = std::numeric_limits<std::size_t>::max();
}

std::vector<std::size_t> LargeBlocks::sizes() const {
    return {record.sizes.begin(), record.sizes.begin() + static_cast<std::ptrdiff_t>(record.count)};
}
