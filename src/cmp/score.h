#pragma once

#include "fn/serialize.h"

namespace Cmp {

/// How sure it is that two records are of one person, from 0 to 1.
class Score {
public:
    Score() = default;
    /// Values beyond 0 and 1 become 0 and 1; one that is no number passes unchanged.
    explicit Score(float value) : value_(value > 1 ? 1.0f : value < 0 ? 0.0f : value) {}
    /// Holds any number as it is.
    static Score unclamped(float value) {
        Score score;
        score.value_ = value;
        return score;
    }

    float value() const noexcept { return value_; }
    auto operator<=>(const Score&) const = default;

private:
    float value_ = 0;
};

} // namespace Cmp
