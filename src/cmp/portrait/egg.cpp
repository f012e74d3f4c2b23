#include "cmp/portrait/egg.h"

#include <cmath>

namespace Cmp::Portrait {

namespace {

constexpr double tolerance = 1e-6;

} // namespace

Egg::Egg(FNPos centre, FNPos across, FNPos down, FNPos up)
    : centre_(centre), across_(across), down_(down), upSquare_(dot(Vector(up), Vector(up))),
      degenerate_(!(dot(across_, across_) >= tolerance && dot(down_, down_) >= tolerance &&
                    upSquare_ >= tolerance)) {}

Egg Egg::ofEyes(FNPos eye0, FNPos eye1, float across, float down, float up) {
    const FNPos v = eye1 - eye0, chin(-v.y, v.x);
    return Egg((eye0 + eye1) / 2.0f, v * across, chin * down, chin * -up);
}

bool Egg::contains(FNPos pos) const {
    if (degenerate_) return false;
    const Vector offset = Vector(pos) - centre_;
    const double acrossSquare = dot(across_, across_), downSquare = dot(down_, down_);
    const double u = dot(offset, across_), v = dot(offset, down_); // times the lengths of the axes
    const double vSquare = v * v / downSquare;
    return u * u / (acrossSquare * acrossSquare) + vSquare / (v >= 0 ? downSquare : upSquare_) <=
           1 + tolerance;
}

FNBox Egg::enclosing() const {
    if (degenerate_) return {};
    const double reach =
        std::sqrt(std::max({dot(across_, across_), dot(down_, down_), upSquare_})) * (1 + tolerance) + 1;
    const FNGridPos low(centre_ - Vector(reach, reach)), high(centre_ + Vector(reach, reach));
    return {low.x, low.y, high.x, high.y};
}

} // namespace Cmp::Portrait
