#pragma once

#include "cmp/gallery_iterator.h"
#include "cmp/matches.h"
#include "cmp/population.h"
#include "cmp/record_builder.h"
#include "fn/view.h"

namespace Cmp::Implementation {

/// How one generation makes records and compares them. May be used by any number of threads.
class ComparisonAlgorithm {
public:
    virtual ~ComparisonAlgorithm() = default;

    /// The version label of its records.
    virtual std::string name() const = 0;
    virtual Sample::Requirements sampleRequirements() const = 0;
    virtual RecordBuilder createRecordBuilder() const = 0;
    /// One record from earlier ones and a new one.
    virtual FIR merge(const std::list<FIR>& earlier, const FIR& added) const = 0;
    /// The raw score of two records. @throws std::bad_cast for a record of another algorithm
    virtual float one2one(const FIR& first, const FIR& second) const = 0;
    /// @param capacity number of records to make room for
    virtual Population createPopulation(unsigned int capacity) const = 0;
    /// Iterators that walk the records of all populations once, together.
    /// @param partitions at most so many iterators; there is at least one
    /// @throws FNEBadArg for 0 partitions; std::bad_cast for a record or population of another algorithm
    virtual std::list<GalleryIterator> prepareFew2Many(const std::vector<FIR>& probes,
                                                       const Fn::View<Population>::Iterator& populations,
                                                       unsigned int partitions) const = 0;
    /// The matches of a search with scores that its distribution of scores has been taken out of; this one
    /// leaves them as they are.
    virtual RawMatches normalizeRawScores(const RawMatches& matches,
                                          const ScoreHistogram& distribution) const {
        (void)distribution;
        return matches;
    }
};

} // namespace Cmp::Implementation
