// Searching a gallery file: entries of one feature, whose records are one record with other words.
//
// ORBEK_ENTRIES is their number, a million otherwise. With ORBEK_GALLERY=FILE the gallery is kept in that
// file, for measurements of the program orbek, and made only if it is not there.

#include "gallery_search.h"
#include "orbek/enrollment.h"
#include "orbek/image_io.h"

#include <benchmark/benchmark.h>

#include <filesystem>
#include <optional>
#include <random>

#include <unistd.h>

namespace {

namespace fs = std::filesystem;
using namespace Orbek;
using Orbek::Tool::GalleryFile;

const Configuration& configuration() {
    static const Configuration instance(std::string(ORBEK_BINARY_DIR "/orbek.conf"));
    return instance;
}

struct Enrolled final : Enrollment::FeedbackBody {
    explicit Enrolled(std::string& record_) : record(record_) {}
    void start() override {}
    void processingImage(const Image&) override {}
    void eyesFound(const Eyes::Location&) override {}
    void eyesNotFound() override {}
    void success(const FIR& fir) override {
        record.resize(fir.size());
        fir.serialize(reinterpret_cast<unsigned char*>(record.data()));
    }
    void failure() override {}
    void end() override {}
    std::string& record;
};

std::string recordOfAlice() {
    std::string record;
    const std::list<Sample> samples{Sample(ImageIO::load(ORBEK_SOURCE_DIR "/examples/images/alice1.jpg"))};
    Enrollment::Processor(configuration())
        .process(samples.begin(), samples.end(), Enrollment::Feedback(new Enrolled(record)));
    return record;
}

void fill(const std::string& file, std::size_t entries) {
    std::mt19937 random(1);
    const std::string record = recordOfAlice();
    const FIRBuilder builder(configuration());
    GalleryFile::create(file);
    GalleryFile gallery(file);
    constexpr std::size_t words = 2600; // at the end of the record
    for (std::size_t added = 0; added < entries;) {
        std::vector<GalleryFile::Entry> some;
        for (; some.size() < 20000 && added < entries; ++added) {
            some.push_back({"person " + std::to_string(added), record});
            std::string& bytes = some.back().record;
            std::generate(bytes.end() - words, bytes.end(),
                          [&] { return static_cast<char>(random() >> 24); });
        }
        (void)gallery.add(some, GalleryFile::Present::Kept, builder);
    }
}

/// A gallery on disk, which is removed at the end unless it shall stay.
class Gallery {
public:
    Gallery() {
        const char* const kept = std::getenv("ORBEK_GALLERY");
        const char* const number = std::getenv("ORBEK_ENTRIES");
        kept_ = kept != nullptr;
        file_ = kept ? kept : fs::temp_directory_path() / ("orbek-bench-" + std::to_string(getpid()));
        if (!fs::exists(file_)) fill(file_, number ? std::stoul(number) : 1000000);
        entries_ = GalleryFile(file_.string()).ids().size();
    }
    ~Gallery() {
        if (!kept_) fs::remove(file_);
    }
    Gallery(const Gallery&) = delete;
    Gallery& operator=(const Gallery&) = delete;

    std::string file() const { return file_.string(); }
    std::size_t entries() const { return entries_; }

private:
    fs::path file_;
    std::size_t entries_ = 0;
    bool kept_ = false;
};

/// @param range threads
void searchGallery(benchmark::State& state) {
    static const Gallery gallery;
    const GalleryFile file(gallery.file());
    const std::string bytes = recordOfAlice();
    const FIR record = FIRBuilder(configuration())
                           .build(reinterpret_cast<const unsigned char*>(bytes.data()),
                                  static_cast<unsigned int>(bytes.size()));
    const Tool::GallerySearch search(configuration(), static_cast<unsigned int>(state.range(0)));
    for (auto _ : state) benchmark::DoNotOptimize(search.bestMatches(record, file, 0.5f, 10));
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(gallery.entries()));
}
BENCHMARK(searchGallery)
    ->Arg(1)
    ->Arg(2)
    ->MeasureProcessCPUTime()
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);

} // namespace
