#include "fn/image_conversion.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "fn/image_conversion.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

// Only the conversions on the road of a face search have a fast form: from what files and cameras deliver
// (bytes and bgra32) to what the finders and analysers work on, and back to bytes.

HWY_BEFORE_NAMESPACE();
namespace Fn::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

/// Converts whole vectors with `step(from, to)`, `lanes` pixels at a time, and the rest one by one.
template <class From, class To, class Step>
HWY_INLINE void convertAll(const From* from, To* to, std::uint64_t n, std::uint64_t lanes, Step step) {
    std::uint64_t i = 0;
    for (; i + lanes <= n; i += lanes) step(from + i, to + i);
    for (; i < n; ++i) to[i] = convertPixel<To>(from[i]);
}

using Words = hn::ScalableTag<std::uint16_t>;
using Reals = hn::ScalableTag<float>;
using Bytes = hn::ScalableTag<std::uint8_t>;
using BytesOfWords = hn::Rebind<std::uint8_t, Words>; // as many as there are words in a vector
using BytesOfReals = hn::Rebind<std::uint8_t, Reals>;
using WordsOfReals = hn::Rebind<std::uint16_t, Reals>;
using IntsOfReals = hn::Rebind<std::int32_t, Reals>;

/// Of words that are below 2^15.
template <class V> HWY_INLINE auto toBytes(V words) {
    return hn::DemoteTo(BytesOfWords(), hn::BitCast(hn::RebindToSigned<Words>(), words));
}

/// Integer samples to the middle of their interval; exact, whatever the order.
template <unsigned range, class V> HWY_INLINE auto toReals(V ints) {
    const Reals d;
    return hn::Add(hn::Mul(hn::ConvertTo(d, ints), hn::Set(d, 1.0f / range)), hn::Set(d, 0.5f / range));
}

/// trunc(greatest * v + 0.5), kept within 0..greatest; 0 for NaN.
HWY_INLINE auto toInts(const float* reals, float greatest) {
    const Reals d;
    const auto scaled = hn::Add(hn::Mul(hn::LoadU(d, reals), hn::Set(d, greatest)), hn::Set(d, 0.5f));
    const auto kept = hn::IfThenElseZero(hn::Gt(scaled, hn::Zero(d)), hn::Min(scaled, hn::Set(d, greatest)));
    return hn::ConvertTo(IntsOfReals(), kept);
}

/// The luminance of as many pixels as there are words in a vector, in 256ths.
HWY_INLINE auto luminanceSums(const Bgra32* pixels) {
    constexpr auto weights = ColorConversions<unsigned int, 256>::luminanceRGB;
    const Words d;
    const BytesOfWords bytes;
    hn::Vec<BytesOfWords> b, g, r, a;
    hn::LoadInterleaved4(bytes, reinterpret_cast<const std::uint8_t*>(pixels), b, g, r, a);
    const auto weighted = [d](auto samples, unsigned weight) HWY_ATTR {
        return hn::Mul(hn::PromoteTo(d, samples), hn::Set(d, static_cast<std::uint16_t>(weight)));
    };
    return hn::Add(hn::Add(weighted(r, weights[0]), weighted(g, weights[1])), weighted(b, weights[2]));
}

void byteToWord(const unsigned char* from, unsigned short* to, std::uint64_t n) {
    const Words d;
    convertAll(from, to, n, hn::Lanes(d), [d](const unsigned char* in, unsigned short* out) HWY_ATTR {
        const auto samples = hn::PromoteTo(d, hn::LoadU(BytesOfWords(), in));
        hn::StoreU(hn::Or(hn::ShiftLeft<8>(samples), hn::Set(d, 128)), d, out);
    });
}

void byteToReal(const unsigned char* from, float* to, std::uint64_t n) {
    const Reals d;
    convertAll(from, to, n, hn::Lanes(d), [d](const unsigned char* in, float* out) HWY_ATTR {
        hn::StoreU(toReals<256>(hn::PromoteTo(IntsOfReals(), hn::LoadU(BytesOfReals(), in))), d, out);
    });
}

void byteToBgra(const unsigned char* from, Bgra32* to, std::uint64_t n) {
    const Bytes d;
    convertAll(from, to, n, hn::Lanes(d), [d](const unsigned char* in, Bgra32* out) HWY_ATTR {
        const auto samples = hn::LoadU(d, in);
        hn::StoreInterleaved4(samples, samples, samples, hn::Set(d, 255), d,
                              reinterpret_cast<std::uint8_t*>(out));
    });
}

void wordToByte(const unsigned short* from, unsigned char* to, std::uint64_t n) {
    const Words d;
    convertAll(from, to, n, hn::Lanes(d), [d](const unsigned short* in, unsigned char* out) HWY_ATTR {
        hn::StoreU(toBytes(hn::ShiftRight<8>(hn::LoadU(d, in))), BytesOfWords(), out);
    });
}

void wordToReal(const unsigned short* from, float* to, std::uint64_t n) {
    const Reals d;
    convertAll(from, to, n, hn::Lanes(d), [d](const unsigned short* in, float* out) HWY_ATTR {
        hn::StoreU(toReals<65536>(hn::PromoteTo(IntsOfReals(), hn::LoadU(WordsOfReals(), in))), d, out);
    });
}

void realToByte(const float* from, unsigned char* to, std::uint64_t n) {
    convertAll(from, to, n, hn::Lanes(Reals()), [](const float* in, unsigned char* out) HWY_ATTR {
        hn::StoreU(hn::DemoteTo(BytesOfReals(), toInts(in, 255)), BytesOfReals(), out);
    });
}

