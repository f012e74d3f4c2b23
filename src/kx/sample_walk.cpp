#include "kx/sample_walk.h"

namespace Kx::Implementation {

namespace {

constexpr const char* rangeKey = "EyeDistanceRange";

} // namespace

EyeSearch::EyeSearch(const FaceFinder& faceFinder, const EyesFinder& eyesFinder,
                     const Fn::Deployment::Component& operation, bool useAttributes)
    : finder_(faceFinder, eyesFinder, useAttributes) {
    const Eye::DistanceRange range(operation.subComponent(rangeKey));
    minEyeDistance_ = range.getMinDistance();
    maxEyeDistance_ = range.getMaxDistance();
}

Fn::Deployment::Property EyeSearch::range() {
    return Fn::Deployment::property<Eye::DistanceRange>::create(rangeKey, "Range for face finding");
}

void EyeSearch::find(SensorSample& sample) const {
    FacialFeatureLocation left, right;
    if (finder_.find(sample.image, left, right, minEyeDistance_, maxEyeDistance_) != EyeFinder::BothEyes)
        return;
    sample.leftEye = left;
    sample.rightEye = right;
}

SensorSample nextSample(const Fn::VideoSource& source) {
    FNImageReference image = cachingIntensity(source.get());
    Fn::addImageSrcNameAttribute(image.attributes(), source.name());
    return SensorSample(image);
}

} // namespace Kx::Implementation
