#pragma once

#include "img/feature_vector.h"
#include "img/gabor/gabor_transformation.h"

namespace Img {

/// A grid on a block of width by height pixels: positions `step` apart that leave out `marginX` columns on
/// the left and right and `marginY` rows above and below, the first one half a step into the rest.
template <std::uint32_t width_, std::uint32_t height_, std::uint32_t marginX_, std::uint32_t marginY_,
          std::uint32_t step_>
struct MaskGridParameters {
    static constexpr std::uint32_t width = width_, height = height_, step = step_;
    static constexpr std::uint32_t firstX = marginX_ + step / 2, endX = width - marginX_;
    static constexpr std::uint32_t firstY = marginY_ + step / 2, endY = height - marginY_;
};

namespace Gabor {

/// Features from responses: for each grid point, row after row, a block of the magnitudes, then the real
/// parts, then the imaginary parts of all filters, divided by the square root of the sum of the squared
/// magnitudes.
struct MRIComponentsExtractor {
    /// @throws FNEBadArg if a response has not the size of the grid's block
    template <class Grid> static FeatureVector<float> extract(const ResponseImages& responses) {
        std::vector<float> features;
        for (std::uint32_t y = Grid::firstY; y < Grid::endY; y += Grid::step)
            for (std::uint32_t x = Grid::firstX; x < Grid::endX; x += Grid::step)
                appendBlock(responses, {static_cast<std::int32_t>(x), static_cast<std::int32_t>(y)},
                            Grid::width, Grid::height, features);
        return FeatureVector<float>(FNVector<float>(features));
    }

private:
    static void appendBlock(const ResponseImages& responses, FNGridPos pos, std::uint32_t width,
                            std::uint32_t height, std::vector<float>& features);
};

} // namespace Gabor
} // namespace Img
