#include "cmp/b7/packed_products.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "cmp/b7/packed_products.cpp"
#include <hwy/foreach_target.h>

#include <hwy/cache_control.h>
#include <hwy/highway.h>

#include <algorithm>
#include <bit>
#include <cstring>

#ifndef ORBEK_B7_PACKED_PRODUCTS
#define ORBEK_B7_PACKED_PRODUCTS
namespace Cmp::B7 {
namespace {

/// How a word of packed codes is taken apart: shifted and masked, each byte has at most one whole code.
template <unsigned int bits> struct Planes;
template <> struct Planes<3> {
    static constexpr int shifts[] = {0, 3, 6};
    static constexpr std::uint32_t masks[] = {0x071c0e07, 0x071c0e07, 0x071c0e07};
    static constexpr int scale = 4; ///< the greatest power of two that a code is multiplied with
};
template <> struct Planes<4> {
    static constexpr int shifts[] = {0, 4};
    static constexpr std::uint32_t masks[] = {0x0f0f0f0f, 0x0f0f0f0f};
    static constexpr int scale = 1;
};
template <> struct Planes<5> {
    static constexpr int shifts[] = {0, 5, 4};
    static constexpr std::uint32_t masks[] = {0x3e007c1f, 0x00007c1f, 0x001f0000};
    static constexpr int scale = 4;
};

/// Vectors of up to so many words go over a group without a rest.
constexpr std::size_t chunkWords = 16;
constexpr std::size_t chunkBytes = 4 * chunkWords;

/// A run over the words of one group.
struct GroupRun {
    unsigned int bits;
    const unsigned char* packed;
    const unsigned char* ahead; ///< is fetched
    std::size_t chunks;
    const short* weights;
    const signed char* factors; ///< chunks of bytes: by 16 words, plane, probe
};

} // namespace
} // namespace Cmp::B7
#endif

HWY_BEFORE_NAMESPACE();
namespace Cmp::B7::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

#if HWY_TARGET != HWY_SCALAR
using Bytes = hn::CappedTag<std::uint8_t, chunkBytes>;
using Words = hn::Repartition<std::uint32_t, Bytes>;
using Pairs = hn::Repartition<std::int16_t, Bytes>;
using Sums32 = hn::Repartition<std::int32_t, Bytes>;

/// Products of unsigned and signed bytes, the two of each 16 bits added. They fit.
HWY_INLINE hn::Vec<Pairs> pairProducts(hn::Vec<Words> codes, hn::Vec<Words> factors) {
    const Pairs d;
#if HWY_TARGET == HWY_AVX2
    (void)d;
    return hn::Vec<Pairs>{_mm256_maddubs_epi16(codes.raw, factors.raw)};
#elif HWY_TARGET == HWY_SSE4 || HWY_TARGET == HWY_SSSE3
    (void)d;
    return hn::Vec<Pairs>{_mm_maddubs_epi16(codes.raw, factors.raw)};
#elif HWY_TARGET <= HWY_AVX3 && HWY_ARCH_X86
    (void)d;
    return hn::Vec<Pairs>{_mm512_maddubs_epi16(codes.raw, factors.raw)};
#else
    const auto c = hn::BitCast(d, codes), f = hn::BitCast(d, factors);
    const auto low = hn::Mul(hn::And(c, hn::Set(d, 0xff)), hn::ShiftRight<8>(hn::ShiftLeft<8>(f)));
    const hn::RebindToUnsigned<Pairs> du;
    const auto high = hn::Mul(hn::BitCast(d, hn::ShiftRight<8>(hn::BitCast(du, c))), hn::ShiftRight<8>(f));
    return hn::Add(low, high);
#endif
}

