// soak: threads enrol, verify and identify over one configuration for a while, with pictures that are good,
// damaged or none at all, and a population that grows and shrinks between the searches.
//
//     soak CONFIGURATION SECONDS [SEED]
//
// Ends with 0 if every outcome was as expected and memory stayed flat. Meant to be run under the sanitizers.

#include "orbek/enrollment.h"
#include "orbek/identification.h"
#include "orbek/image_io.h"
#include "orbek/verification.h"

#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <mutex>
#include <optional>
#include <random>
#include <shared_mutex>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

namespace {

using namespace Orbek;
using Clock = std::chrono::steady_clock;

constexpr unsigned int threads = 8;
constexpr std::size_t mostEntries = 400;
constexpr double allowedGrowth = 48; ///< of the resident memory from a third of the time on, MB

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr bool measuresMemory = false; // the sanitizers keep what is freed
#else
constexpr bool measuresMemory = true;
#endif

double residentMegabytes() {
    std::ifstream file("/proc/self/statm");
    std::size_t all, resident;
    file >> all >> resident;
    return static_cast<double>(resident) * static_cast<double>(sysconf(_SC_PAGESIZE)) / 1e6;
}

void expect(bool condition, const std::string& what) {
    if (!condition) throw std::runtime_error("not as expected: " + what);
}

template <class Body> class Outcome : public Body {
public:
    void start() override {}
    void processingImage(const Image&) override {}
    void eyesFound(const Eyes::Location&) override {}
    void eyesNotFound() override {}
    void end() override {}
};

class Enrolled final : public Outcome<Enrollment::FeedbackBody> {
public:
    explicit Enrolled(std::optional<FIR>& record) : record_(record) {}
    void success(const FIR& fir) override { record_ = fir; }
    void failure() override {}

private:
    std::optional<FIR>& record_;
};

class Verified final : public Outcome<Verification::FeedbackBody> {
public:
    explicit Verified(bool& matched) : matched_(matched) {}
    void score(const Score&) override {}
    void match() override { matched_ = true; }
    void noMatch() override { matched_ = false; }

private:
    bool& matched_;
};

class Identified final : public Outcome<Identification::FeedbackBody> {
public:
    explicit Identified(std::list<Match>& matches) : matches_(matches) {}
    void matches(const std::list<Match>& matches) override { matches_ = matches; }

private:
    std::list<Match>& matches_;
};

std::vector<std::string> filesIn(const std::string& folder) {
    std::vector<std::string> files;
    for (const auto& entry : std::filesystem::directory_iterator(folder)) {
        if (entry.path().extension() != ".jpg") continue;
        std::ifstream file(entry.path(), std::ios::binary);
        files.emplace_back(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
    }
    expect(!files.empty(), "sample pictures in " + folder);
    std::ranges::sort(files);
    return files;
}

/// What all threads share.
struct Shared {
    explicit Shared(const std::string& file) : configuration(file), population(configuration) {}

    struct Entry {
        std::string id;
        std::size_t picture;
        FIR record;
    };

    const Configuration configuration;
    const std::vector<std::string> files = filesIn(ORBEK_SOURCE_DIR "/examples/images");
    std::shared_mutex mutex; ///< shared by searches, guards the next two
    Population population;
    std::vector<Entry> entries;
    std::atomic<bool> stop = false;
    std::atomic<unsigned long> enrolled = 0, verified = 0, identified = 0, refused = 0, names = 0;
};

class Worker {
public:
    Worker(Shared& shared, unsigned int seed)
        : shared_(shared), random_(seed), enroller_(shared.configuration), verifier_(shared.configuration),
          identifier_(shared.configuration, shared.population) {}

    void run() {
        while (!shared_.stop) {
            switch (below(4)) {
            case 0:
                enrol();
                break;
            case 1:
                verify();
                break;
            case 2:
                identify();
                break;
            default:
                useRubbish();
            }
        }
    }

private:
    std::size_t below(std::size_t n) { return std::uniform_int_distribution<std::size_t>(0, n - 1)(random_); }

    static Image picture(const std::string& file) {
        return Jpeg::load(file.data(), static_cast<unsigned int>(file.size()));
    }

    std::optional<FIR> enrol(const std::list<Sample>& samples) {
        std::optional<FIR> record;
        enroller_.process(samples.begin(), samples.end(), Enrollment::Feedback(new Enrolled(record)));
        return record;
    }

    void enrol() {
        const std::size_t chosen = below(shared_.files.size());
        std::list<Sample> samples{Sample(picture(shared_.files[chosen]))};
        const std::optional<FIR> record = enrol(samples);
        expect(record.has_value(), "a record of a good picture");
        ++shared_.enrolled;
        const std::unique_lock lock(shared_.mutex);
        if (shared_.entries.size() >= mostEntries) {
            const std::size_t gone = below(shared_.entries.size());
            shared_.population.remove(shared_.entries[gone].id);
            shared_.entries.erase(shared_.entries.begin() + static_cast<std::ptrdiff_t>(gone));
        }
        const std::string id = std::to_string(shared_.names++);
        shared_.population.append(*record, id);
        shared_.entries.push_back({id, chosen, *record});
    }

    std::optional<Shared::Entry> someEntry() {
        const std::shared_lock lock(shared_.mutex);
        if (shared_.entries.empty()) return {};
        return shared_.entries[below(shared_.entries.size())];
    }

    void verify() {
        const std::optional<Shared::Entry> entry = someEntry();
        if (!entry) return;
        const std::list<Sample> samples{Sample(picture(shared_.files[entry->picture]))};
        bool matched = false;
        verifier_.process(samples.begin(), samples.end(), entry->record, 0.5f,
                          Verification::Feedback(new Verified(matched)));
        expect(matched, "a match of a picture with its own record");
        ++shared_.verified;
    }

    void identify() {
        const std::shared_lock lock(shared_.mutex);
        if (shared_.entries.empty()) return;
        const std::size_t chosen = shared_.entries[below(shared_.entries.size())].picture;
        const std::list<Sample> samples{Sample(picture(shared_.files[chosen]))};
        std::list<Match> matches;
        identifier_.process(samples.begin(), samples.end(), 0.5f,
                            Identification::Feedback(new Identified(matches)), 5);
        expect(!matches.empty(), "a match of a picture with its own record in the population");
        ++shared_.identified;
    }

    /// A picture that is cut off, has wrong bytes, or never was one: a record, none, or an exception.
    void useRubbish() {
        std::string file = shared_.files[below(shared_.files.size())];
        switch (below(3)) {
        case 0:
            file.resize(below(file.size()));
            break;
        case 1:
            for (std::size_t i = 1 + below(40); i > 0; --i)
                file[below(file.size())] = static_cast<char>(below(256));
            break;
        default:
            std::ranges::generate(file, [&] { return static_cast<char>(below(256)); });
        }
        try {
            (void)enrol(std::list<Sample>{Sample(picture(file))});
        } catch (const std::exception&) {
            ++shared_.refused;
        }
    }

    Shared& shared_;
    std::mt19937 random_;
    Enrollment::Processor enroller_;
    Verification::Processor verifier_;
    Identification::Processor identifier_;
};

int soak(const std::string& configuration, double seconds, unsigned int seed) {
    Shared shared(configuration);
    std::mutex mutex; // guards the next one
    std::string failure;
    std::vector<std::thread> running;
    for (unsigned int i = 0; i < threads; ++i)
        running.emplace_back([&, i] {
            try {
                Worker(shared, seed * threads + i).run();
            } catch (const std::exception& e) {
                const std::lock_guard lock(mutex);
                failure = e.what();
                shared.stop = true;
            }
        });
    const auto begin = Clock::now();
    const auto passed = [&] { return std::chrono::duration<double>(Clock::now() - begin).count(); };
    double early = 0;
    while (!shared.stop && passed() < seconds) {
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
        if (early == 0 && passed() > seconds / 3) early = residentMegabytes();
    }
    const double late = residentMegabytes();
    shared.stop = true;
    for (std::thread& thread : running) thread.join();
    std::cout << shared.enrolled << " enrolled, " << shared.verified << " verified, " << shared.identified
              << " identified, " << shared.refused << " pictures refused; memory " << early << " MB, then "
              << late << " MB\n";
    expect(failure.empty(), failure);
    expect(shared.enrolled > 0 && shared.verified > 0 && shared.identified > 0 && shared.refused > 0,
           "some of everything");
    expect(!measuresMemory || late - early < allowedGrowth, "flat memory");
    return 0;
}

} // namespace

int main(int argc, char** argv) try {
    expect(argc == 3 || argc == 4, "soak CONFIGURATION SECONDS [SEED]");
    return soak(argv[1], std::stod(argv[2]), argc == 4 ? static_cast<unsigned int>(std::stoul(argv[3])) : 1);
} catch (const std::exception& e) {
    std::cerr << "soak: " << e.what() << '\n';
    return 1;
}
