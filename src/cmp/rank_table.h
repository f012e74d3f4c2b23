#pragma once

#include <cmath>
#include <cstddef>
#include <span>

namespace Cmp::Implementation {

/// Turns the rank of a filter response among its neighbours into a number. The table has an element for each
/// rank in a full neighbourhood, the response itself included, and may have one more, for what lies beyond
/// the last one; it must outlive this.
class RankTable {
public:
    /// @param full size of a full neighbourhood
    RankTable(std::span<const float> values, unsigned int full) : values_(values), full_(full) {}

    /// @param greater how many of the neighbours exceed the response, below `total`
    /// @param total size of the neighbourhood. The ranks of a smaller one are spread over those of the full.
    float operator()(unsigned int greater, unsigned int total) const {
        if (total == full_) return values_[greater];
        const float spread = static_cast<float>(full_) / static_cast<float>(total);
        const float pos = spread * (static_cast<float>(greater) + 0.5f);
        const float whole = std::trunc(pos - 0.5f), t = pos - (whole + 0.5f);
        const auto i = static_cast<std::size_t>(whole);
        return (1 - t) * values_[i] + t * values_[i + 1 < values_.size() ? i + 1 : i];
    }

private:
    std::span<const float> values_;
    unsigned int full_;
};

} // namespace Cmp::Implementation