/// Vectors of one group's words, taken apart, and their weights.
template <unsigned int bits> struct Codes {
    static constexpr std::size_t planes = std::size(Planes<bits>::shifts);

    HWY_INLINE Codes(const unsigned char* packed, const short* weightsOfThem) {
        const Words d;
        const auto words = hn::BitCast(d, hn::LoadU(Bytes(), packed));
        first = hn::And(words, hn::Set(d, Planes<bits>::masks[0]));
        second = hn::And(hn::ShiftRight<Planes<bits>::shifts[1]>(words), hn::Set(d, Planes<bits>::masks[1]));
        last = hn::And(hn::ShiftRight<Planes<bits>::shifts[planes - 1]>(words),
                       hn::Set(d, Planes<bits>::masks[planes - 1]));
        weights = hn::LoadU(Pairs(), weightsOfThem);
    }

    /// Adds the weighted products with the factors of one probe.
    /// @param stride from plane to plane
    HWY_INLINE void addProducts(const signed char* factors, std::size_t stride, hn::Vec<Sums32>& sum,
                                hn::Vec<Sums32>& other) const {
        const auto plane = [&](std::size_t k) HWY_ATTR {
            const auto* const bytes = reinterpret_cast<const std::uint8_t*>(factors + k * stride);
            return hn::BitCast(Words(), hn::LoadU(Bytes(), bytes));
        };
        auto products = hn::Add(pairProducts(first, plane(0)), pairProducts(second, plane(1)));
        if constexpr (planes == 3) products = hn::Add(products, pairProducts(last, plane(2)));
        sum = hn::ReorderWidenMulAccumulate(Sums32(), products, weights, sum, other);
    }

    hn::Vec<Words> first, second, last;
    hn::Vec<Pairs> weights;
};

/// Exact, in 64 bits.
HWY_INLINE std::int64_t sumOfLanes(hn::Vec<Sums32> v) {
    const hn::RepartitionToWide<Sums32> d;
    const hn::Half<Sums32> half;
    const auto low = hn::PromoteTo(d, hn::LowerHalf(half, v)),
               high = hn::PromoteTo(d, hn::UpperHalf(half, v));
    return hn::GetLane(hn::SumOfLanes(d, hn::Add(low, high)));
}

/// Weighted sums of the products of one group with those of several probes, each of which has a register of
/// its own.
/// @param out of each probe in turn, a Sums apart
template <unsigned int bits, std::size_t... n>
HWY_INLINE void groupSums(std::index_sequence<n...>, const GroupRun& run, std::int64_t* out) {
    constexpr std::size_t stride = sizeof...(n) * chunkBytes;
    const Sums32 d;
    const std::size_t lanes = hn::Lanes(d);
    hn::Vec<Sums32> sums[] = {(static_cast<void>(n), hn::Zero(d))...};
    hn::Vec<Sums32> others[] = {(static_cast<void>(n), hn::Zero(d))...};
    const signed char* factors = run.factors;
    for (std::size_t c = 0; c < run.chunks; ++c, factors += Codes<bits>::planes * stride) {
        hwy::Prefetch(run.ahead + c * chunkBytes);
        for (std::size_t i = 0; i < chunkWords; i += lanes) {
            const std::size_t word = c * chunkWords + i;
            const Codes<bits> codes(run.packed + 4 * word, run.weights + 2 * word);
            (codes.addProducts(factors + n * chunkBytes + 4 * i, stride, sums[n], others[n]), ...);
        }
    }
    ((out[n * PackedProducts::mostGroups] = sumOfLanes(hn::Add(sums[n], others[n]))), ...);
}
#else
template <unsigned int bits, std::size_t... n>
void groupSums(std::index_sequence<n...>, const GroupRun& run, std::int64_t* out) {
    constexpr std::size_t planes = std::size(Planes<bits>::shifts), probes = sizeof...(n);
    for (const std::size_t p : {n...}) {
        std::int64_t total = 0;
        for (std::size_t w = 0; w < run.chunks * chunkWords; ++w) {
            std::uint32_t packed;
            std::memcpy(&packed, run.packed + 4 * w, 4);
            int sum = 0;
            for (std::size_t k = 0; k < planes; ++k) {
                const std::uint32_t codes = packed >> Planes<bits>::shifts[k] & Planes<bits>::masks[k];
                const signed char* const factors = run.factors +
                                                   ((w / chunkWords * planes + k) * probes + p) * chunkBytes +
                                                   4 * (w % chunkWords);
                for (unsigned int b = 0; b < 4; ++b)
                    sum += static_cast<int>(codes >> 8 * b & 0xff) * factors[b];
            }
            total += std::int64_t{sum} * run.weights[2 * w];
        }
        out[p * PackedProducts::mostGroups] = total;
    }
}
#endif

