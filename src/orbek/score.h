#pragma once

#include "orbek/configuration.h"

namespace Orbek {

/// What a comparison algorithm gives for two records, in its own scale.
class RawScore {
public:
    explicit RawScore(float value) : value_(value) {}
    operator float() const { return value_; }

private:
    float value_;
};

/// How sure it is that two records are of one person, from 0 to 1. Holds any number as it is; where a score
/// is a threshold, what is beyond 0 and 1 counts as 0 and 1, and what is no number is refused.
class Score {
public:
    Score(float value) : value_(value) {}
    explicit Score(const RawScore& raw) : value_(raw) {}
    operator float() const { return value_; }

private:
    float value_;
};

/// From scores to the errors that a threshold makes, and back.
///
/// The false acceptance rate (FAR) is the share of comparisons of different people whose score is at or above
/// a threshold; the false rejection rate (FRR) is the share of comparisons of one person whose score is
/// below. Scores end at 1, and whatever is more alike than that has this score, too: the threshold of a FAR
/// of 0 is 1, and does not keep everybody out.
///
///     const Orbek::Score threshold = Orbek::ScoreMappings(configuration).requestFAR(0.001f);
class [[gnu::visibility("default")]] ScoreMappings {
public:
    explicit ScoreMappings(const Configuration& configuration);
    ScoreMappings(const ScoreMappings&);
    ScoreMappings& operator=(const ScoreMappings&);
    ~ScoreMappings();

    /// The threshold that has a rate. Rates beyond 0 and 1 count as 0 and 1.
    /// @throws std::exception for what is no number; so do the next ones
    Score requestFAR(float rate) const;
    Score requestFRR(float rate) const;
    /// The rate of a threshold.
    float expectedFAR(const Score& threshold) const;
    float expectedFRR(const Score& threshold) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

/// From raw scores to scores, and back.
class [[gnu::visibility("default")]] InternalScoreMappings {
public:
    /// @throws std::exception if the comparison's model files cannot be read
    explicit InternalScoreMappings(const Configuration& configuration);
    InternalScoreMappings(const InternalScoreMappings&);
    InternalScoreMappings& operator=(const InternalScoreMappings&);
    ~InternalScoreMappings();

    /// @throws std::exception for what is no number; so does the other
    Score convert(float raw) const;
    RawScore convert(const Score& score) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek
