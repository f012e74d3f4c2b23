#pragma once

#include <algorithm>
#include <cstdint>

namespace Fn {

/// Stretches a sample of the range 0..`from` to 0..`to`, to the nearest integer; greater samples count as
/// `from`.
constexpr std::uint32_t scaleSample(std::uint32_t sample, std::uint32_t from, std::uint32_t to) {
    if (from == to) return std::min(sample, from);
    return static_cast<std::uint32_t>((std::uint64_t{std::min(sample, from)} * to + from / 2) / from);
}

/// Greatest value of a sample of `bits` bits, 1 to 32.
constexpr std::uint32_t greatestSample(unsigned int bits) {
    return 0xFFFFFFFFu >> (32 - bits);
}

} // namespace Fn
