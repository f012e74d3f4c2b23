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

} // namespace
} // namespace Img::Affine::Kernels::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Img::Affine::Kernels {

namespace {
HWY_EXPORT(sample);
} // namespace

void sampleInside(const float* pixels, std::size_t stride, const SampleLine& line, std::uint32_t begin,
                  std::uint32_t end, float* out) {
    if (begin < end) HWY_DYNAMIC_DISPATCH(sample)(pixels, stride, line, begin, end, out);
}

} // namespace Img::Affine::Kernels
#endif
