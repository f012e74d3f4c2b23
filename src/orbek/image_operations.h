#pragma once

#include "orbek/geometry.h"
#include "orbek/image.h"

/// Turning pictures, fading their border, and the geometry of eyes in a face.

namespace Orbek {

enum class ImageRotation {
    QuarterClockwise = 0,
    QuarterCounterClockwise = 1,
    Half = 2,
};

/// A turned image with an empty name; gray stays gray. A rotation that is none of the above gives the image
/// itself.
[[gnu::visibility("default")]] Image rotateImage(const Image& image, ImageRotation rotation);

/// How the fade of vignetting() runs from the border inward.
enum class SmoothingFunction {
    Hard = 0,   ///< the border has the colour throughout
    Linear = 1, ///< from the colour outside to the picture inside
    Bell = 2,   ///< as Linear, along a bell curve that begins at 5 percent of the picture
};

/// The picture in colour with its border faded into `color`, and an empty name.
/// @param borderWidth of the fade, pixels
/// @param cornerRadius of the rounded corners, pixels; 0 or less for square ones. What lies outside of them
/// has the colour.
[[gnu::visibility("default")]] Image vignetting(const Image& image, Rgb color, int borderWidth,
                                                int cornerRadius, SmoothingFunction smoothing);

/// The eyes of a face.
/// @param center between the eyes
/// @param angle in the image plane, radians, positive from x toward y
/// @param distance of the eyes, pixels
/// @param left,right as the observer of an upright picture sees them
[[gnu::visibility("default")]] void faceToEyesPos(const Position& center, float angle, float distance,
                                                  Position& left, Position& right);
[[gnu::visibility("default")]] Position faceToLeftEyePos(const Position& center, float angle, float distance);
[[gnu::visibility("default")]] Position faceToRightEyePos(const Position& center, float angle,
                                                          float distance);

} // namespace Orbek
