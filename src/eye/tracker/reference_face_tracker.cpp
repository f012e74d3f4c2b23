#include "eye/tracker/reference_face_tracker.h"

#include "eye/cara/face_finder.h"
#include "fn/deployment/leaf_values.h"
#include "fn/image_reference.h"

#include <cmath>
#include <numbers>
#include <optional>

namespace Eye {

using namespace Fn::Deployment;
using Fn::UniqueId;

namespace {

/// Of grown people.
constexpr float realEyeDistance = 0.07f; // metres

/// The time of processFrame() without one starts again after 24 days.
constexpr std::uint32_t timePeriod = 24u * 24 * 60 * 60 * 1000;

float checked(float value, float least, float greatest, const char* failure) {
    if (!(value >= least && value <= greatest)) FN_THROW(FNEOutOfRange, failure);
    return value;
}

float floatOf(const Component& component, const char* key) {
    return Value<Float>::get(component.subComponent(key));
}

} // namespace

Type ReferenceFaceTracker::define() {
    return Type(
        typeId(), "Settings of the reference face tracker",
        properties(
            property<DistanceRange>::create("FaceFinderRange", "Face finder relative distance range"),
            propertyWithDefault<Float>::create("MaxAllowedFaceSpeed", 1.0f,
                                               "Maximal allowed face speed in meters/second."),
            propertyWithDefault<Float>::create("FieldOfViewAngle", 60.0f,
                                               "The angular extent of the video stream's field of view in "
                                               "degrees. The range is 0.1 - 179.9 deg."),
            propertyWithDefault<Float>::create(
                "FrameRate", 25.0f,
                "The rate in frames per second for tracking at a constant frame rate ( processFrame()). The "
                "range is 0.01 - 999.9 fps.Defaults to 25.0 fps"),
            property<Cara::T8::FaceFinder>::create("FaceFinder", "Settings of the face finder."),
            propertyWithDefault<Float>::create(
                "ReturnFacesWithNoEyesThreshold", 0.0f,
                "If the eyes finder is used and did not find two eyes a face may be returned anyway if the "
                "face finder confidence exceeds this threshold."),
            propertyWithDefault<Bool>::create("ExhaustiveTracking", true,
                                              "Type of tracking(Exhaustive/Sparse) which we want to use"),
            propertyWithDefault<Int>::create("ZDistanceTolerance", 5,
                                             "Tolerance for the calculation of the distance of the faces in "
                                             "z-direction (in percent)")),
        "", false);
}

ReferenceFaceTracker::ReferenceFaceTracker(const Component& component)
    : ReferenceFaceTracker(component, ::FaceFinder(FNCountedPtr<::FaceFinder::Body>(
                                          new Cara::T8::FaceFinder(component.subComponent("FaceFinder"))))) {}

ReferenceFaceTracker::ReferenceFaceTracker(const Component& component, const ::FaceFinder& finder)
    : Component(component), finder_(finder),
      returnThreshold_(floatOf(component, "ReturnFacesWithNoEyesThreshold")),
      range_(component.subComponent("FaceFinderRange")),
      speedLimit_(floatOf(component, "MaxAllowedFaceSpeed") * 0.001f),
      identities_(UniqueId::Scope(UniqueId::Scope::ProcessWide)),
      exhaustive_(Value<Bool>::get(component.subComponent("ExhaustiveTracking"))) {
    const float fieldOfView = checked(floatOf(component, "FieldOfViewAngle"), 0.01f, 179.9f,
                                      "Face tracker configuration: field of view angle out of range!");
    const float frameRate = checked(floatOf(component, "FrameRate"), 0.01f, 999.9f,
                                    "Face tracker configuration: frame rate out of range!");
    const auto tolerance =
        static_cast<float>(Value<Int>::get(component.subComponent("ZDistanceTolerance"))) / 100.0f;
    zLow_ = 1 - tolerance;
    zHigh_ = 1 + tolerance;
    tanHalf_ = std::tan(fieldOfView * 0.5f * std::numbers::pi_v<float> / 180.0f);
    frameInterval_ = static_cast<std::uint32_t>(1000.0f / frameRate);
}

void ReferenceFaceTracker::processFrame(const FNImageReference& image) {
    processFrame(image, (time_ + frameInterval_) % timePeriod);
}

void ReferenceFaceTracker::processFrame(const FNImageReference& image, const unsigned int& timeMs) {
    const std::uint32_t time = timeMs;
    if (image.w() != width_ || image.h() != height_) {
        width_ = image.w();
        height_ = image.h();
        zFactor_ = static_cast<float>(width_) * realEyeDistance * 0.5f / tanHalf_;
        traces_.clear();
    }
    time_ = time;
    traces_ = findFaces(image, time);

    FaceTracker::FaceInfos faces;
    for (const Trace& trace : traces_)
        if (trace.returned) faces.emplace_back(trace.identity, trace.location, trace.z);
    broadcast(image, faces);
}

auto ReferenceFaceTracker::findFaces(const FNImageReference& image, std::uint32_t time) -> Traces {
    const double least = range_.getMinDistance(), greatest = range_.getMaxDistance();
    std::list<::FaceFinder::Location> locations;
    const bool found = exhaustive_ ? finder_.find(image, locations, least, greatest, ::FaceFinder::everywhere)
                                   : finder_.findInStream(image, locations, least, greatest,
                                                          static_cast<int>(time), ::FaceFinder::everywhere);
    Traces traces;
    if (!found) return traces;
    for (const ::FaceFinder::Location& location : locations) {
        Trace candidate{
            {}, location, zFactor_ / location.width, time, location.confidence >= returnThreshold_};
        const auto old = predecessor(candidate);
        if (old != traces_.end()) {
            candidate.identity = old->identity;
            traces_.erase(old);
        } else {
            candidate.identity = identities_.generate();
        }
        traces.push_back(candidate);
    }
    return traces;
}

auto ReferenceFaceTracker::predecessor(const Trace& candidate) -> Traces::iterator {
    auto nearest = traces_.end();
    float least = 0;
    for (auto old = traces_.begin(); old != traces_.end(); ++old) {
        const auto elapsed =
            static_cast<float>(std::max(candidate.time, old->time) - std::min(candidate.time, old->time));
        const float distance = spatialDistance(candidate, *old);
        if (!(elapsed * speedLimit_ - distance >= 0)) continue;
        if (nearest != traces_.end() && !(distance < least)) continue;
        nearest = old;
        least = distance;
    }
    return nearest;
}

/// Metres. Depths count as far as they differ by more than the tolerance.
float ReferenceFaceTracker::spatialDistance(const Trace& a, const Trace& b) const {
    const float gap =
        a.z > b.z ? std::min(b.z * zHigh_ - a.z * zLow_, 0.0f) : std::max(b.z * zLow_ - a.z * zHigh_, 0.0f);
    const float metresPerPixel = realEyeDistance / ((a.location.width + b.location.width) / 2);
    const float inPlane = length(a.location.pos - b.location.pos) * metresPerPixel;
    return std::sqrt(inPlane * inPlane + gap * gap);
}

} // namespace Eye
