#include "cmp/b7/packed_scoring.h"

#include <cstring>
#include <limits>

namespace Cmp::B7 {

namespace {

constexpr float noScore = std::numeric_limits<float>::lowest();

} // namespace

PreparedProbes::PreparedProbes(const FNCountedPtr<const Core>& core, std::span<const FIR> probes)
    : core_(core), size_(probes.size()) {
    std::vector<const unsigned char*> codes;
    for (std::size_t p = 0; p < probes.size(); ++p) {
        const auto& record = core->records().record(probes[p]);
        for (std::size_t i = 0; i < record.count(); ++i) {
            const unsigned char* const feature = record.feature(i);
            Origin origin{p, 0, 0};
            std::memcpy(&origin.mean, feature, sizeof(float));
            std::memcpy(&origin.stdDev, feature + sizeof(float), sizeof(float));
            origins_.push_back(origin);
            codes.push_back(feature + Encoder::headerSize);
        }
    }
    features_ = core->encoder().packedProducts().prepare(codes);
}

const unsigned char* PackedScorer::codes(const Record& record, std::size_t feature) const {
    return record.feature(feature) + Encoder::headerSize;
}

/// @param score of the sums of a feature with another
template <class Score>
void PackedScorer::scoreFeature(const Record& record, std::size_t feature, const Record* next,
                                std::span<float> scores, Score score) {
    const unsigned char* const ahead = feature + 1 < record.count() ? codes(record, feature + 1)
                                       : next && next->count() != 0 ? codes(*next, 0)
                                                                    : nullptr;
    probes_->core_->encoder().packedProducts().sums(codes(record, feature), probes_->features_, sums_.data(),
                                                    ahead);
    for (std::size_t f = 0; f < sums_.size(); ++f) {
        const PreparedProbes::Origin& origin = probes_->origins_[f];
        float& best = scores[origin.probe];
        best = std::max(best, score(sums_[f], origin));
    }
}

void PackedScorer::score(const Record& record, const Record* next, std::span<float> scores) {
    const Encoder& encoder = probes_->core_->encoder();
    std::ranges::fill(scores, noScore);
    for (std::size_t i = 0; i < record.count(); ++i)
        scoreFeature(record, i, next, scores, [&](const auto& sums, const auto& origin) {
            return (encoder.product(sums) - origin.mean) / origin.stdDev;
        });
}

void PackedScorer::score(const Record& record1, const Record& record2, const Record* next,
                         std::span<float> scores1, std::span<float> scores2) {
    const Encoder& encoder = probes_->core_->encoder();
    std::ranges::fill(scores1, noScore);
    std::ranges::fill(scores2, noScore);
    // Features go in pairs. The last one without a partner is rounded as one alone.
    const std::size_t all = record1.count() + record2.count(), paired = all - all % 2;
    std::size_t i = 0;
    const auto scoreAll = [&](const Record& record, const Record* behind, std::span<float> scores) {
        for (std::size_t feature = 0; feature < record.count(); ++feature, ++i)
            scoreFeature(record, feature, behind, scores, [&](const auto& sums, const auto&) {
                return i < paired ? encoder.productByGroups(sums) : encoder.product(sums);
            });
    };
    scoreAll(record1, &record2, scores1);
    scoreAll(record2, next, scores2);
}

GalleryComparer::GalleryComparer(const FNCountedPtr<const Core>& core,
                                 const FNCountedPtr<const PreparedProbes>& probes)
    : core_(core), scorer_(probes), loaded_(core->settings().twoItemsAtOnce ? 2 : 1) {
    if (core->settings().normalizeScores)
        histograms_.assign(probes->size(), ValueHistogram(rawScoreMin, rawScoreMax, rawScoreBins));
}

void GalleryComparer::compare(std::span<Implementation::GalleryIterator::Item> items) {
    if (items.size() == 1)
        scorer_.score(*loaded_.front(), next_, items.front().scores);
    else
        scorer_.score(*loaded_.front(), *loaded_.back(), next_, items.front().scores, items.back().scores);
    next_ = nullptr;
    for (std::size_t p = 0; p < histograms_.size(); ++p)
        for (const auto& item : items) histograms_[p].add(item.scores[p]);
}

const std::vector<ScoreHistogram>* GalleryComparer::distributions() const {
    if (histograms_.empty()) return nullptr;
    distributions_.clear();
    for (const ValueHistogram& histogram : histograms_) distributions_.push_back(histogram.counts());
    return &distributions_;
}

} // namespace Cmp::B7
