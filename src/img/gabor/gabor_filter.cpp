#include "img/gabor/gabor_filter.h"

#include <cmath>
#include <numbers>
#include <vector>

namespace Img {

namespace {

/// The Gaussian around a frequency along one axis, for each of the samples: exponents, and what they give. A
/// Gaussian of two axes is the product of two of these. Aliases that are too small for any sum are left out.
class AxisGaussian {
public:
    struct Alias {
        double exponent, value;
    };

    /// @param C width, as in the exponent -C * f^2 @param least exponents have to be above it
    AxisGaussian(std::uint32_t samples, double centre, double C, double least) : aliases_(samples) {
        constexpr int aliases = 3;
        for (std::uint32_t i = 0; i < samples; ++i)
            for (int n = -aliases; n <= aliases; ++n) {
                const double f = static_cast<double>(i) / samples + n - centre, exponent = -C * f * f;
                if (exponent > least) aliases_[i].push_back({exponent, std::exp(exponent)});
            }
    }
    const std::vector<Alias>& operator[](std::uint32_t i) const { return aliases_[i]; }

private:
    std::vector<std::vector<Alias>> aliases_;
};

/// Sum over both axes of what is above the least exponent.
double sumOf(const std::vector<AxisGaussian::Alias>& horizontal,
             const std::vector<AxisGaussian::Alias>& vertical, double least) {
    double sum = 0;
    for (const auto& x : horizontal)
        for (const auto& y : vertical)
            if (x.exponent + y.exponent > least) sum += x.value * y.value;
    return sum;
}

} // namespace

void gaborInFourier(double sigma, FN2Vector<double> k, FNImage<FNComplex<float>>& image, double eps) {
    constexpr double pi = std::numbers::pi;
    const double C = 2 * pi * pi * sigma * sigma / dot(k, k), offset = -sigma * sigma / 2;
    const double least = std::log(eps / (static_cast<double>(image.w()) * image.h()));
    const FN2Vector<double> centre = k / (2 * pi);
    const AxisGaussian x(image.w(), centre.x, C, least), y(image.h(), centre.y, C, least);
    const AxisGaussian x0(image.w(), 0, C, least - offset), y0(image.h(), 0, C, least - offset);
    const double factor = 2 * pi, factor0 = factor * std::exp(offset);

    FNComplex<float>* out = image.getExclusive();
    for (std::uint32_t Y = 0; Y < image.h(); ++Y)
        for (std::uint32_t X = 0; X < image.w(); ++X)
            *out++ = {static_cast<float>(factor * sumOf(x[X], y[Y], least) -
                                         factor0 * sumOf(x0[X], y0[Y], least - offset)),
                      0};
}

namespace {

/// The used indexes as two ranges at most, which leave out the longest stretch between them.
PixelBlockRanges rangesOf(const std::vector<bool>& used) {
    std::uint32_t begin = 0, end = 0, gapBegin = 0, gapEnd = 0;
    for (std::uint32_t i = 0; i < used.size(); ++i) {
        if (!used[i]) continue;
        if (end == 0)
            begin = i;
        else if (i - end > gapEnd - gapBegin) {
            gapBegin = end;
            gapEnd = i;
        }
        end = i + 1;
    }
    return gapEnd == 0 ? PixelBlockRanges{begin, end} : PixelBlockRanges{begin, gapBegin, gapEnd, end};
}

} // namespace

SparseImage<float> pruneGaborImage(const FNImage<FNComplex<float>>& filter, float threshold) {
    std::vector<bool> columns(filter.w()), rows(filter.h());
    FNImage<float> kept(filter.w(), filter.h());
    float* out = kept.getExclusive();
    for (std::uint32_t y = 0; y < filter.h(); ++y)
        for (std::uint32_t x = 0; x < filter.w(); ++x, ++out) {
            const float value = filter(x, y).re;
            *out = std::abs(value) >= threshold ? value : 0.0f;
            if (*out != 0) columns[x] = rows[y] = true;
        }
    return SparseImage<float>(kept, rangesOf(columns), rangesOf(rows));
}

} // namespace Img
