#include "cmp/strategy.h"

#include "cmp/gallery_worker.h"
#include "fn/thread/thread.h"

namespace Cmp {

using namespace Implementation;

namespace {

/// Threads that are joined whatever happens.
class JoinedThreads {
public:
    JoinedThreads() = default;
    ~JoinedThreads() { joinAll(); }
    JoinedThreads(const JoinedThreads&) = delete;
    JoinedThreads& operator=(const JoinedThreads&) = delete;

    void start(const Fn::Functor0& job) {
        const FNThread thread = FNSpawn(job, "gallery search");
        thread.start();
        threads_.push_back(thread);
    }

    /// @throws FNEGeneric if one has failed
    void finish() {
        joinAll();
        for (const FNThread& thread : threads_)
            if (thread.state().state == FNThreadState::failed) FN_THROW(FNEGeneric, thread.state().message);
    }

private:
    void joinAll() {
        for (; joined_ < threads_.size(); ++joined_) threads_[joined_].join();
    }

    std::vector<FNThread> threads_;
    std::size_t joined_ = 0;
};

GalleryResults searchInParallel(const std::list<GalleryIterator>& galleries,
                                const std::vector<MatchLimits>& limits) {
    std::vector<GalleryResults> parts(galleries.size(), GalleryResults(limits.size()));
    JoinedThreads threads;
    auto part = parts.begin();
    for (const GalleryIterator& gallery : galleries)
        threads.start(Fn::Functor0(
            [&gallery, &limits, &results = *part++] { searchGallery(gallery, limits, results); }));
    threads.finish();
    return mergeResults(parts, limits);
}

/// A walk over one population.
Strategy::Populations viewOf(const Population& population) {
    return Fn::View<Population>({population}).begin();
}

} // namespace

MultipleProbesRawMatchingResults Strategy::compareRaw(const std::list<RawProbe>& probes,
                                                      const Populations& populations) const {
    std::vector<FIR> records;
    std::vector<MatchLimits> limits;
    for (const RawProbe& probe : probes) {
        records.push_back(probe.first);
        limits.push_back({probe.second, probe.third});
    }
    const auto galleries = algorithm_->prepareFew2Many(records, populations, numberOfThreads_);
    GalleryResults results(limits.size());
    if (galleries.size() > 1)
        results = searchInParallel(galleries, limits);
    else
        for (const GalleryIterator& gallery : galleries) searchGallery(gallery, limits, results);
    return {FNCountedPtr<std::list<RawMatches>>(
                new std::list<RawMatches>(results.matches.begin(), results.matches.end())),
            FNCountedPtr<std::list<ScoreHistogram>>(
                new std::list<ScoreHistogram>(results.distributions.begin(), results.distributions.end()))};
}

MultipleProbesRawMatchingResults Strategy::compareRaw(const std::list<RawProbe>& probes,
                                                      const Population& population) const {
    return compareRaw(probes, viewOf(population));
}

Strategy::Results Strategy::compare(const std::list<Probe>& probes, const Populations& populations) const {
    std::list<RawProbe> rawProbes;
    for (const Probe& probe : probes)
        rawProbes.emplace_back(probe.first, scoreMapping_->convert(probe.second), probe.third);
    return convert(compareRaw(rawProbes, populations));
}

Strategy::Results Strategy::compare(const std::list<Probe>& probes, const Population& population) const {
    return compare(probes, viewOf(population));
}

std::list<Score> Strategy::compare(const FIR& probe, const Population& population) const {
    std::list<Score> scores;
    for (const GalleryIterator& gallery : algorithm_->prepareFew2Many({probe}, viewOf(population), 1))
        while (gallery->loadNextItems() != 0)
            for (const GalleryIterator::Item& item : gallery->compare())
                scores.push_back(scoreMapping_->convert(item.scores.front()));
    return scores;
}

Strategy::Results Strategy::convert(const MultipleProbesRawMatchingResults& results) const {
    const std::list<RawMatches>& matches = *results.matches;
    const std::list<ScoreHistogram>& distributions = *results.distributions;
    if (!distributions.empty() && distributions.size() != matches.size())
        FN_THROW(FNEGeneric, "Comparison algorithm: number of score distributions does not match the number "
                             "of probes");
    const bool normalize = !distributions.empty() && !distributions.front().empty();
    Results converted;
    auto distribution = distributions.begin();
    for (const RawMatches& raw : matches) {
        RawMatches normalized;
        if (normalize) {
            if (distribution == distributions.end())
                FN_THROW(FNEGeneric, "B5: not enough histograms for score normalization");
            normalized = algorithm_->normalizeRawScores(raw, *distribution++);
        }
        const FNCountedPtr<Matches> list(new Matches);
        for (const RawMatch& match : normalize ? normalized : raw)
            list->emplace_front(match.id, scoreMapping_->convert(match.score));
        converted.push_back(list);
    }
    return converted;
}

} // namespace Cmp
