#include "cmp/b7/encoder.h"

#include "cmp/dot_product16.h"

#include <cstring>

namespace Cmp::B7 {

namespace {

/// Bits, components and factor of the blocks: what the components of the trained projection vary less, gets
/// fewer bits. Trained.
constexpr struct {
    unsigned int bits, count;
    float factor;
} blockTable[] = {
    {5, 6, 1.67f},   {5, 6, 1.40f},   {5, 6, 1.21f},   {5, 6, 1.16f},   {5, 6, 1.11f},   {5, 18, 1.07f},
    {5, 6, 1.02f},   {5, 12, 1.01f},  {4, 16, 0.94f},  {4, 8, 0.91f},   {4, 8, 0.89f},   {4, 8, 0.88f},
    {4, 16, 0.87f},  {4, 8, 0.84f},   {4, 88, 0.82f},  {4, 16, 0.80f},  {4, 48, 0.79f},  {4, 32, 0.78f},
    {4, 136, 0.77f}, {4, 96, 0.75f},  {4, 48, 0.74f},  {4, 32, 0.73f},  {4, 48, 0.72f},  {4, 128, 0.71f},
    {4, 56, 0.70f},  {4, 88, 0.69f},  {4, 352, 0.68f}, {4, 216, 0.65f}, {4, 104, 0.63f}, {4, 216, 0.62f},
    {4, 48, 0.61f},  {4, 144, 0.60f}, {4, 176, 0.59f}, {4, 240, 0.58f}, {4, 104, 0.56f}, {4, 24, 0.55f},
    {4, 24, 0.54f},  {4, 160, 0.53f}, {4, 168, 0.52f}, {4, 96, 0.51f},  {4, 40, 0.50f},  {4, 320, 0.49f},
    {3, 150, 0.48f}, {3, 140, 0.47f}, {3, 220, 0.46f}, {3, 80, 0.45f},  {3, 580, 0.44f}, {3, 270, 0.43f},
    {3, 10, 0.42f},  {3, 310, 0.41f}, {3, 230, 0.39f}, {3, 470, 0.38f}, {3, 74, 0.35f}};

/// Of the words of a group.
constexpr std::size_t padded(std::size_t n) {
    return (n + 7) >> 3 << 3;
}

} // namespace

Encoder::Encoder() {
    Implementation::ComponentBlockCollector collector;
    for (const auto& block : blockTable) {
        collector.registerBlock(block.bits, block.count, block.factor);
        components_ += block.count;
    }
    blocks_ = collector.finalizeRegistration(groups_);
    products_.emplace(blocks_);
    encodedSize_ = headerSize;
    for (const auto& block : blocks_) encodedSize_ += block->size();
    for (const Group& group : groups_) words_ += padded(group.first);
}

std::vector<float> Encoder::factors() const {
    std::vector<float> factors;
    for (const auto& block : blocks_) factors.insert(factors.end(), block->count(), block->factor());
    return factors;
}

void Encoder::encode(const FloatingPointFeature& feature, unsigned char* encoded) const {
    if (feature.vector.size() != components_)
        FN_THROW(FNEBadArg, "PCLD: feature of " + std::to_string(feature.vector.size()) +
                                " components instead of " + std::to_string(components_));
    const float header[] = {feature.mean, feature.stdDev, 1.0f};
    std::memcpy(encoded, header, headerSize);
    encode(feature.vector.get(), encoded + headerSize);
}

void Encoder::encode(const float* components, unsigned char* encoded) const {
    for (const auto& block : blocks_) {
        block->encodeVector(components, encoded);
        components += block->count();
        encoded += block->size();
    }
}

void Encoder::decode(const unsigned char* encoded, FloatingPointFeature& feature) const {
    std::memcpy(&feature.mean, encoded, sizeof(float));
    std::memcpy(&feature.stdDev, encoded + sizeof(float), sizeof(float));
    decode(encoded + headerSize, feature.vector.getExclusive());
}

void Encoder::decode(const unsigned char* encoded, FixedPointFeature& feature) const {
    std::memcpy(&feature.mean, encoded, sizeof(float));
    std::memcpy(&feature.stdDev, encoded + sizeof(float), sizeof(float));
    decode(encoded + headerSize, feature.vector.getExclusive());
}

void Encoder::decode(const unsigned char* encoded, float* components) const {
    for (const auto& block : blocks_) {
        block->decodeMem(encoded, components);
        components += block->count();
        encoded += block->size();
    }
}

void Encoder::decode(const unsigned char* encoded, short* words) const {
    auto block = blocks_.begin();
    for (const Group& group : groups_) {
        const short* const begin = words;
        while (words < begin + group.first) {
            (*block)->decodeMemToWord(encoded, words);
            encoded += (*block++)->size();
        }
        while (words < begin + padded(group.first)) *words++ = 0;
    }
}

float Encoder::product(const PackedProducts::Sums& sums) const {
    double total = 0;
    for (std::size_t g = 0; g < groups_.size(); ++g)
        total += static_cast<double>(sums[g]) * groups_[g].second;
    return static_cast<float>(total);
}

float Encoder::productByGroups(const PackedProducts::Sums& sums) const {
    float total = 0;
    for (std::size_t g = 0; g < groups_.size(); ++g)
        total += static_cast<float>(static_cast<double>(sums[g]) * groups_[g].second);
    return total;
}

float Encoder::wordDotProduct(const short* a, const short* b) const {
    double total = 0;
    for (const Group& group : groups_) {
        const std::size_t n = padded(group.first);
        total +=
            static_cast<double>(dotProd16(a, b, static_cast<unsigned int>(n), group.third)) * group.second;
        a += n;
        b += n;
    }
    return static_cast<float>(total);
}

void Encoder::wordDotProduct(const short* a, const short* b, const short* c, float* out) const {
    out[0] = out[1] = 0;
    for (const Group& group : groups_) {
        const std::size_t n = padded(group.first);
        long sums[2];
        dotProd16x2(b, c, a, static_cast<unsigned int>(n), group.third, sums);
        for (int i = 0; i < 2; ++i) out[i] += static_cast<float>(static_cast<double>(sums[i]) * group.second);
        a += n;
        b += n;
        c += n;
    }
}

void Encoder::wordDotProduct(const short* a, const short* b, const short* c, const short* d,
                             float* out) const {
    for (int i = 0; i < 4; ++i) out[i] = 0;
    for (const Group& group : groups_) {
        const std::size_t n = padded(group.first);
        long sums[4];
        dotProd162x2(a, b, c, d, static_cast<unsigned int>(n), group.third, sums);
        for (int i = 0; i < 4; ++i) out[i] += static_cast<float>(static_cast<double>(sums[i]) * group.second);
        a += n;
        b += n;
        c += n;
        d += n;
    }
}

} // namespace Cmp::B7
