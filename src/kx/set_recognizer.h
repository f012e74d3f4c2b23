#pragma once

#include "kx/recognizer.h"
#include "kx/sample_walk.h"

namespace Kx {

/// Tells whether one of some pictures shows the person of a record: compares each for itself, and stops at
/// the first that is accepted. It keeps nothing from one call to the next, and several threads may call at
/// the same time.
///
/// For each picture it sends ProcessingSample, and then EyesNotFound, or EyesFound and the events of the
/// attempt: ExtractedFIR, AchievedScore, AttemptResult. At last it sends Result. A picture whose eyes are
/// known is not searched. An exception of a finder or of the algorithm leaves the call, and no event follows.
class SetRecognizer : public Subject<OperationInterest::ProcessingSample, OperationInterest::EyesNotFound,
                                     OperationInterest::EyesFound, RecognitionInterest::ExtractedFIR,
                                     RecognitionInterest::AchievedScore, RecognitionInterest::AttemptResult,
                                     RecognitionInterest::Result> {
public:
    SetRecognizer(const Fn::Deployment::Component& component, const FaceFinder& faceFinder,
                  const EyesFinder& eyesFinder, const Cmp::Strategy& strategy);

    void recognize(const std::list<SensorSample>& samples, const Cmp::FIR& reference,
                   Cmp::Score threshold) const;
    void recognize(const FNImageSet& images, const Cmp::FIR& reference, Cmp::Score threshold) const;

    static std::string typeId() { return "Kx::SetRecognizer"; }
    static Fn::Deployment::Type define();

private:
    template <class Samples>
    void recognizeAny(const Samples& samples, const Cmp::FIR& reference, Cmp::Score threshold) const;

    Implementation::EyeSearch eyes_;
    Cmp::Strategy strategy_;
};

/// The same for faces whose eyes are known, which are not looked for.
class AnnotatedSetRecognizer
    : public Subject<OperationInterest::ProcessingSample, OperationInterest::EyesFound,
                     RecognitionInterest::ExtractedFIR, RecognitionInterest::AchievedScore,
                     RecognitionInterest::AttemptResult, RecognitionInterest::Result> {
public:
    AnnotatedSetRecognizer(const Cmp::Strategy& strategy, const Fn::Deployment::Component&)
        : strategy_(strategy) {}

    /// @throws FNEBadFunCall for a face without both eyes
    void recognize(const std::list<Cmp::Face>& faces, const Cmp::FIR& reference, Cmp::Score threshold) const;
    template <class Iterator>
    void recognize(Iterator first, Iterator last, const Cmp::FIR& reference, Cmp::Score threshold) const {
        recognize(std::list<Cmp::Face>(first, last), reference, threshold);
    }

    static std::string typeId() { return "Kx::AnnotatedSetRecognizer"; }
    static Fn::Deployment::Type define();

private:
    Cmp::Strategy strategy_;
};

} // namespace Kx
