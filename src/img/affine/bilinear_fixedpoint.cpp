#include "img/affine/bilinear_kernel.h"
#include "img/affine/primitives.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <vector>

namespace Img::Affine::Primitives {

namespace {

constexpr const char* invalidSource =
    "bilinearInterpolationFixedpoint: Invalid source pixels (but padding is not allowed)!";

/// Positions in 2^-15 of a pixel, counted from the middle of pixel (0, 0).
using Fixed = std::int64_t;
constexpr int fractionBits = 15;
constexpr Fixed one = Fixed{1} << fractionBits;

Fixed toFixed(float value) {
    const float scaled = value * static_cast<float>(one);
    constexpr float limit = static_cast<float>(one << 30); // 2^30 pixels: sums stay far within 64 bits
    if (!(std::abs(scaled) <= limit))
        FN_THROW(FNEBadArg, "bilinearInterpolationFixedpoint: coordinates out of range");
    return static_cast<Fixed>(scaled);
}

constexpr int mix(int a, int b, Fixed fraction) {
    return a + static_cast<int>((std::int32_t{b} - a) * static_cast<std::int32_t>(fraction) >> fractionBits);
}

unsigned short mix(unsigned short a, unsigned short b, Fixed fraction) {
    return static_cast<unsigned short>(mix(int{a}, int{b}, fraction));
}

Fn::Bgra32 mix(Fn::Bgra32 a, Fn::Bgra32 b, Fixed fraction) {
    const auto channel = [&](unsigned char p, unsigned char q) {
        return static_cast<unsigned char>(mix(int{p}, int{q}, fraction));
    };
    return {channel(a.r, b.r), channel(a.g, b.g), channel(a.b, b.b)};
}

unsigned short opaque(unsigned short pixel) {
    return pixel;
}
Fn::Bgra32 opaque(Fn::Bgra32 pixel) {
    return {pixel.r, pixel.g, pixel.b};
}

/// Index of a pixel and of the one that it is mixed with.
struct Neighbours {
    std::uint64_t first, second;
    Fixed fraction;
};

/// Beyond the outermost pixel's middle there is nothing to mix with. `size` is at least 1.
Neighbours neighbours(Fixed position, std::uint32_t size) {
    if (position < 0) return {0, 0, 0};
    const auto index = static_cast<std::uint64_t>(position >> fractionBits);
    if (index >= size - 1) return {size - 1u, size - 1u, 0};
    return {index, index + 1, position & (one - 1)};
}

template <class T> T sample(const T* first, const T* second, const Neighbours& x, Fixed yFraction) {
    return mix(mix(first[x.first], first[x.second], x.fraction),
               mix(second[x.first], second[x.second], x.fraction), yFraction);
}

/// The indexes i of [0, n) with low <= start + i * step < high, as a half open range.
struct Range {
    std::int64_t begin, end;
};
Range indexesWithin(Fixed start, Fixed step, Fixed low, Fixed high, std::int64_t n) {
    const auto ceilDiv = [](Fixed a, Fixed b) { return a / b + (a % b > 0); }; // b > 0
    if (step == 0) return start >= low && start < high ? Range{0, n} : Range{0, 0};
    const Range range = step > 0 ? Range{ceilDiv(low - start, step), ceilDiv(high - start, step)}
                                 : Range{ceilDiv(start - high + 1, -step), ceilDiv(start - low + 1, -step)};
    return {std::clamp<std::int64_t>(range.begin, 0, n), std::clamp<std::int64_t>(range.end, 0, n)};
}

/// A run of samples along a straight line in the source.
template <class T> class Line {
public:
    Line(const FNImage<T>& src, Fixed x, Fixed y, Fixed xStep, Fixed yStep)
        : src_(src), x_(x), y_(y), xStep_(xStep), yStep_(yStep) {}

    /// Those whose four neighbours all lie inside.
    Range inside(std::int64_t n) const {
        const Range a = indexesWithin(x_, xStep_, 0, (Fixed{src_.w()} - 1) * one, n);
        const Range b = indexesWithin(y_, yStep_, 0, (Fixed{src_.h()} - 1) * one, n);
        const Range both{std::max(a.begin, b.begin), std::min(a.end, b.end)};
        return both.begin < both.end ? both : Range{0, 0};
    }

    void sampleInside(std::int64_t begin, std::int64_t end, T* out) const {
        if constexpr (std::is_same_v<T, Fn::Bgra32>)
            if (end - begin >= 2)
                return Kernels::sampleInside(src_.data(), src_.w(), {x_, y_, xStep_, yStep_}, begin, end,
                                             out);
        const std::uint32_t w = src_.w();
        Fixed x = x_ + begin * xStep_, y = y_ + begin * yStep_;
        for (std::int64_t i = begin; i < end; ++i, x += xStep_, y += yStep_) {
            const T* const p = src_.data() + (y >> fractionBits) * w + (x >> fractionBits);
            const Fixed fx = x & (one - 1), fy = y & (one - 1);
            out[i] = mix(mix(p[0], p[1], fx), mix(p[w], p[w + 1], fx), fy);
        }
    }

    void sampleAnywhere(std::int64_t begin, std::int64_t end, bool useBackground, T background,
                        T* out) const {
        const Fixed w = src_.w() * one, h = src_.h() * one;
        for (std::int64_t i = begin; i < end; ++i) {
            const Fixed x = x_ + i * xStep_, y = y_ + i * yStep_;
            if (x >= -one && x <= w && y >= -one && y <= h && !src_.empty()) {
                const Neighbours nx = neighbours(x, src_.w()), ny = neighbours(y, src_.h());
                out[i] = sample(src_.row(static_cast<std::uint32_t>(ny.first)),
                                src_.row(static_cast<std::uint32_t>(ny.second)), nx, ny.fraction);
            } else if (useBackground) {
                out[i] = opaque(background);
            } else {
                FN_THROW(FNEBadArg, invalidSource);
            }
        }
    }

private:
    const FNImage<T>& src_;
    Fixed x_, y_, xStep_, yStep_;
};

template <class T>
Mapping sampleParallelogram(const FNImage<T>& src, FNImage<T>& dst, FNPos origin, FN2Vector<float> u,
                            FN2Vector<float> v, bool useBackground, T background) {
    if (dst.empty()) return {};
    const FN2Vector<float> du = u / static_cast<float>(dst.w()), dv = v / static_cast<float>(dst.h());
    const Fixed half = one / 2;
    const Fixed x = toFixed(du.x / 2 + dv.x / 2 + origin.x) - half;
    const Fixed y = toFixed(du.y / 2 + dv.y / 2 + origin.y) - half;
    for (const float extent : {u.x, u.y, v.x, v.y}) toFixed(extent); // the sum of all steps is in range
    const Fixed xx = toFixed(du.x), xy = toFixed(du.y), yx = toFixed(dv.x), yy = toFixed(dv.y);

    T* const out = dst.getExclusive();
    for (std::uint32_t j = 0; j < dst.h(); ++j) {
        const Line<T> line(src, x + j * yx, y + j * yy, xx, xy);
        const Range inside = line.inside(dst.w());
        T* const row = out + std::uint64_t{j} * dst.w();
        line.sampleAnywhere(0, inside.begin, useBackground, background, row);
        line.sampleInside(inside.begin, inside.end, row);
        line.sampleAnywhere(inside.end, dst.w(), useBackground, background, row);
    }
    return {du.x, dv.x, du.y, dv.y, origin.x, origin.y};
}

/// The neighbours of every sample along one axis of a box. Positions up to half a pixel behind the first
/// middle take the first pixel as it stands.
std::vector<Neighbours> axisOfBox(float origin, float step, std::uint32_t samples, std::uint32_t size) {
    const Fixed half = one / 2, start = toFixed(step / 2 + origin) - half, fixedStep = toFixed(step);
    std::vector<Neighbours> axis(samples);
    for (std::uint32_t i = 0; i < samples; ++i) {
        const Fixed position = start + i * fixedStep;
        axis[i] = neighbours(position < half ? 0 : position, size);
    }
    return axis;
}

template <class T> Mapping sampleBox(const FNImage<T>& src, FNImage<T>& dst, const FNBox& box) {
    if (dst.empty()) return {};
    if (src.empty()) FN_THROW(FNEBadArg, invalidSource);
    const auto extent = [](std::int32_t low, std::int32_t high) {
        return static_cast<float>(std::int64_t{high} - low);
    };
    const float dx = extent(box.x0, box.x1) / static_cast<float>(dst.w());
    const float dy = extent(box.y0, box.y1) / static_cast<float>(dst.h());
    const FNPos origin{static_cast<float>(box.x0), static_cast<float>(box.y0)};
    const auto xs = axisOfBox(origin.x, dx, dst.w(), src.w()), ys = axisOfBox(origin.y, dy, dst.h(), src.h());

    // Each source row is interpolated along x once; result rows mix two of them.
    struct Row {
        std::uint64_t index = std::numeric_limits<std::uint64_t>::max();
        std::vector<T> pixels;
    };
    Row rows[2];
    const auto along = [&](std::uint64_t index) -> const T* {
        Row& row = rows[index % 2];
        if (row.index != index) {
            row.index = index;
            row.pixels.resize(dst.w());
            const T* const from = src.row(static_cast<std::uint32_t>(index));
            for (std::uint32_t i = 0; i < dst.w(); ++i)
                row.pixels[i] = mix(from[xs[i].first], from[xs[i].second], xs[i].fraction);
        }
        return row.pixels.data();
    };

    T* out = dst.getExclusive();
    for (const Neighbours& y : ys) {
        const T *const first = along(y.first), *const second = along(y.second);
        for (std::uint32_t i = 0; i < dst.w(); ++i) *out++ = mix(first[i], second[i], y.fraction);
    }
    return Mapping::scaling(dx, dy, origin);
}

} // namespace

Mapping bilinearInterpolationFixedpoint(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst,
                                        const FNBox& box) {
    return sampleBox(src, dst, box);
}
Mapping bilinearInterpolationFixedpoint(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst,
                                        const FNBox& box) {
    return sampleBox(src, dst, box);
}
Mapping bilinearInterpolationFixedpoint(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst,
                                        FNPos origin, FN2Vector<float> u, FN2Vector<float> v,
                                        bool useBackground, unsigned short background) {
    return sampleParallelogram(src, dst, origin, u, v, useBackground, background);
}
Mapping bilinearInterpolationFixedpoint(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst,
                                        FNPos origin, FN2Vector<float> u, FN2Vector<float> v,
                                        bool useBackground, Fn::Bgra32 background) {
    return sampleParallelogram(src, dst, origin, u, v, useBackground, background);
}

} // namespace Img::Affine::Primitives
