#include "fn/package_view.h"

#include "fn/byte_order.h"
#include "fn/exception.h"

namespace Fn {
namespace {

constexpr std::size_t countSize = 4;

/// A count is a core of its own; there must be one.
std::size_t takeCount(PackageView& cores) {
    const std::size_t count = cores.first(1).toUInt32();
    (void)cores.take();
    return count;
}

} // namespace

PackageView::PackageView(Bytes package) : sizes_(package.data() + countSize), data_(nullptr), count_(0) {
    if (package.size() < countSize)
        FN_THROW(FNEBadArg, "creating Package from memory: reading number of cores");
    count_ = loadUInt32(package.data());
    std::size_t left = package.size() - countSize;
    if (count_ > left / countSize)
        FN_THROW(FNEBadArg, "creating Package from memory: reading sizes of cores");
    left -= count_ * countSize;
    data_ = sizes_ + count_ * countSize;
    for (std::size_t i = 0; i < count_; ++i) {
        const std::size_t size = loadUInt32(sizes_ + i * countSize);
        if (size > left) FN_THROW(FNEBadArg, "creating Package from memory: reading core");
        left -= size;
    }
}

PackageView PackageView::first(std::size_t wanted) const noexcept {
    PackageView result = *this;
    result.count_ = wanted;
    return result;
}

PackageView::Bytes PackageView::take() noexcept {
    const Bytes core(data_, loadUInt32(sizes_));
    sizes_ += countSize;
    data_ += core.size();
    --count_;
    return core;
}

void PackageView::skip(std::size_t wanted) noexcept {
    for (std::size_t i = 0; i < wanted; ++i) (void)take();
}

std::uint32_t PackageView::toUInt32() const {
    if (count_ != 1 || loadUInt32(sizes_) != countSize)
        FN_THROW(FNEBadArg, "converting to FNUInt32 from an invalid package");
    return loadUInt32(data_);
}

PackageListView::PackageListView(const PackageView& package) : cores_(package), remaining_(0) {
    if (package.count() == 0) FN_THROW(FNEBadArg, "converting to list<Package> from an invalid package");
    const std::size_t announced = takeCount(cores_);
    PackageView walk = cores_;
    for (; walk.count() != 0; ++remaining_) {
        const std::size_t cores = takeCount(walk);
        if (cores > walk.count())
            FN_THROW(FNEBadArg,
                     "converting to list<Package> from an invalid package(mismatch of number of cores)");
        walk.skip(cores);
    }
    if (remaining_ != announced)
        FN_THROW(FNEBadArg,
                 "converting to list<Package> from an invalid package (mismatch of number of packages)");
}

PackageView PackageListView::next() {
    if (remaining_ == 0) FN_THROW(FNEBadArg, "package has fewer elements than expected");
    const std::size_t cores = takeCount(cores_);
    const PackageView element = cores_.first(cores);
    cores_.skip(cores);
    --remaining_;
    return element;
}

} // namespace Fn
