// One B7 feature, stage by stage, and products of features. The projection has weights of noise.

#include "cmp/b7/encoder.h"
#include "cmp/b7/preprocessor.h"
#include "cmp/b7/reshape_warp.h"
#include "cmp/multiply_digitized.h"

#include <benchmark/benchmark.h>

#include <random>

namespace {

using namespace Cmp::B7;

FNImage<float> noise(std::uint32_t w, std::uint32_t h) {
    std::mt19937 random(1);
    FNImage<float> image(w, h);
    std::generate_n(image.getExclusive(), image.size(),
                    [&] { return static_cast<float>(random() % 256) / 255; });
    return image;
}

const PreProcessor& processor() {
    static const PreProcessor instance;
    return instance;
}

void buildBank(benchmark::State& state) {
    for (auto _ : state) benchmark::DoNotOptimize(PreProcessor());
}
BENCHMARK(buildBank)->Unit(benchmark::kMillisecond);

void warp(benchmark::State& state) {
    const FNImage<float> image = noise(640, 480);
    float padding;
    for (auto _ : state)
        benchmark::DoNotOptimize(reshapeWarp(image, {280, 200}, {360, 210}, {310, 290}, {318, 203}, padding));
}
BENCHMARK(warp)->Unit(benchmark::kMillisecond);

void supportNorm(benchmark::State& state, bool plain) {
    const FNImage<float> face = noise(warpedSize, warpedSize);
    const Img::SupportNorm norm(4.0f, 6, 0.007f, 1.007f);
    for (auto _ : state) benchmark::DoNotOptimize(plain ? norm.plain(face) : norm(face));
}
BENCHMARK_CAPTURE(supportNorm, plain, true)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(supportNorm, fast, false)->Unit(benchmark::kMillisecond);

void normalize(benchmark::State& state) {
    const FNImage<float> face = noise(warpedSize, warpedSize);
    const PreProcessor& made = processor();
    for (auto _ : state) benchmark::DoNotOptimize(made.normalize(face));
}
BENCHMARK(normalize)->Unit(benchmark::kMillisecond);

void respond(benchmark::State& state, bool plain) {
    const FNImage<float> face = processor().normalize(noise(warpedSize, warpedSize));
    const auto& bank = processor().bank();
    for (auto _ : state) benchmark::DoNotOptimize(plain ? bank.respondPlain(face) : bank.respond(face));
}
BENCHMARK_CAPTURE(respond, plain, true)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(respond, fast, false)->Unit(benchmark::kMillisecond);

void rank(benchmark::State& state, bool plain) {
    const auto responses = processor().bank().respond(processor().normalize(noise(warpedSize, warpedSize)));
    for (auto _ : state)
        benchmark::DoNotOptimize(plain ? processor().extractPlain(responses)
                                       : processor().extract(responses));
}
BENCHMARK_CAPTURE(rank, plain, true)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(rank, fast, false)->Unit(benchmark::kMillisecond);

/// The integers of the projection.
void project(benchmark::State& state, bool plain) {
    std::minstd_rand random(1);
    Fn::Matrix<signed char> m(20608, 5912);
    std::generate_n(m.getExclusive(), m.size(), [&] { return static_cast<signed char>(random()); });
    FNVector<short> v(20608);
    std::generate_n(v.getExclusive(), v.size(), [&] { return static_cast<short>(random() % 1000); });
    const Cmp::FPMatVecMultiplier multiplier;
    for (auto _ : state)
        benchmark::DoNotOptimize(plain ? multiplier.leftMultiplyPlain(v, m) : multiplier.leftMultiply(v, m));
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(m.size()));
}
BENCHMARK_CAPTURE(project, plain, true)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(project, fast, false)->Unit(benchmark::kMillisecond);

void decode(benchmark::State& state) {
    const Encoder encoder;
    const auto bytes = encoder.createEncodedType();
    FixedPointFeature feature = encoder.createRawFixedType();
    for (auto _ : state) {
        encoder.decode(bytes.data(), feature);
        benchmark::DoNotOptimize(feature.vector.get());
    }
}
BENCHMARK(decode)->Unit(benchmark::kMicrosecond);

void products(benchmark::State& state, int pairs) {
    const Encoder encoder;
    const auto a = encoder.createRawFixedType(), b = encoder.createRawFixedType();
    const auto c = encoder.createRawFixedType(), d = encoder.createRawFixedType();
    float out[4];
    for (auto _ : state) {
        if (pairs == 1)
            out[0] = encoder.wordDotProduct(a.vector.get(), b.vector.get());
        else
            encoder.wordDotProduct(a.vector.get(), b.vector.get(), c.vector.get(), d.vector.get(), out);
        benchmark::DoNotOptimize(out);
    }
    state.SetItemsProcessed(state.iterations() * pairs);
}
BENCHMARK_CAPTURE(products, one, 1)->Unit(benchmark::kMicrosecond);
BENCHMARK_CAPTURE(products, four, 4)->Unit(benchmark::kMicrosecond);

/// The same from packed features, with 1 and 5 others.
void packedProducts(benchmark::State& state) {
    const Encoder encoder;
    const auto bytes = encoder.createEncodedType();
    const unsigned char* const packed = bytes.data() + Encoder::headerSize;
    const std::vector<const unsigned char*> features(static_cast<std::size_t>(state.range(0)), packed);
    const auto probes = encoder.packedProducts().prepare(features);
    std::vector<PackedProducts::Sums> sums(probes.size());
    for (auto _ : state) {
        encoder.packedProducts().sums(packed, probes, sums.data());
        benchmark::DoNotOptimize(sums.data());
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
}
BENCHMARK(packedProducts)->Arg(1)->Arg(5)->Unit(benchmark::kMicrosecond);

} // namespace
