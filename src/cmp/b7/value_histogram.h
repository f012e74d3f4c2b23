#pragma once

#include "cmp/matches.h"

#include <limits>

namespace Cmp::B7 {

/// The bins in which raw scores are counted.
inline constexpr float rawScoreMin = -500, rawScoreMax = 5000;
inline constexpr unsigned int rawScoreBins = 4000;
inline constexpr float rawScoreBinWidth = (rawScoreMax - rawScoreMin) / rawScoreBins;

/// Counts values in bins of equal width between two values. Those below are dropped, those above go into the
/// last bin.
class ValueHistogram {
public:
    /// @throws FNEBadArg for a range that is turned round, no bins, or bins without width
    ValueHistogram(double min, double max, unsigned int bins) : min_(min), max_(max) {
        if (min > max) FN_THROW(FNEBadArg, "minvalue larger than maxvalue for binning interval");
        if (bins == 0) FN_THROW(FNEBadArg, "Number of bins cannot be 0");
        if ((max - min) / bins < std::numeric_limits<double>::min())
            FN_THROW(FNEBadArg, "Diminishing binning subinterval");
        binsPerUnit_ = bins / (max - min);
        counts_ = ScoreHistogram(bins, 0u);
    }

    void add(float value) {
        if (!(value >= min_)) return;
        unsigned int* const counts = counts_.getExclusive();
        const std::size_t last = counts_.size() - 1;
        const auto bin = value >= max_ ? last : static_cast<std::size_t>((value - min_) * binsPerUnit_);
        ++counts[std::min(bin, last)]; // rounding may reach the end
    }

    const ScoreHistogram& counts() const { return counts_; }

private:
    double min_, max_, binsPerUnit_;
    ScoreHistogram counts_;
};

} // namespace Cmp::B7
