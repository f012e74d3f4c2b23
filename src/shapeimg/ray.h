#pragma once

#include "fn/vector3.h"

namespace ShapeImage {

/// A half-line in space.
class Ray {
public:
    using Vector = FN3Vector<double>;

    /// @param direction of any length. @throws FNEBadArg if it is zero or not finite.
    Ray(const Vector& start, const Vector& direction);

    const Vector& start() const noexcept { return start_; }
    /// Of length 1.
    const Vector& direction() const noexcept { return direction_; }
    Vector at(double t) const { return start_ + direction_ * t; }

    /// Distance from the start to the foot of a point's perpendicular; below 0 behind the start.
    double parameter(const Vector& point) const { return dot(point - start_, direction_); }
    /// Squared distance from the point to the nearest point of the half-line.
    double squaredDistance(const Vector& point) const {
        const double t = parameter(point);
        const Vector d = point - (t > 0 ? at(t) : start_);
        return dot(d, d);
    }

private:
    Vector start_;
    Vector direction_;
};

} // namespace ShapeImage
