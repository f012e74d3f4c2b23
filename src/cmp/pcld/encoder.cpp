#include "cmp/pcld/encoder.h"

#include <cstring>

namespace Cmp::Pcld {

void FloatEncoder::encode(const FloatingPointFeature& feature, unsigned char* encoded) const {
    if (feature.vector.size() != components_)
        FN_THROW(FNEBadArg, "PCLD: feature of " + std::to_string(feature.vector.size()) +
                                " components instead of " + std::to_string(components_));
    const float header[] = {feature.mean, feature.deviation, feature.norm};
    std::memcpy(encoded, header, sizeof header);
    std::memcpy(encoded + sizeof header, feature.vector.get(), components_ * sizeof(float));
}

void FloatEncoder::decode(const unsigned char* encoded, FloatingPointFeature& feature) const {
    float header[3];
    std::memcpy(header, encoded, sizeof header);
    feature.mean = header[0];
    feature.deviation = header[1];
    feature.norm = header[2];
    std::memcpy(feature.vector.getExclusive(), encoded + sizeof header, components_ * sizeof(float));
}

} // namespace Cmp::Pcld
