// What the public finders cost beside their engines, and tracking in video.

#include "eye/face_finder.h"
#include "fn/image_reference.h"
#include "orbek/face_tracker.h"
#include "orbek/implementation/configuration_implementation.h"

#include <benchmark/benchmark.h>

#include <random>
#include <sstream>
#include <vector>

namespace {

/// A camera's gray frame in the application's memory: structure and noise.
class Frame final : public Orbek::ImageBody {
public:
    Frame(unsigned int w, unsigned int h, unsigned int seed) : w_(w), h_(h), pixels_(std::size_t{w} * h) {
        std::mt19937 random(seed);
        for (unsigned int y = 0; y < h; ++y)
            for (unsigned int x = 0; x < w; ++x)
                pixels_[std::size_t{y} * w + x] =
                    static_cast<unsigned char>(40 + x * 90 / w + (x / 37 + y / 53) % 2 * 60 + random() % 12);
    }

    bool isColor() const override { return false; }
    unsigned int width() const override { return w_; }
    unsigned int height() const override { return h_; }
    const unsigned char* grayScaleRepresentation() const override { return pixels_.data(); }
    const Orbek::Rgb* colorRepresentation() const override { return nullptr; }
    std::string name() const override { return "frame"; }

private:
    unsigned int w_, h_;
    std::vector<unsigned char> pixels_;
};

const Orbek::Configuration& configuration() {
    static const Orbek::Configuration instance = [] {
        std::istringstream text("ORBEK.Substitutions.INSTALLDIR = " ORBEK_BINARY_DIR "\n");
        return Orbek::Configuration(text);
    }();
    return instance;
}

constexpr float least = 0.1f, greatest = 0.4f;

void publicFind1080p(benchmark::State& state) {
    const Orbek::Face::Finder finder(configuration());
    const Orbek::Image image(new Frame(1920, 1080, 1));
    for (auto _ : state) benchmark::DoNotOptimize(finder.find(image, least, greatest, 0, 0, 1920, 1080));
}
BENCHMARK(publicFind1080p)->Unit(benchmark::kMillisecond);

void engineFind1080p(benchmark::State& state) {
    const FaceFinder finder =
        Orbek::Configuration::Implementation::implementation(configuration())->resources().faceFinder();
    const Frame frame(1920, 1080, 1);
    FNImage<unsigned char> pixels(1920, 1080);
    std::copy_n(frame.grayScaleRepresentation(), pixels.size(), pixels.getExclusive());
    const FNImageReference image = FNImageReferenceFactory::create(pixels);
    std::list<FaceFinder::Location> faces;
    for (auto _ : state)
        benchmark::DoNotOptimize(finder.find(image, faces, least, greatest, {0, 0, 1920, 1080}));
}
BENCHMARK(engineFind1080p)->Unit(benchmark::kMillisecond);

/// Items are frames.
void trackExhaustively640x480(benchmark::State& state) {
    Orbek::Face::Tracker tracker(configuration());
    std::vector<Orbek::Image> frames;
    for (unsigned int seed = 0; seed < 8; ++seed) frames.emplace_back(new Frame(640, 480, seed));
    std::size_t next = 0;
    for (auto _ : state) benchmark::DoNotOptimize(tracker.processFrame(frames[next++ % frames.size()]));
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(trackExhaustively640x480)->Unit(benchmark::kMillisecond);

} // namespace