/// Of all groups.
template <std::size_t N> void sums(std::span<const GroupRun> runs, std::int64_t* out) {
    const std::make_index_sequence<N> n;
    for (const GroupRun& run : runs) {
        switch (run.bits) {
        case 3:
            groupSums<3>(n, run, out++);
            break;
        case 4:
            groupSums<4>(n, run, out++);
            break;
        default:
            groupSums<5>(n, run, out++);
        }
    }
}
void sums1(std::span<const GroupRun> runs, std::int64_t* out) {
    sums<1>(runs, out);
}
void sums2(std::span<const GroupRun> runs, std::int64_t* out) {
    sums<2>(runs, out);
}
void sums3(std::span<const GroupRun> runs, std::int64_t* out) {
    sums<3>(runs, out);
}
void sums4(std::span<const GroupRun> runs, std::int64_t* out) {
    sums<4>(runs, out);
}
void sums5(std::span<const GroupRun> runs, std::int64_t* out) {
    sums<5>(runs, out);
}

} // namespace
} // namespace Cmp::B7::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Cmp::B7 {

namespace {

HWY_EXPORT(sums1);
HWY_EXPORT(sums2);
HWY_EXPORT(sums3);
HWY_EXPORT(sums4);
HWY_EXPORT(sums5);

/// So many are served by one run over a feature.
constexpr std::size_t probesAtOnce = 5;

struct PlaneTable {
    std::span<const int> shifts;
    std::span<const std::uint32_t> masks;
    int scale;
};

PlaneTable planesOf(unsigned int bits) {
    const auto table = []<unsigned int n>(Planes<n>) {
        return PlaneTable{Planes<n>::shifts, Planes<n>::masks, Planes<n>::scale};
    };
    return bits == 3 ? table(Planes<3>()) : bits == 4 ? table(Planes<4>()) : table(Planes<5>());
}

/// A byte of a plane that has a code, times a power of two.
struct Place {
    unsigned int code; ///< number of the code in the word
    std::size_t plane, byte;
    int power;
};

/// One for each code of a word.
std::vector<Place> placesOf(unsigned int bits) {
    const PlaneTable table = planesOf(bits);
    std::vector<Place> places;
    std::uint32_t placed = 0;
    for (std::size_t k = 0; k < table.shifts.size(); ++k)
        for (unsigned int b = 0; b < 4; ++b) {
            const auto mask = static_cast<unsigned char>(table.masks[k] >> 8 * b);
            if (mask == 0) continue;
            const auto low = static_cast<unsigned int>(std::countr_zero(mask));
            const unsigned int code = (static_cast<unsigned int>(table.shifts[k]) + 8 * b + low) / bits;
            if (code >= 32 / bits || (placed >> code & 1) != 0) continue; // no code, or another plane's
            placed |= 1u << code;
            places.push_back({code, k, b, 1 << low});
        }
    return places;
}

} // namespace

PackedProducts::PackedProducts(const Blocks& blocks) {
    std::size_t words = 0;
    for (const auto& block : blocks) {
        if (block->bits() < 3 || block->bits() > 5) FN_THROW(FNEBadArg, "Products of blocks of other bits");
        if (groups_.empty() || groups_.back().bits != block->bits())
            groups_.push_back({.bits = block->bits(), .begin = words, .blocks = {}});
        Group& group = groups_.back();
        group.blocks.push_back({block->count(), block->size() / 4, int{block->wordOffset()}});
        group.words += block->size() / 4;
        words += block->size() / 4;
    }
    if (groups_.size() > mostGroups) FN_THROW(FNEBadArg, "Products of more groups of blocks than expected");
    for (Group& group : groups_) {
        // Vectors reach over the end of a group, or over its beginning where a feature ends with it.
        group.chunks = (group.words + chunkWords - 1) / chunkWords;
        const std::size_t rest = group.chunks * chunkWords - group.words;
        const bool before = group.begin + group.words + rest > words;
        if (before && rest > group.begin) FN_THROW(FNEBadArg, "Products of features that are too short");
        group.pad = before ? rest : 0;
        group.scaleBits = std::countr_zero(static_cast<unsigned int>(planesOf(group.bits).scale));
        group.weights = weights_.size();
        group.factors = chunks_;
        weights_.resize(weights_.size() + group.chunks);
        chunks_ += planesOf(group.bits).shifts.size() * group.chunks;
        fillWeights(group);
    }
}

