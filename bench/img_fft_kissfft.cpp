// The yardstick of the Fourier transforms: KissFFT.

#include <benchmark/benchmark.h>
#include <kiss_fftnd.h>
#include <kiss_fftr.h>

#include <cstdlib>
#include <memory>
#include <vector>

namespace {

constexpr int sizes[2] = {160, 160};
constexpr std::size_t pixels = 160 * 160;

template <class Plan> using Handle = std::unique_ptr<std::remove_pointer_t<Plan>, void (*)(void*)>;

/// Rows, then the 81 columns that are no mirror images; kiss_fftndr, which does the same, crashes in the
/// distribution's build.
void kissForwardRealFloat(benchmark::State& state) {
    const Handle<kiss_fftr_cfg> rows(kiss_fftr_alloc(160, 0, nullptr, nullptr), std::free);
    const Handle<kiss_fft_cfg> columns(kiss_fft_alloc(160, 0, nullptr, nullptr), std::free);
    const std::vector<float> image(pixels, 0.5f);
    std::vector<kiss_fft_cpx> half(160 * 81), column(160), spectrum(160 * 81);
    for (auto _ : state) {
        for (int y = 0; y < 160; ++y) kiss_fftr(rows.get(), image.data() + 160 * y, half.data() + 81 * y);
        for (int x = 0; x < 81; ++x) {
            kiss_fft_stride(columns.get(), half.data() + x, column.data(), 81);
            for (int y = 0; y < 160; ++y) spectrum[81 * y + x] = column[y];
        }
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
