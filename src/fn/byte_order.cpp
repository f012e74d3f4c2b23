#include "fn/byte_order.h"

#include "fn/exception.h"

#include <bit>
#include <cstring>

namespace {

/// The 32-bit word in the byte order of stored data.
constexpr std::uint32_t bigEndian(std::uint32_t value) {
    if constexpr (std::endian::native == std::endian::little) return __builtin_bswap32(value);
    return value;
}

const RealCompat checkedAtStart;

} // namespace

namespace Fn {

void storeUInt32(std::uint32_t value, unsigned char* stored) noexcept {
    value = bigEndian(value);
    std::memcpy(stored, &value, sizeof value);
}

std::uint32_t loadUInt32(const unsigned char* stored) noexcept {
    std::uint32_t value;
    std::memcpy(&value, stored, sizeof value);
    return bigEndian(value);
}

void storeUInt64(std::uint64_t value, unsigned char* stored) noexcept {
    storeUInt32(static_cast<std::uint32_t>(value), stored);
    storeUInt32(static_cast<std::uint32_t>(value >> 32), stored + 4);
}

std::uint64_t loadUInt64(const unsigned char* stored) noexcept {
    return loadUInt32(stored) | std::uint64_t{loadUInt32(stored + 4)} << 32;
}

} // namespace Fn

void htond(const double* values, unsigned char* stored, std::size_t n) noexcept {
    for (std::size_t i = 0; i < n; ++i)
        Fn::storeUInt64(std::bit_cast<std::uint64_t>(values[i]), stored + 8 * i);
}

void ntohd(const unsigned char* stored, double* values, std::size_t n) noexcept {
    for (std::size_t i = 0; i < n; ++i) values[i] = std::bit_cast<double>(Fn::loadUInt64(stored + 8 * i));
}

RealCompat::RealCompat() {
    constexpr unsigned char storedFloat[] = {0x3E, 0xA0, 0xD9, 0x7C};
    float f;
    ntohf(storedFloat, &f, 1);
    if (std::bit_cast<std::uint32_t>(f) != 0x3EA0D97C || f != 0x1.41b2f8p-2f)
        FN_THROW(FNESysError, "Incompatible architecture: float mismatch !");

    constexpr unsigned char storedDouble[] = {0x92, 0x17, 0x27, 0x1A, 0x3F, 0xA0, 0x15, 0xBF};
    double d;
    ntohd(storedDouble, &d, 1);
    if (std::bit_cast<std::uint64_t>(d) != 0x3FA015BF9217271A || d != 0x1.015bf9217271ap-5)
        FN_THROW(FNESysError, "Incompatible architecture: double mismatch !");
}
