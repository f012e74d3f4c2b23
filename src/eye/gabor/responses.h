#pragma once

#include "eye/gabor/kernel_table.h"

#include <cstddef>
#include <vector>

/// Integer Gabor responses on a grid, and their comparison. Each function has a plain form and one for the
/// vector units; both give the same bits.

namespace Eye::Gabor {

/// Responses at the points of a grid: for each direction a plane of rows. Rows begin and end with room that
/// vectors may touch.
class Responses {
public:
    Responses(unsigned directions, std::uint32_t columns, std::uint32_t rows)
        : directions_(directions), columns_(columns), rows_(rows),
          stride_(lead + (columns + lead - 1) / lead * lead), re_(size()), im_(size()), mag_(size()) {}

    unsigned directions() const noexcept { return directions_; }
    std::uint32_t columns() const noexcept { return columns_; }
    std::uint32_t rows() const noexcept { return rows_; }

    /// Index of the response in direction d at column 0 of row y; the one at column x is x further.
    std::size_t row(unsigned d, std::uint32_t y) const noexcept {
        return (std::size_t{d} * rows_ + y) * stride_ + lead;
    }
    /// Real and imaginary part, and the sum of their squares.
    std::int32_t* re() noexcept { return re_.data(); }
    std::int32_t* im() noexcept { return im_.data(); }
    std::int32_t* mag() noexcept { return mag_.data(); }
    const std::int32_t* re() const noexcept { return re_.data(); }
    const std::int32_t* im() const noexcept { return im_.data(); }
    const std::int32_t* mag() const noexcept { return mag_.data(); }

private:
    /// Numbers before the first column: as many as the widest vector has.
    static constexpr std::uint32_t lead = 16;
    /// One row more than there are.
    std::size_t size() const { return row(directions_ - 1, rows_) + stride_; }

    unsigned directions_;
    std::uint32_t columns_, rows_;
    std::size_t stride_;
    std::vector<std::int32_t> re_, im_, mag_;
};

/// Computes the responses around the grid points that lie `step` (1 or 2) pixels apart; `pixels` is the upper
/// left pixel of a mask of maskSize(columns, step) by maskSize(rows, step).
void computeResponses(const KernelTable& kernels, const unsigned short* pixels, std::size_t pixelStride,
                      std::uint32_t step, Responses& responses);

/// Bits of the comparisons of one grid point in one direction, of two bits each: whether the first response
/// is at least as strong as the second, and whether its phase lies on the positive side of the second's.
namespace WindowBits {
inline constexpr unsigned right = 0;     ///< the point and the one to the right
inline constexpr unsigned diagonal = 2;  ///< the one to the right and the one below
inline constexpr unsigned downRight = 4; ///< the point and the one below to the right
inline constexpr unsigned down = 6;      ///< the point and the one below
inline constexpr unsigned next = 8;      ///< the point in this and in the next direction
} // namespace WindowBits

/// For direction d and row y the WindowBits of all columns to codes[x]; what has no second point there is
/// undefined. `codes` has room for columns() rounded up to a multiple of 16.
void compareInWindow(const Responses& responses, unsigned d, std::uint32_t y, std::int32_t* codes);

/// For row y, at distance 2 in x and y, the bytes of points of six directions, see RowOrientedGaborSods:
/// bytes[p][x] is byte p of the point in column x. In the first two columns and rows the bits without a
/// second point are clear. Each bytes[p] has room for columns() rounded up to a multiple of 16.
void compareInPatch(const Responses& responses, std::uint32_t y, unsigned char* const bytes[8]);

namespace Plain {

void computeResponses(const KernelTable& kernels, const unsigned short* pixels, std::size_t pixelStride,
                      std::uint32_t step, Responses& responses);
void compareInWindow(const Responses& responses, unsigned d, std::uint32_t y, std::int32_t* codes);
void compareInPatch(const Responses& responses, std::uint32_t y, unsigned char* const bytes[8]);

} // namespace Plain

} // namespace Eye::Gabor
