#pragma once

#include <list>

namespace Img {

/// Scale factors, relative to objects of the size `reference`, that cover objects of `minSize` to `maxSize`.
/// Consecutive factors differ by s = factor^(2 (1 - overlap)): each stands for sizes from 1 / factor to
/// `factor` times its own, less the overlap. What is left over is split evenly between both ends. Factors
/// below 1, which would enlarge the image, are left out.
/// @param clampToOne has a table that starts below 1 begin with 1 itself where the series passes it, and go
/// on from there
/// @throws FNEBadArg unless reference > 0, factor > 1, 0 <= overlap < 1 and 0 < minSize <= maxSize, or for a
/// table of more than 10000 factors
std::list<float> createScalingTable(double const& reference, double const& factor, double const& minSize,
                                    double const& maxSize, double const& overlap, bool clampToOne);

} // namespace Img
