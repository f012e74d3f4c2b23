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

/// The same for one string against eight, which begin `stride` bytes apart; one register holds a block of the
/// one string for all of them, and their sums are brought together at the end.
HWY_INLINE void differingBitsOfEight(const unsigned char* a, const unsigned char* b, std::size_t stride,
                                     std::size_t blocks, std::uint32_t* counts) {
#if HWY_TARGET <= HWY_AVX3_DL
    namespace hn = hwy::HWY_NAMESPACE;
    constexpr std::size_t block = 64;
    const hn::FixedTag<std::uint64_t, 8> d64;
    const hn::Half<decltype(d64)> half;
    using Sums = hn::Vec<decltype(d64)>;
    const auto words = [&](const unsigned char* bytes)
                           HWY_ATTR { return hn::LoadU(d64, reinterpret_cast<const std::uint64_t*>(bytes)); };
    Sums s0 = hn::Zero(d64), s1 = s0, s2 = s0, s3 = s0, s4 = s0, s5 = s0, s6 = s0, s7 = s0;
    for (std::size_t i = 0; i < block * blocks; i += block) {
        const Sums x = words(a + i);
        const auto count = [&](Sums& sum, std::size_t k) HWY_ATTR {
            sum = hn::Add(sum, hn::PopulationCount(hn::Xor(x, words(b + k * stride + i))));
        };
        count(s0, 0), count(s1, 1), count(s2, 2), count(s3, 3);
        count(s4, 4), count(s5, 5), count(s6, 6), count(s7, 7);
    }
    // Two sums at a time, by halves of their 128-bit parts; then those parts.
    const auto pair = [&](Sums u, Sums v) HWY_ATTR {
        const Sums both = hn::Add(hn::InterleaveLower(d64, u, v), hn::InterleaveUpper(d64, u, v));
        return hn::Add(hn::LowerHalf(half, both), hn::UpperHalf(half, both));
    };
    const auto store = [&](hn::Vec<decltype(half)> two, std::size_t k) HWY_ATTR {
        const hn::Half<decltype(half)> quarter;
        const auto sums = hn::Add(hn::LowerHalf(quarter, two), hn::UpperHalf(quarter, two));
        const hn::Rebind<std::uint32_t, decltype(quarter)> d32;
        hn::StoreU(hn::TruncateTo(d32, sums), d32, counts + k);
    };
    store(pair(s0, s1), 0);
    store(pair(s2, s3), 2);
    store(pair(s4, s5), 4);
    store(pair(s6, s7), 6);
#else
    for (std::size_t k = 0; k < 8; ++k) counts[k] = differingBitsOfBlocks(a, b + k * stride, blocks);
#endif
}

} // namespace Fn::Numeric::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif // per target
