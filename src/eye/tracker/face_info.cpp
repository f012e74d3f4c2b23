#include "eye/face_tracker.h"

#include <stdexcept>

using Location = FaceFinder::Location;

namespace Eye {
namespace {

void require(bool defined, const char* operation, const char* item, const std::string& identity) {
    if (defined) return;
    throw std::runtime_error(std::string(operation) + "(): " + item + " is undefined! (ID = " + identity +
                             ")");
}

} // namespace

FaceTracker::FaceInfo::FaceInfo(Fn::PackageReader reader)
    : identity_(reader.next<std::string>()), location_(reader.next<Location>()),
      distance_(reader.next<float>()), distanceDefined_(reader.next<bool>()), velocity_(reader.next<float>()),
      pixVelocity_(reader.next<float>()), velocityDefined_(reader.next<bool>()) {
    reader.expectEnd();
}

Fn::Package FaceTracker::FaceInfo::serialize() const {
    return Fn::Package(std::list<Fn::Package>{Fn::serialize(identity_), Fn::serialize(location_),
                                              Fn::Package(distance_), Fn::Package(distanceDefined_),
                                              Fn::Package(velocity_), Fn::Package(pixVelocity_),
                                              Fn::Package(velocityDefined_)});
}

const Location& FaceTracker::FaceInfo::checkedLocation(const char* operation) const {
    require(location_.width > 0, operation, "location", identity_);
    return location_;
}

const Location& FaceTracker::FaceInfo::location() const {
    return checkedLocation("location");
}

float FaceTracker::FaceInfo::distanceFromCamera() const {
    require(distanceDefined_, "distanceFromCamera", "distance from camera", identity_);
    return distance_;
}

float FaceTracker::FaceInfo::velocity() const {
    require(velocityDefined_, "velocity", "velocity", identity_);
    return velocity_;
}

float FaceTracker::FaceInfo::pixVelocity() const {
    require(velocityDefined_, "pixVelocity", "pixel velocity", identity_);
    return pixVelocity_;
}

void FaceTracker::FaceInfo::velocityInfo(float velocity, float pixVelocity) {
    velocity_ = velocity;
    pixVelocity_ = pixVelocity;
    velocityDefined_ = true;
}

void FaceTracker::FaceInfo::scaleshift(float factor, const FNPos& shift) {
    location_.pos = checkedLocation("scaleshift").pos * factor + shift;
    location_.width *= factor;
}

FaceTracker::FaceInfos scaleshift(const FaceTracker::FaceInfos& faces, float factor, const FNPos& shift) {
    FaceTracker::FaceInfos result(faces);
    for (FaceTracker::FaceInfo& face : result) face.scaleshift(factor, shift);
    return result;
}

} // namespace Eye

Fn::Package Fn::Serializer<Location>::pack(const Location& location) {
    return Package(std::list<Package>{
        static_cast<Package>(FNPair<float, float>(location.pos.x, location.pos.y)), Package(location.width),
        Package(location.confidence), Package(location.rotationAngle)});
}

Location Fn::Serializer<Location>::unpack(const Package& package) {
    PackageReader reader(package);
    const auto pos = reader.next<FNPair<float, float>>();
    Location location;
    location.pos = {pos.first, pos.second};
    location.width = reader.next<float>();
    location.confidence = reader.next<float>();
    location.rotationAngle = reader.next<float>();
    reader.expectEnd();
    return location;
}