/// @throws FNEBadArg if the sum of a lane of four does not fit 32 bits
void PackedProducts::fillWeights(const Group& group) {
    const PlaneTable planes = planesOf(group.bits);
    const std::int64_t most = (1 << group.bits) - 1;
    std::array<std::int64_t, 4> lanes{};
    std::size_t word = group.pad;
    for (const Block& block : group.blocks) {
        const int weight = block.offset * block.offset;
        for (std::size_t i = 0; i < block.words; ++i, ++word) {
            for (std::size_t half = 0; half < 2; ++half)
                weights_[group.weights + word / chunkWords].values[2 * (word % chunkWords) + half] =
                    static_cast<short>(weight);
            lanes[word % 4] += weight * planes.scale * most * most * (32 / group.bits);
        }
        if (weight > 0x7fff || *std::ranges::max_element(lanes) > 0x7fffffff)
            FN_THROW(FNEBadArg, "Products of features do not fit");
    }
}

PackedProducts::Probes PackedProducts::prepare(std::span<const unsigned char* const> packed) const {
    Probes probes;
    probes.size_ = packed.size();
    for (; !packed.empty(); packed = packed.subspan(probes.batches_.back().size)) {
        const std::size_t n = std::min(probesAtOnce, packed.size());
        Probes::Batch& batch = probes.batches_.emplace_back();
        batch.size = n;
        batch.chunks.resize(n * chunks_);
        batch.subtrahends.resize(n);
        for (std::size_t i = 0; i < n; ++i) prepare(packed[i], i, batch);
    }
    return probes;
}

void PackedProducts::prepare(const unsigned char* packed, std::size_t place, Probes::Batch& batch) const {
    for (std::size_t g = 0; g < groups_.size(); ++g) {
        const Group& group = groups_[g];
        const PlaneTable planes = planesOf(group.bits);
        const int codes = 1 << group.bits;
        const std::vector<Place> places = placesOf(group.bits);
        std::size_t word = group.pad;
        std::int64_t sum = 0;
        for (const Block& block : group.blocks)
            for (std::size_t w = 0; w < block.words; ++w, ++word, packed += 4) {
                std::uint32_t bits;
                std::memcpy(&bits, packed, sizeof bits);
                for (const Place& at : places) {
                    if (w * (32 / group.bits) + at.code >= block.count) continue;
                    const int code = static_cast<int>(bits >> group.bits * at.code) & (codes - 1);
                    const int odd = 2 * code + 1 - codes;
                    const std::size_t chunk = word / chunkWords * planes.shifts.size() + at.plane;
                    batch.chunks[group.factors * batch.size + chunk * batch.size + place]
                        .factors[4 * (word % chunkWords) + at.byte] =
                        static_cast<signed char>(odd * planes.scale / at.power);
                    sum += odd * block.offset * block.offset;
                }
            }
        batch.subtrahends[place][g] = (codes - 1) * sum;
    }
}

void PackedProducts::sums(const unsigned char* packed, const Probes& probes, Sums* out,
                          const unsigned char* ahead) const {
    for (const Probes::Batch& batch : probes.batches_) {
        std::array<GroupRun, mostGroups> runs;
        for (std::size_t g = 0; g < groups_.size(); ++g) {
            const Group& group = groups_[g];
            const std::size_t begin = 4 * (group.begin - group.pad);
            runs[g] = {group.bits,
                       packed + begin,
                       (ahead ? ahead : packed) + begin,
                       group.chunks,
                       weights_[group.weights].values.data(),
                       batch.chunks[group.factors * batch.size].factors.data()};
        }
        const std::span<const GroupRun> all(runs.data(), groups_.size());
        std::int64_t sums[probesAtOnce * mostGroups];
        switch (batch.size) {
        case 1:
            HWY_DYNAMIC_DISPATCH(sums1)(all, sums);
            break;
        case 2:
            HWY_DYNAMIC_DISPATCH(sums2)(all, sums);
            break;
        case 3:
            HWY_DYNAMIC_DISPATCH(sums3)(all, sums);
            break;
        case 4:
            HWY_DYNAMIC_DISPATCH(sums4)(all, sums);
            break;
        default:
            HWY_DYNAMIC_DISPATCH(sums5)(all, sums);
        }
        for (std::size_t i = 0; i < batch.size; ++i, ++out)
            for (std::size_t g = 0; g < groups_.size(); ++g)
                (*out)[g] = 2 * (sums[i * mostGroups + g] >> groups_[g].scaleBits) - batch.subtrahends[i][g];
        ahead = nullptr;
    }
}

} // namespace Cmp::B7
#endif
