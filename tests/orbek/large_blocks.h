#pragma once

#include <cstddef>
#include <vector>

/// Records the blocks of memory that this thread allocates, by operator new or aligned_alloc, while the
/// object lives. One at a time.
class LargeBlocks {
public:
    /// @param least bytes of what is recorded
    explicit LargeBlocks(std::size_t least);
    ~LargeBlocks();
    LargeBlocks(const LargeBlocks&) = delete;
    LargeBlocks& operator=(const LargeBlocks&) = delete;

    std::vector<std::size_t> sizes() const;
};
