#pragma once

#include "cmp/score.h"
#include "fn/cptr.h"
#include "fn/invertible_function.h"

#include <string>

/// From the raw scores of a comparison algorithm, which have no fixed range, to scores, and from scores to
/// rates of error and back. All operations are const and without locks.

namespace Cmp::Implementation {

class ScoreMapping {
public:
    virtual ~ScoreMapping() = default;
    virtual Score convert(float raw) const = 0;
    virtual float convert(const Score& score) const = 0;
};

/// Raw scores are the scores.
class IdentityScoreMapping final : public ScoreMapping {
public:
    /// Does not clamp.
    Score convert(float raw) const override { return Score::unclamped(raw); }
    float convert(const Score& score) const override { return score.value(); }
};

/// By a table from raw scores to scores.
class SMap final : public ScoreMapping {
public:
    explicit SMap(const Fn::InvertibleFunction<float, float>& table) : table_(table) {}
    Score convert(float raw) const override { return Score(table_(raw)); }
    float convert(const Score& score) const override { return table_.applyInverse(score.value()); }

private:
    Fn::InvertibleFunction<float, float> table_;
};

/// False acceptance rate (FAR): the share of pairs of different people whose score is above a threshold.
/// False rejection rate (FRR): the share of pairs of one person whose score is below it.
class RatesMapping {
public:
    virtual ~RatesMapping() = default;
    /// The threshold that has a rate.
    virtual Score requestFAR(float rate) const = 0;
    virtual Score requestFRR(float rate) const = 0;
    /// The rates of a threshold.
    virtual float expectedFAR(const Score& threshold) const = 0;
    virtual float expectedFRR(const Score& threshold) const = 0;
};

/// By tables from scores to rates.
class RMap final : public RatesMapping {
public:
    RMap(const Fn::InvertibleFunction<float, float>& far, const Fn::InvertibleFunction<float, float>& frr)
        : far_(far), frr_(frr) {}
    Score requestFAR(float rate) const override { return Score(far_.applyInverse(rate)); }
    Score requestFRR(float rate) const override { return Score(frr_.applyInverse(rate)); }
    float expectedFAR(const Score& threshold) const override { return far_(threshold.value()); }
    float expectedFRR(const Score& threshold) const override { return frr_(threshold.value()); }

private:
    Fn::InvertibleFunction<float, float> far_;
    Fn::InvertibleFunction<float, float> frr_;
};

} // namespace Cmp::Implementation
