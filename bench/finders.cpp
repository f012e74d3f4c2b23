// Finding faces, eyes, mouth and nose bridge on photos of 640 by 480 pixels, one thread. The photos are those
// named by ORBEK_PHOTOS, a folder with labels.tsv.

#include "eval/yardsticks.h"
#include "fn/image_reference.h"
#include "fn/image_representation.h"
#include "fn/imagefile/image_file.h"
#include "img/affine/transform.h"
#include "labelled/finder_access.h"
#include "labelled/pictures.h"

#include <benchmark/benchmark.h>

#include <cstdlib>
#include <stdexcept>

namespace {

constexpr std::uint32_t width = 640, height = 480;
constexpr std::size_t mostPhotos = 30;
constexpr double smallestEyes = 32.0 / width, largestEyes = 0.4;
constexpr const char* etc = ORBEK_BENCH_ETC;

/// The middle of the photo, filling the frame.
FNImageReference framed(const FNImageReference& photo) {
    const FNImage<unsigned char> source = photo.toMono8();
    const float scale =
        std::min(static_cast<float>(source.w()) / width, static_cast<float>(source.h()) / height);
    const FNPos u{scale * width, 0}, v{0, scale * height};
    const FNPos middle{static_cast<float>(source.w()) / 2, static_cast<float>(source.h()) / 2};
    FNImage<unsigned char> frame(width, height);
    Img::Affine::transform(source, frame, middle - u / 2.0f - v / 2.0f, u, v, true,
                           static_cast<unsigned char>(0));
    return FNImageReferenceFactory::create(frame);
}

const std::vector<FNImageReference>& photos() {
    static const std::vector<FNImageReference> all = [] {
        const char* const folder = std::getenv("ORBEK_PHOTOS");
        if (!folder) throw std::runtime_error("ORBEK_PHOTOS names no folder with labels.tsv");
        Labelled::Selection selection;
        selection.labels = {std::string(folder) + "/labels.tsv"};
        std::vector<FNImageReference> images;
        const auto pictures = Labelled::picturesOf(selection);
        const std::size_t step = std::max<std::size_t>(pictures.size() / mostPhotos, 1);
        for (std::size_t i = 0; i < pictures.size() && images.size() < mostPhotos; i += step)
            images.push_back(framed(Fn::readImage(pictures[i].file.string())));
        return images;
    }();
    return all;
}

void find(benchmark::State& state, const FaceFinder& finder) {
    const std::vector<FNImageReference>& images = photos();
    std::list<FaceFinder::Location> faces;
    for (auto _ : state)
        for (const FNImageReference& image : images)
            finder.find(image, faces, smallestEyes, largestEyes, FaceFinder::everywhere);
    state.counters["ms/photo"] =
        benchmark::Counter(static_cast<double>(state.iterations() * images.size()) / 1000,
                           benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
}

void findFaces(benchmark::State& state) {
    find(state, Labelled::makeFaceFinder(etc));
}
BENCHMARK(findFaces)->Unit(benchmark::kMillisecond);

/// The same photo again and again, as of a camera before which little moves.
void findFacesInStream(benchmark::State& state) {
    const FaceFinder finder = Labelled::makeFaceFinder(etc);
    const std::vector<FNImageReference>& images = photos();
    constexpr int frames = 30;
    std::list<FaceFinder::Location> faces;
    for (auto _ : state)
        for (const FNImageReference& image : images)
            for (int frame = 0; frame < frames; ++frame)
                finder.findInStream(image, faces, smallestEyes, largestEyes, frame, FaceFinder::everywhere);
    state.counters["ms/photo"] =
        benchmark::Counter(static_cast<double>(state.iterations() * images.size()) * frames / 1000,
                           benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
}
BENCHMARK(findFacesInStream)->Unit(benchmark::kMillisecond);

void findFeaturesOfAFace(benchmark::State& state) {
    const FaceFinder finder = Labelled::makeFaceFinder(etc);
    const EyesFinder eyes = Labelled::makeEyesFinder(etc, "Strict");
    const MouthFinder mouth = Labelled::makeMouthFinder(etc);
    const BridgeFinder bridge = Labelled::makeBridgeFinder(etc);
    std::vector<std::pair<FNImageReference, FaceFinder::Location>> found;
    for (const FNImageReference& image : photos()) {
        std::list<FaceFinder::Location> faces;
        if (finder.find(image, faces, smallestEyes, largestEyes, FaceFinder::everywhere))
            found.emplace_back(image, faces.front());
    }
    FacialFeatureLocation first, second, feature;
    bool foundFirst, foundSecond;
    for (auto _ : state)
        for (const auto& [image, face] : found) {
            eyes.find(face, image, foundFirst, first, foundSecond, second);
            if (!foundFirst || !foundSecond) continue;
            mouth.find(first, second, image, feature);
            bridge.find(first, second, image, feature);
        }
    state.counters["ms/face"] =
        benchmark::Counter(static_cast<double>(state.iterations() * found.size()) / 1000,
                           benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
}
BENCHMARK(findFeaturesOfAFace)->Unit(benchmark::kMillisecond);

void constructAllFinders(benchmark::State& state) {
    for (auto _ : state) {
        benchmark::DoNotOptimize(Labelled::makeFaceFinder(etc));
        benchmark::DoNotOptimize(Labelled::makeEyesFinder(etc, "Strict"));
        benchmark::DoNotOptimize(Labelled::makeMouthFinder(etc));
        benchmark::DoNotOptimize(Labelled::makeBridgeFinder(etc));
    }
}
BENCHMARK(constructAllFinders)->Unit(benchmark::kMillisecond);

const int yardsticks = [] {
    for (const std::string& name : Eval::yardstickNames())
        benchmark::RegisterBenchmark(("findFaces/" + name).c_str(), [name](benchmark::State& state) {
            find(state, *Eval::makeYardstick(name));
        })->Unit(benchmark::kMillisecond);
    return 0;
}();

} // namespace
