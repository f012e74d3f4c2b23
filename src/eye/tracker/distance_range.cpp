#include "eye/tracker/distance_range.h"

#include "fn/deployment/leaf_values.h"

namespace Eye {

using namespace Fn::Deployment;

Type DistanceRange::define() {
    return Type(typeId(), "Eye distance limitation range for face finder.",
                properties(propertyWithDefault<Float>::create(
                               "MinEyeDistance", 0.1f,
                               "Lower eye distance limit (relative to image width, range [0.0 - 1.0]) of "
                               "faces to be found by the face finder. Decrease to find smaller faces. "
                               "Increase to speed up face finding."),
                           propertyWithDefault<Float>::create(
                               "MaxEyeDistance", 0.4f,
                               "Upper eye distance limit (relative to image width, range [0.0 - 1.0]) of "
                               "faces to be found by the face finder. Increasing will not lead to a "
                               "significantly higher computational effort.")),
                "", false);
}

float DistanceRange::get(const char* key) const {
    return Value<Float>::get(component_.subComponent(key));
}

void DistanceRange::set(const char* key, float distance) {
    Value<Float>::set(component_.subComponent(key), distance);
}

} // namespace Eye
