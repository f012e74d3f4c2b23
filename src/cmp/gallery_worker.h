#pragma once

#include "cmp/gallery_iterator.h"

namespace Cmp::Implementation {

/// What a search asks for one probe.
struct MatchLimits {
    float threshold = 0;   ///< raw scores above it are matches
    unsigned int most = 0; ///< number of matches to keep, the best ones
};

/// What one walk over a gallery found, by probe.
struct GalleryResults {
    explicit GalleryResults(std::size_t probes) : matches(probes), distributions(probes) {}

    std::vector<RawMatches> matches;
    std::vector<ScoreHistogram> distributions;
};

/// Walks a gallery to its end.
void searchGallery(const GalleryIterator& gallery, const std::vector<MatchLimits>& limits,
                   GalleryResults& results);

/// The results of walks over the parts of a gallery, as one walk over the whole would give them.
GalleryResults mergeResults(const std::vector<GalleryResults>& parts, const std::vector<MatchLimits>& limits);

} // namespace Cmp::Implementation
