// Searching a gallery of 100000 records for one probe, limit 10: the whole search on one and on two threads,
// and what the worker does alone (thresholds and the set of the best), with scores that are there already.

#include "cmp/gallery_worker.h"
#include "cmp/pcld/pcld.h"
#include "cmp/strategy.h"
#include "fn/deployment/app_config_db.h"

#include <benchmark/benchmark.h>

#include <cmath>
#include <cstring>
#include <filesystem>
#include <random>
#include <sstream>

#include <unistd.h>

namespace {

using namespace Cmp::Implementation;

constexpr std::size_t galleryItems = 100000, components = 256;
constexpr unsigned int limit = 10;

/// L5 with a projection of zeros: it is not used here.
PCLD makeAlgorithm() {
    const std::string name = "orbek-bench-" + std::to_string(getpid()) + ".dat";
    const auto folder = std::filesystem::temp_directory_path();
    Cmp::Pcld::Transformation t{Fn::Matrix<float>(4328, components), FNVector<float>(4328, 0.0f)};
    t.matrix = 0.0f;
    t.write(folder / name);
    std::stringstream settings;
    settings << "X.DataDir = " << folder.string() << "\nX.TransfFile = " << name << "\n";
    const Fn::Deployment::Type& type = Fn::Deployment::type<L5Settings>();
    const PCLD algorithm(L5Settings(
        Fn::Deployment::Component(FNCountedPtr<AppConfigDB>(new AppVolatileConfigDB(settings)),
                                  Fn::Deployment::Property(type, "X", type.defaultValue(), "", false))));
    std::filesystem::remove(folder / name);
    return algorithm;
}

/// Records of one random feature each, which share the memory of the flat form.
struct Gallery {
    Gallery() : algorithm(new PCLD(makeAlgorithm())), population(algorithm->createPopulation(galleryItems)) {
        std::mt19937 random(1);
        std::normal_distribution<float> normal;
        const std::size_t words = 1 + 3 + components;
        memory.resize(galleryItems * words);
        for (std::size_t i = 0; i < galleryItems; ++i) {
            float* const record = &memory[i * words];
            const std::uint32_t one = 1;
            std::memcpy(record, &one, sizeof one);
            record[1] = 0;
            record[2] = record[3] = 1;
            float square = 0;
            for (std::size_t c = 4; c < words; ++c) {
                record[c] = normal(random);
                square += record[c] * record[c];
            }
            for (std::size_t c = 4; c < words; ++c) record[c] /= std::sqrt(square);
        }
        const Cmp::RecordBuilder builder = algorithm->createRecordBuilder();
        auto* next = reinterpret_cast<unsigned char*>(memory.data());
        for (std::size_t i = 0; i < galleryItems; ++i)
            population.add(builder->createFromMemento(next), "person " + std::to_string(i));
    }

    Cmp::FIR probe() const { return population.get("person 4711"); }

    std::vector<float> memory;
    FNCountedPtr<PCLD> algorithm;
    Cmp::Population population;
};

const Gallery& gallery() {
    static const Gallery instance;
    return instance;
}

void search(benchmark::State& state) {
    const Cmp::Strategy strategy(gallery().algorithm, FNCountedPtr<ScoreMapping>(new IdentityScoreMapping),
                                 FNCountedPtr<RatesMapping>(), static_cast<unsigned int>(state.range(0)));
    const Cmp::FIR probe = gallery().probe();
    for (auto _ : state)
        benchmark::DoNotOptimize(strategy.compareRaw({{probe, 0.0f, limit}}, gallery().population));
    state.SetItemsProcessed(galleryItems * state.iterations());
}
BENCHMARK(search)->Arg(1)->Arg(2)->MeasureProcessCPUTime()->UseRealTime()->Unit(benchmark::kMillisecond);

/// Hands out the scores of a search again, one at a time in the same place, as a walk does.
class Recorded final : public GalleryIterator::Body {
public:
    explicit Recorded(const std::vector<float>& scores) : scores_(scores), item_{"person 4711", {0}} {}
    std::size_t loadNextItems() override { return next_ < scores_.size() ? 1 : 0; }
    std::span<const GalleryIterator::Item> compare() override {
        item_.scores.front() = scores_[next_++];
        return {&item_, 1};
    }

private:
    const std::vector<float>& scores_;
    std::size_t next_ = 0;
    GalleryIterator::Item item_;
};

void workerAlone(benchmark::State& state) {
    std::vector<float> scores;
    const Fn::View<Cmp::Population> view({gallery().population});
    for (const GalleryIterator& walk :
         gallery().algorithm->prepareFew2Many({gallery().probe()}, view.begin(), 1))
        while (walk->loadNextItems() != 0)
            for (const auto& item : walk->compare()) scores.push_back(item.scores.front());
    const std::vector<MatchLimits> limits{{0, limit}};
    for (auto _ : state) {
        GalleryResults results(1);
        searchGallery(GalleryIterator(FNCountedPtr<GalleryIterator::Body>(new Recorded(scores))), limits,
                      results);
        benchmark::DoNotOptimize(results);
    }
    state.SetItemsProcessed(galleryItems * state.iterations());
}
BENCHMARK(workerAlone)->UseRealTime()->Unit(benchmark::kMillisecond);

} // namespace
