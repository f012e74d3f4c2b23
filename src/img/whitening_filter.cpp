#include "img/whitening_filter.h"

#include "img/contrast.h"
#include "img/fft/frequency_grid.h"

#include <algorithm>
#include <cmath>
#include <iostream>
#include <limits>
#include <numbers>
#include <utility>

namespace {

/// The filter at each point of the spectrum.
template <class T, class Convert>
FNImage<T> filterValues(int width, int height, double cutoff, Convert convert) {
    FNImage<T> values(static_cast<std::uint32_t>(width), static_cast<std::uint32_t>(height));
    const ImgFSConv grid(width, height);
    T* out = values.getExclusive();
    for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) {
            double r, phi;
            grid.frequency(x, y, r, phi);
            *out++ = convert(r * std::exp(-std::pow(r / cutoff, 4)));
        }
    return values;
}

} // namespace

ImgWhiteningFilter::ImgWhiteningFilter(int width, int height, float cutoff)
    : fft_(new ImgFFTFloat(static_cast<unsigned>(std::max(width, 0)),
                           static_cast<unsigned>(std::max(height, 0)))),
      filter_(filterValues<float>(width, height, double{cutoff},
                                  [](double value) { return static_cast<float>(value); })) {}

FNImage<float> ImgWhiteningFilter::operator()(const FNImage<float>& image) const {
    if (image.w() != filter_.w() || image.h() != filter_.h())
        FN_THROW(FNEBadArg, "ImgWhiteningFilter: image to be processed has different dimensions than the "
                            "instantiation paramters.");
    const auto temporary = fft_->create();
    auto spectrum = fft_->transformReal(image, temporary);
    FNComplex<float>* const values = spectrum.getExclusive();
    for (std::uint64_t i = 0; i < filter_.size(); ++i) values[i] = values[i] * filter_.data()[i];
    return Img::realPart<float>(fft_->inverse(spectrum, temporary));
}

FNImage<float> ImgWhiteningFilter::operator()(const FNImage<unsigned char>& image) const {
    FNImage<float> reals(image.w(), image.h());
    std::transform(image.data(), image.data() + image.size(), reals.getExclusive(),
                   [](unsigned char v) { return (static_cast<float>(v) + 0.5f) / 256; });
    return (*this)(reals);
}

namespace Img {

namespace {

constexpr double integerCutoff = 0.390625;
constexpr std::pair<int, int> integerSizes[] = {{16, 16}, {64, 64},   {80, 64},
                                                {80, 96}, {108, 108}, {160, 160}};

/// Clamps a component to 2^30 and divides it by 2^6, so that the product with a byte of the table (at most
/// 127) fits.
int weighted(int component, int weight) {
    constexpr int limit = 1 << 30;
    return ((std::clamp(component, -limit, limit) + 32) >> 6) * weight;
}

} // namespace

IntWhiteningFilter::IntWhiteningFilter(int width, int height)
    : width_(static_cast<unsigned>(width)), height_(static_cast<unsigned>(height)) {
    if (std::ranges::find(integerSizes, std::pair(width, height)) == std::end(integerSizes)) {
        std::cerr << " WhiteningFilterClass wrong dimensions ! Please generate !" << std::endl;
        return;
    }
    fft_ = FNCountedPtr(new ImgFFTInt(width_, height_));
    const double peak = integerCutoff / std::numbers::sqrt2 * std::exp(-0.25);
    table_ = filterValues<unsigned char>(width, height, integerCutoff, [&](double value) {
        return static_cast<unsigned char>(std::lround(127 * value / peak));
    });
}

FNImage<short> IntWhiteningFilter::operator()(const FNImage<short>& image) const {
    if (table_.empty() || image.w() != width_ || image.h() != height_)
        FN_THROW(FNEBadArg, "IntWhiteningFilter: no filter for images of this size");
    FNImage<int> wide(width_, height_);
    std::transform(image.data(), image.data() + image.size(), wide.getExclusive(),
                   [](short v) { return v * (1 << 16); });
    const auto temporary = fft_->create();
    auto spectrum = fft_->transformReal(wide, temporary);
    FNComplex<int>* const values = spectrum.getExclusive();
    for (std::uint64_t i = 0; i < table_.size(); ++i)
        values[i] = {weighted(values[i].re, table_.data()[i]), weighted(values[i].im, table_.data()[i])};
    const auto filtered = fft_->inverse(spectrum, temporary);

    FNImage<short> result(width_, height_);
    std::transform(filtered.data(), filtered.data() + filtered.size(), result.getExclusive(),
                   [](FNComplex<int> v) {
                       using Limits = std::numeric_limits<short>;
                       return static_cast<short>(std::clamp<int>(v.re, Limits::min(), Limits::max()));
                   });
    return result;
}

} // namespace Img
