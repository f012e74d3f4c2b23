#include "cmp/reshape.h"

#include "img/affine/transform.h"

namespace Cmp {

template <class T>
FNTriple<FNImage<T>, FNPos, FNPos> reshape(FNImage<T> const& image, FNPos first, FNPos second,
                                           unsigned int width, unsigned int height, FNPos targetFirst,
                                           bool const& interpolate, float const& scale) {
    if (image.empty()) FN_THROW(FNEBadArg, "Wrong image dimension in Face reshape!");
    const auto region = regionToReshape(first, second, width, height, targetFirst, scale);
    const FNPos targetSecond(static_cast<float>(width) - targetFirst.x, targetFirst.y);
    const auto near = [](FNPos a, FNPos b) {
        return std::abs(a.x - b.x) <= 0.01f && std::abs(a.y - b.y) <= 0.01f;
    };
    if (image.w() == width && image.h() == height && near(first, targetFirst) && near(second, targetSecond))
        return {image, first, second};
    FNImage<T> result(width, height);
    Img::Affine::transform(image, result, region.origin, region.u, region.v, interpolate, T{0});
    return {result, targetFirst, targetSecond};
}

template FNTriple<FNImage<float>, FNPos, FNPos> reshape(FNImage<float> const&, FNPos, FNPos, unsigned int,
                                                        unsigned int, FNPos, bool const&, float const&);
template FNTriple<FNImage<unsigned short>, FNPos, FNPos> reshape(FNImage<unsigned short> const&, FNPos, FNPos,
                                                                 unsigned int, unsigned int, FNPos,
                                                                 bool const&, float const&);

} // namespace Cmp
