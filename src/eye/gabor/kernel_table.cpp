#include "eye/gabor/kernel_table.h"

#include <cmath>
#include <numbers>

namespace Eye::Gabor {
namespace {

constexpr double gaborSigma = 1.8849555921538759; // 0.6 pi
constexpr double waveNumber = 2.221441469079183;  // pi / sqrt(2)
constexpr double range = 26754.959963839727;      // 32768 sqrt(2/3)

/// Half away from zero.
std::int32_t rounded(double v) {
    return static_cast<std::int32_t>(v >= 0 ? std::trunc(v + 0.5) : -std::trunc(0.5 - v));
}

template <class Function> KernelTable::Taps tapsOf(Function f) {
    KernelTable::Taps result;
    for (unsigned t = 0; t < taps; ++t) result[t] = rounded(f(static_cast<double>(t) - 2));
    return result;
}

const KernelTable table6(6), table8(8);

} // namespace

KernelTable::KernelTable(unsigned directions_) : directions(directions_) {
    const double g = -waveNumber * waveNumber / (2 * gaborSigma * gaborSigma);
    double sum = 0;
    for (int i = -2; i <= 2; ++i) sum += std::exp(g * i * i);
    const double amplitude = std::trunc(range / sum);
    const auto G = [=](double i) { return amplitude * std::exp(g * i * i); };

    dc = tapsOf([&](double i) { return -G(i) * std::exp(-gaborSigma * gaborSigma / 2); });
    gauss = tapsOf(G);
    for (unsigned m = 0; m <= directions / 2; ++m) {
        const double angle = m * std::numbers::pi / directions;
        const double kx = waveNumber * std::cos(angle), ky = waveNumber * std::sin(angle);
        cosX[m] = tapsOf([&](double i) { return G(i) * std::cos(i * kx); });
        sinX[m] = tapsOf([&](double i) { return -G(i) * std::sin(i * kx); });
        cosY[m] = tapsOf([&](double i) { return G(i) * std::cos(i * ky); });
        sinY[m] = tapsOf([&](double i) { return -G(i) * std::sin(i * ky); });
    }
}

template <> const KernelTable& kernelRep<6>() {
    return table6;
}

template <> const KernelTable& kernelRep<8>() {
    return table8;
}

} // namespace Eye::Gabor
