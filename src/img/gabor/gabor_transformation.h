#pragma once

#include "img/fft/img_fft.h"
#include "img/gabor/gabor_filter.h"

#include <cmath>
#include <numbers>
#include <vector>

/// Float Gabor responses of small blocks, and features from them, for the assessment of portraits.
///
///     const Img::Gabor::GaborFourierTransformation<float, Img::Gabor::TransformationParameters<16, 16, 0, 2,
///     6>> gabor; const Img::FeatureVector<float> features =
///         Img::Gabor::MRIComponentsExtractor::extract<Img::MaskGridParameters<16, 16, 3, 6,
///         1>>(gabor.transform(block));

namespace Img::Gabor {

/// Blocks of width by height pixels; filters of the wave numbers pi * sqrt(2)^-s for s from firstScale to
/// endScale - 1, each in `directions` orientations k * pi / directions.
template <std::uint32_t width_, std::uint32_t height_, unsigned firstScale_, unsigned endScale_,
          unsigned directions_>
struct TransformationParameters {
    static constexpr std::uint32_t width = width_, height = height_;
    static constexpr unsigned firstScale = firstScale_, endScale = endScale_, directions = directions_;
    static constexpr unsigned filters = (endScale - firstScale) * directions;
};

/// The responses of all filters, by scale and in each by orientation.
using ResponseImages = std::vector<FNImage<FNComplex<float>>>;

template <class T, class Parameters> class GaborFourierTransformation;

/// Immutable once constructed; may be used by any number of threads.
template <class Parameters> class GaborFourierTransformation<float, Parameters> {
public:
    GaborFourierTransformation() : fft_(Parameters::width, Parameters::height) {
        constexpr double sigma = 0.8 * std::numbers::pi, magnitudeFloor = 1e-6;
        for (unsigned s = Parameters::firstScale; s < Parameters::endScale; ++s)
            for (unsigned d = 0; d < Parameters::directions; ++d) {
                const double angle = d * std::numbers::pi / Parameters::directions;
                const double waveNumber =
                    std::numbers::pi * std::pow(std::numbers::sqrt2, -static_cast<double>(s));
                FNImage<FNComplex<float>> filter(Parameters::width, Parameters::height);
                gaborInFourier(sigma, FN2Vector<double>(std::cos(angle), std::sin(angle)) * waveNumber,
                               filter, magnitudeFloor);
                filters_.push_back(filter);
            }
    }

    /// Filters an image of width by height pixels. Responses are width * height times those of a normalised
    /// transform.
    /// @throws FNEBadArg for another size
    ResponseImages transform(const FNImage<float>& image) const {
        const auto temporary = fft_.create();
        const FNImage<FNComplex<float>> spectrum = fft_.transformReal(image, temporary);
        ResponseImages responses;
        for (const auto& filter : filters_) {
            FNImage<FNComplex<float>> product(spectrum.w(), spectrum.h());
            std::transform(spectrum.data(), spectrum.data() + spectrum.size(), filter.data(),
                           product.getExclusive(),
                           [](FNComplex<float> value, FNComplex<float> weight) { return value * weight.re; });
            responses.push_back(fft_.inverse(product, temporary));
        }
        return responses;
    }

private:
    ImgFFTFloat fft_;
    std::vector<FNImage<FNComplex<float>>> filters_;
};

} // namespace Img::Gabor
