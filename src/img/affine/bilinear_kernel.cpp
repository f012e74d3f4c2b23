#include "img/affine/bilinear_kernel.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "img/affine/bilinear_kernel.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

#include <algorithm>
#include <cmath>

HWY_BEFORE_NAMESPACE();
namespace Img::Affine::Kernels::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

void sample(const float* pixels, std::size_t stride, const SampleLine& line, std::uint32_t begin,
            std::uint32_t end, float* out) {
    const hn::ScalableTag<float> d;
    const hn::RebindToSigned<decltype(d)> di;
    const std::uint32_t lanes = static_cast<std::uint32_t>(hn::Lanes(d));
    const auto startX = hn::Set(d, line.start.x), startY = hn::Set(d, line.start.y);
    const auto stepX = hn::Set(d, line.step.x), stepY = hn::Set(d, line.step.y);
    const auto one = hn::Set(d, 1.0f);
    const auto width = hn::Set(di, static_cast<std::int32_t>(stride));

    std::uint32_t i = begin;
    // Indexes are 32 bits wide, relative to the row of the first sample.
    const float firstRow = std::floor(std::min(line.y(begin), line.y(std::max(begin + 1, end) - 1)));
    const float* const base = pixels + static_cast<std::size_t>(std::max(0.0f, firstRow)) * stride;
    const auto row = hn::Set(d, firstRow);
    for (; i + lanes <= end; i += lanes) {
        const auto index = hn::Add(hn::Iota(d, static_cast<float>(i)), hn::Set(d, 0.5f));
        const auto x = hn::Add(startX, hn::Mul(index, stepX)), y = hn::Add(startY, hn::Mul(index, stepY));
        const auto x0 = hn::Floor(x), y0 = hn::Floor(y);
        const auto a = hn::Sub(x, x0), b = hn::Sub(y, y0);
        const auto upper =
            hn::Add(hn::Mul(hn::ConvertTo(di, hn::Sub(y0, row)), width), hn::ConvertTo(di, x0));
        const auto p00 = hn::GatherIndex(d, base, upper), p10 = hn::GatherIndex(d, base + 1, upper);
        const auto p01 = hn::GatherIndex(d, base + stride, upper),
                   p11 = hn::GatherIndex(d, base + stride + 1, upper);
        const auto ca = hn::Sub(one, a), cb = hn::Sub(one, b);
        const auto top = hn::Add(hn::Mul(ca, p00), hn::Mul(a, p10));
        const auto bottom = hn::Add(hn::Mul(ca, p01), hn::Mul(a, p11));
        hn::StoreU(hn::Add(hn::Mul(cb, top), hn::Mul(b, bottom)), d, out + i);
    }
    for (; i < end; ++i) {
        const float x = line.x(i), y = line.y(i), x0 = std::floor(x), y0 = std::floor(y), a = x - x0,
                    b = y - y0;
        const float* const p = pixels + static_cast<std::size_t>(y0) * stride + static_cast<std::size_t>(x0);
        out[i] = (1 - b) * ((1 - a) * p[0] + a * p[1]) + b * ((1 - a) * p[stride] + a * p[stride + 1]);
    }
}

constexpr int fractionBits = 15;
constexpr std::int64_t fixedOne = 1 << fractionBits;

