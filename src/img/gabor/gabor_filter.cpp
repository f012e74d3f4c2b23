#include "img/gabor/gabor_filter.h"

#include <cmath>
#include <numbers>
#include <vector>

namespace Img {

void gaborInFourier(double sigma, FN2Vector<double> k, FNImage<FNComplex<float>>& image, double eps) {
    constexpr double pi = std::numbers::pi;
    constexpr int aliases = 3;
    const double w = image.w(), h = image.h();
    const double C = 2 * pi * pi * sigma * sigma / dot(k, k);
    const double least = std::log(eps / (w * h));
    const auto term = [=](double exponent) { return exponent > least ? std::exp(exponent) : 0; };
    const FN2Vector<double> centre = k / (2 * pi);

    FNComplex<float>* out = image.getExclusive();
    for (std::uint32_t Y = 0; Y < image.h(); ++Y)
        for (std::uint32_t X = 0; X < image.w(); ++X) {
            double sum = 0;
            for (int n = -aliases; n <= aliases; ++n)
                for (int m = -aliases; m <= aliases; ++m) {
                    const FN2Vector<double> f(X / w + n, Y / h + m), difference = f - centre;
                    sum += term(-C * dot(difference, difference)) - term(-sigma * sigma / 2 - C * dot(f, f));
                }
            *out++ = {static_cast<float>(2 * pi * sum), 0};
        }
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
