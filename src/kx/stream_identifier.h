#pragma once

#include "cmp/strategy.h"
#include "fn/real_time.h"
#include "kx/life_checker.h"
#include "kx/sample_walk.h"

namespace Kx {

/// Tells whom of a population a camera sees: compares each image for itself, and stops at the first that has
/// matches, or when time is over, which is asked after each image. With the life check further images of the
/// first match must be accepted, and have moved in depth; without that there are no matches. The camera's own
/// speed sets the pace. It keeps nothing from one call to the next, and several threads may call at the same
/// time.
///
/// For each image it sends ProcessingSample, and then EyesFound or EyesNotFound. The matches, best first, are
/// the last event, ProcessingTimeExceeded the one before if time is over. An exception of the source, a
/// finder or the algorithm leaves the call, and no event follows.
class StreamIdentifier
    : public Subject<OperationInterest::ProcessingSample, OperationInterest::EyesNotFound,
                     OperationInterest::EyesFound, Cmp::Matches, OperationInterest::ProcessingTimeExceeded> {
public:
    StreamIdentifier(const FaceFinder& faceFinder, const EyesFinder& eyesFinder,
                     const Cmp::Strategy& strategy, const Fn::Deployment::Component& component,
                     const FNCountedPtr<FNRealTime::Clock>& clock = FNRealTime::Clock::system());

    /// @param maxMatches to list at most
    void identify(const Fn::VideoSource& source, const Cmp::Population& population, Cmp::Score threshold,
                  unsigned int maxMatches) const;

    /// The least time that an attempt of the life check is meant to take, milliseconds, as it is configured.
    /// Nothing waits for it: the source sets the pace of the life check, too.
    int lifeImagePeriod() const { return lifeImagePeriod_; }

    static std::string typeId() { return "Kx::StreamIdentifier"; }
    static Fn::Deployment::Type define();

private:
    Implementation::EyeSearch eyes_;
    Cmp::Strategy strategy_;
    int totalTime_;                              // milliseconds
    int lifeImagePeriod_;                        // milliseconds
    FNCountedPtr<Cmp::LifeChecker> lifeChecker_; ///< null without life check
    FNCountedPtr<FNRealTime::Clock> clock_;
};

} // namespace Kx
