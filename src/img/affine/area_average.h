#pragma once

#include "fn/image.h"
#include "img/affine/overlap.h"

namespace Img::Affine {

/// The part of an image that is averaged, and how its pixels overlap those of the result.
struct AreaGrid {
    FNBox box; ///< inside the source
    Overlap x, y;
};

/// dst(x, y) = (the sum over i, j of weights * src(i, j)) >> shift, sums of 32 bits.
void averageByShift(const FNImage<unsigned short>& src, const AreaGrid& grid, int shift,
                    FNImage<unsigned short>& dst);

/// dst(x, y) = (the sum over i, j of weights * src(i, j)) / (width of x * width of y).
///
/// Of 16-bit pixels, sums have 32 bits and the quotient is formed with a truncated reciprocal: it is up to 3
/// below the true one. Where a sum needs more bits (only where more than 65536 units make a pixel), it is the
/// true one.
void averageByDivision(const FNImage<unsigned short>& src, const AreaGrid& grid,
                       FNImage<unsigned short>& dst);
void averageByDivision(const FNImage<float>& src, const AreaGrid& grid, FNImage<float>& dst);
/// Channel by channel as 16-bit pixels; opaque.
void averageByDivision(const FNImage<Fn::Bgra32>& src, const AreaGrid& grid, FNImage<Fn::Bgra32>& dst);

} // namespace Img::Affine
