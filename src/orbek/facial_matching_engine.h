#pragma once

#include "orbek/population.h"
#include "orbek/score.h"

#include <list>

namespace Orbek {

/// A record of a population, and how well it fits.
struct Match {
    std::string name; ///< its id in the population
    Score score;
};

/// Compares records. Any number of threads may use one engine.
///
///     const Orbek::FacialMatchingEngine engine(configuration);
///     const auto matches = engine.bestMatches(probe, people, 0.5f, 10);
///     for (const Orbek::Match& match : *matches)
///         std::cout << match.name << " " << match.score << "\n";
class [[gnu::visibility("default")]] FacialMatchingEngine {
public:
    explicit FacialMatchingEngine(const Configuration& configuration);
    FacialMatchingEngine(const FacialMatchingEngine&);
    FacialMatchingEngine& operator=(const FacialMatchingEngine&);
    ~FacialMatchingEngine();

    /// @throws std::exception for a record of another algorithm; so do the next two
    Score compare(const FIR& first, const FIR& second) const;
    /// The scores of all records, in the order of the population.
    CountedPtr<std::list<Score>> compare(const FIR& fir, const Population& population) const;
    /// The best records that reach a threshold, the best one first, and of equal ones the one with the
    /// greater id. What is compared is the raw score: it is above that of the threshold. So with a threshold
    /// of 1, at which scores end, those match that are beyond the end. Takes as many threads as the
    /// configuration says.
    /// @throws std::exception for a threshold that is no number
    CountedPtr<std::list<Match>> bestMatches(const FIR& fir, const Population& population,
                                             const Score& threshold, unsigned int maxMatches) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek
