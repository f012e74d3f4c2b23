#pragma once

#include "cmp/b7/encoder.h"

#include <span>

namespace Cmp::B7 {

/// What features of a probe are compared with. Scores are those of the best pair of features, -FLT_MAX if
/// there is none.
using FixedPointFeatures = std::vector<FixedPointFeature>;

/// The score of two records.
float score(const FixedPointFeatures& probe, const FixedPointFeatures& gallery, const Encoder& encoder);

/// The scores of one record for several probes.
void score(const std::vector<FixedPointFeatures>& probes, std::span<const FixedPointFeature> gallery,
           std::span<float> scores, const Encoder& encoder);

/// The scores of two records for several probes. The features of both records go in pairs, so that some
/// products are rounded group by group, and means and deviations of features do not count.
/// @param probeWords of all probes, one after another @param counts of the features of each probe
/// @param galleryWords of the first record's n1 features, and then of the second's n2
void score(std::span<const short* const> probeWords, std::span<const std::size_t> counts,
           std::span<const short* const> galleryWords, std::size_t n1, std::size_t n2,
           std::span<float> scores1, std::span<float> scores2, const Encoder& encoder);

} // namespace Cmp::B7
