// Fourier transforms of 160 by 160 pixels, the size of a normalised face.

#include "img/fft/img_fft.h"

#include <benchmark/benchmark.h>

#include <cmath>
#include <random>

namespace {

constexpr unsigned size = 160;
constexpr int filters = 120;

template <class T> FNImage<T> noise() {
    FNImage<T> image(size, size);
    std::minstd_rand engine(1);
    std::generate_n(image.getExclusive(), image.size(), [&] { return static_cast<T>(engine() % 1000); });
    return image;
}

void forwardRealFloat(benchmark::State& state) {
    const ImgFFTFloat fft(size, size);
    const auto temporary = fft.create();
    const FNImage<float> image = noise<float>();
    for (auto _ : state) benchmark::DoNotOptimize(fft.transformReal(image, temporary));
}
BENCHMARK(forwardRealFloat)->Unit(benchmark::kMicrosecond);

void forwardRealFixedPoint(benchmark::State& state) {
    const ImgFFTInt fft(size, size);
    const auto temporary = fft.create();
    const FNImage<int> image = noise<int>();
    for (auto _ : state) benchmark::DoNotOptimize(fft.transformReal(image, temporary));
}
BENCHMARK(forwardRealFixedPoint)->Unit(benchmark::kMicrosecond);

void inverseFloat(benchmark::State& state) {
    const ImgFFTFloat fft(size, size);
    const auto temporary = fft.create();
    const auto spectrum = fft.transformReal(noise<float>(), temporary);
    for (auto _ : state) benchmark::DoNotOptimize(fft.inverse(spectrum, temporary));
}
BENCHMARK(inverseFloat)->Unit(benchmark::kMicrosecond);

/// Band filters of many sizes, as a filter bank has them: lines and pixels around a middle that circles the
/// origin, cut in two where it wraps around.
template <class T>
std::vector<SparseImage<FNComplex<T>>> filteredSpectra(const FNImage<FNComplex<T>>& spectrum) {
    std::vector<SparseImage<FNComplex<T>>> spectra;
    for (int i = 0; i < filters; ++i) {
        const double radius = size / 2.83 * std::exp2(-(i / 12) / 4.0), angle = i % 12 * 0.2618;
        const auto ranges = [&](double middle) {
            const int reach = static_cast<int>(radius * 0.55) + 1, n = static_cast<int>(size);
            const int begin = static_cast<int>(middle) - reach, end = static_cast<int>(middle) + reach;
            const auto u = [](int v) { return static_cast<std::uint32_t>(v); };
            if (begin >= 0) return PixelBlockRanges{u(begin), u(std::min(end, n)), 0, 0};
            if (end <= 0) return PixelBlockRanges{u(begin + n), u(end + n), 0, 0};
            return PixelBlockRanges{0, u(end), u(begin + n), u(n)};
        };
        spectra.emplace_back(spectrum, ranges(radius * std::cos(angle)), ranges(radius * std::sin(angle)));
    }
    return spectra;
}

template <class Fft, class T> void sparseInverses(benchmark::State& state) {
    const Fft fft(size, size);
    const auto temporary = fft.create();
    const auto spectra = filteredSpectra(fft.transformReal(noise<T>(), temporary));
    std::vector<std::uint32_t> columns; // the 104 that the grids of a face's features touch
    for (std::uint32_t x = 20; x < 145; ++x)
        if (x % 6 < 5) columns.push_back(x);
    for (auto _ : state)
        for (const auto& spectrum : spectra)
            benchmark::DoNotOptimize(fft.processColumnsSparse(spectrum, columns, temporary));
    state.counters["columns"] = static_cast<double>(columns.size());
}

void sparseInversesFloat(benchmark::State& state) {
    sparseInverses<ImgFFTFloat, float>(state);
}
BENCHMARK(sparseInversesFloat)->Unit(benchmark::kMicrosecond);

void sparseInversesFixedPoint(benchmark::State& state) {
    sparseInverses<ImgFFTInt, int>(state);
}
BENCHMARK(sparseInversesFixedPoint)->Unit(benchmark::kMicrosecond);

} // namespace
