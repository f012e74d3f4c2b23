#pragma once

#include "cmp/b7/core.h"
#include "cmp/b7/value_histogram.h"
#include "cmp/gallery_iterator.h"

namespace Cmp::B7 {

/// The features of the probes of a search, prepared to be compared with packed ones.
class PreparedProbes {
public:
    /// @throws std::bad_cast for a record of another algorithm
    PreparedProbes(const FNCountedPtr<const Core>& core, std::span<const FIR> probes);
    /// Number of probes.
    std::size_t size() const { return size_; }

private:
    friend class PackedScorer;
    /// Of one feature, beside what it is multiplied by.
    struct Origin {
        std::size_t probe;
        float mean, stdDev;
    };

    FNCountedPtr<const Core> core_;
    std::size_t size_;
    std::vector<Origin> origins_; ///< of the features of all probes
    PackedProducts::Probes features_;
};

/// Compares records with probes as they are, packed, and gives the same scores as score() of decoded ones,
/// bit for bit. Belongs to one thread.
class PackedScorer {
public:
    using Record = Core::Records::Record;

    explicit PackedScorer(const FNCountedPtr<const PreparedProbes>& probes)
        : probes_(probes), sums_(probes->features_.size()) {}

    /// The scores of one record. @param next is compared next; null if that is not known
    void score(const Record& record, const Record* next, std::span<float> scores);
    /// Of two at once.
    void score(const Record& record1, const Record& record2, const Record* next, std::span<float> scores1,
               std::span<float> scores2);

private:
    const unsigned char* codes(const Record& record, std::size_t feature) const;
    template <class Score>
    void scoreFeature(const Record& record, std::size_t feature, const Record* next, std::span<float> scores,
                      Score score);

    FNCountedPtr<const PreparedProbes> probes_;
    std::vector<PackedProducts::Sums> sums_;
};

/// What a walk over a gallery compares with, see gallery_walk.h.
class GalleryComparer {
public:
    using Record = PackedScorer::Record;

    explicit GalleryComparer(const FNCountedPtr<const Core>& core,
                             const FNCountedPtr<const PreparedProbes>& probes);

    std::size_t itemsAtOnce() const { return loaded_.size(); }
    void load(std::size_t slot, const Record& record) {
        loaded_[slot] = &core_->records().demandSize(record);
    }
    void expect(const Record& next) { next_ = &next; }
    void compare(std::span<Implementation::GalleryIterator::Item> items);
    const std::vector<ScoreHistogram>* distributions() const;

private:
    FNCountedPtr<const Core> core_;
    PackedScorer scorer_;
    std::vector<const Record*> loaded_;      ///< by slot
    const Record* next_ = nullptr;           ///< null at the end of a part
    std::vector<ValueHistogram> histograms_; ///< of each probe, or none
    mutable std::vector<ScoreHistogram> distributions_;
};

} // namespace Cmp::B7
