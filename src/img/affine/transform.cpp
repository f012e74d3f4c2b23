#include "img/affine/transform.h"

#include "img/affine/primitives.h"

#include <algorithm>
#include <array>
#include <cmath>

namespace Img::Affine {

namespace {

using namespace Primitives;

constexpr double maximalSamples = 1 << 28;

Mapping interpolate(const FNImage<float>& src, FNImage<float>& dst, const FNBox& box) {
    return bilinearInterpolation(src, dst, box);
}
Mapping interpolate(const FNImage<float>& src, FNImage<float>& dst, FNPos origin, FN2Vector<float> u,
                    FN2Vector<float> v, bool useBackground, float background) {
    return bilinearInterpolation(src, dst, origin, u, v, useBackground, background);
}
template <class T> Mapping interpolate(const FNImage<T>& src, FNImage<T>& dst, const FNBox& box) {
    return bilinearInterpolationFixedpoint(src, dst, box);
}
template <class T>
Mapping interpolate(const FNImage<T>& src, FNImage<T>& dst, FNPos origin, FN2Vector<float> u,
                    FN2Vector<float> v, bool useBackground, T background) {
    return bilinearInterpolationFixedpoint(src, dst, origin, u, v, useBackground, background);
}

Mapping averageFinely(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst, const FNBox& box) {
    return destinationAlignedFractionalAveraging(src, dst, box);
}
template <class T> Mapping averageFinely(const FNImage<T>& src, FNImage<T>& dst, const FNBox& box) {
    return sourceAlignedFractionalAveraging(src, dst, box);
}

template <class T> bool isWholeAtItsSize(const FNImage<T>& src, const FNImage<T>& dst, const FNBox& box) {
    return box == src.box() && dst.w() == src.w() && dst.h() == src.h();
}

template <class T> Mapping scaleBox(const FNImage<T>& src, FNImage<T>& dst, const FNBox& box) {
    if (isWholeAtItsSize(src, dst, box)) {
        dst = src;
        return {};
    }
    if (dst.empty()) return {};
    const float fx = static_cast<float>(box.width()) / static_cast<float>(dst.w());
    const float fy = static_cast<float>(box.height()) / static_cast<float>(dst.h());
    const float f = std::min(fx, fy);
    if (f < 1) return interpolate(src, dst, box);
    if (f < 2) return averageFinely(src, dst, box);
    if (f < 8) return sourceAlignedFractionalAveraging(src, dst, box);
    return integerAveraging(src, dst, box);
}

/// The pixels of an image of size w by h that the parallelogram may touch.
FNBox hull(FNPos origin, FN2Vector<float> u, FN2Vector<float> v, std::uint32_t w, std::uint32_t h) {
    const auto along = [](float o, float a, float b, std::uint32_t size) {
        const auto [low, high] = std::minmax({o, o + a, o + b, o + a + b});
        const float limit = static_cast<float>(size);
        return std::pair(static_cast<std::int32_t>(std::clamp(std::floor(low), 0.0f, limit)),
                         static_cast<std::int32_t>(std::clamp(std::ceil(high), 0.0f, limit)));
    };
    const auto [x0, x1] = along(origin.x, u.x, v.x, w);
    const auto [y0, y1] = along(origin.y, u.y, v.y, h);
    return FNBox{x0, y0, x1, y1} & FNBox{0, 0, static_cast<std::int32_t>(w), static_cast<std::int32_t>(h)};
}

template <class T> class CutOut {
public:
    CutOut(const FNImage<T>& src, FNImage<T>& dst, FNPos origin, FN2Vector<float> u, FN2Vector<float> v,
           bool useBackground, T background)
        : source_(src), dst_(dst), origin_(origin), u_(u), v_(v), useBackground_(useBackground),
          background_(background) {}

    Mapping operator()() {
        if (dst_.empty()) return {};
        for (const float value : {origin_.x, origin_.y, u_.x, u_.y, v_.x, v_.y})
            if (!std::isfinite(value)) FN_THROW(FNEBadArg, "transform: the parallelogram is not finite");

        const float fx = length(u_) / static_cast<float>(dst_.w()),
                    fy = length(v_) / static_cast<float>(dst_.h());
        if ((fx + fy) / 2 < 1) return sampleInto(dst_);

        Mapping toSource;
        if (fx > 2 && fy > 2) {
            const Mapping direct{u_.x / static_cast<float>(dst_.w()),
                                 v_.x / static_cast<float>(dst_.h()),
                                 u_.y / static_cast<float>(dst_.w()),
                                 v_.y / static_cast<float>(dst_.h()),
                                 origin_.x,
                                 origin_.y};
            if (!reduceSource(2 / std::min(fx, fy), toSource)) {
                if (!useBackground_)
                    FN_THROW(FNEBadArg,
                             "transform: padding required for this transformation but not allowed!");
                dst_.fill(background_);
                return direct;
            }
        }
        return sampleAndAverage().compose(toSource);
    }

private:
    Mapping sampleInto(FNImage<T>& image) const {
        return interpolate(source_, image, origin_, u_, v_, useBackground_, background_);
    }

    /// Replaces the source by an area average of the part that is needed, scaled by `scale`, and the
    /// parallelogram by its place there.
    /// @return false if nothing of the source is needed.
    bool reduceSource(float scale, Mapping& toSource) {
        const FNBox box = hull(origin_, u_, v_, source_.w(), source_.h());
        const auto scaled = [&](std::uint32_t n) {
            return static_cast<std::uint32_t>(static_cast<float>(n) * scale + 0.5f);
        };
        FNImage<T> middle(scaled(box.width()), scaled(box.height()));
        if (middle.empty()) return false;
        toSource = scaleBox(source_, middle, box);
        const Mapping inverse = toSource.inverse();
        const FNPos right = inverse(origin_ + u_), below = inverse(origin_ + v_);
        origin_ = inverse(origin_);
        u_ = right - origin_;
        v_ = below - origin_;
        source_ = middle;
        return true;
    }

    /// One sample for about every source pixel, and their means.
    Mapping sampleAndAverage() {
        const double w = std::max(1.0f, std::ceil(length(u_))), h = std::max(1.0f, std::ceil(length(v_)));
        if (w * h > maximalSamples) FN_THROW(FNEBadArg, "transform: the parallelogram is too large");
        FNImage<T> samples(static_cast<std::uint32_t>(w), static_cast<std::uint32_t>(h));
        const Mapping fromSamples = sampleInto(samples);
        return scaleBox(samples, dst_, samples.box()).compose(fromSamples);
    }

    FNImage<T> source_;
    FNImage<T>& dst_;
    FNPos origin_;
    FN2Vector<float> u_, v_;
    const bool useBackground_;
    const T background_;
};

FNImage<unsigned short> widened(const FNImage<unsigned char>& image) {
    FNImage<unsigned short> wide(image.w(), image.h());
    std::transform(image.data(), image.data() + image.size(), wide.getExclusive(),
                   [](unsigned char v) { return static_cast<unsigned short>(v << 8 | 128); });
    return wide;
}

/// Runs a transform of 16-bit pixels on 8-bit ones.
template <class Transform>
Mapping throughWords(const FNImage<unsigned char>& src, FNImage<unsigned char>& dst, Transform onWords) {
    FNImage<unsigned short> wide(dst.w(), dst.h());
    const Mapping mapping = onWords(widened(src), wide);
    std::transform(wide.data(), wide.data() + wide.size(), dst.getExclusive(),
                   [](unsigned short v) { return static_cast<unsigned char>(v >> 8); });
    return mapping;
}

} // namespace

Mapping transform(const FNImage<unsigned char>& src, FNImage<unsigned char>& dst, const FNBox& box) {
    if (isWholeAtItsSize(src, dst, box)) {
        dst = src;
        return {};
    }
    return throughWords(src, dst, [&](const FNImage<unsigned short>& from, FNImage<unsigned short>& to) {
        return scaleBox(from, to, box);
    });
}
Mapping transform(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst, const FNBox& box) {
    return scaleBox(src, dst, box);
}
Mapping transform(const FNImage<float>& src, FNImage<float>& dst, const FNBox& box) {
    return scaleBox(src, dst, box);
}
Mapping transform(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst, const FNBox& box) {
    return scaleBox(src, dst, box);
}

Mapping transform(const FNImage<unsigned char>& src, FNImage<unsigned char>& dst) {
    return transform(src, dst, src.box());
}
Mapping transform(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst) {
    return transform(src, dst, src.box());
}
Mapping transform(const FNImage<float>& src, FNImage<float>& dst) {
    return transform(src, dst, src.box());
}
Mapping transform(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst) {
    return transform(src, dst, src.box());
}

Mapping transform(const FNImage<unsigned char>& src, FNImage<unsigned char>& dst, FNPos origin,
                  FN2Vector<float> u, FN2Vector<float> v, bool const& useBackground,
                  unsigned char const& background) {
    return throughWords(src, dst, [&](const FNImage<unsigned short>& from, FNImage<unsigned short>& to) {
        const auto wideBackground = static_cast<unsigned short>(background << 8 | 128);
        return CutOut(from, to, origin, u, v, useBackground, wideBackground)();
    });
}
Mapping transform(const FNImage<unsigned short>& src, FNImage<unsigned short>& dst, FNPos origin,
                  FN2Vector<float> u, FN2Vector<float> v, bool const& useBackground,
                  unsigned short const& background) {
    return CutOut(src, dst, origin, u, v, useBackground, background)();
}
Mapping transform(const FNImage<float>& src, FNImage<float>& dst, FNPos origin, FN2Vector<float> u,
                  FN2Vector<float> v, bool const& useBackground, float const& background) {
    return CutOut(src, dst, origin, u, v, useBackground, background)();
}
Mapping transform(const FNImage<Fn::Bgra32>& src, FNImage<Fn::Bgra32>& dst, FNPos origin, FN2Vector<float> u,
                  FN2Vector<float> v, bool const& useBackground, Fn::Bgra32 const& background) {
    const Fn::Bgra32 opaque(background.r, background.g, background.b);
    return CutOut(src, dst, origin, u, v, useBackground, opaque)();
}

} // namespace Img::Affine
