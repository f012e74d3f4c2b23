#include "img/affine/bilinear_kernel.h"
#include "img/affine/primitives.h"

#include <algorithm>
#include <cmath>

namespace Img::Affine::Primitives {

namespace {

/// Samples of one row of the result.
class Row {
public:
    Row(const FNImage<float>& src, Kernels::SampleLine line) : src_(src), line_(line) {}

    /// Whether all four neighbours of sample i lie inside.
    bool inside(std::uint32_t i) const {
        const float x = std::floor(line_.x(i)), y = std::floor(line_.y(i));
        return x >= 0 && y >= 0 && x + 1 < static_cast<float>(src_.w()) &&
               y + 1 < static_cast<float>(src_.h());
    }

    float anywhere(std::uint32_t i, bool useBackground, float background) const {
        const float w = static_cast<float>(src_.w()), h = static_cast<float>(src_.h());
        const float x = line_.x(i), y = line_.y(i), x0 = std::floor(x), y0 = std::floor(y);
        if (!(x0 >= -1 && x0 < w && y0 >= -1 && y0 < h)) {
            if (useBackground) return background;
            FN_THROW(FNEBadArg,
                     "DoBilinearInterpolation: Invalid source pixels (but padding is not allowed)!");
        }
        const auto clamped = [](float index, std::uint32_t size) {
            return static_cast<std::uint32_t>(std::clamp(index, 0.0f, static_cast<float>(size - 1)));
        };
        const std::uint32_t left = clamped(x0, src_.w()), right = clamped(x0 + 1, src_.w());
        const float *const upper = src_.row(clamped(y0, src_.h())), *const lower =
                                                                        src_.row(clamped(y0 + 1, src_.h()));
        const float a = x - x0, b = y - y0;
        return (1 - b) * ((1 - a) * upper[left] + a * upper[right]) +
               b * ((1 - a) * lower[left] + a * lower[right]);
    }

private:
    const FNImage<float>& src_;
    Kernels::SampleLine line_;
};

} // namespace

Mapping bilinearInterpolation(const FNImage<float>& src, FNImage<float>& dst, FNPos origin,
                              FN2Vector<float> u, FN2Vector<float> v, bool useBackground, float background) {
    if (dst.empty()) return {};
    const FN2Vector<float> du = u / static_cast<float>(dst.w()), dv = v / static_cast<float>(dst.h());
    float* const out = dst.getExclusive();
    for (std::uint32_t j = 0; j < dst.h(); ++j) {
        // Counted from the middle of pixel (0, 0).
        const FNPos start = origin + (static_cast<float>(j) + 0.5f) * dv - FNPos(0.5f, 0.5f);
        const Kernels::SampleLine line{start, du};
        const Row row(src, line);
        float* const to = out + std::uint64_t{j} * dst.w();

        // Positions are monotonic along the line: between two samples inside, all are inside.
        std::uint32_t begin = 0, end = dst.w();
        while (begin < end && !row.inside(begin))
            to[begin] = row.anywhere(begin, useBackground, background), ++begin;
        while (begin < end && !row.inside(end - 1))
            --end, to[end] = row.anywhere(end, useBackground, background);
        Kernels::sampleInside(src.data(), src.w(), line, begin, end, to);
    }
    return {du.x, dv.x, du.y, dv.y, origin.x, origin.y};
}

Mapping bilinearInterpolation(const FNImage<float>& src, FNImage<float>& dst, const FNBox& box) {
    const auto real = [](std::int64_t value) { return static_cast<float>(value); };
    return bilinearInterpolation(src, dst, {real(box.x0), real(box.y0)},
                                 {real(std::int64_t{box.x1} - box.x0), 0},
                                 {0, real(std::int64_t{box.y1} - box.y0)}, false, 0);
}

} // namespace Img::Affine::Primitives
