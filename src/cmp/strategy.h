#pragma once

#include "cmp/comparison_algorithm.h"
#include "cmp/score_mapping.h"

namespace Cmp {

/// A comparison algorithm with its mappings and a number of threads: what compares records. A plain value;
/// may be used by any number of threads.
///
///     const auto results = strategy.compare({{probe, Cmp::Score(0.6f), 10}}, people);
///     for (const Cmp::Match& match : *results.front())
///         std::cout << match.id << "\n";
class Strategy {
public:
    using Algorithm = Implementation::ComparisonAlgorithm;
    using Populations = Fn::View<Population>::Iterator;
    /// A record, the raw threshold that its matches are above, and the largest number of matches.
    using RawProbe = FNTriple<FIR, float, unsigned int>;
    /// The same with a threshold as a score.
    using Probe = FNTriple<FIR, Score, unsigned int>;
    /// For each probe its matches, best first; of equal ones the greater id first.
    using Results = std::list<FNCountedPtr<Matches>>;

    Strategy(const FNCountedPtr<Algorithm>& algorithm,
             const FNCountedPtr<Implementation::ScoreMapping>& scoreMapping,
             const FNCountedPtr<Implementation::RatesMapping>& ratesMapping, unsigned int numberOfThreads)
        : algorithm_(algorithm), scoreMapping_(scoreMapping), ratesMapping_(ratesMapping),
          numberOfThreads_(numberOfThreads) {}

    const FNCountedPtr<Algorithm>& algorithm() const { return algorithm_; }
    const FNCountedPtr<Implementation::ScoreMapping>& scoreMapping() const { return scoreMapping_; }
    const FNCountedPtr<Implementation::RatesMapping>& ratesMapping() const { return ratesMapping_; }
    unsigned int numberOfThreads() const { return numberOfThreads_; }

    /// Compares probes with all records of populations, on threads of its own if there are to be several. Of
    /// an algorithm that compares several records at once, their number may change the last digits of scores,
    /// since it changes which records those are; it makes no other difference.
    /// @throws what ComparisonAlgorithm::prepareFew2Many() throws; FNEGeneric if a thread fails
    MultipleProbesRawMatchingResults compareRaw(const std::list<RawProbe>& probes,
                                                const Populations& populations) const;
    MultipleProbesRawMatchingResults compareRaw(const std::list<RawProbe>& probes,
                                                const Population& population) const;
    Results compare(const std::list<Probe>& probes, const Populations& populations) const;
    Results compare(const std::list<Probe>& probes, const Population& population) const;

    /// The score of each record of a population, in its order, on the calling thread.
    std::list<Score> compare(const FIR& probe, const Population& population) const;

    /// @throws FNEGeneric for results whose two lists do not fit each other
    Results convert(const MultipleProbesRawMatchingResults& results) const;

private:
    FNCountedPtr<Algorithm> algorithm_;
    FNCountedPtr<Implementation::ScoreMapping> scoreMapping_;
    FNCountedPtr<Implementation::RatesMapping> ratesMapping_;
    unsigned int numberOfThreads_;
};

} // namespace Cmp
