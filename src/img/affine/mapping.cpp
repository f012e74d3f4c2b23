#include "img/affine/mapping.h"

#include "fn/exception.h"

namespace Img::Affine {

Mapping Mapping::inverse() const {
    const double determinant = double{m0} * m3 - double{m1} * m2;
    if (determinant == 0) FN_THROW(FNEBadArg, "Mapping::inverse: the mapping has no inverse");
    const double a = m3 / determinant, b = -m1 / determinant, c = -m2 / determinant, d = m0 / determinant;
    const auto f = [](double value) { return static_cast<float>(value); };
    return {f(a), f(b), f(c), f(d), f(-(a * tx + b * ty)), f(-(c * tx + d * ty))};
}

Mapping Mapping::compose(const Mapping& next) const {
    const auto linear = [](float a, float b, float c, float d) {
        return static_cast<float>(double{a} * b + double{c} * d);
    };
    const FNPos t = next({tx, ty});
    return {linear(next.m0, m0, next.m1, m2),
            linear(next.m0, m1, next.m1, m3),
            linear(next.m2, m0, next.m3, m2),
            linear(next.m2, m1, next.m3, m3),
            t.x,
            t.y};
}

} // namespace Img::Affine
