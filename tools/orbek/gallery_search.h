#pragma once

#include "gallery_file.h"
#include "orbek/facial_matching_engine.h"

#include <list>

namespace Orbek::Tool {

/// Searches galleries on disk, a part at a time: all that is in memory at once is some thousand records,
/// unless the configuration normalizes scores over all.
class GallerySearch {
public:
    /// @param jobs threads of a search
    GallerySearch(const Configuration& configuration, unsigned int jobs);

    /// What FacialMatchingEngine::bestMatches() gives for a population of all records.
    /// @throws what GalleryFile::read() throws
    std::list<Match> bestMatches(const FIR& record, const GalleryFile& gallery, const Score& threshold,
                                 unsigned int maxMatches) const;

private:
    Configuration configuration_;
    unsigned int jobs_;
    bool normalized_; ///< scores depend on all records of the population
    FacialMatchingEngine engine_;
};

} // namespace Orbek::Tool
