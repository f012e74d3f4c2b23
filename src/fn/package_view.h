#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

/// The bytes of a package read where they lie. Nothing is copied or allocated, for readers of very many small
/// packages; all others read a Package.

namespace Fn {

/// Some successive cores of a package. The bytes must outlive it.
class PackageView {
public:
    using Bytes = std::span<const unsigned char>;

    /// All cores. @throws FNEBadArg as Package does for the same bytes
    explicit PackageView(Bytes package);

    std::size_t count() const noexcept { return count_; }
    /// @param wanted at most count()
    PackageView first(std::size_t wanted) const noexcept;
    /// The first core, which is no longer part of this then. There must be one.
    Bytes take() noexcept;
    /// As many take() calls. @param wanted at most count()
    void skip(std::size_t wanted) noexcept;
    /// @throws FNEBadArg if this is not a single core of 4 bytes
    std::uint32_t toUInt32() const;

private:
    const unsigned char* sizes_; ///< stored size of each core
    const unsigned char* data_;
    std::size_t count_;
};

/// The elements of a list, one after another.
class PackageListView {
public:
    /// @throws FNEBadArg if it is not a list
    explicit PackageListView(const PackageView& package);

    std::size_t remaining() const noexcept { return remaining_; }
    /// The next element. @throws FNEBadArg if there is none
    PackageView next();

private:
    PackageView cores_;
    std::size_t remaining_;
};

} // namespace Fn
