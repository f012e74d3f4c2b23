#pragma once

#include "fn/geometry.h"

namespace Cmp::Portrait {

/// A shape like a head: two half ellipses that share the horizontal axis and have vertical ones of their own.
class Egg {
public:
    /// @param across half of the shared axis
    /// @param down,up the other half axes, both perpendicular to `across`
    Egg(FNPos centre, FNPos across, FNPos down, FNPos up);

    /// Around the middle of the eyes, upright with them: the half axes are the vector from eye to eye,
    /// turned where needed, times these factors.
    static Egg ofEyes(FNPos eye0, FNPos eye1, float across, float down, float up);

    /// Whether the position lies inside, with a tolerance of 1e-6. An egg whose axes are shorter than a
    /// thousandth of a pixel holds nothing.
    bool contains(FNPos pos) const;
    /// Whether the middle of the pixel does.
    bool containsPixel(FNGridPos pixel) const {
        return contains(FNPos(static_cast<float>(pixel.x) + 0.5f, static_cast<float>(pixel.y) + 0.5f));
    }
    /// A box that holds all pixels whose middle lies inside.
    FNBox enclosing() const;

private:
    using Vector = FN2Vector<double>;

    Vector centre_, across_, down_;
    double upSquare_;
    bool degenerate_;
};

} // namespace Cmp::Portrait
