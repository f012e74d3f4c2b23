#include "img/affine/area_average.h"
#include "img/affine/primitives.h"
#include "img/affine/rothstein.h"

#include <algorithm>
#include <sstream>
#include <string_view>
#include <vector>

namespace Img::Affine::Primitives {

namespace {

template <class T> void demandBoxInside(const FNImage<T>& src, const FNBox& box, const char* who) {
    const FNBox all = src.box();
    if (box.x0 < 0 || box.y0 < 0 || box.x1 > all.x1 || box.y1 > all.y1 || box.x0 > box.x1 || box.y0 > box.y1)
        FN_THROW(FNEBadArg,
                 std::string(who) + ": the given source box does not lay inside the source image!");
}

template <class T> Mapping boxMapping(const FNBox& box, const FNImage<T>& dst) {
    return Mapping::scaling(static_cast<float>(box.width()) / static_cast<float>(dst.w()),
                            static_cast<float>(box.height()) / static_cast<float>(dst.h()),
                            {static_cast<float>(box.x0), static_cast<float>(box.y0)});
}

/// Result pixels of `units` each, source pixels rounded to units.
Overlap destinationAligned(std::uint32_t source, std::uint32_t result, std::uint32_t units) {
    return {imgRothsteinCode(std::uint64_t{units} * result, source),
            std::vector<std::uint32_t>(result, units)};
}

/// Source pixels of `units` each, result pixels rounded to units.
Overlap sourceAligned(std::uint32_t source, std::uint32_t result, std::uint32_t units) {
    return {std::vector<std::uint32_t>(source, units),
            imgRothsteinCode(std::uint64_t{units} * source, result)};
}

/// Area average with source pixels of `units` each.
template <class T>
void averageSourceAligned(const FNImage<T>& src, FNImage<T>& dst, const FNBox& box, std::uint32_t units) {
    const AreaGrid grid{box, sourceAligned(box.width(), dst.w(), units),
                        sourceAligned(box.height(), dst.h(), units)};
    averageByDivision(src, grid, dst);
}

template <class T> constexpr std::string_view pixelName = "FNUInt16";
template <> constexpr std::string_view pixelName<float> = "float";
template <>
constexpr std::string_view pixelName<Fn::Bgra32> =
    "Fn::Rgb<unsigned char, Fn::BgraRepresentation<unsigned char> >";

/// Units per source pixel for a horizontal factor: 256 or fewer units make a result pixel.
template <class T>
std::uint32_t unitsPerSourcePixel(const FNImage<T>& src, const FNBox& box, const FNImage<T>& dst) {
    const float factor = static_cast<float>(box.width()) / static_cast<float>(dst.w());
    std::uint32_t units = 128;
    for (float bound = 2; bound <= 256; bound *= 2, units /= 2)
        if (factor < bound) return std::max(units, 1u);
    std::ostringstream message;
    message << "Img::downScale<" << pixelName<T> << ", " << pixelName<T> << ">"
            << ": could not find a valid scale factor for requested scaling [" << src.w() << "x" << src.h()
            << "]->[" << dst.w() << "x" << dst.h() << "], requested scale factor is " << factor
            << " but maximal possible is " << 256 << "!";
    FN_THROW(FNEBadArg, message.str());
}

template <class T> Mapping sourceAlignedAverage(const FNImage<T>& src, FNImage<T>& dst, const FNBox& box) {
    demandBoxInside(src, box, "PreciseScaleFromImage");
    if (dst.empty()) return {};
    averageSourceAligned(src, dst, box, unitsPerSourcePixel(src, box, dst));
    return boxMapping(box, dst);
}

template <class T> Mapping integerAverage(const FNImage<T>& src, FNImage<T>& dst, const FNBox& box) {
    demandBoxInside(src, box, "IntegerAveraging");
    if (dst.empty()) return {};
    averageSourceAligned(src, dst, box, 1);
    return boxMapping(box, dst);
}

[[noreturn]] void throwFactorTooLarge(const FNBox& box, const FNImage<unsigned short>& dst) {
    std::ostringstream message;
    message << "Img::scaleImageFd: the scale factors " << box.width() / dst.w() << " and "
            << box.height() / dst.h() << " for scaling from " << box.width() << "x" << box.height() << " to "
            << dst.w() << "x" << dst.h() << " are too large. maximal allowed factor is 16.";
    FN_THROW(FNEBadArg, message.str());
}

} // namespace

Mapping destinationAlignedFractionalAveraging(const FNImage<unsigned short>& src,
                                              FNImage<unsigned short>& dst, const FNBox& box) {
    demandBoxInside(src, box, "scaleImageFd");
    if (dst.empty()) return {};
    const std::uint64_t bw = box.width(), bh = box.height(), w = dst.w(), h = dst.h();
    if (bw > 16 * w || bh > 16 * h) throwFactorTooLarge(box, dst);

    // Units per result pixel times the factor stay within 256: sums of 16-bit pixels stay within 32 bits.
    int bits = bw > 8 * w ? 4 : bw > 4 * w ? 5 : bw > 2 * w ? 6 : 7;
    while (bh > h << (8 - bits)) --bits;
    const std::uint32_t units = 1u << bits;
    averageByShift(src,
                   {box, destinationAligned(box.width(), dst.w(), units),
                    destinationAligned(box.height(), dst.h(), units)},
                   2 * bits, dst);
    return boxMapping(box, dst);
}

Mapping sourceAlignedFractionalAveraging(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst,
                                         const FNBox& box) {
    return sourceAlignedAverage(src, dst, box);
}
Mapping sourceAlignedFractionalAveraging(const FNImage<float>& src, FNImage<float>& dst, const FNBox& box) {
    return sourceAlignedAverage(src, dst, box);
}
Mapping sourceAlignedFractionalAveraging(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst,
                                         const FNBox& box) {
    return sourceAlignedAverage(src, dst, box);
}

Mapping integerAveraging(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst, const FNBox& box) {
    return integerAverage(src, dst, box);
}
Mapping integerAveraging(const FNImage<float>& src, FNImage<float>& dst, const FNBox& box) {
    return integerAverage(src, dst, box);
}
Mapping integerAveraging(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst, const FNBox& box) {
    return integerAverage(src, dst, box);
}

Mapping FourToThreeFractionalAveraging::scale(const FNImage<unsigned short>& src,
                                              FNImage<unsigned short>& dst) {
    if (dst.w() != dstDim(src.w()) || dst.h() != dstDim(src.h()))
        FN_THROW(FNEBadArg, "FourToThreeFractionalAveraging: the destination has not the size of the result");
    // Source pixels 3 units wide under result pixels of 4 units.
    const auto axis = [](std::uint32_t n) {
        return Overlap(std::vector<std::uint32_t>(n, 3), std::vector<std::uint32_t>(dstDim(n), 4));
    };
    if (!dst.empty()) averageByShift(src, {src.box(), axis(src.w()), axis(src.h())}, 4, dst);
    return Mapping::scaling(4.0f / 3, 4.0f / 3);
}

} // namespace Img::Affine::Primitives
