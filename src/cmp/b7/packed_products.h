#pragma once

#include "cmp/encoding.h"

#include <cstdint>
#include <span>

namespace Cmp::B7 {

/// Exact scalar products of packed features, as the words of decoded ones would give them, without the words.
///
/// A feature that many others are compared with is prepared once. A word of a packed feature is then taken
/// apart with a few shifts and masks, after which each of its bytes holds one code times a power of two, and
/// bytes are what vector units multiply most of at once. With c a packed code from 0 to 2 n - 1, p a
/// prepared one as the odd number 2 c + 1 - 2 n, and o the offset of the block's words,
///
///     sum of p o (2 c + 1 - 2 n) o = 2 sum of c p o^2 - (2 n - 1) sum of p o^2
///
/// where only the first sum depends on both. Immutable.
class PackedProducts {
public:
    using Blocks = Implementation::ComponentBlockCollector::Blocks;
    static constexpr std::size_t mostGroups = 3;
    /// Of products of words, for each group of blocks with the same bits.
    using Sums = std::array<std::int64_t, mostGroups>;

    /// @param blocks groups of 3, 4 and 5 bits, the order being that of the words
    /// @throws FNEBadArg for others, or if their sums do not fit
    explicit PackedProducts(const Blocks& blocks);

    /// A prepared feature: factors of the bytes of packed ones, once they are taken apart.
    class Probe {
    private:
        friend class PackedProducts;
        std::vector<signed char> factors;
        Sums subtrahends{};
    };
    Probe prepare(const unsigned char* packed) const;

    /// The sums of one feature with several.
    /// @param ahead what is going to be compared next, to be fetched meanwhile; may be null
    void sums(const unsigned char* packed, std::span<const Probe> probes, Sums* out,
              const unsigned char* ahead = nullptr) const;

private:
    struct Block {
        std::size_t count, words;
        int offset;
    };
    struct Group {
        unsigned int bits;
        std::size_t begin; ///< packed words before it
        std::size_t words = 0;
        std::vector<Block> blocks;
        std::size_t padded = 0;               ///< words in whole vectors
        int scaleBits = 0;                    ///< log2 of what all codes are multiplied with
        std::size_t pad = 0;                  ///< words before it that its vectors have, with factors 0
        std::size_t weights = 0, factors = 0; ///< places of its own
    };

    void fillWeights(const Group& group);

    std::vector<Group> groups_;
    std::vector<short> weights_; ///< o^2, twice for each word
    std::size_t factors_ = 0;    ///< bytes
};

} // namespace Cmp::B7
