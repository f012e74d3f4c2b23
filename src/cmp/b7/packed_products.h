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

    /// Prepared features: factors of the bytes of packed ones, once these are taken apart.
    class Probes {
    public:
        std::size_t size() const { return size_; }

    private:
        friend class PackedProducts;
        /// Factors of the bytes of 16 words.
        struct alignas(64) Chunk {
            std::array<signed char, 64> factors{};
        };
        /// Of up to so many, which are served by one run over a feature.
        struct Batch {
            std::size_t size;
            std::vector<Chunk> chunks; ///< by group, 16 words, plane, probe
            std::vector<Sums> subtrahends;
        };
        std::size_t size_ = 0;
        std::vector<Batch> batches_;
    };
    Probes prepare(std::span<const unsigned char* const> packed) const;

    /// The sums of one feature with each probe.
    /// @param out probes.size() of them
    /// @param ahead what is going to be compared next, to be fetched meanwhile; may be null
    void sums(const unsigned char* packed, const Probes& probes, Sums* out,
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
        std::size_t pad = 0;                  ///< words before it that its vectors have, with factors 0
        std::size_t chunks = 0;               ///< of 16 words
        std::size_t weights = 0, factors = 0; ///< chunks before its own, the latter for one probe
        int scaleBits = 0;                    ///< log2 of what all codes are multiplied with
    };
    /// o^2, twice for each of 16 words.
    struct alignas(64) Weights {
        std::array<short, 32> values{};
    };

    void fillWeights(const Group& group);
    void prepare(const unsigned char* packed, std::size_t place, Probes::Batch& batch) const;

    std::vector<Group> groups_;
    std::vector<Weights> weights_;
    std::size_t chunks_ = 0; ///< of one probe
};

} // namespace Cmp::B7
