#include "eye/cara/overlap_removal.h"

#include <algorithm>
#include <cmath>

namespace Eye::Cara::T8 {
namespace {

using Location = ::FaceFinder::Location;

/// How far a face reaches in the direction of the unit vector.
double radius(const Location& face, FNPos direction) {
    constexpr double height = 1.2;
    const double c = std::cos(face.rotationAngle), s = std::sin(-face.rotationAngle);
    const double rx = direction.x * c + direction.y * s;
    const double ry = direction.y * c - direction.x * s;
    return face.width * std::sqrt(rx * rx + height * ry * height * ry);
}

bool overlap(const Location& accepted, const Location& candidate) {
    const FNPos step = accepted.pos - candidate.pos;
    const float distance = length(step);
    if (distance < 1.0f) return true;
    const auto [smaller, larger] =
        std::minmax({radius(accepted, step / distance), radius(candidate, step / distance)});
    return larger + 0.5 * smaller > distance;
}

} // namespace

std::list<Location> removeOverlaps(const std::multiset<Location, MoreConfident>& candidates) {
    std::list<Location> accepted;
    for (const Location& candidate : candidates)
        if (std::none_of(accepted.begin(), accepted.end(),
                         [&](const Location& better) { return overlap(better, candidate); }))
            accepted.push_back(candidate);
    return accepted;
}

} // namespace Eye::Cara::T8
