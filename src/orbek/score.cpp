#include "orbek/score.h"

#include "orbek/implementation/comparison.h"

namespace Orbek {

class ScoreMappings::Implementation : public Comparison {
public:
    using Comparison::Comparison;
};

ScoreMappings::ScoreMappings(const Configuration& configuration)
    : implementation_(new Implementation(configuration)) {}
ScoreMappings::ScoreMappings(const ScoreMappings&) = default;
ScoreMappings& ScoreMappings::operator=(const ScoreMappings&) = default;
ScoreMappings::~ScoreMappings() = default;

Score ScoreMappings::requestFAR(float rate) const {
    demandNumber(rate, "The false acceptance rate");
    return implementation_->strategy().ratesMapping()->requestFAR(rate).value();
}

Score ScoreMappings::requestFRR(float rate) const {
    demandNumber(rate, "The false rejection rate");
    return implementation_->strategy().ratesMapping()->requestFRR(rate).value();
}

float ScoreMappings::expectedFAR(const Score& threshold) const {
    return implementation_->strategy().ratesMapping()->expectedFAR(thresholdOf(threshold));
}

float ScoreMappings::expectedFRR(const Score& threshold) const {
    return implementation_->strategy().ratesMapping()->expectedFRR(thresholdOf(threshold));
}

class InternalScoreMappings::Implementation : public Comparison {
public:
    explicit Implementation(const Configuration& configuration) : Comparison(configuration) { strategy(); }
};

InternalScoreMappings::InternalScoreMappings(const Configuration& configuration)
    : implementation_(new Implementation(configuration)) {}
InternalScoreMappings::InternalScoreMappings(const InternalScoreMappings&) = default;
InternalScoreMappings& InternalScoreMappings::operator=(const InternalScoreMappings&) = default;
InternalScoreMappings::~InternalScoreMappings() = default;

Score InternalScoreMappings::convert(float raw) const {
    return implementation_->strategy().scoreMapping()->convert(demandNumber(raw, "The raw score")).value();
}

RawScore InternalScoreMappings::convert(const Score& score) const {
    return RawScore(
        implementation_->strategy().scoreMapping()->convert(Cmp::Score(demandNumber(score, "The score"))));
}

} // namespace Orbek