void realToWord(const float* from, unsigned short* to, std::uint64_t n) {
    convertAll(from, to, n, hn::Lanes(Reals()), [](const float* in, unsigned short* out) HWY_ATTR {
        hn::StoreU(hn::DemoteTo(WordsOfReals(), toInts(in, 65535)), WordsOfReals(), out);
    });
}

void bgraToByte(const Bgra32* from, unsigned char* to, std::uint64_t n) {
    convertAll(from, to, n, hn::Lanes(Words()), [](const Bgra32* in, unsigned char* out) HWY_ATTR {
        hn::StoreU(toBytes(hn::ShiftRight<8>(luminanceSums(in))), BytesOfWords(), out);
    });
}

void bgraToWord(const Bgra32* from, unsigned short* to, std::uint64_t n) {
    const Words d;
    convertAll(from, to, n, hn::Lanes(d), [d](const Bgra32* in, unsigned short* out) HWY_ATTR {
        hn::StoreU(hn::Add(luminanceSums(in), hn::Set(d, 128)), d, out);
    });
}

void bgraToReal(const Bgra32* from, float* to, std::uint64_t n) {
    static constexpr auto weights = ColorConversions<float, 256>::luminanceRGBdiv;
    const Reals d;
    const IntsOfReals ints;
    convertAll(from, to, n, hn::Lanes(d), [d, ints](const Bgra32* in, float* out) HWY_ATTR {
        // A pixel is an integer with blue in its lowest byte.
        const auto pixels = hn::LoadU(ints, reinterpret_cast<const std::int32_t*>(in));
        const auto weighted = [&](auto shifted, float weight) HWY_ATTR {
            return hn::Mul(hn::ConvertTo(d, hn::And(shifted, hn::Set(ints, 255))), hn::Set(d, weight));
        };
        const auto redAndGreen = hn::Add(weighted(hn::ShiftRight<16>(pixels), weights[0]),
                                         weighted(hn::ShiftRight<8>(pixels), weights[1]));
        hn::StoreU(hn::Add(hn::Add(redAndGreen, weighted(pixels, weights[2])), hn::Set(d, 0.5f / 256)), d,
                   out);
    });
}

} // namespace Fn::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Fn {

HWY_EXPORT(byteToWord);
HWY_EXPORT(byteToReal);
HWY_EXPORT(byteToBgra);
HWY_EXPORT(wordToByte);
HWY_EXPORT(wordToReal);
HWY_EXPORT(realToByte);
HWY_EXPORT(realToWord);
HWY_EXPORT(bgraToByte);
HWY_EXPORT(bgraToWord);
HWY_EXPORT(bgraToReal);

template <class To, class From> void convertPixels(const From* from, To* to, std::uint64_t n) {
    for (std::uint64_t i = 0; i < n; ++i) to[i] = convertPixel<To>(from[i]);
}

template <> void convertPixels(const unsigned char* from, unsigned short* to, std::uint64_t n) {
    HWY_DYNAMIC_DISPATCH(byteToWord)(from, to, n);
}
template <> void convertPixels(const unsigned char* from, float* to, std::uint64_t n) {
    HWY_DYNAMIC_DISPATCH(byteToReal)(from, to, n);
}
template <> void convertPixels(const unsigned char* from, Bgra32* to, std::uint64_t n) {
    HWY_DYNAMIC_DISPATCH(byteToBgra)(from, to, n);
}
template <> void convertPixels(const unsigned short* from, unsigned char* to, std::uint64_t n) {
    HWY_DYNAMIC_DISPATCH(wordToByte)(from, to, n);
}
template <> void convertPixels(const unsigned short* from, float* to, std::uint64_t n) {
    HWY_DYNAMIC_DISPATCH(wordToReal)(from, to, n);
}
template <> void convertPixels(const float* from, unsigned char* to, std::uint64_t n) {
    HWY_DYNAMIC_DISPATCH(realToByte)(from, to, n);
}
template <> void convertPixels(const float* from, unsigned short* to, std::uint64_t n) {
    HWY_DYNAMIC_DISPATCH(realToWord)(from, to, n);
}
template <> void convertPixels(const Bgra32* from, unsigned char* to, std::uint64_t n) {
    HWY_DYNAMIC_DISPATCH(bgraToByte)(from, to, n);
}
template <> void convertPixels(const Bgra32* from, unsigned short* to, std::uint64_t n) {
    HWY_DYNAMIC_DISPATCH(bgraToWord)(from, to, n);
}
template <> void convertPixels(const Bgra32* from, float* to, std::uint64_t n) {
    HWY_DYNAMIC_DISPATCH(bgraToReal)(from, to, n);
}

template void convertPixels(const unsigned char*, Rgb48*, std::uint64_t);
template void convertPixels(const unsigned short*, Bgra32*, std::uint64_t);
template void convertPixels(const unsigned short*, Rgb48*, std::uint64_t);
template void convertPixels(const float*, Bgra32*, std::uint64_t);
template void convertPixels(const float*, Rgb48*, std::uint64_t);
template void convertPixels(const Bgra32*, Rgb48*, std::uint64_t);
template void convertPixels(const Rgb48*, unsigned char*, std::uint64_t);
template void convertPixels(const Rgb48*, unsigned short*, std::uint64_t);
template void convertPixels(const Rgb48*, float*, std::uint64_t);
template void convertPixels(const Rgb48*, Bgra32*, std::uint64_t);

} // namespace Fn
#endif
