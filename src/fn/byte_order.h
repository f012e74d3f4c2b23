#pragma once

#include <cstddef>
#include <cstdint>

/// The stored form of numbers: the same on every processor.
///
/// 32-bit integers and floats are stored most significant byte first. 64-bit integers and doubles are two
/// such 32-bit words, the less significant word first: 0x0102030405060708 is 05 06 07 08 01 02 03 04.

namespace Fn {

void storeUInt32(std::uint32_t value, unsigned char* stored) noexcept;
std::uint32_t loadUInt32(const unsigned char* stored) noexcept;
void storeUInt64(std::uint64_t value, unsigned char* stored) noexcept;
std::uint64_t loadUInt64(const unsigned char* stored) noexcept;

} // namespace Fn

/// `n` floats to and from their stored form of 4 bytes each.
void htonf(const float* values, unsigned char* stored, std::size_t n) noexcept;
void ntohf(const unsigned char* stored, float* values, std::size_t n) noexcept;
/// `n` doubles to and from their stored form of 8 bytes each.
void htond(const double* values, unsigned char* stored, std::size_t n) noexcept;
void ntohd(const unsigned char* stored, double* values, std::size_t n) noexcept;

/// Checks at start-up that reals have the layout that the stored form supposes.
class RealCompat {
public:
    /// @throws FNESysError if floats or doubles are not IEEE 754 of the expected layout.
    RealCompat();
};
