#pragma once

#include "fn/geometry.h"

namespace Img::Affine {

/// Maps positions of a result image to positions of its source:
///
///     x' = m0 * x + m1 * y + tx
///     y' = m2 * x + m3 * y + ty
///
/// Positions are continuous: pixel i covers [i, i + 1), its middle lies at i + 0.5.
struct Mapping {
    float m0 = 1, m1 = 0, m2 = 0, m3 = 1, tx = 0, ty = 0;

    /// The map that scales by `x` and `y` and puts the origin at `origin`.
    static constexpr Mapping scaling(float x, float y, FNPos origin = {}) {
        return {x, 0, 0, y, origin.x, origin.y};
    }

    constexpr FNPos operator()(FNPos p) const { return {m0 * p.x + m1 * p.y + tx, m2 * p.x + m3 * p.y + ty}; }

    /// The map of the other direction. @throws FNEBadArg if the map takes the plane to a line or a point.
    Mapping inverse() const;

    /// The map that applies this one first and then `next`.
    Mapping compose(const Mapping& next) const;

    friend constexpr bool operator==(const Mapping&, const Mapping&) = default;
};

} // namespace Img::Affine
