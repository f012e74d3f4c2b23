#pragma once

#include "cmp/strategy.h"
#include "kx/sample_walk.h"

namespace Kx {

/// Tells whom of a population some pictures show: compares each for itself, and stops at the first that has
/// matches. It keeps nothing from one call to the next, and several threads may call at the same time.
///
/// For each picture it sends ProcessingSample, and then EyesFound or EyesNotFound. At last it sends the
/// matches, best first. A picture whose eyes are known is not searched; what its attributes say of eyes does
/// not count here. An exception of a finder or of the algorithm leaves the call, and no event follows.
class SetIdentifier : public Subject<OperationInterest::ProcessingSample, OperationInterest::EyesNotFound,
                                     OperationInterest::EyesFound, Cmp::Matches> {
public:
    SetIdentifier(const Fn::Deployment::Component& component, const FaceFinder& faceFinder,
                  const EyesFinder& eyesFinder, const Cmp::Strategy& strategy);

    /// @param maxMatches to list at most
    void identify(const std::list<SensorSample>& samples, const Cmp::Population& population,
                  Cmp::Score threshold, unsigned int maxMatches) const;
    void identify(const FNImageSet& images, const Cmp::Population& population, Cmp::Score threshold,
                  unsigned int maxMatches) const;

    static std::string typeId() { return "Kx::SetIdentifier"; }
    static Fn::Deployment::Type define();

private:
    template <class Samples>
    void identifyAny(const Samples& samples, const Cmp::Population& population, Cmp::Score threshold,
                     unsigned int maxMatches) const;

    Implementation::EyeSearch eyes_;
    Cmp::Strategy strategy_;
};

/// The same for faces whose eyes are known, which are not looked for.
class AnnotatedSetIdentifier
    : public Subject<OperationInterest::ProcessingSample, OperationInterest::EyesFound, Cmp::Matches> {
public:
    AnnotatedSetIdentifier(const Cmp::Strategy& strategy, const Fn::Deployment::Component&)
        : strategy_(strategy) {}

    /// @throws FNEBadFunCall for a face without both eyes
    void identify(const std::list<Cmp::Face>& faces, const Fn::View<Cmp::Population>& populations,
                  Cmp::Score threshold, unsigned int maxMatches) const;
    template <class Iterator>
    void identify(Iterator first, Iterator last, const Cmp::Population& population, Cmp::Score threshold,
                  unsigned int maxMatches) const {
        const Fn::View<Cmp::Population> view(std::list{population});
        identify(first, last, view.begin(), threshold, maxMatches);
    }
    /// In all populations from a place on.
    template <class Iterator>
    void identify(Iterator first, Iterator last, Fn::View<Cmp::Population>::Iterator populations,
                  Cmp::Score threshold, unsigned int maxMatches) const {
        std::list<Cmp::Population> rest; // each attempt goes through them anew
        for (; !populations.atEnd(); ++populations) rest.push_back(*populations);
        identify(std::list<Cmp::Face>(first, last), Fn::View<Cmp::Population>(rest), threshold, maxMatches);
    }

    static std::string typeId() { return "Kx::AnnotatedSetIdentifier"; }
    static Fn::Deployment::Type define();

private:
    Cmp::Strategy strategy_;
};

} // namespace Kx
