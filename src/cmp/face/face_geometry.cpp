#include "cmp/face/face_geometry.h"

#include "fn/exception.h"

#include <limits>
#include <stdexcept>

namespace Cmp {

namespace {

/// From the line of the eyes to the mouth, in eye distances.
constexpr float mouthBelowEyes = 1.02f;

FNPos rotated(FNPos p, float angle) {
    const float c = std::cos(angle), s = std::sin(angle);
    return {p.x * c - p.y * s, p.x * s + p.y * c};
}

} // namespace

FNPos eyesToMouthPos(FNPos left, FNPos right) {
    const FNPos d = right - left;
    return {left.x + 0.5f * d.x - mouthBelowEyes * d.y, left.y + 0.5f * d.y + mouthBelowEyes * d.x};
}

FNPos faceToMouthPos(FNPos pos, float angle, float width) {
    return pos + rotated({0, mouthBelowEyes * width}, angle);
}

FNPos faceToLeftEyePos(FNPos pos, float angle, float width) {
    return pos + rotated({-0.5f * width, 0}, angle);
}

FNPos faceToRightEyePos(FNPos pos, float angle, float width) {
    return pos + rotated({0.5f * width, 0}, angle);
}

void faceToEyesPos(FNPos pos, float angle, float width, FNPos& left, FNPos& right) {
    left = faceToLeftEyePos(pos, angle, width);
    right = faceToRightEyePos(pos, angle, width);
}

void checkEyesApart(FNPos left, FNPos right) {
    constexpr float least = std::numeric_limits<float>::epsilon();
    const FNPos d = right - left;
    if (std::fabs(d.x) < least && std::fabs(d.y) < least)
        throw std::invalid_argument("eye distance should not be zero");
}

void eyesToFacePos(FNPos left, FNPos right, FNPos& pos, float& angle, float& distance) {
    checkEyesApart(left, right);
    const FNPos d = right - left;
    pos = (left + right) / 2.0f;
    angle = std::atan2(d.y, d.x);
    distance = length(d);
}

SourceRegion regionToReshape(FNPos first, FNPos second, unsigned int width, unsigned int height, FNPos target,
                             float const& scale) {
    if (!(first.x < second.x)) FN_THROW(FNEBadArg, "Right eye is right eye from observer's position!");
    const float w = static_cast<float>(width), h = static_cast<float>(height);
    const FNPos u = (second - first) * (w / (w - 2 * target.x));
    const FNPos v = FNPos(-u.y, u.x) * (h / w) * scale;
    return {(first + second - u) / 2.0f - v * (target.y / h), u, v};
}

SourceRegion regionToReshape(FNPos const& pos, float faceWidth, float angle, unsigned int width,
                             unsigned int height, FNPos target, float const& scale) {
    FNPos left, right;
    faceToEyesPos(pos, angle, faceWidth, left, right);
    return regionToReshape(left, right, width, height, target, scale);
}

} // namespace Cmp
