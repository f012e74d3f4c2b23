#pragma once

#include "fn/image.h"
#include "img/affine/overlap.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

/// The inner loops of area averages. Integer sums are taken modulo 2^32, so that any order gives the same
/// result.
namespace Img::Affine::Kernels {

/// out[i] = the sum over k of weights[k] * rows[k][i], for i < n.
void combineRows(std::span<const std::uint16_t* const> rows, const std::uint32_t* weights, std::uint32_t* out,
                 std::size_t n);
void combineRows(std::span<const std::uint32_t* const> rows, const std::uint32_t* weights, std::uint32_t* out,
                 std::size_t n);
void combineRows(std::span<const float* const> rows, const std::uint32_t* weights, float* out, std::size_t n);

/// Weighted sums along a row for windows of at most 4 source pixels, in the layout that shuffles and pairwise
/// multiplications want: result pixels in blocks of 4, all of whose first (and third) source pixels lie
/// within 7 pixels of the block's first one.
class NarrowWindows {
public:
    static constexpr std::uint32_t block = 4;     ///< result pixels
    static constexpr std::uint32_t overread = 10; ///< pixels behind a block's first one that may be read

    /// Whether the windows are narrow enough.
    static bool suits(const Overlap& overlap);
    explicit NarrowWindows(const Overlap& overlap);

    /// Number of sums that are written: the result's width rounded up to a multiple of 8.
    std::size_t paddedSize() const { return starts_.size() * block; }
    /// out[x] = the sum over k of weight(x)[k] * row[first[x] + k]. Reads up to `overread` pixels beyond the
    /// row.
    void sums(const std::uint16_t* row, std::uint32_t* out) const;

    // For the kernel, by block:
    const std::uint32_t* starts() const {
        return starts_.data();
    } ///< 1: source pixel that the block starts at
    const std::uint8_t* shuffles() const { return shuffles_.data(); } ///< 16: brings pairs of pixels in place
    const std::int16_t* weights01() const { return weights01_.data(); } ///< 8: weights of those pairs
    const std::int16_t* weights23() const {
        return weights23_.data();
    }                                                               ///< 8: weights of the pairs 2 further on
    const std::int32_t* offsets() const { return offsets_.data(); } ///< 4: 2^15 times the sum of the weights
    bool pairsSuffice() const { return pairsSuffice_; }             ///< weights23 is all zero

private:
    std::vector<std::uint32_t> starts_;
    std::vector<std::uint8_t> shuffles_;
    std::vector<std::int16_t> weights01_, weights23_;
    std::vector<std::int32_t> offsets_;
    bool pairsSuffice_ = true;
};

/// out[i] = sums[i] >> shift, which must fit.
void shiftDown(const std::uint32_t* sums, int shift, std::uint16_t* out, std::size_t n);

/// out[i] = sums[i] * reciprocals[i] / 2^32 by 16-bit halves: the product of the two low halves and all
/// carries from below bit 32 are dropped, so that the result is up to 3 too small.
void multiplyHigh(const std::uint32_t* sums, const std::uint32_t* reciprocals, std::uint16_t* out,
                  std::size_t n);

/// out[i] = sums[i] * factors[i].
void multiply(const float* sums, const float* factors, float* out, std::size_t n);

/// Planes of blue, green and red as 16-bit pixels: (v << 8) | 128.
void splitColor(const Fn::Bgra32* pixels, const std::array<std::uint16_t*, 3>& planes, std::size_t n);
/// Opaque pixels of the high bytes of three such planes.
void joinColor(const std::array<const std::uint16_t*, 3>& planes, Fn::Bgra32* pixels, std::size_t n);

} // namespace Img::Affine::Kernels
