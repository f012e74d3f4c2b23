// B7 records as they are stored: searching a gallery of 200000, what one of them takes in memory, reading the
// transformation, and one feature from a photo whose landmarks are known. The memory bandwidth of the machine
// stands beside them.

#include "cmp/b7/cmp_algorithm.h"
#include "cmp/b7/core.h"
#include "cmp/b7/reshape_warp.h"
#include "cmp/strategy.h"
#include "fn/deployment/app_config_db.h"

#include <benchmark/benchmark.h>

#include <filesystem>
#include <random>
#include <sstream>

#include <malloc.h>
#include <unistd.h>

namespace {

using namespace Cmp::B7;
using namespace Cmp::Implementation;

constexpr std::size_t galleryItems = 200000;
constexpr unsigned int limit = 10;

struct NoFeature {
    template <class Finder> static Finder finder() {
        struct Body final : Finder::Body {
            bool find(const FacialFeatureLocation&, const FacialFeatureLocation&, const FNImageReference&,
                      FacialFeatureLocation&) const override {
                return false;
            }
            std::string processingId() const override { return {}; }
        };
        return Finder(FNCountedPtr<typename Finder::Body>(new Body));
    }
};

/// B7 with a projection of noise, in a file that lives as long as the program.
class Setup {
public:
    Setup() : folder_(std::filesystem::temp_directory_path() / ("orbek-bench-" + std::to_string(getpid()))) {
        std::filesystem::create_directory(folder_);
        constexpr std::size_t raw = 20604, components = 5912;
        std::minstd_rand random(1);
        Transformation t{2e-5f, Fn::Matrix<signed char>(raw, components), FNVector<float>(raw, 0.3f),
                         FNVector<float>(components, 0.0f), FNVector<float>(components, 0.0f)};
        std::generate_n(t.matrix.getExclusive(), t.matrix.size(),
                        [&] { return static_cast<signed char>(random()); });
        t.write(file());
        std::stringstream text("X.DataDir = " + folder_.string() + "\n");
        const Fn::Deployment::Type& type = Fn::Deployment::type<CmpAlgorithm>();
        algorithm_ = FNCountedPtr<CmpAlgorithm>(new CmpAlgorithm(
            Fn::Deployment::Component(FNCountedPtr<AppConfigDB>(new AppVolatileConfigDB(text)),
                                      Fn::Deployment::Property(type, "X", type.defaultValue(), "", false)),
            Finders{EyesFinder(FNCountedPtr<EyesFinder::Body>()),
                    NoFeature::finder<MouthFinder>(),
                    NoFeature::finder<BridgeFinder>(),
                    {}}));
    }
    ~Setup() { std::filesystem::remove_all(folder_); }

    std::string file() const { return (folder_ / "trans-b7.dat").string(); }
    const FNCountedPtr<CmpAlgorithm>& algorithm() const { return algorithm_; }

    Cmp::FIR record(std::size_t features, unsigned int seed) const {
        std::mt19937 random(seed);
        std::vector<FloatingPointFeature> all;
        for (std::size_t i = 0; i < features; ++i) {
            all.push_back({FNVector<float>(5912)});
            std::generate_n(all.back().vector.getExclusive(), 5912,
                            [&] { return static_cast<float>(random() % 1000) / 1000 - 0.5f; });
        }
        return algorithm_->record(all);
    }

private:
    std::filesystem::path folder_;
    FNCountedPtr<CmpAlgorithm> algorithm_;
};

const Setup& setup() {
    static const Setup instance;
    return instance;
}

/// One-feature records as they come from a store, each read from its package.
class Gallery {
public:
    Gallery() : population_(setup().algorithm()->createPopulation(galleryItems)) {
        const Cmp::RecordBuilder builder = setup().algorithm()->createRecordBuilder();
        std::vector<Cmp::FIR> people;
        for (unsigned int i = 0; i < 64; ++i) people.push_back(setup().record(1, i));
        std::vector<Fn::Package> packages;
        for (const Cmp::FIR& person : people) packages.push_back(person.serialize());
        const std::size_t before = mallinfo2().uordblks + mallinfo2().hblkhd;
        for (std::size_t i = 0; i < galleryItems; ++i)
            population_.add(builder->create(packages[i % packages.size()]), std::to_string(i));
        bytes_ = static_cast<double>(mallinfo2().uordblks + mallinfo2().hblkhd - before) / galleryItems;
    }

    const Cmp::Population& population() const { return population_; }
    /// Of one record, with what the vector of all takes for it; without the packed bytes and the id.
    double overhead() const { return bytes_ - 2728; }

private:
    Cmp::Population population_;
    double bytes_;
};

const Gallery& gallery() {
    static const Gallery instance;
    return instance;
}

void readMemory(benchmark::State& state) {
    const std::vector<std::uint64_t> memory(64 << 20, 1);
    for (auto _ : state) {
        std::uint64_t sum[4] = {};
        for (std::size_t i = 0; i < memory.size(); i += 4)
            for (std::size_t k = 0; k < 4; ++k) sum[k] += memory[i + k];
        benchmark::DoNotOptimize(sum);
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(8 * memory.size()));
}
BENCHMARK(readMemory)->ThreadRange(1, 2)->UseRealTime()->Unit(benchmark::kMillisecond);

/// @param range features of the probe, threads
void search(benchmark::State& state) {
    const Cmp::Strategy strategy(setup().algorithm(), FNCountedPtr<ScoreMapping>(new IdentityScoreMapping),
                                 FNCountedPtr<RatesMapping>(), static_cast<unsigned int>(state.range(1)));
    const Cmp::FIR probe = setup().record(static_cast<std::size_t>(state.range(0)), 4711);
    const Cmp::Population& people = gallery().population();
    for (auto _ : state) benchmark::DoNotOptimize(strategy.compareRaw({{probe, 0.0f, limit}}, people));
    state.SetItemsProcessed(state.range(0) * static_cast<std::int64_t>(galleryItems) * state.iterations());
    state.counters["overhead_bytes"] = gallery().overhead();
}
BENCHMARK(search)
    ->ArgsProduct({{1, 5}, {1, 2}})
    ->MeasureProcessCPUTime()
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);

void readTransformation(benchmark::State& state) {
    const std::string file = setup().file();
    for (auto _ : state) benchmark::DoNotOptimize(Transformation::read(file, 20604, 5912));
}
BENCHMARK(readTransformation)->UseRealTime()->Unit(benchmark::kMillisecond);

void processSample(benchmark::State& state) {
    std::mt19937 random(1);
    FNImage<unsigned char> photo(640, 480);
    std::generate_n(photo.getExclusive(), photo.size(), [&] { return static_cast<unsigned char>(random()); });
    const FNImageReference image = FNImageReferenceFactory::create(photo);
    const CmpAlgorithm& algorithm = *setup().algorithm();
    for (auto _ : state)
        benchmark::DoNotOptimize(
            algorithm.processSample(image, {}, {280, 200}, {360, 210}, {310, 290}, {318, 203}));
}
BENCHMARK(processSample)->UseRealTime()->Unit(benchmark::kMillisecond);

} // namespace
