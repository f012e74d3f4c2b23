#include "kx/stream_recognizer.h"

#include "fn/deployment/leaf_values.h"
#include "fn/image_sequence.h"

#include <limits>

namespace Kx {

using namespace Fn::Deployment;
using namespace RecognitionInterest;

StreamRecognizer::StreamRecognizer(const FaceFinder& faceFinder, const EyesFinder& eyesFinder,
                                   const Cmp::Strategy& strategy, const Component& component,
                                   const FNCountedPtr<FNRealTime::Clock>& clock)
    : eyes_(faceFinder, eyesFinder, component, false), strategy_(strategy),
      maxNumOfImages_(Value<Int>::get(component.subComponent("MaxNumOfImages"))),
      imagePeriod_(static_cast<unsigned int>(Value<Int>::get(component.subComponent("ImagePeriod")))),
      totalTime_(static_cast<unsigned int>(Value<Int>::get(component.subComponent("TotalTime")))),
      lifeChecker_(Implementation::configuredLifeChecker(component)), clock_(clock) {}

Type StreamRecognizer::define() {
    return Type(
        typeId(), "Recognizer/Verifier for image streams",
        properties(
            Implementation::EyeSearch::range(),
            propertyWithDefault<Int>::create(
                "MaxNumOfImages", std::numeric_limits<std::int32_t>::max(),
                "Maximum number of recognition attempts for each verification request. Minimum value is 1. "
                "If "
                "no value is configured, verification will continue until total time elapsed"),
            propertyWithDefault<Int>::create(
                "ImagePeriod", 200,
                "Minimum duration in msecs for one recognition attempt. This time "
                "limitation is useful on fast systems."),
            propertyWithDefault<Int>::create(
                "TotalTime", 10000,
                "Total verification time in msecs. If time elapsed during verification exceeds this value, "
                "verification is cancelled"),
            Implementation::useLifeCheck("Whether to perform life checks with the recognition images")),
        "", false);
}

void StreamRecognizer::recognize(const std::list<Fn::VideoSource>& sources, const Cmp::FIR& reference,
                                 Cmp::Score threshold) const {
    const FNRealTime time(clock_);
    FNImageSequenceFactory factory(sources, imagePeriod_);
    auto [image, end] = factory.start(totalTime_);
    const Implementation::Recognizer recognizer(strategy_, reference, threshold);
    forward<ExtractedFIR, AchievedScore, AttemptResult>(recognizer, *this);
    Implementation::LifeChecker life(lifeChecker_);

    bool accepted = false, timeUp = false;
    int attempt = 0;
    do {
        SensorSample sample(Implementation::cachingIntensity(*image));
        accepted =
            Implementation::lookAt(*this, eyes_, sample, attempt) && recognizer.compare(sample, attempt);
        if (accepted && lifeChecker_) {
            life.addFace(sample.face());
            accepted = life.isAlive();
        }
        ++attempt;
        ++image;
        timeUp = static_cast<unsigned int>(time.milliseconds()) >= totalTime_;
    } while (!accepted && attempt < maxNumOfImages_ && !timeUp && image != end);
    if (timeUp) broadcast(OperationInterest::ProcessingTimeExceeded{});
    broadcast(Result{accepted});
}

void StreamRecognizer::recognize(const Fn::VideoSource& source, const Cmp::FIR& reference,
                                 Cmp::Score threshold) const {
    recognize(std::list{source}, reference, threshold);
}

void StreamRecognizer::recognize(const std::list<Fn::VideoSource>& sources, const std::list<Cmp::Face>& faces,
                                 Cmp::Score threshold) const {
    const Cmp::RecordBuilder builder = strategy_.algorithm()->createRecordBuilder();
    bool taken = false;
    for (const Cmp::Face& face : faces) {
        SensorSample sample(Implementation::cachingIntensity(face.image()));
        eyes_.find(sample);
        if (sample.hasEyes() && Implementation::pushSample(builder, sample.cmpSample()) != -1) taken = true;
    }
    if (!taken) FN_THROW(FNEGeneric, "Creation of FIR failed");
    recognize(sources, builder->generate(), threshold);
}

} // namespace Kx
