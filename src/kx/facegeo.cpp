#include "kx/facegeo.h"

#include "fn/deployment/leaf_values.h"

#include <algorithm>
#include <limits>

namespace Kx {

using namespace Fn::Deployment;

namespace {

Property factor(const char* key, float value, const char* doc) {
    return propertyWithDefault<Float>::create(key, value, doc);
}

} // namespace

Type FaceGeometry::define() {
    return Type(typeId(), "Face geometry from eyes positions",
                properties(factor("WidthOfHeadFactor", 2.2f,
                                  "An estimate for the width of head is computed from horizontal eye "
                                  "distance multiplied by WidthOfHeadFactor"),
                           factor("LengthOfHeadFactor", 3.436f,
                                  "An estimate for the length of head is computed from horizontal eye "
                                  "distance multiplied by LengthOfHeadFactor"),
                           factor("TopOfHeadFactor", 1.669f,
                                  "An estimate for the top of head is computed from horizontal eye distance "
                                  "multiplied by TopOfHeadFactor. Top of head is from center (middle point "
                                  "of eyes) to crown."),
                           factor("BottomOfHeadFactor", 1.766f,
                                  "An estimate for the bottom of head is computed from horizontal eye "
                                  "distance multiplied by BottomOfHead. Bottom of head is from center "
                                  "(middle point of eyes) to chin.")),
                "", false);
}

FaceGeometry::FaceGeometry(const Component& component)
    : widthOfHead_(Value<Float>::get(component.subComponent("WidthOfHeadFactor"))),
      topOfHead_(Value<Float>::get(component.subComponent("TopOfHeadFactor"))),
      bottomOfHead_(Value<Float>::get(component.subComponent("BottomOfHeadFactor"))) {}

FaceGeometry::Points FaceGeometry::completed(const Points& points) const {
    constexpr FNPos Points::*outline[] = {&Points::chin, &Points::crown, &Points::leftEar, &Points::rightEar};
    const auto unset = [&](FNPos Points::*place) { return points.*place == FNPos(); };
    Points result = points;
    if (std::ranges::none_of(outline, unset)) return result;
    const Points estimate = fromEyes(points.leftEye, points.rightEye);
    for (const auto place : outline)
        if (unset(place)) result.*place = estimate.*place;
    return result;
}

FaceGeometry::Points FaceGeometry::fromEyes(FNPos left, FNPos right) const {
    const FNPos eyeLine = right - left;
    if (std::fabs(eyeLine.x) <= std::numeric_limits<float>::epsilon())
        FN_THROW(FNEBadArg, "Invalid eye locations set. Both x values are the same.");
    const float distance = length(eyeLine), slope = eyeLine.y / eyeLine.x;
    /// Both components count as positive, whichever way the head leans.
    const auto along = [squaredSlope = slope * slope](float reach) -> FNPos {
        if (!(squaredSlope > 10 * std::numeric_limits<float>::epsilon())) return {reach, 0};
        return {std::sqrt(reach * reach / (1 + squaredSlope)),
                std::sqrt(reach * reach / (1 + 1 / squaredSlope))};
    };
    const FNPos middle = (left + right) / 2.0f, ear = along(0.5f * distance * widthOfHead_),
                up = along(distance * topOfHead_), down = along(distance * bottomOfHead_);
    return {left,         right,       middle + FNPos(down.y, down.x), middle - FNPos(up.y, up.x),
            middle - ear, middle + ear};
}

} // namespace Kx
