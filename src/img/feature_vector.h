#pragma once

#include "fn/vector.h"

namespace Img {

/// A vector of features, and the order in which they lie: the trained one (canonical), or one of the variants
/// of a layout in which an extractor finds it cheaper to deliver them.
template <class T> class FeatureVector {
public:
    FeatureVector() = default;
    /// In canonical order.
    explicit FeatureVector(const FNVector<T>& values) : values_(values) {}
    /// In the order of variant `variant` of a layout.
    FeatureVector(const FNVector<T>& values, unsigned int variant)
        : values_(values), canonical_(false), variant_(variant) {}

    std::size_t size() const noexcept { return values_.size(); }
    const FNVector<T>& values() const noexcept { return values_; }
    bool canonical() const noexcept { return canonical_; }
    /// 0 for a canonical vector.
    unsigned int variant() const noexcept { return variant_; }

private:
    FNVector<T> values_;
    bool canonical_ = true;
    unsigned int variant_ = 0;
};

/// How a canonical vector is reordered into the vectors that evaluation uses.
template <class T> class FeatureVectorLayout {
public:
    virtual ~FeatureVectorLayout() = default;
    /// Number of variants, at least 1.
    virtual unsigned int variants() const = 0;
    /// @param variant below variants()
    virtual FeatureVector<T> canonicalToIntermediate(const FeatureVector<T>& canonical,
                                                     unsigned int variant) const = 0;
};

/// The identity: one variant, which is the canonical order.
template <class T> class CanonicalFeatureVectorLayout final : public FeatureVectorLayout<T> {
public:
    unsigned int variants() const override { return 1; }
    FeatureVector<T> canonicalToIntermediate(const FeatureVector<T>& canonical,
                                             unsigned int variant) const override {
        return FeatureVector<T>(canonical.values(), variant);
    }
};

} // namespace Img
