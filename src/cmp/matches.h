#pragma once

#include "cmp/score.h"
#include "fn/vector.h"

#include <compare>

namespace Cmp {

/// One record of a search and how well it fits, in an algorithm's own scale.
struct RawMatch {
    float score = 0;
    std::string id;

    RawMatch() = default;
    RawMatch(float score_, const std::string& id_) : score(score_), id(id_) {}
    explicit RawMatch(const Fn::Package& package);
    /// A list of both.
    explicit operator Fn::Package() const;

    /// By score, then by the bytes of the id.
    auto operator<=>(const RawMatch&) const = default;
};

/// The same with a score.
struct Match {
    std::string id;
    Score score;

    Match() = default;
    Match(const std::string& id_, Score score_) : id(id_), score(score_) {}
    explicit Match(const Fn::Package& package);
    /// A list of the id and the number.
    explicit operator Fn::Package() const;
    bool operator==(const Match&) const = default;
};

using RawMatches = Fn::SerializableMultiset<RawMatch>;
using Matches = Fn::SerializableList<Match>;
/// Counts of raw scores by bins; empty where an algorithm counts none.
using ScoreHistogram = VectorImplementations::IPP::Vector<unsigned int>;

/// What a search found, for each probe in order.
struct MultipleProbesRawMatchingResults {
    FNCountedPtr<std::list<RawMatches>> matches;
    /// Of all scores, also of those that are no matches. May be empty.
    FNCountedPtr<std::list<ScoreHistogram>> distributions;
};

} // namespace Cmp
