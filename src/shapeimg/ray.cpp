#include "shapeimg/ray.h"

#include "fn/exception.h"

#include <algorithm>

namespace ShapeImage {

Ray::Ray(const Vector& start, const Vector& direction) : start_(start) {
    // Scaled first: squares of very long and very short directions leave the range of doubles.
    const double greatest =
        std::max({std::fabs(direction.x), std::fabs(direction.y), std::fabs(direction.z)});
    if (greatest == 0) FN_THROW(FNEBadArg, "Zero direction vector in ray instantiation");
    const Vector scaled = direction / greatest;
    direction_ = scaled / length(scaled);
    if (!std::isfinite(dot(direction_, direction_)))
        FN_THROW(FNEBadArg, "Direction vector in ray instantiation is not finite");
}

} // namespace ShapeImage
