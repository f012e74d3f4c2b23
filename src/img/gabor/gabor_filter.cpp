#include "img/gabor/gabor_filter.h"

#include <cmath>
#include <numbers>

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

} // namespace Img