#if HWY_TARGET == HWY_SCALAR
void sampleColor(const Fn::Bgra32* pixels, std::size_t stride, const FixedSampleLine& line,
                 std::int64_t begin, std::int64_t end, Fn::Bgra32* out) {
    for (std::int64_t i = begin; i < end; ++i) {
        const std::int64_t x = line.x + i * line.xStep, y = line.y + i * line.yStep;
        const Fn::Bgra32* const p =
            pixels + (y >> fractionBits) * static_cast<std::int64_t>(stride) + (x >> fractionBits);
        const auto mix = [](int a, int b, std::int64_t position) {
            return a + ((b - a) * static_cast<int>(position & (fixedOne - 1)) >> fractionBits);
        };
        const auto channel = [&](unsigned char Fn::Bgra32::*c) {
            return static_cast<unsigned char>(
                mix(mix(p[0].*c, p[1].*c, x), mix(p[stride].*c, p[stride + 1].*c, x), y));
        };
        out[i] = {channel(&Fn::Bgra32::r), channel(&Fn::Bgra32::g), channel(&Fn::Bgra32::b)};
    }
}
#else
/// Two samples at a time: their four neighbours each are four vectors of eight channels.
void sampleColor(const Fn::Bgra32* pixels, std::size_t stride, const FixedSampleLine& line,
                 std::int64_t begin, std::int64_t end, Fn::Bgra32* out) {
    const hn::Full128<std::int16_t> d;
    const hn::Rebind<std::uint8_t, decltype(d)> bytes;
    const auto opaque =
        hn::BitCast(d, hn::Set(hn::Repartition<std::uint64_t, decltype(d)>(), std::uint64_t{255} << 48));
    const auto pairAt = [&](const Fn::Bgra32* p) {
        return hn::PromoteTo(d, hn::LoadU(bytes, reinterpret_cast<const std::uint8_t*>(p)));
    };
    /// a + ((b - a) * fraction >> 15)
    const auto mix = [](auto a, auto b, auto fraction) {
        const auto difference = hn::Sub(b, a);
        return hn::Add(a, hn::MulHigh(hn::Add(difference, difference), fraction));
    };
    const auto fractions = [&](std::int64_t first, std::int64_t second) {
        const auto low = [](std::int64_t v) { return static_cast<std::int16_t>(v & (fixedOne - 1)); };
        return hn::ConcatLowerLower(d, hn::Set(d, low(second)), hn::Set(d, low(first)));
    };
    const auto samplePair = [&](std::int64_t i) {
        const std::int64_t x = line.x + i * line.xStep, y = line.y + i * line.yStep;
        const std::int64_t nextX = x + line.xStep, nextY = y + line.yStep;
        const auto width = static_cast<std::int64_t>(stride);
        const Fn::Bgra32* const p = pixels + (y >> fractionBits) * width + (x >> fractionBits);
        const Fn::Bgra32* const q = pixels + (nextY >> fractionBits) * width + (nextX >> fractionBits);
        const auto upperP = pairAt(p), upperQ = pairAt(q), lowerP = pairAt(p + stride),
                   lowerQ = pairAt(q + stride);
        const auto fx = fractions(x, nextX), fy = fractions(y, nextY);
        const auto upper =
            mix(hn::ConcatLowerLower(d, upperQ, upperP), hn::ConcatUpperUpper(d, upperQ, upperP), fx);
        const auto lower =
            mix(hn::ConcatLowerLower(d, lowerQ, lowerP), hn::ConcatUpperUpper(d, lowerQ, lowerP), fx);
        const auto result = hn::Or(mix(upper, lower, fy), opaque);
        hn::StoreU(hn::DemoteTo(bytes, result), bytes, reinterpret_cast<std::uint8_t*>(out + i));
    };
    for (std::int64_t i = begin; i + 2 <= end; i += 2) samplePair(i);
    if ((end - begin) % 2 != 0) samplePair(end - 2);
}
#endif

} // namespace
} // namespace Img::Affine::Kernels::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Img::Affine::Kernels {

namespace {
HWY_EXPORT(sample);
HWY_EXPORT(sampleColor);
} // namespace

void sampleInside(const float* pixels, std::size_t stride, const SampleLine& line, std::uint32_t begin,
                  std::uint32_t end, float* out) {
    if (begin < end) HWY_DYNAMIC_DISPATCH(sample)(pixels, stride, line, begin, end, out);
}

void sampleInside(const Fn::Bgra32* pixels, std::size_t stride, const FixedSampleLine& line,
                  std::int64_t begin, std::int64_t end, Fn::Bgra32* out) {
    HWY_DYNAMIC_DISPATCH(sampleColor)(pixels, stride, line, begin, end, out);
}

} // namespace Img::Affine::Kernels
#endif
