#include "fn/byte_order.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "fn/stored_words.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

#include <bit>
#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace Fn::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

/// Between the stored order of bytes and that of this processor.
void orderWords(const unsigned char* from, unsigned char* to, std::size_t n) {
    std::size_t i = 0;
#if HWY_TARGET != HWY_SCALAR
    if constexpr (std::endian::native == std::endian::little) {
        constexpr std::uint8_t reversed[] = {3, 2, 1, 0, 7, 6, 5, 4, 11, 10, 9, 8, 15, 14, 13, 12};
        const hn::ScalableTag<std::uint8_t> d;
        const auto order = hn::LoadDup128(d, reversed);
        for (const std::size_t step = hn::Lanes(d) / 4; i + step <= n; i += step)
            hn::StoreU(hn::TableLookupBytes(hn::LoadU(d, from + 4 * i), order), d, to + 4 * i);
    }
#endif
    for (; i < n; ++i) {
        const std::uint32_t value = loadUInt32(from + 4 * i);
        std::memcpy(to + 4 * i, &value, sizeof value);
    }
}

} // namespace
} // namespace Fn::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Fn {
namespace {
HWY_EXPORT(orderWords);
} // namespace
} // namespace Fn

void htonf(const float* values, unsigned char* stored, std::size_t n) noexcept {
    using namespace Fn;
    HWY_DYNAMIC_DISPATCH(orderWords)(reinterpret_cast<const unsigned char*>(values), stored, n);
}

void ntohf(const unsigned char* stored, float* values, std::size_t n) noexcept {
    using namespace Fn;
    HWY_DYNAMIC_DISPATCH(orderWords)(stored, reinterpret_cast<unsigned char*>(values), n);
}
#endif
