#pragma once

#include "fn/image.h"
#include "orbek/lense_distortion_corrector.h"

#include <vector>

namespace Orbek {

/// Where a point at `undistorted`, relative to the centre, lies in the bent picture: solves
/// |undistorted| = r (1 + k r^2) for r by Cardano's formula.
FN2Vector<double> distortedPoint(FN2Vector<double> undistorted, double k);

/// The table of a lens: how far each pixel's source lies from it, toward the centre or away from it.
class LenseDistortionCorrector::Implementation {
public:
    Implementation(float parameter, std::uint32_t width, std::uint32_t height, int centerOffsetX,
                   int centerOffsetY);

    /// @throws FNEBadArg for an image of another size, or a region without pixels or outside of the image
    Image undistort(const Image& image, const Position& lowerCorner, const Position& upperCorner) const;

private:
    /// Of a quarter of the plane: x displacement in the low byte, y displacement in the high byte.
    using Entry = std::uint16_t;

    Entry entry(std::int64_t x, std::int64_t y, double scale) const;
    FNBox region(const Position& lowerCorner, const Position& upperCorner) const;

    std::uint32_t width_, height_;
    std::int64_t centerX_, centerY_;
    double k_;
    bool positive_;
    std::uint64_t tableWidth_;
    std::vector<Entry> table_;
};

} // namespace Orbek
