#pragma once

#include "fn/real_time.h"
#include "kx/life_checker.h"
#include "kx/recognizer.h"
#include "kx/sample_walk.h"

namespace Kx {

/// Tells whether the person in front of one or several cameras is that of a record: compares each image for
/// itself, and stops at the first that is accepted, after a number of images, or when time is over, which is
/// asked after each image. With the life check a face must be accepted at least twice, and have moved in
/// depth. It keeps nothing from one call to the next, and several threads may call at the same time.
///
/// For each image it sends ProcessingSample, and then EyesNotFound, or EyesFound and the events of the
/// attempt: ExtractedFIR, AchievedScore, AttemptResult. Result is the last event, ProcessingTimeExceeded the
/// one before if time is over. An exception of a finder or of the algorithm leaves the call, and no event
/// follows; a source that fails or ends ends the images.
class StreamRecognizer
    : public Subject<OperationInterest::ProcessingSample, OperationInterest::EyesNotFound,
                     OperationInterest::EyesFound, RecognitionInterest::ExtractedFIR,
                     RecognitionInterest::AchievedScore, RecognitionInterest::AttemptResult,
                     RecognitionInterest::Result, OperationInterest::ProcessingTimeExceeded> {
public:
    StreamRecognizer(const FaceFinder& faceFinder, const EyesFinder& eyesFinder,
                     const Cmp::Strategy& strategy, const Fn::Deployment::Component& component,
                     const FNCountedPtr<FNRealTime::Clock>& clock = FNRealTime::Clock::system());

    /// @throws FNEBadArg if there is no source
    void recognize(const std::list<Fn::VideoSource>& sources, const Cmp::FIR& reference,
                   Cmp::Score threshold) const;
    void recognize(const Fn::VideoSource& source, const Cmp::FIR& reference, Cmp::Score threshold) const;
    /// The reference is made of faces, whose eyes are looked for; no events tell of that.
    /// @throws FNEGeneric if none of them becomes a part of it
    void recognize(const std::list<Fn::VideoSource>& sources, const std::list<Cmp::Face>& faces,
                   Cmp::Score threshold) const;

    static std::string typeId() { return "Kx::StreamRecognizer"; }
    static Fn::Deployment::Type define();

private:
    Implementation::EyeSearch eyes_;
    Cmp::Strategy strategy_;
    int maxNumOfImages_;
    unsigned int imagePeriod_;                   // milliseconds
    unsigned int totalTime_;                     // milliseconds
    FNCountedPtr<Cmp::LifeChecker> lifeChecker_; ///< null without life check
    FNCountedPtr<FNRealTime::Clock> clock_;
};

} // namespace Kx
