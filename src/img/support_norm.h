#pragma once

#include "fn/image.h"

#include <vector>

namespace Img {

/// Contrast normalization by counting support: each pixel becomes the weighted share of its neighbours that
/// are darker, less that of those that are brighter, in -1 to 1. Neighbours that differ by less than the
/// noise count for neither, so that flat regions become 0.
///
/// A neighbour at (dx, dy), each up to `radius`, weighs exp(-(dx^2 + dy^2) / sigma^2), the pixel itself
/// nothing. With v the pixel's value, a neighbour is brighter above v * m + a and darker below v / m - a,
/// with the multiplicative noise m and the additive noise a. The window is cut to the image. Immutable.
class SupportNorm {
public:
    /// @param sigma,radius of the window, pixels
    /// @param additiveNoise in units of pixel values
    /// @param multiplicativeNoise at least 1
    /// @throws FNEGeneric for a sigma or a multiplicative noise out of range
    SupportNorm(float sigma, unsigned int radius, float additiveNoise, float multiplicativeNoise);

    /// A pixel without neighbours becomes 0, as does one that is not a number.
    FNImage<float> operator()(const FNImage<float>& image) const;
    /// The same, without vectors.
    FNImage<float> plain(const FNImage<float>& image) const;

private:
    float weight(std::int64_t dx, std::int64_t dy) const;
    /// Sums of weights in the windows around the pixels of a row.
    std::vector<float> windowSums(std::uint32_t w, std::uint32_t h, std::uint32_t y) const;

    std::int64_t radius_;
    float additiveNoise_, multiplicativeNoise_;
    std::vector<float> weights_; ///< row after row of the window
};

} // namespace Img
