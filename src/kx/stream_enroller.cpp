#include "kx/stream_enroller.h"

#include "fn/deployment/leaf_values.h"
#include "kx/enroller_settings.h"
#include "kx/time_flow_controller.h"

namespace Kx {

using namespace Fn::Deployment;

StreamEnroller::StreamEnroller(const FaceFinder& faceFinder, const EyesFinder& eyesFinder,
                               const Cmp::Strategy& strategy, const Component& component,
                               const FNCountedPtr<FNRealTime::Clock>& clock)
    : eyes_(faceFinder, eyesFinder, component, false), strategy_(strategy),
      minNumOfSamples_(Implementation::minNumOfSamples(component)),
      numOfAcquisitions_(Value<Int>::get(component.subComponent("NumOfAcquisitions"))),
      totalEnrollmentTime_(Value<Int>::get(component.subComponent("TotalEnrollmentTime"))),
      minImageTime_(Value<Int>::get(component.subComponent("MinImageTime"))), clock_(clock) {}

Type StreamEnroller::define() {
    return Type(
        typeId(), "Enroller for image streams",
        properties(
            Implementation::EyeSearch::range(), Implementation::minNumOfSamplesOfSearch(),
            propertyWithDefault<Int>::create(
                "NumOfAcquisitions", 8,
                "The number of successful sample acquisitions required for stream enrolment. A sample "
                "acquisition is successful if at least one of the images grabbed simultaneously from the "
                "configured video streams meets the quality requirements for feature extraction."),
            propertyWithDefault<Int>::create(
                "TotalEnrollmentTime", 60000,
                "Total enrolment time of complete stream enrolment process in msecs. If time elapsed during "
                "enrolment exceeds this value, enrolment is cancelled (default: 60000)."),
            propertyWithDefault<Int>::create(
                "MinImageTime", 1000,
                "Minimal time in msecs for taking and processing one enrolment image during the stream "
                "enrolment process. This time shall ensure, that head movements and other user performed "
                "measures to improve enrollment are not made ineffective on fast computers")),
        "", false);
}

void StreamEnroller::enrol(const std::list<Fn::VideoSource>& sources, const Fn::Functor0Ret<bool>& morePasses,
                           const SamplesToDrop& samplesToDrop, const FirsToMerge& firsToMerge) const {
    Implementation::Enroller enroller(strategy_, minNumOfSamples_, samplesToDrop, firsToMerge);
    forward<EnrolmentInterest::NotEnoughGoodImages, EnrolmentInterest::DoneProcessing>(enroller, *this);

    /// @return whether one of the samples was taken
    const auto process = [&](std::list<SensorSample>& acquisition, int index, TimeFlowController& time) {
        bool taken = false;
        for (SensorSample& sample : acquisition) {
            {
                const TimeFlowController::Hold hold(time);
                broadcast(OperationInterest::ProcessingSample{index, sample.image});
            }
            eyes_.find(sample);
            const TimeFlowController::Hold hold(time);
            if (Implementation::tellEyes(*this, sample, index) && enroller.pushSample(index, sample))
                taken = true;
            ++index;
        }
        return taken;
    };

    int index = 0;
    std::int64_t target = 0;
    do {
        TimeFlowController time(totalEnrollmentTime_, minImageTime_, clock_);
        target += static_cast<std::int64_t>(sources.size()) * numOfAcquisitions_;
        while (index < target) {
            if (time.elapsed()) return broadcast(OperationInterest::ProcessingTimeExceeded{});
            std::list<SensorSample> acquisition;
            for (const Fn::VideoSource& source : sources)
                acquisition.push_back(Implementation::nextSample(source));
            if (index > 0) time.waitMinPeriod();
            if (process(acquisition, index, time)) index += static_cast<int>(acquisition.size());
        }
    } while (morePasses());
    enroller.processSamples();
}

} // namespace Kx
