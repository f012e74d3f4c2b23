#pragma once

#include "cmp/face/face_geometry.h"
#include "fn/deployment/component.h"
#include "fn/image.h"

#include <initializer_list>

/// What the pictures that are cut out of portraits have in common.
namespace Kx {

/// A rectangle of an image, turned as the face is, and the size of the picture that it becomes. The rectangle
/// may pass the border of the image.
struct CutBox : Cmp::SourceRegion {
    int width = 0, height = 0; ///< pixels

    /// The picture, with pixels that are not initialised. @throws FNEBadArg if it is too large
    template <class T> FNImage<T> picture() const {
        checkSize();
        return {static_cast<std::uint32_t>(width), static_cast<std::uint32_t>(height)};
    }

private:
    void checkSize() const;
};

/// A side of a picture, rounded. @throws FNEBadArg if no picture has such a side
int pictureSide(float pixels);

/// A side of a box that becomes as many pixels of a picture. Rounding never makes it longer: a box larger
/// than its picture by a hair would be averaged, and lose sharpness.
FNPos boxSide(FNPos direction, int pixels);

/// @throws FNEBadArg unless all are numbers that can be places in an image
void checkPlaces(std::initializer_list<FNPos> places);

/// What stands in a picture where its box passes the border of the image, and how much of that there may be.
/// Also the part of a configuration type that tells so.
struct Padding {
    float ratio;      ///< greatest share of the picture; 1 and above for any
    Fn::Bgra32 color; ///< opaque

    static std::list<Fn::Deployment::Property> properties();
    /// @throws FNEBadArg for a colour outside of 0..255
    explicit Padding(const Fn::Deployment::Component& component);
    Padding(float greatestRatio, const Fn::Bgra32& paddingColor)
        : ratio(greatestRatio), color(paddingColor) {}
};

/// @param image the pixels that there are
/// @throws FNEBadArg "Maximum padding ratio exceeded." if more than that share of the box lies outside
void checkPaddingRatio(const CutBox& box, const FNBox& image, float ratio);

} // namespace Kx
