#include "cmp/gabor_bank.h"

#include "img/gabor/gabor_filter.h"

#include <cmath>
#include <numbers>

namespace Cmp::Implementation {

namespace {

using Complex = FNComplex<float>;

constexpr double magnitudeFloor = 1e-6;

SparseImage<Complex> multiply(const FNImage<Complex>& spectrum, const SparseImage<float>& filter) {
    FNImage<Complex> product(filter.data().w(), filter.data().h());
    Complex* out = product.getExclusive();
    const float* weight = filter.data().data();
    const PixelBlockRanges& pixels = filter.pixels();
    for (std::uint32_t j = 0; j < filter.data().h(); ++j) {
        const Complex* const row = spectrum.row(filter.lines()[j]);
        for (std::uint32_t x = pixels.begin; x < pixels.end; ++x) *out++ = row[x] * *weight++;
        for (std::uint32_t x = pixels.secondBegin; x < pixels.secondEnd; ++x) *out++ = row[x] * *weight++;
    }
    return {product, filter.pixels(), filter.lines(), filter.w(), filter.h()};
}

FNImage<float> squaredMagnitudes(const FNImage<Complex>& image) {
    FNImage<float> magnitudes(image.w(), image.h());
    std::transform(image.data(), image.data() + image.size(), magnitudes.getExclusive(), norm<float>);
    return magnitudes;
}

} // namespace

GaborBank::GaborBank(unsigned int width, unsigned int height, const std::vector<Scale>& scales,
                     unsigned int angles, double sigma, float threshold)
    : fft_(width, height), angles_(angles), scales_(scales) {
    FNImage<Complex> filter(width, height);
    for (const Scale& scale : scales) {
        std::vector<std::uint32_t>& index = columnIndex_.emplace_back(width);
        for (std::uint32_t i = 0; i < scale.columns.size(); ++i) index.at(scale.columns[i]) = i;
        for (unsigned int a = 0; a < angles; ++a) {
            const double angle = a * std::numbers::pi / angles;
            Img::gaborInFourier(sigma, FN2Vector<double>(std::cos(angle), std::sin(angle)) * scale.waveNumber,
                                filter, magnitudeFloor);
            filters_.push_back(Img::pruneGaborImage(filter, threshold));
        }
    }
}

GaborBank::Responses GaborBank::respond(const FNImage<float>& image) const {
    const auto temporary = fft_.create();
    const FNImage<Complex> spectrum = fft_.transformReal(image, temporary);
    Responses responses(*this);
    for (std::size_t i = 0; i < filters_.size(); ++i)
        responses.filters_.push_back(squaredMagnitudes(fft_.processColumnsSparse(
            multiply(spectrum, filters_[i]), scales_[i / angles_].columns, temporary)));
    return responses;
}

GaborBank::Responses GaborBank::respondPlain(const FNImage<float>& image) const {
    const auto temporary = fft_.create();
    const FNImage<Complex> spectrum = fft_.transformReal(image, temporary);
    Responses responses(*this);
    for (std::size_t i = 0; i < filters_.size(); ++i) {
        const FNImage<float> weights(filters_[i]);
        FNImage<Complex> product(image.w(), image.h());
        std::transform(spectrum.data(), spectrum.data() + spectrum.size(), weights.data(),
                       product.getExclusive(), [](Complex value, float weight) { return value * weight; });
        const FNImage<float> everywhere = squaredMagnitudes(fft_.inverse(product, temporary));
        const std::vector<std::uint32_t>& columns = scales_[i / angles_].columns;
        FNImage<float> selected(static_cast<std::uint32_t>(columns.size()), image.h());
        float* out = selected.getExclusive();
        for (std::uint32_t y = 0; y < image.h(); ++y)
            for (const std::uint32_t x : columns) *out++ = everywhere(x, y);
        responses.filters_.push_back(selected);
    }
    return responses;
}

} // namespace Cmp::Implementation
