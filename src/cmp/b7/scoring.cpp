#include "cmp/b7/scoring.h"

#include <limits>

namespace Cmp::B7 {

namespace {

constexpr float noScore = std::numeric_limits<float>::lowest();

} // namespace

float score(const FixedPointFeatures& probe, const FixedPointFeatures& gallery, const Encoder& encoder) {
    float result;
    score({probe}, gallery, {&result, 1}, encoder);
    return result;
}

void score(const std::vector<FixedPointFeatures>& probes, std::span<const FixedPointFeature> gallery,
           std::span<float> scores, const Encoder& encoder) {
    std::ranges::fill(scores, noScore);
    for (const FixedPointFeature& g : gallery)
        for (std::size_t p = 0; p < probes.size(); ++p)
            for (const FixedPointFeature& f : probes[p]) {
                const float s = (encoder.wordDotProduct(f.vector.get(), g.vector.get()) - f.mean) / f.stdDev;
                if (s > scores[p]) scores[p] = s;
            }
}

void score(std::span<const short* const> probeWords, std::span<const std::size_t> counts,
           std::span<const short* const> galleryWords, std::size_t n1, std::size_t n2,
           std::span<float> scores1, std::span<float> scores2, const Encoder& encoder) {
    std::ranges::fill(scores1, noScore);
    std::ranges::fill(scores2, noScore);
    std::vector<std::size_t> owner; // probe of each feature
    for (std::size_t p = 0; p < counts.size(); ++p) owner.insert(owner.end(), counts[p], p);
    const auto offer = [&](std::size_t g, std::size_t f, float s) {
        float& best = (g < n1 ? scores1 : scores2)[owner[f]];
        if (s > best) best = s;
    };
    const std::size_t items = n1 + n2, features = probeWords.size();
    std::size_t g = 0;
    for (; g + 2 <= items; g += 2) {
        std::size_t f = 0;
        float out[4];
        for (; f + 2 <= features; f += 2) {
            encoder.wordDotProduct(probeWords[f], probeWords[f + 1], galleryWords[g], galleryWords[g + 1],
                                   out);
            for (std::size_t i = 0; i < 4; ++i) offer(g + i % 2, f + i / 2, out[i]);
        }
        if (f < features) {
            encoder.wordDotProduct(probeWords[f], galleryWords[g], galleryWords[g + 1], out);
            for (std::size_t i = 0; i < 2; ++i) offer(g + i, f, out[i]);
        }
    }
    if (g < items)
        for (std::size_t f = 0; f < features; ++f)
            offer(g, f, encoder.wordDotProduct(probeWords[f], galleryWords[g]));
}

} // namespace Cmp::B7
