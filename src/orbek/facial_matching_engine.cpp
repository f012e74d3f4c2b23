#include "orbek/facial_matching_engine.h"

#include "orbek/implementation/comparison.h"

namespace Orbek {

class FacialMatchingEngine::Implementation : public Comparison {
public:
    using Comparison::Comparison;
};

FacialMatchingEngine::FacialMatchingEngine(const Configuration& configuration)
    : implementation_(new Implementation(configuration)) {}
FacialMatchingEngine::FacialMatchingEngine(const FacialMatchingEngine&) = default;
FacialMatchingEngine& FacialMatchingEngine::operator=(const FacialMatchingEngine&) = default;
FacialMatchingEngine::~FacialMatchingEngine() = default;

Score FacialMatchingEngine::compare(const FIR& first, const FIR& second) const {
    const Cmp::Strategy strategy = implementation_->strategy();
    const float raw =
        strategy.algorithm()->one2one(FIR::Implementation::of(first), FIR::Implementation::of(second));
    return strategy.scoreMapping()->convert(raw).value();
}

CountedPtr<std::list<Score>> FacialMatchingEngine::compare(const FIR& fir,
                                                           const Population& population) const {
    const CountedPtr<std::list<Score>> result(new std::list<Score>);
    const std::list<Cmp::Score> scores = implementation_->strategy().compare(
        FIR::Implementation::of(fir), Population::Implementation::of(population));
    for (const Cmp::Score& score : scores) result->emplace_back(score.value());
    return result;
}

CountedPtr<std::list<Match>> FacialMatchingEngine::bestMatches(const FIR& fir, const Population& population,
                                                               const Score& threshold,
                                                               unsigned int maxMatches) const {
    const CountedPtr<std::list<Match>> result(new std::list<Match>);
    const std::list<Cmp::Strategy::Probe> probes{
        {FIR::Implementation::of(fir), thresholdOf(threshold), maxMatches}};
    const Cmp::Strategy::Results found =
        implementation_->strategy().compare(probes, Population::Implementation::of(population));
    for (const Cmp::Match& match : *found.front()) result->push_back({match.id, match.score.value()});
    return result;
}

} // namespace Orbek
