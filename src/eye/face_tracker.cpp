#include "eye/face_tracker.h"

#include <stdexcept>

namespace Eye {

using FaceInfo = FaceTracker::FaceInfo;

FaceInfo::FaceInfo(const Fn::Package& package) {
    Fn::PackageReader reader(package);
    identity_ = reader.next<std::string>();
    location_ = reader.next<FaceFinder::Location>();
    distance_ = reader.next<float>();
    distanceDefined_ = reader.next<bool>();
    velocity_ = reader.next<float>();
    pixVelocity_ = reader.next<float>();
    velocityDefined_ = reader.next<bool>();
    reader.expectEnd();
}

Fn::Package FaceInfo::serialize() const {
    return Fn::Package(std::list<Fn::Package>{Fn::serialize(identity_), Fn::serialize(location_),
                                              Fn::Package(distance_), Fn::Package(distanceDefined_),
                                              Fn::Package(velocity_), Fn::Package(pixVelocity_),
                                              Fn::Package(velocityDefined_)});
}

void FaceInfo::demand(bool defined, const char* operation, const char* item) const {
    if (!defined)
        throw std::runtime_error(std::string(operation) + "(): " + item +
                                 " is undefined! (ID = " + identity_ + ")");
}

FaceFinder::Location FaceInfo::location() const {
    demand(hasLocation(), "location", "location");
    return location_;
}

float FaceInfo::distanceFromCamera() const {
    demand(distanceDefined_, "distanceFromCamera", "distance from camera");
    return distance_;
}

float FaceInfo::velocity() const {
    demand(velocityDefined_, "velocity", "velocity");
    return velocity_;
}

float FaceInfo::pixVelocity() const {
    demand(velocityDefined_, "pixVelocity", "pixel velocity");
    return pixVelocity_;
}

void FaceInfo::velocityInfo(float velocity, float pixVelocity) {
    velocity_ = velocity;
    pixVelocity_ = pixVelocity;
    velocityDefined_ = true;
}

void FaceInfo::scaleshift(float factor, const FNPos& shift) {
    demand(hasLocation(), "scaleshift", "location");
    location_.pos = location_.pos * factor + shift;
    location_.width *= factor;
}

FaceTracker::FaceInfos scaleshift(const FaceTracker::FaceInfos& faces, float factor, const FNPos& shift) {
    FaceTracker::FaceInfos moved = faces;
    for (FaceInfo& face : moved) face.scaleshift(factor, shift);
    return moved;
}

} // namespace Eye
