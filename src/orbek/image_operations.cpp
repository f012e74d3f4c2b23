#include "orbek/image_operations.h"

#include "img/affine/turns.h"
#include "orbek/implementation/adapt.h"

#include <cmath>

namespace Orbek {
namespace {

template <class T> Image rotated(const FNImage<T>& image, ImageRotation rotation) {
    using namespace Img::Affine;
    const FNImage<T> result = image.empty()                                 ? image
                              : rotation == ImageRotation::QuarterClockwise ? rightRotation(image)
                              : rotation == ImageRotation::QuarterCounterClockwise
                                  ? leftRotation(image)
                                  : vertReflection(horReflection(image, image.box()), image.box());
    return adapt(FNImageReferenceFactory::create(result), "");
}

} // namespace

Image rotateImage(const Image& image, ImageRotation rotation) {
    if (rotation != ImageRotation::QuarterClockwise && rotation != ImageRotation::QuarterCounterClockwise &&
        rotation != ImageRotation::Half)
        return image;
    const FNImageReference reference = adapt(image);
    return reference.isColor() ? rotated(reference.toBgra32(), rotation)
                               : rotated(reference.toMono8(), rotation);
}

void faceToEyesPos(const Position& center, float angle, float distance, Position& left, Position& right) {
    const float half = distance / 2;
    const float x = half * std::cos(angle), y = half * std::sin(angle);
    const Position middle = center; // may be one of the results
    left = {middle.x - x, middle.y - y};
    right = {middle.x + x, middle.y + y};
}

Position faceToLeftEyePos(const Position& center, float angle, float distance) {
    Position left, right;
    faceToEyesPos(center, angle, distance, left, right);
    return left;
}

Position faceToRightEyePos(const Position& center, float angle, float distance) {
    Position left, right;
    faceToEyesPos(center, angle, distance, left, right);
    return right;
}

} // namespace Orbek
