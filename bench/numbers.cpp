// Vector primitives, sign vectors, cascades and Gabor sign vectors: the plain form of each beside the fast
// one.

#include "eye/discriminator/cascaded_svm_discriminator.h"
#include "eye/gabor/window_convolver.h"
#include "eye/gabor/windowing_iterator.h"
#include "fn/numeric/sign_bits.h"
#include "fn/numeric/vector_primitives.h"

#include <benchmark/benchmark.h>

#include <random>

namespace {

using namespace Eye::Implementation;
using Signs = Fn::SignValueVector<int>;

template <class T> std::vector<T> randomValues(std::size_t n, unsigned seed) {
    std::mt19937 random(seed);
    std::vector<T> values(n);
    for (T& value : values) value = static_cast<T>(static_cast<int>(random() % 256) - 128);
    return values;
}

template <auto dot, class A, class B> void scalarProduct(benchmark::State& state) {
    const auto n = static_cast<std::size_t>(state.range(0));
    const auto a = randomValues<A>(n, 1);
    const auto b = randomValues<B>(n, 2);
    for (auto _ : state) benchmark::DoNotOptimize(dot(a.data(), b.data(), n));
    state.SetItemsProcessed(static_cast<std::int64_t>(n) * state.iterations());
}

using FloatDot = float (*)(const float*, const float*, std::size_t);
using FixedDot = std::int64_t (*)(const std::int8_t*, const std::int16_t*, std::size_t);
constexpr FloatDot plainFloat = Fn::Numeric::Plain::dot, fastFloat = Fn::Numeric::dot;
constexpr FixedDot plainFixed = Fn::Numeric::Plain::dot, fastFixed = Fn::Numeric::dot;
BENCHMARK(scalarProduct<plainFloat, float, float>)->Name("floatProductPlain")->Arg(5912);
BENCHMARK(scalarProduct<fastFloat, float, float>)->Name("floatProduct")->Arg(5912);
BENCHMARK(scalarProduct<plainFixed, std::int8_t, std::int16_t>)->Name("weightProductPlain")->Arg(20604);
BENCHMARK(scalarProduct<fastFixed, std::int8_t, std::int16_t>)->Name("weightProduct")->Arg(20604);

Signs randomSigns(std::uint32_t n, std::mt19937& random) {
    Fn::SVVectorSequentialBuilder<int> builder(n);
    while (builder.position() < n) builder.setNextSign(random() & 1);
    return builder.vector();
}

void signProductByTable(benchmark::State& state) {
    std::mt19937 random(3);
    const auto n = static_cast<std::uint32_t>(state.range(0));
    const Signs a = randomSigns(n, random), b = randomSigns(n, random);
    for (auto _ : state)
        benchmark::DoNotOptimize(Fn::Numeric::Plain::differingBits(a.bytes(), b.bytes(), a.byteCount()));
}
BENCHMARK(signProductByTable)->Arg(2048)->Arg(7072);

void signProduct(benchmark::State& state) {
    std::mt19937 random(3);
    const auto n = static_cast<std::uint32_t>(state.range(0));
    const Signs a = randomSigns(n, random), b = randomSigns(n, random);
    for (auto _ : state) benchmark::DoNotOptimize(a * b);
}
BENCHMARK(signProduct)->Arg(2048)->Arg(7072);

/// A machine all of whose steps pass, so that every support vector is seen.
template <class Disc> Disc cascade(std::size_t n, std::uint32_t dimension) {
    std::mt19937 random(4);
    TrainedSvm svm;
    svm.kernel = KernelTraits<typename Disc::KernelType>::trained;
    svm.kernelScale = 300;
    for (std::size_t i = 0; i < n; ++i) {
        svm.alphas.push_back(static_cast<float>(i % 7) - 3.5f);
        svm.supportVectors.push_back(randomSigns(dimension, random));
    }
    return Disc(svm, CascadeSettings{"", {{std::to_string(n), -1e30f}}});
}

template <class Disc, std::uint32_t dimension, bool fast> void windowThroughCascade(benchmark::State& state) {
    const auto disc = cascade<Disc>(static_cast<std::size_t>(state.range(0)), dimension);
    std::mt19937 random(5);
    const Signs window = randomSigns(disc.dimension(), random);
    std::vector<unsigned char> padded(disc.tables().stride);
    std::copy_n(window.bytes(), window.byteCount(), padded.begin());
    float score = 0;
    std::int64_t sum = 0;
    for (auto _ : state) {
        if (fast)
            benchmark::DoNotOptimize(disc(window, score));
        else
            benchmark::DoNotOptimize(
                Plain::evaluateCascade(disc.tables(), disc.kernel(), padded.data(), sum));
    }
}
using Dot = CascadedSvmDiscriminator<DotKernel, CombinedSods16x16>;
using Sods = CascadedSvmDiscriminator<FpKernelDeg2, CombinedSods16x16>;
using Final = CascadedSvmDiscriminator<FpKernelDeg2, TrainedLayout>;
BENCHMARK(windowThroughCascade<Dot, 1924, false>)->Name("dotCascadePlain")->Arg(1)->Arg(2)->Arg(6);
BENCHMARK(windowThroughCascade<Dot, 1924, true>)->Name("dotCascade")->Arg(1)->Arg(2)->Arg(6);
BENCHMARK(windowThroughCascade<Sods, 1924, false>)->Name("polynomialCascadePlain")->Arg(300);
BENCHMARK(windowThroughCascade<Sods, 1924, true>)->Name("polynomialCascade")->Arg(300);
BENCHMARK(windowThroughCascade<Final, 7072, false>)->Name("finalDeciderPlain")->Arg(200);
BENCHMARK(windowThroughCascade<Final, 7072, true>)->Name("finalDecider")->Arg(200);

FNImage<unsigned short> noise(std::uint32_t w, std::uint32_t h) {
    std::mt19937 random(6);
    FNImage<unsigned short> image(w, h);
    std::generate_n(image.getExclusive(), image.size(),
                    [&] { return static_cast<unsigned short>(random()); });
    return image;
}

template <class Settings> void gaborSodsOfWindow(benchmark::State& state) {
    const auto image = noise(64, 64);
    const Eye::Cara::Impl::FastSpatialGaborConvolver<unsigned short, int, Settings> convolver;
    for (auto _ : state) benchmark::DoNotOptimize(convolver.getGaborSODs(image, {11, 7}));
}
BENCHMARK(gaborSodsOfWindow<Eye::Cara::Impl::SpatialGaborConvolverSettings_T8>)->Name("gaborSodsOf17x17");
BENCHMARK(gaborSodsOfWindow<Eye::Cara::Impl::SpatialGaborConvolverSettings_T8_FinalDecider>)
    ->Name("gaborSodsOf23x23");

using Patch = Eye::Ojo::T8::ConvolverSettings<25, 25>;
using PatchConvolver = Eye::Ojo::T8::FastSpatialGaborConvolver<unsigned short, int, Patch>;

void gaborSodsOfPatch29x29(benchmark::State& state) {
    const auto patch = noise(29, 29);
    const PatchConvolver convolver;
    PatchConvolver::ConvolutionData data;
    for (auto _ : state) {
        convolver.calculateResponses(patch, data);
        benchmark::DoNotOptimize(convolver.getAllGaborSODs(data));
    }
}
BENCHMARK(gaborSodsOfPatch29x29);

void gaborSodsOfPatch29x29Plain(benchmark::State& state) {
    const auto patch = noise(29, 29);
    PatchConvolver::ConvolutionData data;
    std::vector<unsigned char> rows(8 * 32);
    unsigned char* bytes[8];
    for (unsigned i = 0; i < 8; ++i) bytes[i] = rows.data() + 32 * i;
    for (auto _ : state) {
        Eye::Gabor::Plain::computeResponses(Eye::Gabor::kernelRep<6>(), patch.data(), 29, 1, data);
        for (std::uint32_t y = 0; y < 25; ++y) Eye::Gabor::Plain::compareInPatch(data, y, bytes);
        benchmark::DoNotOptimize(rows.data());
    }
}
BENCHMARK(gaborSodsOfPatch29x29Plain);

void windowsOfPatch29x29(benchmark::State& state) {
    const auto patch = noise(29, 29);
    const PatchConvolver convolver;
    PatchConvolver::ConvolutionData data;
    convolver.calculateResponses(patch, data);
    const auto sods = convolver.getAllGaborSODs(data);
    for (auto _ : state)
        for (Eye::Ojo::T8::GSodWindowingIterator<7, 7, 6> window(sods); !window.atEnd(); ++window)
            benchmark::DoNotOptimize(*window);
}
BENCHMARK(windowsOfPatch29x29);

} // namespace
