#include "img/affine/turns.h"

#include "fn/vector3.h"

#include <algorithm>

namespace Img::Affine {

namespace {

/// Copies every pixel (x, y) to element target + x * xStep + y * yStep, in tiles that fit the cache both
/// ways.
template <class T> void scatter(const FNImage<T>& image, T* target, std::int64_t xStep, std::int64_t yStep) {
    constexpr std::uint32_t tile = 32;
    for (std::uint32_t y0 = 0; y0 < image.h(); y0 += tile)
        for (std::uint32_t x0 = 0; x0 < image.w(); x0 += tile)
            for (std::uint32_t y = y0; y < std::min(y0 + tile, image.h()); ++y)
                for (std::uint32_t x = x0; x < std::min(x0 + tile, image.w()); ++x)
                    target[x * xStep + y * yStep] = image(x, y);
}

template <class T> FNImage<T> onePixel() {
    FNImage<T> pixel(1, 1);
    *pixel.getExclusive() = T{};
    return pixel;
}

} // namespace

template <class T> FNImage<T> rightRotation(const FNImage<T>& image) {
    FNImage<T> turned(image.h(), image.w());
    if (!image.empty()) scatter(image, turned.getExclusive() + (image.h() - 1), image.h(), -1);
    return turned;
}

template <class T> FNImage<T> leftRotation(const FNImage<T>& image) {
    FNImage<T> turned(image.h(), image.w());
    const std::int64_t w = image.w(), h = image.h();
    if (!image.empty()) scatter(image, turned.getExclusive() + (w - 1) * h, -h, 1);
    return turned;
}

template <class T> FNImage<T> horReflection(const FNImage<T>& image, const FNBox& box) {
    const FNBox part = box & image.box();
    if (part.empty()) return onePixel<T>();
    FNImage<T> mirrored(part.width(), part.height());
    T* out = mirrored.getExclusive();
    for (std::int32_t y = part.y1; y-- > part.y0; out += part.width())
        std::copy_n(image.row(static_cast<std::uint32_t>(y)) + part.x0, part.width(), out);
    return mirrored;
}

template <class T> FNImage<T> vertReflection(const FNImage<T>& image, const FNBox& box) {
    const FNBox part = box & image.box();
    if (part.empty()) return onePixel<T>();
    FNImage<T> mirrored(part.width(), part.height());
    T* out = mirrored.getExclusive();
    for (std::int32_t y = part.y0; y < part.y1; ++y, out += part.width()) {
        const T* const row = image.row(static_cast<std::uint32_t>(y));
        std::reverse_copy(row + part.x0, row + part.x1, out);
    }
    return mirrored;
}

template FNImage<unsigned char> rightRotation(const FNImage<unsigned char>&);
template FNImage<int> rightRotation(const FNImage<int>&);
template FNImage<Fn::Bgra32> rightRotation(const FNImage<Fn::Bgra32>&);
template FNImage<Fn::Rgb48> rightRotation(const FNImage<Fn::Rgb48>&);
template FNImage<unsigned char> leftRotation(const FNImage<unsigned char>&);
template FNImage<int> leftRotation(const FNImage<int>&);
template FNImage<Fn::Bgra32> leftRotation(const FNImage<Fn::Bgra32>&);
template FNImage<Fn::Rgb48> leftRotation(const FNImage<Fn::Rgb48>&);

template FNImage<float> horReflection(const FNImage<float>&, const FNBox&);
template FNImage<unsigned short> horReflection(const FNImage<unsigned short>&, const FNBox&);
template FNImage<unsigned char> horReflection(const FNImage<unsigned char>&, const FNBox&);
template FNImage<Fn::Bgra32> horReflection(const FNImage<Fn::Bgra32>&, const FNBox&);
template FNImage<Fn::Rgb48> horReflection(const FNImage<Fn::Rgb48>&, const FNBox&);

template FNImage<float> vertReflection(const FNImage<float>&, const FNBox&);
template FNImage<unsigned short> vertReflection(const FNImage<unsigned short>&, const FNBox&);
template FNImage<unsigned char> vertReflection(const FNImage<unsigned char>&, const FNBox&);
template FNImage<Fn::Bgra32> vertReflection(const FNImage<Fn::Bgra32>&, const FNBox&);
template FNImage<Fn::Rgb48> vertReflection(const FNImage<Fn::Rgb48>&, const FNBox&);
template FNImage<bool> vertReflection(const FNImage<bool>&, const FNBox&);
template FNImage<FN3Vector<double>> vertReflection(const FNImage<FN3Vector<double>>&, const FNBox&);
template FNImage<FN3Matrix<double>> vertReflection(const FNImage<FN3Matrix<double>>&, const FNBox&);

} // namespace Img::Affine
