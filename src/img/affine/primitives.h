#pragma once

#include "fn/image.h"
#include "img/affine/mapping.h"

/// The methods of resampling, one by one. Img::Affine::transform chooses among them.
///
/// All fill `dst`, whose size is the size of the result, from a box of `src` (or a parallelogram) and return
/// the mapping from `dst` to `src`. An empty `dst` stays as it is. The averages give each result pixel the
/// mean of the area that it covers; colour pixels are averaged channel by channel as 16-bit numbers (v << 8)
/// | 128, of which the high byte is the result, and become opaque.
namespace Img::Affine::Primitives {

/// Area average, with the width of a source pixel rounded to a fraction of a result pixel (1/16 to 1/128).
/// @throws FNEBadArg for a box that is not inside `src`, or a factor above 16.
Mapping destinationAlignedFractionalAveraging(const FNImage<unsigned short>& src,
                                              FNImage<unsigned short>& dst, const FNBox& box);

/// Area average, with the width of a result pixel rounded to a fraction of a source pixel (1/2 to 1/128,
/// chosen by the horizontal factor; integerAveraging from a factor of 128 on).
/// @throws FNEBadArg for a box that is not inside `src`, or a horizontal factor of 256 or more.
Mapping sourceAlignedFractionalAveraging(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst,
                                         const FNBox& box);
Mapping sourceAlignedFractionalAveraging(const FNImage<float>& src, FNImage<float>& dst, const FNBox& box);
Mapping sourceAlignedFractionalAveraging(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst,
                                         const FNBox& box);

/// Mean of blocks of whole pixels. @throws FNEBadArg for a box that is not inside `src`, or smaller than
/// `dst`.
Mapping integerAveraging(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst, const FNBox& box);
Mapping integerAveraging(const FNImage<float>& src, FNImage<float>& dst, const FNBox& box);
Mapping integerAveraging(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst, const FNBox& box);

/// Four source pixels become three, along both axes: weights (3, 1, 0, 0), (0, 2, 2, 0) and (0, 0, 1, 3)
/// sixteenths. What remains of a size that is no multiple of 4 is completed with zeros, so those pixels are
/// darker.
struct FourToThreeFractionalAveraging {
    /// Size of the result along one axis.
    static constexpr std::uint32_t dstDim(std::uint32_t n) { return 3 * (n / 4) + n % 4; }
    /// An image that takes the result of a source of the given size.
    static FNImage<unsigned short> createDst(std::uint32_t width, std::uint32_t height) {
        return {dstDim(width), dstDim(height)};
    }
    /// @throws FNEBadArg if `dst` has not the size that createDst gives.
    static Mapping scale(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst);
};

/// Bilinear interpolation in 17.15 fixed point of a box, for scaling up. Outermost half pixels and what lies
/// outside of `src` take the value of the next pixel inside. @throws FNEBadArg if `src` is empty.
Mapping bilinearInterpolationFixedpoint(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst,
                                        const FNBox& box);
Mapping bilinearInterpolationFixedpoint(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst,
                                        const FNBox& box);

/// Bilinear interpolation in 17.15 fixed point of the parallelogram with corner `origin` and sides `u` (along
/// the rows of `dst`) and `v` (along its columns).
/// @param useBackground whether samples more than half a pixel outside of `src` take `background`
/// @throws FNEBadArg if a sample lies there and that is not allowed, or if coordinates are not below 2^30.
Mapping bilinearInterpolationFixedpoint(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst,
                                        FNPos origin, FN2Vector<float> u, FN2Vector<float> v,
                                        bool useBackground, unsigned short background);
Mapping bilinearInterpolationFixedpoint(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst,
                                        FNPos origin, FN2Vector<float> u, FN2Vector<float> v,
                                        bool useBackground, Fn::Bgra32 background);

/// Bilinear interpolation in floating point. A neighbour outside of `src` takes the value of one inside.
/// @throws FNEBadArg if all four neighbours of a sample lie outside and no background is allowed.
Mapping bilinearInterpolation(const FNImage<float>& src, FNImage<float>& dst, const FNBox& box);
Mapping bilinearInterpolation(const FNImage<float>& src, FNImage<float>& dst, FNPos origin,
                              FN2Vector<float> u, FN2Vector<float> v, bool useBackground, float background);

} // namespace Img::Affine::Primitives
