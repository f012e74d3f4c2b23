#include "img/fft/line_plan.h"

#include "fn/exception.h"
#include "img/fft/line_kernels.h"

#include <bit>
#include <cmath>
#include <numbers>

namespace Img::Fft {

namespace {

/// Radices of a smooth length: fours, then a two, then the odd ones, which do best without twiddle factors.
std::vector<std::uint32_t> radicesOf(std::uint32_t n, std::uint32_t largest) {
    std::vector<std::uint32_t> radices;
    for (; n % 4 == 0; n /= 4) radices.push_back(4);
    for (std::uint32_t r = 2; n > 1 && r <= largest; r += 1 + r % 2)
        for (; n % r == 0; n /= r) radices.push_back(r);
    if (n > 1) radices.clear();
    return radices;
}

template <class T> T factor(double value) {
    if constexpr (std::is_floating_point_v<T>)
        return static_cast<T>(value);
    else
        return static_cast<T>(std::lround(value * 2147483647.0));
}

/// Appends exp(-2 pi i k / n).
template <class T> void appendRoot(std::vector<T>& pairs, std::uint64_t k, std::uint64_t n) {
    const double angle = -2 * std::numbers::pi * static_cast<double>(k % n) / static_cast<double>(n);
    pairs.push_back(factor<T>(std::cos(angle)));
    pairs.push_back(factor<T>(std::sin(angle)));
}

} // namespace

template <class T> bool LinePlan<T>::isSmooth(std::uint32_t n) {
    return n == 1 || !radicesOf(n, largestRadix).empty();
}

template <class T> LinePlan<T>::LinePlan(std::uint32_t n_) : n(n_) {
    if (n < 2) FN_THROW(FNEBadArg, "FFT::FFT: At least 2 points must be given for transforms");
    if (isSmooth(n))
        makeStages();
    else if constexpr (std::is_floating_point_v<T>)
        makeConvolution();
    else
        FN_THROW(FNEBadArg,
                 "The generated FFT mixed radix rotation factors are not available for this configation!");
}

template <class T> std::uint32_t LinePlan<T>::totalShift() const {
    std::uint32_t sum = 0;
    for (const Stage& stage : stages) sum += stage.shift;
    return sum;
}

template <class T> void LinePlan<T>::makeStages() {
    std::uint32_t stride = 1, left = n;
    for (const std::uint32_t radix : radicesOf(n, largestRadix)) {
        const std::uint32_t groups = left / radix;
        const auto shift =
            std::is_floating_point_v<T> ? 0u : static_cast<std::uint32_t>(std::bit_width(radix - 1));
        stages.push_back({radix, groups, stride, shift, factors.size(), 0});
        for (std::uint32_t p = 0; p < groups; ++p)
            for (std::uint32_t k = 1; k < radix; ++k) appendRoot(factors, std::uint64_t{p} * k, left);
        stages.back().rotations = factors.size();
        if (radix % 2)
            for (std::uint32_t k = 0; k < radix; ++k) appendRoot(factors, k, radix);
        stride *= radix;
        left = groups;
    }
}

template <class T> void LinePlan<T>::makeConvolution() {
    convolution = std::make_unique<LinePlan>(std::bit_ceil(2 * n - 1));
    const std::uint32_t m = convolution->n;
    for (std::uint64_t k = 0; k < n; ++k) appendRoot(chirp, k * k, 2 * std::uint64_t{n});

    std::vector<T> conjugate(2 * std::size_t{m});
    for (std::uint32_t k = 0; k < n; ++k)
        for (const std::uint32_t place : {k, (m - k) % m}) {
            conjugate[2 * place] = chirp[2 * k] / static_cast<T>(m);
            conjugate[2 * place + 1] = -chirp[2 * k + 1] / static_cast<T>(m);
        }
    filter.resize(conjugate.size());
    Workspace<T> workspace;
    RowSource<T> row{.source = conjugate.data(), .complex = true, .lines = 1};
    row.segments[0].count = m;
    transformRows<T>(*convolution, row, {}, filter.data(), workspace);
}

template struct LinePlan<float>;
template struct LinePlan<std::int32_t>;

} // namespace Img::Fft
