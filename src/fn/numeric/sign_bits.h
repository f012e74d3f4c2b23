#pragma once

#include <cstddef>
#include <cstdint>

/// Comparison of bit strings, under the dot product of sign vectors.

namespace Fn::Numeric {

/// Number of bits in which two strings of `bytes` bytes differ.
std::uint32_t differingBits(const unsigned char* a, const unsigned char* b, std::size_t bytes);

namespace Plain {

/// The same by a table of the bits in a byte.
std::uint32_t differingBits(const unsigned char* a, const unsigned char* b, std::size_t bytes);

} // namespace Plain

} // namespace Fn::Numeric
