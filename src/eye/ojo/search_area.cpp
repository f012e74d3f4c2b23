#include "eye/ojo/search_area.h"

namespace Eye::Ojo::T8 {

EyeSearchAreas EyeSearchAreas::of(const FaceFinder::Location& face) {
    const float w = face.width, side = w * relPatchSize;
    const float c = std::cos(face.rotationAngle), s = std::sin(face.rotationAngle);
    const auto rotated = [=](float x, float y) { return FNPos{x * c - y * s, x * s + y * c}; };
    const float reach = w / 2 + side / 2;
    const FNPos u = FNPos{c, s} * side, v = FNPos{-s, c} * side;
    return {{face.pos + rotated(-reach, -side / 2), u, v}, {face.pos + rotated(reach, -side / 2), -u, v}};
}

EyeSearchAreas EyeSearchAreas::of(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2) {
    const FNPos line = eye2.pos - eye1.pos, unit = line / length(line);
    const auto around = [&](const FacialFeatureLocation& eye, float direction) {
        const float side = eye.size * relPatchSize;
        const FNPos u = unit * (direction * side), v = FNPos{-unit.y, unit.x} * side;
        return SearchArea{eye.pos - u / 2.0f - v / 2.0f, u, v};
    };
    return {around(eye1, 1), around(eye2, -1)};
}

SearchArea Placement::area(FNPos eye1, FNPos eye2) const {
    const FNPos line = eye2 - eye1, down{-line.y, line.x};
    const FNPos u = line * along, v = down * across;
    const FNPos centre = (eye1 + eye2) / 2.0f + down * below;
    return {centre - (u + v) / 2.0f, u, v};
}

} // namespace Eye::Ojo::T8
