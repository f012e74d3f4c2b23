#pragma once

#include "cmp/gallery_iterator.h"
#include "cmp/partitionizer.h"

/// The walk over populations that all generations share. A generation brings a comparer, one for each
/// iterator:
///
///     struct Comparer {
///         using Record = ...;                              // class of the records
///         std::size_t itemsAtOnce() const;                 // 1 or more
///         void load(std::size_t slot, const Record&);      // slot < itemsAtOnce()
///         void compare(std::span<GalleryIterator::Item>);  // fills the scores of the loaded ones
///         const std::vector<ScoreHistogram>* distributions() const;
///         void expect(const Record&);                      // may have: of the next ones, the first
///     };

namespace Cmp::Implementation {

/// Walks the parts that a partitionizer gives.
template <class Comparer> class FeatureSetsIterator final : public GalleryIterator::Body {
public:
    using Source = Partitionizer<typename Comparer::Record>;
    using Partition = typename Source::Partition;

    /// @param first part that was taken from `source` already
    FeatureSetsIterator(const FNCountedPtr<Source>& source, const Partition& first, const Comparer& comparer,
                        std::size_t probes)
        : source_(source), partition_(first), next_(first.begin), comparer_(comparer),
          items_(comparer.itemsAtOnce(), {{}, std::vector<float>(probes)}) {}

    std::size_t loadNextItems() override {
        loaded_ = 0;
        while (next_ == partition_.end) {
            const auto partition = source_->getPartition();
            if (!partition) return 0;
            partition_ = *partition;
            next_ = partition_.begin;
        }
        const auto& all = partition_.records->items();
        for (; loaded_ < items_.size() && next_ < partition_.end; ++loaded_, ++next_) {
            items_[loaded_].id = all[next_].id;
            comparer_.load(loaded_, *all[next_].record);
            // What tells where the features of a record are must be there before they are asked for.
            constexpr std::size_t ahead = 6;
            if (partition_.end - next_ > ahead) __builtin_prefetch(all[next_ + ahead].record);
        }
        if constexpr (requires(Comparer & c, const typename Comparer::Record& r) { c.expect(r); })
            if (next_ < partition_.end) comparer_.expect(*all[next_].record);
        return loaded_;
    }

    std::span<const GalleryIterator::Item> compare() override {
        const auto loaded = std::span(items_).first(loaded_);
        comparer_.compare(loaded);
        return loaded;
    }

    const std::vector<ScoreHistogram>* rawScoreDistributions() const override {
        return comparer_.distributions();
    }

private:
    FNCountedPtr<Source> source_;
    Partition partition_;
    std::size_t next_;
    Comparer comparer_;
    std::vector<GalleryIterator::Item> items_;
    std::size_t loaded_ = 0;
};

/// Stands for no records at all.
class EmptyGalleryIterator final : public GalleryIterator::Body {
public:
    /// @param distributions may be empty, for none
    explicit EmptyGalleryIterator(const std::vector<ScoreHistogram>& distributions)
        : distributions_(distributions) {}

    std::size_t loadNextItems() override { return 0; }
    std::span<const GalleryIterator::Item> compare() override {
        FN_THROW(FNEBadFunCall, "Called compare on empty gallery");
    }
    const std::vector<ScoreHistogram>* rawScoreDistributions() const override {
        return distributions_.empty() ? nullptr : &distributions_;
    }

private:
    std::vector<ScoreHistogram> distributions_;
};

/// Iterators over populations, one for each part that there is, each with a copy of a comparer.
/// @param module begins the text of the refusal
/// @throws FNEBadArg for 0 partitions; std::bad_cast for a population of other records
template <class Comparer>
std::list<GalleryIterator> walkGallery(const Fn::View<Population>::Iterator& populations,
                                       unsigned int partitions, std::size_t probes, const Comparer& comparer,
                                       const std::string& module) {
    if (partitions == 0) FN_THROW(FNEBadArg, module + ": Number of partitions has to be >= 1");
    using Iterator = FeatureSetsIterator<Comparer>;
    using Body = FNCountedPtr<GalleryIterator::Body>;
    // All are looked at before any is compared: a search ends with all results or with none.
    std::list<Population> all;
    for (Fn::View<Population>::Iterator next = populations; !next.atEnd(); ++next) {
        all.push_back(*next);
        (void)dynamic_cast<const FeatureSets<typename Comparer::Record>&>(*all.back().body());
    }
    const FNCountedPtr<typename Iterator::Source> source(
        new typename Iterator::Source(Fn::View<Population>(all).begin(), partitions));
    std::list<GalleryIterator> iterators;
    for (unsigned int i = 0; i < partitions; ++i)
        if (const auto first = source->getPartition())
            iterators.emplace_back(Body(new Iterator(source, *first, comparer, probes)));
    if (iterators.empty()) {
        const auto* const distributions = comparer.distributions();
        iterators.emplace_back(
            Body(new EmptyGalleryIterator(distributions ? *distributions : std::vector<ScoreHistogram>())));
    }
    return iterators;
}

} // namespace Cmp::Implementation
