#include "img/support_norm.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "img/support_norm.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

#include <cmath>
#include <limits>

#ifndef ORBEK_SUPPORT_NORM_WINDOW
#define ORBEK_SUPPORT_NORM_WINDOW
namespace Img {
namespace {

/// A row of the image with the rows around it, as far as windows reach; what lies outside of the image is not
/// a number, and so is neither darker nor brighter than anything.
struct Window {
    const float* corner; ///< upper left neighbour of the first pixel
    std::size_t stride;
    std::size_t side; ///< 2 * radius + 1
    const float* weights;
    float additiveNoise, multiplicativeNoise;
};

} // namespace
} // namespace Img
#endif

HWY_BEFORE_NAMESPACE();
namespace Img::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

/// Writes a whole number of vectors, and so reads.
void normalizeRow(const Window& window, const float* sums, float* out, std::size_t n) {
    const hn::CappedTag<float, 16> d;
    const std::size_t lanes = hn::Lanes(d), radius = window.side / 2;
    const auto additive = hn::Set(d, window.additiveNoise);
    const auto multiplicative = hn::Set(d, window.multiplicativeNoise);
    for (std::size_t x = 0; x < n; x += lanes) {
        const auto value = hn::LoadU(d, window.corner + radius * window.stride + radius + x);
        const auto high = hn::Add(hn::Mul(value, multiplicative), additive);
        const auto low = hn::Sub(hn::Div(value, multiplicative), additive);
        auto darker = hn::Zero(d), brighter = hn::Zero(d);
        const float* weight = window.weights;
        for (std::size_t j = 0; j < window.side; ++j) {
            const float* const row = window.corner + j * window.stride + x;
            for (std::size_t i = 0; i < window.side; ++i, ++weight) {
                const auto neighbour = hn::LoadU(d, row + i), w = hn::Set(d, *weight);
                darker = hn::Add(darker, hn::IfThenElseZero(hn::Lt(neighbour, low), w));
                brighter = hn::Add(brighter, hn::IfThenElseZero(hn::Gt(neighbour, high), w));
            }
        }
        hn::StoreU(hn::Div(hn::Sub(darker, brighter), hn::LoadU(d, sums + x)), d, out + x);
    }
}

} // namespace
} // namespace Img::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Img {
namespace {

HWY_EXPORT(normalizeRow);

constexpr std::size_t widestVector = 16; // floats

} // namespace

SupportNorm::SupportNorm(float sigma, unsigned int radius, float additiveNoise, float multiplicativeNoise)
    : radius_(radius), additiveNoise_(additiveNoise), multiplicativeNoise_(multiplicativeNoise) {
    if (!(multiplicativeNoise >= 1))
        FN_THROW(FNEGeneric, "Multiplicative noise threshold parameter must be >=1!");
    if (!(sigma > 0)) FN_THROW(FNEGeneric, "Sigma must be positive!");
    for (std::int64_t dy = -radius_; dy <= radius_; ++dy)
        for (std::int64_t dx = -radius_; dx <= radius_; ++dx) {
            const auto squared = static_cast<double>(dx * dx + dy * dy);
            const double width = double{sigma} * double{sigma};
            weights_.push_back(squared == 0 ? 0.0f : static_cast<float>(std::exp(-squared / width)));
        }
}

float SupportNorm::weight(std::int64_t dx, std::int64_t dy) const {
    return weights_[static_cast<std::size_t>((dy + radius_) * (2 * radius_ + 1) + dx + radius_)];
}

std::vector<float> SupportNorm::windowSums(std::uint32_t w, std::uint32_t h, std::uint32_t y) const {
    std::vector<float> sums(w);
    const std::int64_t columns = w, rows = h, row = y;
    for (std::int64_t x = 0; x < columns; ++x) {
        double sum = 0;
        for (std::int64_t dy = std::max(-radius_, -row); dy <= std::min(radius_, rows - 1 - row); ++dy)
            for (std::int64_t dx = std::max(-radius_, -x); dx <= std::min(radius_, columns - 1 - x); ++dx)
                sum += double{weight(dx, dy)};
        sums[static_cast<std::size_t>(x)] = sum > 0 ? static_cast<float>(sum) : 1.0f;
    }
    return sums;
}

FNImage<float> SupportNorm::plain(const FNImage<float>& image) const {
    FNImage<float> result(image.w(), image.h());
    float* out = result.getExclusive();
    const std::int64_t w = image.w(), h = image.h();
    for (std::int64_t y = 0; y < h; ++y) {
        const std::vector<float> sums = windowSums(image.w(), image.h(), static_cast<std::uint32_t>(y));
        for (std::int64_t x = 0; x < w; ++x) {
            const float value = image(static_cast<std::uint32_t>(x), static_cast<std::uint32_t>(y));
            const float high = value * multiplicativeNoise_ + additiveNoise_;
            const float low = value / multiplicativeNoise_ - additiveNoise_;
            float darker = 0, brighter = 0;
            for (std::int64_t dy = std::max(-radius_, -y); dy <= std::min(radius_, h - 1 - y); ++dy)
                for (std::int64_t dx = std::max(-radius_, -x); dx <= std::min(radius_, w - 1 - x); ++dx) {
                    const float neighbour =
                        image(static_cast<std::uint32_t>(x + dx), static_cast<std::uint32_t>(y + dy));
                    if (neighbour < low) darker += weight(dx, dy);
                    if (neighbour > high) brighter += weight(dx, dy);
                }
            *out++ = (darker - brighter) / sums[static_cast<std::size_t>(x)];
        }
    }
    return result;
}

FNImage<float> SupportNorm::operator()(const FNImage<float>& image) const {
    FNImage<float> result(image.w(), image.h());
    if (image.empty()) return result;
    const auto radius = static_cast<std::size_t>(radius_);
    const std::size_t w = image.w(), padded = (w + widestVector - 1) / widestVector * widestVector;
    const std::size_t stride = padded + 2 * radius;
    std::vector<float> framed(stride * (image.h() + 2 * radius), std::numeric_limits<float>::quiet_NaN());
    for (std::uint32_t y = 0; y < image.h(); ++y)
        std::copy_n(image.row(y), w, framed.data() + (y + radius) * stride + radius);

    float* const out = result.getExclusive();
    std::vector<float> sums, row(padded);
    for (std::uint32_t y = 0; y < image.h(); ++y) {
        // Between the borders all rows have the same windows.
        if (y <= radius || y + radius >= image.h()) {
            sums = windowSums(image.w(), image.h(), y);
            sums.resize(padded, 1.0f);
        }
        const Window window{
            framed.data() + y * stride, stride, 2 * radius + 1, weights_.data(), additiveNoise_,
            multiplicativeNoise_};
        HWY_DYNAMIC_DISPATCH(normalizeRow)(window, sums.data(), row.data(), w);
        std::copy_n(row.data(), w, out + y * w);
    }
    return result;
}

} // namespace Img
#endif
