// Resampling of a 1080p 16-bit image to the sizes that the face search asks for.

#include "img/affine/primitives.h"
#include "img/affine/transform.h"

#include <benchmark/benchmark.h>

#include <random>

namespace {

FNImage<unsigned short> noise(std::uint32_t w, std::uint32_t h) {
    FNImage<unsigned short> image(w, h);
    std::minstd_rand engine(1);
    std::generate_n(image.getExclusive(), image.size(),
                    [&] { return static_cast<unsigned short>(engine()); });
    return image;
}

/// To 1920 / (state / 10) columns.
void scale1080p(benchmark::State& state) {
    const FNImage<unsigned short> source = noise(1920, 1080);
    const auto scaled = [&](std::uint32_t n) { return static_cast<std::uint32_t>(n * 10 / state.range(0)); };
    FNImage<unsigned short> level(scaled(1920), scaled(1080));
    for (auto _ : state) {
        Img::Affine::transform(source, level);
        benchmark::DoNotOptimize(level.data());
    }
}
BENCHMARK(scale1080p)->Arg(15)->Arg(30)->Arg(90)->Unit(benchmark::kMicrosecond);

void scale1080pFourToThree(benchmark::State& state) {
    using Img::Affine::Primitives::FourToThreeFractionalAveraging;
    const FNImage<unsigned short> source = noise(1920, 1080);
    FNImage<unsigned short> level = FourToThreeFractionalAveraging::createDst(1920, 1080);
    for (auto _ : state) {
        FourToThreeFractionalAveraging::scale(source, level);
        benchmark::DoNotOptimize(level.data());
    }
}
BENCHMARK(scale1080pFourToThree)->Unit(benchmark::kMicrosecond);

/// An 800 by 160 strip, turned, of a large float image.
void cutOutFloatStrip(benchmark::State& state) {
    FNImage<float> source(1000, 1000), strip(800, 160);
    source.fill(0.5f);
    for (auto _ : state) {
        Img::Affine::transform(source, strip, {100, 200}, {700, 100}, {-40, 150}, true, 0.0f);
        benchmark::DoNotOptimize(strip.data());
    }
}
BENCHMARK(cutOutFloatStrip)->Unit(benchmark::kMicrosecond);

/// A 23 by 23 patch, turned.
void cutOutPatch(benchmark::State& state) {
    const FNImage<unsigned short> source = noise(1920, 1080);
    FNImage<unsigned short> patch(23, 23);
    const float side = static_cast<float>(state.range(0));
    for (auto _ : state) {
        Img::Affine::transform(source, patch, {500, 500}, {side, side / 9}, {-side / 9, side}, true,
                               static_cast<unsigned short>(0));
        benchmark::DoNotOptimize(patch.data());
    }
}
BENCHMARK(cutOutPatch)->Arg(20)->Arg(40)->Arg(160)->Unit(benchmark::kMicrosecond);

} // namespace
