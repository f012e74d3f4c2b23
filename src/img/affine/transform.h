#pragma once

#include "fn/image.h"
#include "img/affine/mapping.h"

/// Resampling of images to another scale, angle or shape.
///
/// The size of `dst`, which the caller allocates, is the size of the result; what it holds is replaced. A
/// result pixel is the mean over the area that it covers in the source whenever that is more than about one
/// source pixel, and a bilinear interpolation otherwise, so that a patch looks the same at every scale. All
/// return the mapping from `dst` to `src`.
///
///     FNImage<unsigned short> patch(23, 23);
///     const auto toImage = Img::Affine::transform(image, patch, corner, right, down, true, 0);
namespace Img::Affine {

/// Scales the whole of `src`. At its own size, `dst` becomes `src` and shares its pixels.
Mapping transform(const FNImage<unsigned char>& src, FNImage<unsigned char>& dst);
Mapping transform(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst);
Mapping transform(const FNImage<float>& src, FNImage<float>& dst);
Mapping transform(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst);

/// Scales a box of `src`. @throws FNEBadArg if it is to be scaled down and does not lie inside `src`, or is
/// scaled down by factors that the averaging methods (primitives.h) refuse.
Mapping transform(const FNImage<unsigned char>& src, FNImage<unsigned char>& dst, const FNBox& box);
Mapping transform(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst, const FNBox& box);
Mapping transform(const FNImage<float>& src, FNImage<float>& dst, const FNBox& box);
Mapping transform(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst, const FNBox& box);

/// Cuts out the parallelogram with corner `origin` and sides `u` (along the rows of `dst`) and `v` (along its
/// columns): rotated, sheared, mirrored.
/// @param useBackground whether what lies outside of `src` takes the value `background`
/// @throws FNEBadArg if anything lies outside and that is not allowed, or for a parallelogram beyond 2^28
/// pixels.
Mapping transform(const FNImage<unsigned char>& src, FNImage<unsigned char>& dst, FNPos origin,
                  FN2Vector<float> u, FN2Vector<float> v, bool const& useBackground,
                  unsigned char const& background);
Mapping transform(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst, FNPos origin,
                  FN2Vector<float> u, FN2Vector<float> v, bool const& useBackground,
                  unsigned short const& background);
Mapping transform(const FNImage<float>& src, FNImage<float>& dst, FNPos origin, FN2Vector<float> u,
                  FN2Vector<float> v, bool const& useBackground, float const& background);
Mapping transform(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst, FNPos origin, FN2Vector<float> u,
                  FN2Vector<float> v, bool const& useBackground, Fn::Bgra32 const& background);

} // namespace Img::Affine
