#include "cmp/gallery_worker.h"

namespace Cmp::Implementation {

namespace {

/// Keeps a match if it belongs to the best so far.
/// @return the score that matches must reach from now on
float offer(const MatchLimits& limits, float score, const std::string& id, RawMatches& best) {
    if (!(score > limits.threshold) || limits.most == 0) return limits.threshold;
    if (best.size() < limits.most) {
        best.emplace(score, id);
    } else if (const auto worst = best.begin();
               score > worst->score || (score == worst->score && id > worst->id)) {
        auto node = best.extract(worst); // the new one takes its place in memory
        node.value().score = score;
        node.value().id = id;
        best.insert(std::move(node));
    }
    return best.size() < limits.most ? limits.threshold : best.begin()->score;
}

void addTo(ScoreHistogram& sum, const ScoreHistogram& part) {
    if (part.empty()) return;
    if (sum.empty()) sum = ScoreHistogram(part.size(), 0u);
    sum += part;
}

/// The best of several sets, each of which holds its own best.
RawMatches bestOf(const std::vector<const RawMatches*>& sets, unsigned int most) {
    std::vector<std::pair<RawMatches::const_reverse_iterator, RawMatches::const_reverse_iterator>> cursors;
    for (const RawMatches* const set : sets)
        if (!set->empty()) cursors.emplace_back(set->rbegin(), set->rend());
    RawMatches best;
    while (!cursors.empty() && best.size() < most) {
        const auto greatest = std::ranges::max_element(
            cursors, [](const auto& a, const auto& b) { return *a.first < *b.first; }); // the first of equals
        best.insert(best.begin(), *greatest->first);
        if (++greatest->first == greatest->second) cursors.erase(greatest);
    }
    return best;
}

} // namespace

void searchGallery(const GalleryIterator& gallery, const std::vector<MatchLimits>& limits,
                   GalleryResults& results) {
    // Nearly all scores of a large gallery stay below what is needed: that test comes first and alone.
    std::vector<float> needed;
    for (const MatchLimits& l : limits) needed.push_back(l.threshold);
    GalleryIterator::Body& walk = *gallery.operator->();
    while (walk.loadNextItems() != 0)
        for (const GalleryIterator::Item& item : walk.compare())
            for (std::size_t p = 0; p < needed.size(); ++p)
                if (item.scores[p] >= needed[p])
                    needed[p] = offer(limits[p], item.scores[p], item.id, results.matches[p]);
    if (const auto* const distributions = gallery->rawScoreDistributions())
        results.distributions = *distributions;
}

GalleryResults mergeResults(const std::vector<GalleryResults>& parts,
                            const std::vector<MatchLimits>& limits) {
    GalleryResults merged(limits.size());
    std::vector<const RawMatches*> sets(parts.size());
    for (std::size_t p = 0; p < limits.size(); ++p) {
        for (std::size_t k = 0; k < parts.size(); ++k) {
            sets[k] = &parts[k].matches[p];
            addTo(merged.distributions[p], parts[k].distributions[p]);
        }
        merged.matches[p] = bestOf(sets, limits[p].most);
    }
    return merged;
}

} // namespace Cmp::Implementation
