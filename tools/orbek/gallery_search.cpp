#include "gallery_search.h"

#include <limits>
#include <map>
#include <mutex>

#include <malloc.h>

namespace Orbek::Tool {
namespace {

/// Their records stay in the processor's caches from reading to comparing.
constexpr std::uint64_t recordsAtOnce = 1024;

} // namespace

GallerySearch::GallerySearch(const Configuration& configuration, unsigned int jobs)
    : configuration_(configuration), jobs_(jobs),
      normalized_(configuration_.getValue(
                      "ORBEK.ComparisonAlgorithm.AlgorithmVersion.B7.ScoreNormalization") == "Enabled"),
      engine_(configuration_) {
    (void)mallopt(M_TRIM_THRESHOLD, 64 << 20); // the memory of one part is that of the next
}

std::list<Match> GallerySearch::bestMatches(const FIR& record, const GalleryFile& gallery,
                                            const Score& threshold, unsigned int maxMatches) const {
    const auto matchesAmong = [&](const Population& population) {
        return *engine_.bestMatches(record, population, threshold, maxMatches);
    };
    if (normalized_) {
        std::list<Match> matches;
        gallery.read(configuration_, std::numeric_limits<std::uint64_t>::max(), jobs_,
                     [&](const Population& all) { matches = matchesAmong(all); });
        return matches;
    }
    std::map<std::string, FIR> finalists; // in an order that does not depend on threads
    std::mutex mutex;                     // guards them
    gallery.read(configuration_, recordsAtOnce, jobs_, [&](const Population& part) {
        const std::list<Match> found = matchesAmong(part);
        const std::lock_guard lock(mutex);
        for (const Match& match : found) finalists.emplace(match.name, part.get(match.name));
    });
    Population last(configuration_);
    for (const auto& [name, finalist] : finalists) last.append(finalist, name);
    return matchesAmong(last);
}

} // namespace Orbek::Tool
