#pragma once

#include <algorithm>
#include <vector>

namespace Cmp::Implementation {

/// Divides the features of one person among at most `most` clusters, whose centres make the record: a
/// generation brings the class of its clusters.
///
///     struct Cluster {
///         Cluster(const Feature& centre, const Argument&...);
///         float similarity(const Feature& feature) const;   // to the centre
///         void add(const Feature& feature);                 // to the sum
///         bool settle();  // moves the centre to the sum and forgets the sum; false if it moved
///     };
///
/// The first features are the first centres. In each pass every feature goes to the most similar centre, the
/// first of equals; then clusters settle in their order up to the first one whose centre moves, and those
/// behind it keep their sums for the next pass. It ends when no centre moves, or after 1000 passes.
///
/// @param arguments for each cluster
/// @return min(most, number of features) clusters
template <class Cluster, class Feature, class... Argument>
std::vector<Cluster> cluster(const std::vector<Feature>& features, std::size_t most,
                             const Argument&... arguments) {
    constexpr int mostPasses = 1000;
    std::vector<Cluster> clusters;
    for (std::size_t i = 0; i < std::min(most, features.size()); ++i)
        clusters.emplace_back(features[i], arguments...);
    if (clusters.empty()) return clusters;
    for (int pass = 0; pass < mostPasses; ++pass) {
        for (const Feature& feature : features) {
            Cluster* nearest = &clusters.front();
            float greatest = nearest->similarity(feature);
            for (std::size_t c = 1; c < clusters.size(); ++c) {
                const float similarity = clusters[c].similarity(feature);
                if (similarity > greatest) {
                    greatest = similarity;
                    nearest = &clusters[c];
                }
            }
            nearest->add(feature);
        }
        if (std::ranges::all_of(clusters, [](Cluster& c) { return c.settle(); })) break;
    }
    return clusters;
}

} // namespace Cmp::Implementation
