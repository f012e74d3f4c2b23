// Counting of differing bits for one instruction set; included once for each, behind hwy/highway.h.

#if defined(ORBEK_SIGN_BITS_INL) == defined(HWY_TARGET_TOGGLE)
#ifdef ORBEK_SIGN_BITS_INL
#undef ORBEK_SIGN_BITS_INL
#else
#define ORBEK_SIGN_BITS_INL
#endif

#include "fn/numeric/sign_bits.h"

#include <algorithm>
#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace Fn::Numeric::HWY_NAMESPACE {

#if HWY_TARGET == HWY_SCALAR

inline std::uint32_t differingBitsOfBlocks(const unsigned char* a, const unsigned char* b,
                                           std::size_t blocks) {
    return Plain::differingBits(a, b, 64 * blocks);
}

#else

/// Bits in which two strings of 64 bytes each block differ.
HWY_INLINE std::uint32_t differingBitsOfBlocks(const unsigned char* a, const unsigned char* b,
                                               std::size_t blocks) {
    namespace hn = hwy::HWY_NAMESPACE;
    constexpr std::size_t block = 64;
    const hn::CappedTag<std::uint8_t, block> d8;
    const hn::RepartitionToWide<hn::RepartitionToWide<hn::RepartitionToWide<decltype(d8)>>> d64;
    const std::size_t lanes = hn::Lanes(d8);
    auto sums = hn::Zero(d64);
#if HWY_TARGET <= HWY_AVX3_DL // counts the bits of 64-bit lanes in one instruction
    for (std::size_t i = 0; i < block * blocks; i += lanes) {
        const auto difference = hn::Xor(hn::LoadU(d8, a + i), hn::LoadU(d8, b + i));
        sums = hn::Add(sums, hn::PopulationCount(hn::BitCast(d64, difference)));
    }
#else
    // A byte holds the counts of 31 bytes.
    const std::size_t longestRun = 31 * lanes;
    for (std::size_t i = 0; i < block * blocks;) {
        const std::size_t end = std::min(block * blocks, i + longestRun);
        auto counts = hn::Zero(d8);
        for (; i < end; i += lanes)
            counts =
                hn::Add(counts, hn::PopulationCount(hn::Xor(hn::LoadU(d8, a + i), hn::LoadU(d8, b + i))));
        sums = hn::Add(sums, hn::SumsOf8(counts));
    }
#endif
    return static_cast<std::uint32_t>(hn::GetLane(hn::SumOfLanes(d64, sums)));
}

#endif

} // namespace Fn::Numeric::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif // per target
