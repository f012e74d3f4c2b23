// What a portrait costs, on noise: all values of a colour portrait of 600 by 800 pixels with known eyes, the
// two that enrolment needs, and the parts.

#include "cmp/portrait/analyzer.h"
#include "cmp/portrait/background_uniformity.h"
#include "cmp/portrait/pixel_measures.h"
#include "cmp/portrait/portrait_features.h"
#include "fn/deployment/app_config_db.h"

#include <benchmark/benchmark.h>

#include <random>

namespace {

using namespace Cmp::Portrait;
using Eye = PortraitFeatures::Eye;

constexpr FNPos leftEye(240, 330), rightEye(360, 332);

const FNImageReference& picture() {
    static const FNImageReference instance = [] {
        std::mt19937 random(1);
        FNImage<Fn::Bgra32> image(600, 800);
        std::generate_n(image.getExclusive(), image.size(), [&] {
            const auto value = [&] { return static_cast<unsigned char>(random()); };
            return Fn::Bgra32(value(), value(), value());
        });
        return FNImageReferenceFactory::create(image);
    }();
    return instance;
}

const Cmp::Face& face() {
    static const Cmp::Face instance(picture(), {leftEye, 120, 1}, {rightEye, 120, 1});
    return instance;
}

const FNImage<float>& portrait() {
    static const FNImage<float> instance = portraitOf(face(), standardPortrait);
    return instance;
}

const PortraitFeatures& features() {
    static const PortraitFeatures instance{FNMutex()};
    return instance;
}

const Analyzer& analyzer() {
    using namespace Fn::Deployment;
    static const Analyzer instance = [] {
        const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB);
        db->set("Analyzer.DataDir", ORBEK_BENCH_ETC "/portrait");
        return Analyzer(Component(db, Property(type<Analyzer>(), "Analyzer", "", "", false)));
    }();
    return instance;
}

void allValues(benchmark::State& state) {
    analyzer().analyze(face()).serialize(); // loads files and makes filters
    for (auto _ : state) benchmark::DoNotOptimize(analyzer().analyze(face()).serialize());
}
BENCHMARK(allValues)->Unit(benchmark::kMillisecond);

void valuesOfEnrolment(benchmark::State& state) {
    for (auto _ : state) {
        const Characteristics portrait = analyzer().analyze(face());
        benchmark::DoNotOptimize(portrait.sharpness() + portrait.deviationFromFrontalPose());
    }
}
BENCHMARK(valuesOfEnrolment)->Unit(benchmark::kMillisecond);

void reshape(benchmark::State& state) {
    for (auto _ : state) benchmark::DoNotOptimize(portraitOf(face(), standardPortrait));
}
BENCHMARK(reshape)->Unit(benchmark::kMillisecond);

template <class Extract> void extraction(benchmark::State& state, Extract extract) {
    extract(); // makes the filters
    for (auto _ : state) benchmark::DoNotOptimize(extract());
}
BENCHMARK_CAPTURE(extraction, glasses, [] {
    return features().glasses(portrait());
})->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(extraction, pose, [] {
    return features().pose(portrait());
})->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(extraction, mouth, [] {
    return features().mouth(portrait());
})->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(extraction, head, [] {
    return features().head(portrait());
})->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(extraction, closedEye, [] {
    return features().closedEye(portrait(), Eye::eye0);
})->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(extraction, gazeAway, [] {
    return features().gazeAway(portrait(), Eye::eye0);
})->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(extraction, genderWithPortrait, [] {
    return features().genderOrAge(portraitOf(face(), genderPortrait));
})->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(extraction, ethnicityWithPortrait, [] {
    return features().ethnicity(portraitOf(face(), ethnicityPortrait));
})->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(extraction, sharpness, [] {
    return features().sharpnessMeter()(windowOf(portrait(), Window::sharpness));
})->Unit(benchmark::kMillisecond);

void pixelMeasures(benchmark::State& state) {
    for (auto _ : state) {
        const FNImage<Fn::Bgra32> color = picture().toBgra32();
        benchmark::DoNotOptimize(hotSpots(portrait()));
        benchmark::DoNotOptimize(grayScaleDensity(picture().toMono8(), leftEye, rightEye));
        benchmark::DoNotOptimize(naturalSkinColour(color, leftEye, rightEye));
        benchmark::DoNotOptimize(redEye(color, leftEye, leftEye, rightEye));
        benchmark::DoNotOptimize(glassTint(color, leftEye, leftEye, rightEye));
    }
}
BENCHMARK(pixelMeasures)->Unit(benchmark::kMillisecond);

void background(benchmark::State& state) {
    const FNImage<Fn::Bgra32> color = picture().toBgra32();
    for (auto _ : state) benchmark::DoNotOptimize(backgroundUniformity(color, leftEye, rightEye));
}
BENCHMARK(background)->Unit(benchmark::kMillisecond);

} // namespace
