#pragma once

#include <array>
#include <cstdint>

namespace Eye::Gabor {

inline constexpr unsigned taps = 5;
/// Pixels from one grid point of a window to the next.
inline constexpr unsigned gridStep = 2;
/// Extent in pixels of a grid of `n` points `step` pixels apart, whose kernels reach 2 pixels beyond.
constexpr std::uint32_t maskSize(std::uint32_t n, std::uint32_t step) {
    return step * (n - 1) + taps;
}

/// Most directions that any convolver has.
inline constexpr unsigned mostDirections = 8;

/// The separable 5-tap kernels of complex Gabor responses in integers.
///
/// With tap offsets a, b from -2 to 2 in x and y, direction d of D correlates the pixels with
/// G(a) * G(b) * exp(-i * (kx * a + ky * b)), less a Gaussian so that a constant image gives nearly 0, where
/// (kx, ky) = pi / sqrt(2) * (cos, sin)(d * pi / D). Directions m and D - m differ in the sign of kx alone,
/// so that the products of one-dimensional kernels of directions 0 to D / 2 serve all.
///
/// G is scaled such that Re^2 + Im^2 stays in 32 bits for pixels of 16 bits.
struct KernelTable {
    using Taps = std::array<std::int32_t, taps>;

    /// For an even number of directions, up to mostDirections.
    explicit KernelTable(unsigned directions);

    unsigned directions;
    Taps dc;
    Taps gauss;
    std::array<Taps, mostDirections / 2 + 1> cosX, sinX, cosY, sinY;
};

/// The table for D directions, built before main.
template <unsigned D> const KernelTable& kernelRep();
template <> const KernelTable& kernelRep<6>();
template <> const KernelTable& kernelRep<8>();

} // namespace Eye::Gabor
