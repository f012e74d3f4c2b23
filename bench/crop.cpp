// What it costs to cut a portrait to the standard's pictures, on noise: from a picture of 1920 by 1080 pixels
// with eyes 160 pixels apart, from a portrait of 600 by 800 with eyes 120 apart, and where the box passes the
// border.

#include "fn/deployment/app_config_db.h"
#include "kx/full_frontal_creator.h"
#include "kx/token_face.h"

#include <benchmark/benchmark.h>

#include <random>

namespace {

template <class T> FNImageReference noise(std::uint32_t w, std::uint32_t h) {
    std::mt19937 random(1);
    FNImage<T> image(w, h);
    std::generate_n(image.getExclusive(), image.size(), [&] {
        const auto value = [&] { return static_cast<unsigned char>(random()); };
        if constexpr (sizeof(T) == 1)
            return value();
        else
            return T(value(), value(), value());
    });
    return FNImageReferenceFactory::create(image);
}

Cmp::Face face(const FNImageReference& image, FNPos left, FNPos right) {
    return Cmp::Face(image, {left, 0, 1}, {right, 0, 1});
}

template <class T> const Cmp::Face& photo() {
    static const Cmp::Face instance = face(noise<T>(1920, 1080), {880, 400}, {1040, 404});
    return instance;
}
template <class T> const Cmp::Face& portrait() {
    static const Cmp::Face instance = face(noise<T>(600, 800), {240, 330}, {360, 332});
    return instance;
}
const Cmp::Face& closeUp() {
    static const Cmp::Face instance = face(noise<Fn::Bgra32>(600, 800), {180, 330}, {420, 332});
    return instance;
}

template <class Cut> void cut(benchmark::State& state, const Cmp::Face& face, Cut produce) {
    for (auto _ : state) benchmark::DoNotOptimize(produce(face).image().w());
    state.SetLabel(std::to_string(produce(face).image().w()) + " x " +
                   std::to_string(produce(face).image().h()));
}

Cmp::Face token(const Cmp::Face& face) {
    return Kx::TokenFace::produceImage(face, 1, {192, 192, 192});
}
Cmp::Face minimalToken(const Cmp::Face& face) {
    return Kx::TokenFace::produceMinimalImage(face, 1, {192, 192, 192});
}
Cmp::Face frontal(const Cmp::Face& face) {
    using namespace Fn::Deployment;
    using Kx::FullFrontal::Creator;
    static const Creator creator(Component(FNCountedPtr<AppConfigDB>(new AppVolatileConfigDB),
                                           Property(type<Creator>(), "Crop", "", "", false)));
    return creator.extract(face);
}

BENCHMARK_CAPTURE(cut, tokenOf1080p, photo<Fn::Bgra32>(), token)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(cut, tokenOfGray1080p, photo<unsigned char>(), token)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(cut, tokenOfPortrait, portrait<Fn::Bgra32>(), token)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(cut, tokenOfGrayPortrait, portrait<unsigned char>(), token)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(cut, tokenOfCloseUp, closeUp(), token)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(cut, minimalTokenOf1080p, photo<Fn::Bgra32>(), minimalToken)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(cut, minimalTokenOfPortrait, portrait<Fn::Bgra32>(), minimalToken)
    ->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(cut, frontalOf1080p, photo<Fn::Bgra32>(), frontal)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(cut, frontalOfPortrait, portrait<Fn::Bgra32>(), frontal)->Unit(benchmark::kMillisecond);

} // namespace
