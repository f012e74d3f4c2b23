#include "kx/set_enroller.h"

#include "kx/enroller_settings.h"

namespace Kx {

using namespace Fn::Deployment;

SetEnroller::SetEnroller(const FaceFinder& faceFinder, const EyesFinder& eyesFinder,
                         const Cmp::Strategy& strategy, const Component& component)
    : eyes_(faceFinder, eyesFinder, component, true), strategy_(strategy),
      minNumOfSamples_(Implementation::minNumOfSamples(component)) {}

Type SetEnroller::define() {
    return Type(typeId(), "Enroller for image streams",
                properties(Implementation::EyeSearch::range(), Implementation::minNumOfSamplesOfSearch()), "",
                false);
}

template <class Samples>
void SetEnroller::enrolAll(const Samples& samples, const SamplesToDrop& samplesToDrop,
                           const FirsToMerge& firsToMerge) const {
    Implementation::Enroller enroller(strategy_, minNumOfSamples_, samplesToDrop, firsToMerge);
    forward<EnrolmentInterest::NotEnoughGoodImages, EnrolmentInterest::DoneProcessing>(enroller, *this);
    Implementation::walk(*this, eyes_, samples, [&](const SensorSample& sample, int index) {
        enroller.pushSample(index, sample);
        return false; // all of them
    });
    enroller.processSamples();
}

void SetEnroller::enrol(const std::list<SensorSample>& samples, const SamplesToDrop& samplesToDrop,
                        const FirsToMerge& firsToMerge) const {
    enrolAll(samples, samplesToDrop, firsToMerge);
}

void SetEnroller::enrol(const FNImageSet& images, const SamplesToDrop& samplesToDrop,
                        const FirsToMerge& firsToMerge) const {
    enrolAll(images, samplesToDrop, firsToMerge);
}

} // namespace Kx
