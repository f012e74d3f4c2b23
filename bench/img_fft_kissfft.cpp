// The yardstick of the Fourier transforms: KissFFT.

#include <benchmark/benchmark.h>
#include <kiss_fftnd.h>
#include <kiss_fftndr.h>

#include <cstdlib>
#include <memory>
#include <vector>

namespace {

constexpr int sizes[2] = {160, 160};
constexpr std::size_t pixels = 160 * 160;

template <class Plan> using Handle = std::unique_ptr<std::remove_pointer_t<Plan>, void (*)(void*)>;

void kissForwardRealFloat(benchmark::State& state) {
    const Handle<kiss_fftndr_cfg> plan(kiss_fftndr_alloc(sizes, 2, 0, nullptr, nullptr), std::free);
    const std::vector<float> image(pixels, 0.5f);
    std::vector<kiss_fft_cpx> spectrum(160 * 81);
    for (auto _ : state) {
        kiss_fftndr(plan.get(), image.data(), spectrum.data());
        benchmark::DoNotOptimize(spectrum.data());
    }
}
BENCHMARK(kissForwardRealFloat)->Unit(benchmark::kMicrosecond);

void kiss120InversesFloat(benchmark::State& state) {
    const Handle<kiss_fftnd_cfg> plan(kiss_fftnd_alloc(sizes, 2, 1, nullptr, nullptr), std::free);
    const std::vector<kiss_fft_cpx> spectrum(pixels, kiss_fft_cpx{0.5f, 0.25f});
    std::vector<kiss_fft_cpx> image(pixels);
    for (auto _ : state)
        for (int i = 0; i < 120; ++i) {
            kiss_fftnd(plan.get(), spectrum.data(), image.data());
            benchmark::DoNotOptimize(image.data());
        }
}
BENCHMARK(kiss120InversesFloat)->Unit(benchmark::kMicrosecond);

} // namespace
