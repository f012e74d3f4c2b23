#include "cmp/b7/feature_set_builder.h"

#include "cmp/b7/reshape_warp.h"

#include <cmath>
#include <stdexcept>

namespace Cmp::B7 {

namespace {

/// Of a frame that does not tell when or how long it was exposed.
constexpr float unknownMotion = 0.15f;

/// Images that tell both.
struct Exposure {
    explicit Exposure(const FNImageReference& image)
        : time(Fn::getImageCaptureTime(image.attributes())),
          microseconds(Fn::getImageExposureTime(image.attributes())) {}

    bool known() const { return time.isSet() && microseconds.isSet(); }

    Fn::Optional<Fn::TimeStamp> time;
    Fn::Optional<unsigned int> microseconds;
};

FNImage<unsigned char> bytes(const FNImage<float>& image) {
    FNImage<unsigned char> result(image.w(), image.h());
    std::transform(image.data(), image.data() + image.size(), result.getExclusive(), [](float v) {
        return static_cast<unsigned char>(std::clamp(v * 255 + 0.5f, 0.0f, 255.0f));
    });
    return result;
}

using Location = FNCountedPtr<FacialFeatureLocation>;

Location counted(const FacialFeatureLocation& location) {
    return Location(new FacialFeatureLocation(location));
}

} // namespace

float motionBlur(FNPos const& prevLeft, FNPos const& prevRight, float prevEyeDistance,
                 Fn::TimeStamp const& prevTime, FNPos const& curLeft, FNPos const& curRight,
                 float curEyeDistance, Fn::TimeStamp const& curTime, float exposure) {
    const float delta = std::chrono::duration<float>(curTime - prevTime).count();
    const auto demand = [](float value, const char* what) {
        if (std::abs(value) < 1.1920929e-7f)
            throw std::invalid_argument("motionBlur(): " + std::string(what) + " should not be zero");
    };
    demand(prevEyeDistance, "previous frame eye distance");
    demand(curEyeDistance, "current frame eye distance");
    demand(delta, "time delta between the frames capture times");
    const auto distance = [](FNPos a, FNPos b) { return std::hypot(a.x - b.x, a.y - b.y); };
    const float moved = std::max(distance(prevLeft, curLeft), distance(prevRight, curRight));
    return exposure * moved / delta / ((prevEyeDistance + curEyeDistance) / 2);
}

int FeatureSetBuilder::pushSample(const Sample& sample) {
    int id = -1;
    if (sample.faceStream) {
        id = nextSampleId_++;
        id = push(*sample.faceStream, id);
    } else {
        if (!sample.intensityImage || !sample.leftEye || !sample.rightEye) return -1;
        const Face face(*sample.intensityImage, FacialFeatureLocation{*sample.leftEye},
                        FacialFeatureLocation{*sample.rightEye});
        id = nextSampleId_++;
        id = push(face, id, 0, {0, 0});
    }
    pendingFirst_ = false;
    return id;
}

int FeatureSetBuilder::push(FaceStream const& stream, int id) {
    const std::size_t before = numberOfSamples();
    const unsigned long frames = stream.numberOfFrames();
    for (unsigned long i = 0; i < frames; ++i) {
        const FaceStream::Frame frame = stream[i];
        if (!frame.hasFaceTrackInfo(stream.personTrackId())) continue;
        const Face face = frame.getFaceForID(stream.personTrackId(), EvidenceFrame::CROPPED);
        push(face, id, static_cast<int>(i), frame.faceInfo().location().pos - face.facePosition());
    }
    quality_.mean = selection_.meanQuality();
    quality_.duration +=
        std::chrono::duration_cast<std::chrono::milliseconds>(stream.endTime() - stream.startTime()).count();
    return numberOfSamples() > before ? id : -1;
}

int FeatureSetBuilder::push(Face const& face, int id, int frameIndex, FN2Vector<float> const& offset) {
    Face annotated = face;
    if (annotateLandmarks(annotated) <= 1) return -1;
    if (core_->settings().selector.strictLandmarks && !annotated.hasBothEyeLocations()) return -1;
    Fn::Optional<FNImage<float>> warped;
    const Measures measures = measure(annotated, warped);
    const float moved = motion({id, frameIndex}, annotated, offset, measures);
    const float quality = rate(measures, moved);
    if (selection_.tryAddSample({id, frameIndex}, quality,
                                SampleEntryValue(PrimaryData(warped, annotated, quality))))
        return id;
    pendingFirst_ = false;
    return -1;
}

/// Looks for what is not known of the face yet. @return how many landmarks it has then
int FeatureSetBuilder::annotateLandmarks(Face& face) const {
    const Finders& finders = core_->finders();
    FNCountedPtr<FaceFinder::Location> place;
    if (face.hasFaceFinderInfo())
        place = FNCountedPtr<FaceFinder::Location>(new FaceFinder::Location(face.faceFinderLocation()));
    Location left, right;
    if (face.hasEyeFinderLeftEyeInfo()) left = counted(face.leftEyeLocation());
    if (face.hasEyeFinderRightEyeInfo()) right = counted(face.rightEyeLocation());
    int landmarks = 2;
    if (!left || !right) {
        if (!place) return 0;
        bool foundLeft = false, foundRight = false;
        FacialFeatureLocation first, second;
        finders.eyes.find(*place, face.image(), foundLeft, first, foundRight, second);
        if (foundLeft) left = counted(first);
        if (foundRight) right = counted(second);
        landmarks = foundLeft + foundRight;
    }
    const FacialFeatureLocation eye1 =
        left ? *left : FacialFeatureLocation{face.ffLeftEye(), 0, place->confidence};
    const FacialFeatureLocation eye2 =
        right ? *right : FacialFeatureLocation{face.ffRightEye(), 0, place->confidence};
    const auto look = [&](const auto& finder) {
        FacialFeatureLocation found;
        if (!finder.find(eye1, eye2, face.image(), found)) return Location();
        ++landmarks;
        return counted(found);
    };
    Location mouth = look(finders.mouth), nasion = look(finders.bridge);
    if (!mouth && face.hasMouthInfo()) mouth = counted(face.mouthLocation());
    if (!nasion && face.hasNasionInfo()) nasion = counted(face.nasionLocation());
    face = Face(face.image(), place, left, right, nasion, mouth);
    return landmarks;
}

FeatureSetBuilder::Measures FeatureSetBuilder::measure(const Face& face,
                                                       Fn::Optional<FNImage<float>>& warped) const {
    const SampleEvaluator::Regarded& regarded = core_->settings().selector.evaluator.regarded();
    Measures measures;
    if (regarded.paddingRatio || regarded.simToIdeal) {
        warped = reshapeWarp(face.image().toMonoFloat(), face.leftEye(), face.rightEye(), face.mouth(),
                             face.nasion(), measures.padding);
        measures.simToIdeal = imgSimToIdeal(bytes(*warped), 0.0f);
    }
    if (regarded.sharpness || regarded.deviationFromFrontalPose) {
        const PortraitMeasures portrait = core_->finders().portrait(face, regarded);
        measures.sharpness = portrait.sharpness;
        measures.deviation = portrait.deviationFromFrontalPose;
    }
    return measures;
}

/// The motion of a face since the sample before, which is the last one that was kept.
float FeatureSetBuilder::motion(const SampleEntryKey& key, const Face& face, FN2Vector<float> offset,
                                const Measures& measures) {
    if (!core_->settings().selector.evaluator.regarded().motionBlurStrength) return unknownMotion;
    const Exposure exposure(face.image());
    if (!exposure.known()) return unknownMotion;
    if (numberOfSamples() == 0) {
        pendingFirst_ = true;
        pending_ = measures;
        pendingKey_ = key;
        return 0;
    }
    const SampleEntryValue& last = selection_.samples().rbegin()->second;
    if (!last.primary.isSet()) return unknownMotion;
    const Face& before = last.primary->face;
    const Exposure exposureBefore(before.image());
    if (!exposureBefore.known()) return unknownMotion;
    const float moved =
        motionBlur(before.leftEye() + offset, before.rightEye() + offset, before.eyeDistance(),
                   *exposureBefore.time, face.leftEye() + offset, face.rightEye() + offset,
                   face.eyeDistance(), *exposure.time, static_cast<float>(*exposure.microseconds) * 1e-6f);
    if (pendingFirst_) rateFirst(moved);
    return moved;
}

/// Rates the frame that has waited, unless others have taken its place.
void FeatureSetBuilder::rateFirst(float motion) {
    pendingFirst_ = false;
    const auto first = selection_.samples().find(pendingKey_);
    if (first == selection_.samples().end()) return;
    const PrimaryData data = *first->second.primary;
    const float quality = rate(pending_, motion);
    selection_.removeFrame(pendingKey_);
    selection_.tryAddSample(pendingKey_, quality,
                            SampleEntryValue(PrimaryData(data.warped, data.face, quality)));
}

float FeatureSetBuilder::rate(const Measures& measures, float motion) const {
    return core_->settings().selector.evaluator.quality(measures.sharpness, measures.deviation, motion,
                                                        measures.padding, measures.simToIdeal);
}

Face FeatureSetBuilder::bestFace() const {
    const SampleEntryValue& best = selection_.best();
    if (!best.primary.isSet()) FN_THROW(FNEOutOfRange, "Sample with best quality not accessible.");
    return best.primary->face;
}

FIR FeatureSetBuilder::generate() {
    if (numberOfSamples() == 0) FN_THROW(FNEBadFunCall, "No faces are provided to FIR generation!");
    Core::Features features;
    const SampleSelection::Samples samples = selection_.samples();
    for (const auto& [key, value] : samples) {
        if (!value.feature.isSet()) {
            const PrimaryData& data = *value.primary;
            features.push_back(core_->processSample(data.face.image(), data.warped, data.face.leftEye(),
                                                    data.face.rightEye(), data.face.mouth(),
                                                    data.face.nasion()));
            selection_.settle(key, features.back());
        } else
            features.push_back(*value.feature);
    }
    return core_->record(features);
}

void FeatureSetBuilder::clear() {
    selection_.clear();
    nextSampleId_ = 0;
    pendingFirst_ = false;
    quality_ = {};
}

Fn::Package FeatureSetBuilder::createMemento() const {
    return Fn::Package(std::list<Fn::Package>{
        Fn::Package(nextSampleId_), Fn::Package(pendingFirst_), Fn::Package(pending_.sharpness),
        Fn::Package(pending_.deviation), Fn::Package(pending_.padding), Fn::Package(pending_.simToIdeal),
        Fn::serialize(selection_.samples()), Fn::serialize(selection_.qualities()), Fn::serialize(quality_)});
}

void FeatureSetBuilder::setMemento(const Fn::Package& package) {
    Fn::PackageReader reader(package);
    const int nextSampleId = reader.next<int>();
    const bool pendingFirst = reader.next<bool>();
    Measures pending;
    for (float* const measure :
         {&pending.sharpness, &pending.deviation, &pending.padding, &pending.simToIdeal})
        *measure = reader.next<float>();
    const auto samples = reader.next<SampleSelection::Samples>();
    const auto qualities = reader.next<SampleSelection::Qualities>();
    const auto quality = reader.next<Quality>();
    reader.expectEnd();
    selection_.restore(samples, qualities);
    nextSampleId_ = nextSampleId;
    pendingFirst_ = pendingFirst && !samples.empty();
    if (pendingFirst_) pendingKey_ = samples.begin()->first; // the only one
    pending_ = pending;
    quality_ = quality;
}

} // namespace Cmp::B7
