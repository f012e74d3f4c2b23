#include "kx/cut_box.h"

#include "fn/deployment/leaf_values.h"
#include "fn/imagefile/image_limits.h"
#include "fn/shape.h"

#include <sstream>

namespace Kx {

using namespace Fn::Deployment;

namespace {

constexpr const char *ratioKey = "PaddingRatio", *redKey = "PaddingColorRed", *greenKey = "PaddingColorGreen",
                     *blueKey = "PaddingColorBlue";

Property channel(const char* key, const std::string& name) {
    return propertyWithDefault<Int>::create(
        key, 192,
        "Channel of color " + name +
            " of the color to be used for padding. Valid range: 0 - 255 (default: 0xC0, 192)");
}

unsigned char channelOf(const Component& component, const char* key) {
    const int value = Value<Int>::get(component.subComponent(key));
    if (value < 0 || value > 255)
        FN_THROW(FNEBadArg, component.name() + "." + key + ": " + std::to_string(value) +
                                " is no value of a color channel, 0 to 255");
    return static_cast<unsigned char>(value);
}

} // namespace

int pictureSide(float pixels) {
    const float side = std::trunc(pixels + 0.5f);
    if (!(side >= 1 && side <= static_cast<float>(Fn::ImageLimits().maxWidth))) {
        std::ostringstream text;
        text << "Failed to cut out a face: a side of the picture would have " << side << " pixels";
        FN_THROW(FNEBadArg, text.str());
    }
    return static_cast<int>(side);
}

void CutBox::checkSize() const {
    if (static_cast<std::uint64_t>(width) * static_cast<std::uint64_t>(height) > Fn::ImageLimits().maxPixels)
        FN_THROW(FNEBadArg, "Failed to cut out a face: a picture of " + std::to_string(width) + " x " +
                                std::to_string(height) + " pixels is too large");
}

FNPos boxSide(FNPos direction, int pixels) {
    const float longest = static_cast<float>(pixels);
    FNPos side = direction * longest;
    while (length(side) > longest) side = side * (1 - std::numeric_limits<float>::epsilon() / 2);
    return side;
}

void checkPlaces(std::initializer_list<FNPos> places) {
    constexpr float farthest = 1 << 24; // neighbouring pixels are one number from here on
    for (const FNPos place : places)
        if (!(std::fabs(place.x) <= farthest && std::fabs(place.y) <= farthest))
            FN_THROW(FNEBadArg, "Failed to cut out a face: its annotation does not lie in an image");
}

std::list<Property> Padding::properties() {
    return Fn::Deployment::properties(
        propertyWithDefault<Float>::create(
            ratioKey, 1.0f,
            "Maximum ratio of padded pixels in the output image. (default: 1.0, no restriction on padding."),
        channel(redKey, "red"), channel(greenKey, "green"), channel(blueKey, "blue"));
}

Padding::Padding(const Component& component)
    : ratio(Value<Float>::get(component.subComponent(ratioKey))),
      color(channelOf(component, redKey), channelOf(component, greenKey), channelOf(component, blueKey)) {}

void checkPaddingRatio(const CutBox& box, const FNBox& image, float ratio) {
    if (!(ratio < 1)) return;
    using Fn::Shape;
    const Shape shape = Shape::parallelogram(box.origin, box.origin + box.u, box.origin + box.v);
    const double outside = static_cast<double>((shape - Shape(image)).area());
    // Of the picture: a box that is scaled has pixels of another size.
    const double pixels = double{length(box.u)} * length(box.v);
    if (outside / pixels > ratio) FN_THROW(FNEBadArg, "Maximum padding ratio exceeded.");
}

} // namespace Kx
