#include "fn/numeric/sign_bits.h"

#define HWY_WANT_AVX3_DL
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "fn/numeric/sign_bits.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

#include "fn/numeric/sign_bits-inl.h"

#include <array>
#include <bit>

HWY_BEFORE_NAMESPACE();
namespace Fn::Numeric::HWY_NAMESPACE {

std::uint32_t differingBitsOfAny(const unsigned char* a, const unsigned char* b, std::size_t bytes) {
    const std::size_t blocks = bytes / 64, rest = bytes % 64;
    std::uint32_t result = differingBitsOfBlocks(a, b, blocks);
    if (rest != 0) {
        alignas(64) unsigned char lastA[64] = {}, lastB[64] = {};
        std::memcpy(lastA, a + 64 * blocks, rest);
        std::memcpy(lastB, b + 64 * blocks, rest);
        result += differingBitsOfBlocks(lastA, lastB, 1);
    }
    return result;
}

} // namespace Fn::Numeric::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Fn::Numeric {

HWY_EXPORT(differingBitsOfAny);

std::uint32_t differingBits(const unsigned char* a, const unsigned char* b, std::size_t bytes) {
    return HWY_DYNAMIC_DISPATCH(differingBitsOfAny)(a, b, bytes);
}

std::uint32_t Plain::differingBits(const unsigned char* a, const unsigned char* b, std::size_t bytes) {
    static constexpr auto bitsOfByte = [] {
        std::array<unsigned char, 256> table{};
        for (unsigned i = 0; i < table.size(); ++i) table[i] = static_cast<unsigned char>(std::popcount(i));
        return table;
    }();
    std::uint32_t result = 0;
    for (std::size_t i = 0; i < bytes; ++i) result += bitsOfByte[a[i] ^ b[i]];
    return result;
}

} // namespace Fn::Numeric
#endif
