#include "kx/stream_identifier.h"

#include "fn/deployment/leaf_values.h"
#include "kx/identifier.h"
#include "kx/recognizer.h"

namespace Kx {

using namespace Fn::Deployment;

StreamIdentifier::StreamIdentifier(const FaceFinder& faceFinder, const EyesFinder& eyesFinder,
                                   const Cmp::Strategy& strategy, const Component& component,
                                   const FNCountedPtr<FNRealTime::Clock>& clock)
    : eyes_(faceFinder, eyesFinder, component, false), strategy_(strategy),
      totalTime_(Value<Int>::get(component.subComponent("TotalTime"))),
      lifeImagePeriod_(Value<Int>::get(component.subComponent("LifeImagePeriod"))),
      lifeChecker_(Implementation::configuredLifeChecker(component)), clock_(clock) {}

Type StreamIdentifier::define() {
    return Type(
        typeId(), "Identifier for image streams",
        properties(
            Implementation::EyeSearch::range(),
            propertyWithDefault<Int>::create(
                "TotalTime", 10000,
                "Total identification time in msecs. If time elapsed during identification exceeds this "
                "value, identification is cancelled"),
            Implementation::useLifeCheck("Whether to perform life checks with the identification images"),
            propertyWithDefault<Int>::create("LifeImagePeriod", 200,
                                             "Minimum duration in msecs for life check attempt. This time "
                                             "limitation is useful on fast systems.")),
        "", false);
}

void StreamIdentifier::identify(const Fn::VideoSource& source, const Cmp::Population& population,
                                Cmp::Score threshold, unsigned int maxMatches) const {
    const FNRealTime time(clock_);
    const auto timeUp = [&] { return time.milliseconds() > totalTime_; };
    Implementation::Identifier identifier(strategy_, Fn::View<Cmp::Population>({population}), threshold,
                                          maxMatches);
    Implementation::LifeChecker life(lifeChecker_);

    int index = 0;
    bool found = false, late = false;
    while (!found && !late) {
        SensorSample sample = Implementation::nextSample(source);
        found = Implementation::lookAt(*this, eyes_, sample, index) && identifier.compare(sample);
        late = timeUp();
        ++index;
        if (found && !late) life.addFace(sample.face());
    }

    if (lifeChecker_ && !late) {
        const Implementation::Recognizer recognizer(
            strategy_, population.get(identifier.matches().front().id), threshold);
        do {
            SensorSample sample = Implementation::nextSample(source);
            broadcast(OperationInterest::ProcessingSample{index, sample.image});
            eyes_.find(sample);
            if (Implementation::tellEyes(*this, sample, 0) && recognizer.compare(sample, 0))
                life.addFace(sample.face());
            late = timeUp();
        } while (!life.isAlive() && !late);
    }

    if (late) broadcast(OperationInterest::ProcessingTimeExceeded{});
    broadcast(lifeChecker_ && !life.isAlive() ? Cmp::Matches() : identifier.matches());
}

} // namespace Kx
