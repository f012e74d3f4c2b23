#include "eye/face_finder.h"

namespace Fn {

using Position = FNPair<float, float>;

Package Serializer<FaceFinder::Location>::pack(const FaceFinder::Location& location) {
    return Package(std::list<Package>{Package(Position(location.pos.x, location.pos.y)),
                                      Package(location.width), Package(location.confidence),
                                      Package(location.rotationAngle)});
}

FaceFinder::Location Serializer<FaceFinder::Location>::unpack(const Package& package) {
    PackageReader reader(package);
    const auto pos = reader.next<Position>();
    FaceFinder::Location location;
    location.pos = {pos.first, pos.second};
    location.width = reader.next<float>();
    location.confidence = reader.next<float>();
    location.rotationAngle = reader.next<float>();
    reader.expectEnd();
    return location;
}

} // namespace Fn
