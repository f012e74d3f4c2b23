#include "cmp/encoding.h"

#include <cmath>
#include <cstring>
#include <numeric>

namespace Cmp::Implementation {

namespace {

constexpr unsigned int leastBits = 3, mostBits = 8, mostWordBits = 5;
/// Of the words that components are multiplied as.
constexpr int wordRangeBits = 15;
/// Words of 128-bit vectors; sums run in two of them at once.
constexpr unsigned int vectorWords = 8;

/// Codes of one size.
template <unsigned int n> class ComponentBlock final : public ComponentBlockBase {
public:
    ComponentBlock(unsigned int count, float factor, float wordScaling)
        : ComponentBlockBase(count, n, factor, wordScaling) {}

    void encodeVector(const float* components, unsigned char* encoded) const override {
        for (unsigned int i = 0; i < count_; encoded += sizeof(std::uint32_t)) {
            std::uint32_t word = 0;
            for (unsigned int k = 0; k < codesInWord && i < count_; ++k, ++i)
                word |= code(components[i]) << codeWidth * k;
            std::memcpy(encoded, &word, sizeof word);
        }
    }
    void decodeMem(const unsigned char* encoded, float* components) const override {
        decode(encoded, components, decodeTable_.data());
    }
    void decodeMemToWord(const unsigned char* encoded, short*& words) const override {
        if constexpr (n <= mostWordBits) {
            decode(encoded, words, wordTable_.data());
            words += count_;
        } else
            ComponentBlockBase::decodeMemToWord(encoded, words);
    }

private:
    static constexpr unsigned int codesInWord = 32 / n;
    static constexpr unsigned int codeWidth = n == 7 ? 8 : n; // bytes, where a code fits one badly

    std::uint32_t code(float component) const {
        const float q = std::floor(component * encodeFactor_);
        if (!(q >= minCode_)) return 0; // nor is what is not a number
        return static_cast<std::uint32_t>(std::min<float>(q, maxCode_) - minCode_);
    }
    template <class T> void decode(const unsigned char* encoded, T* values, const T* table) const {
        const unsigned int whole = count_ / codesInWord;
        std::uint32_t word;
        for (unsigned int i = 0; i < whole; ++i, encoded += sizeof word, values += codesInWord) {
            std::memcpy(&word, encoded, sizeof word);
            for (unsigned int k = 0; k < codesInWord; ++k)
                values[k] = table[word >> codeWidth * k & ((1u << n) - 1)];
        }
        if (whole * codesInWord == count_) return;
        std::memcpy(&word, encoded, sizeof word);
        for (unsigned int k = 0; k < count_ - whole * codesInWord; ++k)
            values[k] = table[word >> codeWidth * k & ((1u << n) - 1)];
    }
};

/// What factors have to be multiplied with to become integers without a common divisor that do not pass the
/// range of words.
float getScaling(const std::vector<float>& factors) {
    constexpr double maxRange = 1 << (wordRangeBits - 1), tolerance = 0.5 / maxRange;
    double best = 1;
    for (const float factor : factors) {
        const double f = factor;
        double power = 1;
        while (power <= 1e7 && !(std::abs(std::floor(f * power + 0.5) / power - f) / f < tolerance))
            power *= 10;
        best = std::max(best, power);
    }
    std::int64_t greatest = 0, divisor = 0;
    for (const float factor : factors) {
        const auto value = static_cast<std::int64_t>(factor * best);
        greatest = std::max(greatest, value);
        divisor = std::gcd(divisor, value);
    }
    double scaling = best / static_cast<double>(std::max(divisor, std::int64_t{1}));
    if (maxRange < static_cast<double>(greatest)) scaling *= (maxRange + 0.5) / static_cast<double>(greatest);
    return static_cast<float>(scaling);
}

/// How many products fit a sum of 32 bits: of a lane that takes two of each 16 words.
unsigned int maxSteps(const std::vector<unsigned int>& contributions) {
    std::int64_t sum = 0;
    unsigned int steps = 0;
    for (std::size_t i = 0; i < contributions.size(); i += i % 2 == 0 ? 1 : 2 * vectorWords - 1) {
        sum += contributions[i];
        if (sum > 0x7fffffff) break;
        ++steps;
    }
    return steps;
}

FNCountedPtr<const ComponentBlockBase> makeBlock(unsigned int bits, unsigned int count, float factor,
                                                 float wordScaling) {
    using Block = FNCountedPtr<const ComponentBlockBase>;
    switch (bits) {
    case 3:
        return Block(new ComponentBlock<3>(count, factor, wordScaling));
    case 4:
        return Block(new ComponentBlock<4>(count, factor, wordScaling));
    case 5:
        return Block(new ComponentBlock<5>(count, factor, wordScaling));
    case 6:
        return Block(new ComponentBlock<6>(count, factor, wordScaling));
    case 7: // one code in a byte, as are those of 8
        return Block(new ComponentBlock<7>(count, factor, wordScaling));
    default:
        return Block(new ComponentBlock<8>(count, factor, wordScaling));
    }
}

} // namespace

ComponentBlockBase::ComponentBlockBase(unsigned int count, unsigned int bits, float factor, float wordScaling)
    : count_(count), bits_(bits), factor_(factor), wordScaling_(wordScaling) {
    const int n = 1 << (bits - 1);
    minCode_ = static_cast<short>(-n);
    maxCode_ = static_cast<short>(n - 1);
    encodeFactor_ = static_cast<float>(n) / factor;
    const float decodeStep = 1 / encodeFactor_;
    const int wordOffset = static_cast<int>(wordScaling * factor + 0.0001f);
    for (int i = 0; i < 2 * n; ++i) {
        const auto index = static_cast<std::size_t>(i);
        decodeTable_[index] = (static_cast<float>(i - n) + 0.5f) * decodeStep;
        if (bits <= mostWordBits)
            wordTable_[index] = static_cast<short>(wordOffset + (i - n) * 2 * wordOffset);
    }
}

std::size_t ComponentBlockBase::size() const {
    const unsigned int codes = 32 / bits_;
    return sizeof(std::uint32_t) * ((count_ + codes - 1) / codes);
}

void ComponentBlockBase::decodeMemToWord(const unsigned char*, short*&) const {
    FN_THROW(FNEBadArg, "decoding to word not implemented for this bitsize");
}

double ComponentBlockBase::wordDotProductScale() const {
    return 1 / (std::ldexp(1.0, static_cast<int>(2 * bits_)) * double{wordScaling_} * double{wordScaling_});
}

unsigned int ComponentBlockBase::wordDotProductMaxContribution() const {
    const unsigned int greatest =
        ((1u << bits_) - 1) * static_cast<unsigned int>(factor_ * wordScaling_ + 0.001f);
    return greatest * greatest;
}

void ComponentBlockCollector::registerBlock(unsigned int bits, unsigned int count, float const& factor) {
    if (bits < leastBits || bits > mostBits) FN_THROW(FNEBadArg, "Invalid bitsize in component block");
    registered_.push_back({bits, count, factor});
}

ComponentBlockCollector::Blocks
ComponentBlockCollector::finalizeRegistration(std::vector<Group>& groups) const {
    if (registered_.empty()) FN_THROW(FNEBadArg, "Finishing empty bit size block");
    std::vector<float> factors;
    for (const Registered& block : registered_) factors.push_back(block.factor);
    const float scaling = getScaling(factors);
    Blocks blocks;
    std::vector<unsigned int> contributions; // of each component of the group
    for (const Registered& block : registered_) {
        blocks.push_back(makeBlock(block.bits, block.count, block.factor, scaling));
        contributions.insert(contributions.end(), block.count,
                             blocks.back()->wordDotProductMaxContribution());
        const bool last = blocks.size() == registered_.size();
        if (!last && registered_[blocks.size()].bits == block.bits) continue;
        groups.push_back({static_cast<unsigned int>(contributions.size()),
                          blocks.back()->wordDotProductScale(), maxSteps(contributions)});
        contributions.clear();
    }
    return blocks;
}

} // namespace Cmp::Implementation
