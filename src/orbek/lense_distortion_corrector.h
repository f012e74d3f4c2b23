#pragma once

#include "orbek/configuration.h"
#include "orbek/geometry.h"
#include "orbek/image.h"

namespace Orbek {

/// Straightens what a wide lens has bent, by the radial model r_u = r_d (1 + k r_d^2) of the distance from
/// the centre in the straight and in the bent picture. Made once for a camera:
///
///     const Orbek::LenseDistortionCorrector corrector(configuration, 0.3f, 640, 480, 0, 0);
///     const Orbek::Image straight = corrector.undistort(frame);
///
/// The corners of the table stay where they are. Each pixel is fetched whole, without interpolation. Copies
/// share the table, and any number of threads may use one.
class [[gnu::visibility("default")]] LenseDistortionCorrector {
public:
    /// @param parameter -1 to 1: k in 100000ths per squared pixel; the sign tells the direction
    /// @param width,height of the images
    /// @param centerOffsetX,centerOffsetY from the middle of the image to the centre, pixels
    /// @throws std::exception if a pixel would have to move by more than 255, or for a parameter out of range
    LenseDistortionCorrector(const Configuration& configuration, const float& parameter, unsigned int width,
                             unsigned int height, int centerOffsetX, int centerOffsetY);
    LenseDistortionCorrector(const LenseDistortionCorrector&);
    LenseDistortionCorrector& operator=(const LenseDistortionCorrector&);
    ~LenseDistortionCorrector();

    /// The picture in colour and of the same size, with an empty name; black where nothing is known.
    /// @throws std::exception for an image of another size
    Image undistort(const Image& image) const;
    /// The same for a region only, which becomes the whole result.
    /// @param lowerCorner,upperCorner pixels, rounded down; both (0, 0) for the whole image
    /// @throws std::exception for a region without pixels or outside of the image
    Image undistort(const Image& image, const Position& lowerCorner, const Position& upperCorner) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek
