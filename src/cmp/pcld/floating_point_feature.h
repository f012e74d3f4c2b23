#pragma once

#include "fn/vector.h"

#include <span>
#include <vector>

namespace Cmp::Pcld {

/// Feature vectors of a data base of other people, each of length 1: what a feature scores against them tells
/// how high its scores are in general.
using IsotropisationData = std::vector<FNVector<float>>;

struct FloatingPointFeature {
    FloatingPointFeature() = default;
    FloatingPointFeature(const FNVector<float>& vector_, float mean_, float deviation_, float norm_)
        : vector(vector_), mean(mean_), deviation(deviation_), norm(norm_) {}
    /// Scales the vector to length 1 unless it has that already.
    /// @param data of at least two vectors, or null
    /// @throws FNEBadArg for a vector of length 0, or data of another size
    FloatingPointFeature(const FNVector<float>& vector, const IsotropisationData* data, bool alreadyUnit);

    FNVector<float> vector;
    float mean = 0; ///< of the scores against the data base, and their deviation
    float deviation = 1;
    float norm = 1; ///< length of the vector
};

/// Cosine of two features, normalised by the means and deviations of both; the largest float for one above
/// 0.99.
float score(const FloatingPointFeature& probe, const FloatingPointFeature& gallery);

/// For each probe the greatest score of one of its features with one of the first `count` of a gallery
/// record's, the lowest float without any.
void score(const std::vector<std::vector<FloatingPointFeature>>& probes,
           const std::vector<FloatingPointFeature>& gallery, std::size_t count, std::span<float> results);

} // namespace Cmp::Pcld
