#pragma once

#include "fn/real_time.h"
#include "kx/enroller.h"
#include "kx/sample_walk.h"

namespace Kx {

/// Makes a record of a person in front of one or several cameras. It keeps nothing from one enrolment to the
/// next, and several threads may enrol at the same time, from different sources.
///
/// An acquisition is one image of each source. It counts if one of its images became a sample; one that does
/// not costs nothing but time, and the next one has its indexes again. The time limit holds for one pass,
/// without what observers and the extraction of features take.
///
/// For each image it sends ProcessingSample, and then EyesFound or EyesNotFound. At last it sends one of
/// DoneProcessing, NotEnoughGoodImages and ProcessingTimeExceeded. An exception of a source, a finder or the
/// algorithm leaves the enrolment, and no event follows.
class StreamEnroller
    : public Subject<OperationInterest::ProcessingSample, OperationInterest::EyesNotFound,
                     OperationInterest::EyesFound, EnrolmentInterest::NotEnoughGoodImages,
                     EnrolmentInterest::DoneProcessing, OperationInterest::ProcessingTimeExceeded> {
public:
    StreamEnroller(const FaceFinder& faceFinder, const EyesFinder& eyesFinder, const Cmp::Strategy& strategy,
                   const Fn::Deployment::Component& component,
                   const FNCountedPtr<FNRealTime::Clock>& clock = FNRealTime::Clock::system());

    /// @param morePasses asked at the end of each pass whether there is to be another one
    void enrol(const std::list<Fn::VideoSource>& sources, const Fn::Functor0Ret<bool>& morePasses = {},
               const SamplesToDrop& samplesToDrop = {}, const FirsToMerge& firsToMerge = {}) const;

    static std::string typeId() { return "Kx::StreamEnroller"; }
    static Fn::Deployment::Type define();

private:
    Implementation::EyeSearch eyes_;
    Cmp::Strategy strategy_;
    unsigned int minNumOfSamples_;
    int numOfAcquisitions_;
    int totalEnrollmentTime_; // milliseconds
    int minImageTime_;        // milliseconds
    FNCountedPtr<FNRealTime::Clock> clock_;
};

} // namespace Kx
