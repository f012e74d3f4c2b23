#include "cmp/pcld/floating_point_feature.h"

#include <cmath>
#include <limits>

namespace Cmp::Pcld {

FloatingPointFeature::FloatingPointFeature(const FNVector<float>& vector_, const IsotropisationData* data,
                                           bool alreadyUnit)
    : vector(vector_) {
    if (!alreadyUnit) vector /= std::sqrt(vector * vector);
    if (!data) return;
    FNVector<float> products(data->size());
    float* out = products.getExclusive();
    for (const FNVector<float>& other : *data) *out++ = vector * other;
    double exactMean = 0;
    deviation = static_cast<float>(products.stdDeviation(exactMean));
    mean = static_cast<float>(exactMean);
}

float score(const FloatingPointFeature& probe, const FloatingPointFeature& gallery) {
    constexpr float same = 0.99f;
    const float cosine = probe.vector * gallery.vector / (probe.norm * gallery.norm);
    if (cosine > same) return std::numeric_limits<float>::max();
    const float halfDifference = (probe.mean - gallery.mean) / 2;
    const float variance = (probe.deviation * probe.deviation + gallery.deviation * gallery.deviation) / 2 +
                           halfDifference * halfDifference;
    return (cosine - (probe.mean + gallery.mean) / 2) / std::sqrt(variance);
}

void score(const std::vector<std::vector<FloatingPointFeature>>& probes,
           const std::vector<FloatingPointFeature>& gallery, std::size_t count, std::span<float> results) {
    std::ranges::fill(results, std::numeric_limits<float>::lowest());
    for (std::size_t g = 0; g < count; ++g)
        for (std::size_t p = 0; p < probes.size(); ++p)
            for (const FloatingPointFeature& feature : probes[p]) {
                const float s = score(feature, gallery[g]);
                if (s > results[p]) results[p] = s;
            }
}

} // namespace Cmp::Pcld
