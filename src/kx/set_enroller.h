#pragma once

#include "kx/enroller.h"
#include "kx/sample_walk.h"

namespace Kx {

/// Makes a record from pictures of one person. It keeps nothing from one enrolment to the next, and several
/// threads may enrol at the same time.
///
/// For each picture it sends ProcessingSample, and then EyesFound or EyesNotFound; at last DoneProcessing or
/// NotEnoughGoodImages. A picture whose eyes are known is not searched. An exception of a finder or of the
/// algorithm leaves the enrolment, and no event follows.
class SetEnroller : public Subject<OperationInterest::ProcessingSample, OperationInterest::EyesNotFound,
                                   OperationInterest::EyesFound, EnrolmentInterest::NotEnoughGoodImages,
                                   EnrolmentInterest::DoneProcessing> {
public:
    SetEnroller(const FaceFinder& faceFinder, const EyesFinder& eyesFinder, const Cmp::Strategy& strategy,
                const Fn::Deployment::Component& component);

    void enrol(const std::list<SensorSample>& samples, const SamplesToDrop& samplesToDrop = {},
               const FirsToMerge& firsToMerge = {}) const;
    void enrol(const FNImageSet& images, const SamplesToDrop& samplesToDrop = {},
               const FirsToMerge& firsToMerge = {}) const;

    static std::string typeId() { return "Kx::SetEnroller"; }
    static Fn::Deployment::Type define();

private:
    template <class Samples>
    void enrolAll(const Samples& samples, const SamplesToDrop& samplesToDrop,
                  const FirsToMerge& firsToMerge) const;

    Implementation::EyeSearch eyes_;
    Cmp::Strategy strategy_;
    unsigned int minNumOfSamples_;
};

} // namespace Kx
