#pragma once

#include "fn/vector.h"

namespace Fn {

/// A monotonic function, sampled at equal distances, that can be read in both directions.
template <class X, class Y> class InvertibleFunction;

/// Sample i stands at xMin + i / scale; between samples the function is linear, and beyond the ends it keeps
/// their values. Immutable.
///
/// Packs as a list: the text "INVFUNC40", the samples, xMin, xMax. Two older forms are read, too, which hold
/// the places of the samples in place of the range: "INVFUNC30" (samples, places) and "INVFUNC20" (samples,
/// two packages without meaning, places). Of the places only the first and the last count.
template <> class InvertibleFunction<float, float> {
public:
    /// @throws FNEBadArg for less than two samples; FNEIOError for a number that is not finite, or a range
    /// that is wider than a float can say
    InvertibleFunction(const FNVector<float>& values, float xMin, float xMax);
    /// @throws FNEIOError for another form; FNEBadArg for a package that is no list of these
    explicit InvertibleFunction(const Package& package);
    explicit operator Package() const;

    float operator()(float x) const;
    /// Where the function takes a value: the end of the range for a value beyond it, and on a stretch of
    /// equal samples the first of them.
    float applyInverse(const float& y) const;

    const FNVector<float>& values() const noexcept { return values_; }
    float xMin() const noexcept { return xMin_; }
    float xMax() const noexcept { return xMax_; }

private:
    void readOlderPlaces(const FNVector<float>& places);
    void init();
    float place(int i) const { return xMin_ + static_cast<float>(i) / scale_; }

    FNVector<float> values_;
    float xMin_ = 0;
    float xMax_ = 0;
    int lastIndex_ = 0;
    float scale_ = 0; ///< samples per unit of x
    bool increasing_ = false;
};

} // namespace Fn
