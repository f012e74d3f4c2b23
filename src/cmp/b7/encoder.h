#pragma once

#include "cmp/b7/packed_products.h"
#include "fn/vector.h"

#include <optional>

namespace Cmp::B7 {

/// A feature vector; its scores have this mean and standard deviation taken out of them.
struct FloatingPointFeature {
    FNVector<float> vector;
    float mean = 0, stdDev = 1;

    /// Plain scalar product.
    float score(FloatingPointFeature const& other) const { return vector * other.vector; }
};

/// The same as words whose products are those of components in integers: group after group of the encoder,
/// each filled up with 0 to a multiple of 8.
struct FixedPointFeature {
    FNVector<short> vector;
    float mean = 0, stdDev = 1;
};

/// From features of 5912 components to the 2728 bytes of a record and back: mean, standard deviation, 1.0 and
/// blocks of 5, 4 and 3 bits. Immutable; may be used by any number of threads.
class Encoder {
public:
    using EncodedFeature = std::vector<unsigned char>;
    using Group = Implementation::ComponentBlockCollector::Group;

    Encoder();

    /// @param encoded mementoSize() bytes. @throws FNEBadArg for a feature of another size
    void encode(const FloatingPointFeature& feature, unsigned char* encoded) const;
    /// @param feature from createRawType() or createRawFixedType()
    void decode(const unsigned char* encoded, FloatingPointFeature& feature) const;
    void decode(const unsigned char* encoded, FixedPointFeature& feature) const;
    /// The blocks, without what is before them.
    void encode(const float* components, unsigned char* encoded) const;
    void decode(const unsigned char* encoded, float* components) const;
    void decode(const unsigned char* encoded, short* words) const;

    /// Room for a feature.
    EncodedFeature createEncodedType() const { return EncodedFeature(encodedSize_); }
    FloatingPointFeature createRawType() const { return {FNVector<float>(components_, 0.0f)}; }
    FixedPointFeature createRawFixedType() const { return {FNVector<short>(words_, short{0})}; }

    /// Of a feature vector, of its words, and the bytes of an encoded one.
    std::size_t components() const { return components_; }
    std::size_t words() const { return words_; }
    std::size_t mementoSize() const { return encodedSize_; }

    const std::vector<Group>& groups() const { return groups_; }
    /// The magnitude up to which each component is told apart.
    std::vector<float> factors() const;

    /// Bytes of an encoded feature before the blocks, which are what packedProducts() takes.
    static constexpr std::size_t headerSize = 3 * sizeof(float);
    const PackedProducts& packedProducts() const { return *products_; }
    /// The scalar product of two features from their sums: rounded once, and group by group.
    float product(const PackedProducts::Sums& sums) const;
    float productByGroups(const PackedProducts::Sums& sums) const;

    /// The scalar product of two features, from their words.
    float wordDotProduct(const short* a, const short* b) const;
    /// a * b, a * c
    void wordDotProduct(const short* a, const short* b, const short* c, float* out) const;
    /// a * c, a * d, b * c, b * d
    void wordDotProduct(const short* a, const short* b, const short* c, const short* d, float* out) const;

private:
    Implementation::ComponentBlockCollector::Blocks blocks_;
    std::vector<Group> groups_;
    std::optional<PackedProducts> products_;
    std::size_t components_ = 0, words_ = 0, encodedSize_ = 0;
};

} // namespace Cmp::B7
