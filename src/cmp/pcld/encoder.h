#pragma once

#include "cmp/pcld/floating_point_feature.h"

namespace Cmp::Pcld {

/// From features to the bytes of a record and back. Immutable.
class Encoder {
public:
    using EncodedFeature = std::vector<unsigned char>;

    virtual ~Encoder() = default;
    /// @param encoded mementoSize() bytes. @throws FNEBadArg for a feature of another size
    virtual void encode(const FloatingPointFeature& feature, unsigned char* encoded) const = 0;
    /// @param feature from createRawType()
    virtual void decode(const unsigned char* encoded, FloatingPointFeature& feature) const = 0;
    /// Room for a feature.
    virtual EncodedFeature createEncodedType() const = 0;
    virtual FloatingPointFeature createRawType() const = 0;
    /// Of a feature vector.
    virtual std::size_t components() const = 0;
    /// Bytes of an encoded feature.
    virtual std::size_t mementoSize() const = 0;
};

/// Mean, deviation, norm and the components as they are in memory.
class FloatEncoder final : public Encoder {
public:
    explicit FloatEncoder(std::size_t components) : components_(components) {}

    void encode(const FloatingPointFeature& feature, unsigned char* encoded) const override;
    void decode(const unsigned char* encoded, FloatingPointFeature& feature) const override;
    EncodedFeature createEncodedType() const override { return EncodedFeature(mementoSize()); }
    FloatingPointFeature createRawType() const override {
        return {FNVector<float>(components_, 0.0f), 0, 1, 1};
    }
    std::size_t components() const override { return components_; }
    std::size_t mementoSize() const override { return sizeof(float) * (3 + components_); }

private:
    std::size_t components_;
};

} // namespace Cmp::Pcld
