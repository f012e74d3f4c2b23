#pragma once

#include "fn/cptr.h"
#include "fn/serialize.h"

#include <array>
#include <vector>

/// Feature components in a few bits each, for which a factor tells the range: block by block of components
/// that share both. Codes lie in words of 32 bits in the order of bytes of the machine, the first one in the
/// lowest bits, as many as fit; the last word of a block may have room left, which is 0.

namespace Cmp::Implementation {

class ComponentBlockBase {
public:
    virtual ~ComponentBlockBase() = default;

    unsigned int count() const { return count_; }
    unsigned int bits() const { return bits_; }
    float factor() const { return factor_; }
    /// Words are odd multiples of this. For up to 5 bits.
    short wordOffset() const { return wordTable_[1u << (bits_ - 1)]; }
    std::size_t size() const; ///< in bytes

    /// Codes are floor(x * 2^(bits - 1) / factor), cut to their range.
    virtual void encodeVector(const float* components, unsigned char* encoded) const = 0;
    /// The middles of what the codes stand for.
    virtual void decodeMem(const unsigned char* encoded, float* components) const = 0;
    /// The same in a unit that makes them integers; moves `words` behind them.
    /// @throws FNEBadArg for more than 5 bits
    virtual void decodeMemToWord(const unsigned char* encoded, short*& words) const;

    /// What turns products of words into those of components.
    double wordDotProductScale() const;
    /// The greatest product of two words, in magnitude.
    unsigned int wordDotProductMaxContribution() const;

protected:
    ComponentBlockBase(unsigned int count, unsigned int bits, float factor, float wordScaling);

    unsigned int count_, bits_;
    float factor_, wordScaling_;
    short minCode_, maxCode_;
    float encodeFactor_;
    std::array<float, 256> decodeTable_{}; ///< by code less the least one
    std::array<short, 32> wordTable_{};    ///< the same, of up to 5 bits
};

/// Makes the blocks of an encoder.
class ComponentBlockCollector {
public:
    /// A group of blocks of the same bits: number of components, wordDotProductScale(), and how many products
    /// of words can be summed in 32 bits.
    using Group = FNTriple<unsigned int, double, unsigned int>;
    using Blocks = std::vector<FNCountedPtr<const ComponentBlockBase>>;

    /// Blocks of the same bits come one after another. @throws FNEBadArg for bits other than 3 to 8
    void registerBlock(unsigned int bits, unsigned int count, float const& factor);
    /// @throws FNEBadArg without any block
    Blocks finalizeRegistration(std::vector<Group>& groups) const;

private:
    struct Registered {
        unsigned int bits, count;
        float factor;
    };
    std::vector<Registered> registered_;
};

} // namespace Cmp::Implementation
