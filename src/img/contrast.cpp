#include "img/contrast.h"

#include <algorithm>
#include <cmath>

namespace Img {

template <class T> FNImage<T> normalizeContrast(const FNImage<T>& image) {
    double sum = 0;
    for (const T pixel : std::span(image.data(), image.size())) sum += double{pixel} * double{pixel};
    if (sum == 0) return image;
    const double factor = 1 / std::sqrt(sum);
    FNImage<T> result(image.w(), image.h());
    std::transform(image.data(), image.data() + image.size(), result.getExclusive(),
                   [&](T pixel) { return static_cast<T>(double{pixel} * factor); });
    return result;
}

template <class T> FNImage<T> realPart(const FNImage<FNComplex<T>>& image) {
    FNImage<T> result(image.w(), image.h());
    std::transform(image.data(), image.data() + image.size(), result.getExclusive(),
                   [](const FNComplex<T>& pixel) { return pixel.re; });
    return result;
}

template FNImage<float> normalizeContrast(const FNImage<float>&);
template FNImage<float> realPart(const FNImage<FNComplex<float>>&);

} // namespace Img
