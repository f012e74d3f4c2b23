#pragma once

#include "fn/image.h"

#include <array>

/// Conversions between the five pixel types. All are exact to the bit: what one processor computes, every
/// other does.

namespace Fn {

/// Factors of colour computations; `range` is the number of values that a sample can take.
template <class T, unsigned range> struct ColorConversions;

template <unsigned range> struct ColorConversions<unsigned int, range> {
    /// Weights of red, green and blue in the luminance, in 256ths (ITU-R BT.601, rounded). Their sum is 255.
    static constexpr std::array<unsigned int, 3> luminanceRGB{76, 150, 29};
};

template <unsigned range> struct ColorConversions<float, range> {
    static constexpr std::array<float, 3> luminanceRGB{0.299f, 0.587f, 0.114f};
    /// The weights, divided by `range`.
    static constexpr std::array<float, 3> luminanceRGBdiv{0.299f / range, 0.587f / range, 0.114f / range};

    /// From Y - 16, Cb - 128 and Cr - 128 of studio range to red, green and blue (ITU-R BT.601).
    static constexpr float luma = 1.164f;
    static constexpr float redCr = 1.596f;
    static constexpr float greenCb = -0.392f;
    static constexpr float greenCr = -0.813f;
    static constexpr float blueCb = 2.017f;
};

/// Type of a pixel's samples.
template <class P> struct SampleOf { using Type = P; };
template <class T, class Representation> struct SampleOf<Rgb<T, Representation>> { using Type = T; };
template <class P> inline constexpr bool isColorPixel = !std::is_same_v<typename SampleOf<P>::Type, P>;

/// Number of values of an integer sample.
template <class T> inline constexpr unsigned sampleRange = std::numeric_limits<T>::max() + 1u;

/// One sample: integers stand for the middle of their interval of the reals 0..1. Reals outside of 0..1
/// become the least or the greatest integer, NaN becomes 0.
template <class To, class From> constexpr To convertSample(From v) {
    if constexpr (std::is_same_v<To, From>) {
        return v;
    } else if constexpr (std::is_same_v<From, float>) {
        constexpr float greatest = std::numeric_limits<To>::max();
        const float scaled = greatest * v + 0.5f;
        return scaled > 0 ? static_cast<To>(std::min(scaled, greatest)) : To{0};
    } else if constexpr (std::is_same_v<To, float>) {
        constexpr float range = sampleRange<From>;
        return static_cast<float>(v) / range + 0.5f / range;
    } else if constexpr (sizeof(To) > sizeof(From)) {
        return static_cast<To>(v << 8 | 128);
    } else {
        return static_cast<To>(v >> 8);
    }
}

/// Luminance of a colour pixel.
template <class To, class Color> constexpr To luminance(const Color& p) {
    using Sample = typename SampleOf<Color>::Type;
    constexpr unsigned range = sampleRange<Sample>;
    if constexpr (std::is_same_v<To, float>) {
        constexpr auto weights = ColorConversions<float, range>::luminanceRGBdiv;
        return static_cast<float>(p.r) * weights[0] + static_cast<float>(p.g) * weights[1] +
               static_cast<float>(p.b) * weights[2] + 0.5f / range;
    } else {
        constexpr auto weights = ColorConversions<unsigned int, 256>::luminanceRGB;
        const unsigned sum = weights[0] * p.r + weights[1] * p.g + weights[2] * p.b; // of 256 * range
        if constexpr (256 * range == sampleRange<To>) return static_cast<To>(sum + 128);
        return static_cast<To>(sum / (256 * range / sampleRange<To>));
    }
}

/// One pixel, among `unsigned char`, `unsigned short`, `float`, Bgra32 and Rgb48. Alpha is lost in gray and
/// Rgb48 and becomes 255 from them.
template <class To, class From> constexpr To convertPixel(const From& p) {
    using Sample = typename SampleOf<To>::Type;
    if constexpr (std::is_same_v<To, From>) {
        return p;
    } else if constexpr (isColorPixel<From> && isColorPixel<To>) {
        return To(convertSample<Sample>(p.r), convertSample<Sample>(p.g), convertSample<Sample>(p.b));
    } else if constexpr (isColorPixel<From>) {
        return luminance<To>(p);
    } else {
        const Sample v = convertSample<Sample>(p);
        if constexpr (isColorPixel<To>)
            return To(v, v, v);
        else
            return v;
    }
}

/// Converts `n` pixels, as convertPixel() does one by one; with the vector units where that is worth it.
template <class To, class From> void convertPixels(const From* from, To* to, std::uint64_t n);

/// Converts a whole image; one of the same type is returned as it is, sharing its pixels.
template <class To, class From> FNImage<To> convertImage(const FNImage<From>& from) {
    if constexpr (std::is_same_v<To, From>) {
        return from;
    } else {
        FNImage<To> to(from.w(), from.h());
        convertPixels(from.data(), to.getExclusive(), from.size());
        return to;
    }
}

} // namespace Fn
