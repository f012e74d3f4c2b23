#include "kx/enroller_settings.h"

#include "fn/deployment/leaf_values.h"

namespace Kx::Implementation {

using namespace Fn::Deployment;

namespace {

constexpr const char* key = "MinNumOfSamples";

} // namespace

Property minNumOfSamples(const std::string& doc) {
    return propertyWithDefault<Int>::create(key, 1, doc);
}

Property minNumOfSamplesOfSearch() {
    return minNumOfSamples("Only images where face and eyes are found can be used for enrolment. This key "
                           "determines the minimum number of those images required for enrollment.");
}

unsigned int minNumOfSamples(const Component& enroller) {
    return static_cast<unsigned int>(Value<Int>::get(enroller.subComponent(key)));
}

} // namespace Kx::Implementation
