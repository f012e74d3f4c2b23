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
    static constexpr int scale = 4; ///< the greatest power of two before a code
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
constexpr std::size_t vectorWords = 16;

/// What one run over the words of a group needs.
struct GroupRun {
    const unsigned char* packed;
    std::size_t words; ///< a multiple of vectorWords
    const short* weights;
    const unsigned char* ahead; ///< may be null
};

} // namespace
} // namespace Cmp::B7
#endif

HWY_BEFORE_NAMESPACE();
namespace Cmp::B7::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

#if HWY_TARGET != HWY_SCALAR
using Bytes = hn::CappedTag<std::uint8_t, 4 * vectorWords>;
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

/// Weighted sums of the products of one group with those of N probes.
/// @param factors of each probe; those of one plane lie one behind the other
template <unsigned int bits, std::size_t N>
HWY_INLINE void groupSums(const GroupRun& run, const signed char* const* factors, std::int64_t* out) {
    constexpr std::size_t planes = std::size(Planes<bits>::shifts);
    const Words dw;
    const Pairs dp;
    const Sums32 ds;
    const std::size_t lanes = hn::Lanes(dw), planeSize = 4 * run.words;
    hn::Vec<Sums32> sums[N], others[N];
    for (std::size_t n = 0; n < N; ++n) sums[n] = others[n] = hn::Zero(ds);
    for (std::size_t w = 0; w < run.words; w += vectorWords) {
        if (run.ahead) hwy::Prefetch(run.ahead + 4 * w);
        for (std::size_t i = w; i < w + vectorWords; i += lanes) {
            const auto load = [&](const void* bytes) HWY_ATTR {
                return hn::BitCast(dw, hn::LoadU(Bytes(), static_cast<const std::uint8_t*>(bytes) + 4 * i));
            };
            const auto packed = load(run.packed);
            const auto codes0 = hn::And(packed, hn::Set(dw, Planes<bits>::masks[0]));
            const auto codes1 =
                hn::And(hn::ShiftRight<Planes<bits>::shifts[1]>(packed), hn::Set(dw, Planes<bits>::masks[1]));
            const auto codes2 = hn::And(hn::ShiftRight<Planes<bits>::shifts[planes - 1]>(packed),
                                        hn::Set(dw, Planes<bits>::masks[planes - 1]));
            const auto weights = hn::LoadU(dp, run.weights + 2 * i);
            for (std::size_t n = 0; n < N; ++n) {
                auto products = hn::Add(pairProducts(codes0, load(factors[n])),
                                        pairProducts(codes1, load(factors[n] + planeSize)));
                if constexpr (planes == 3)
                    products = hn::Add(products, pairProducts(codes2, load(factors[n] + 2 * planeSize)));
                sums[n] = hn::ReorderWidenMulAccumulate(ds, products, weights, sums[n], others[n]);
            }
        }
    }
    for (std::size_t n = 0; n < N; ++n) {
        HWY_ALIGN std::int32_t lane[vectorWords];
        hn::Store(hn::Add(sums[n], others[n]), ds, lane);
        std::int64_t sum = 0;
        for (std::size_t i = 0; i < lanes; ++i) sum += lane[i];
        out[n] = sum;
    }
}
#else
template <unsigned int bits, std::size_t N>
void groupSums(const GroupRun& run, const signed char* const* factors, std::int64_t* out) {
    constexpr std::size_t planes = std::size(Planes<bits>::shifts);
    for (std::size_t n = 0; n < N; ++n) {
        out[n] = 0;
        for (std::size_t w = 0; w < run.words; ++w) {
            std::uint32_t packed;
            std::memcpy(&packed, run.packed + 4 * w, 4);
            int sum = 0;
            for (std::size_t k = 0; k < planes; ++k) {
                const std::uint32_t codes = packed >> Planes<bits>::shifts[k] & Planes<bits>::masks[k];
                for (unsigned int b = 0; b < 4; ++b)
                    sum += static_cast<int>(codes >> 8 * b & 0xff) * factors[n][4 * (k * run.words + w) + b];
            }
            out[n] += std::int64_t{sum} * run.weights[2 * w];
        }
    }
}
#endif

template <std::size_t N>
void sums(unsigned int bits, const GroupRun& run, const signed char* const* factors, std::int64_t* out) {
    switch (bits) {
    case 3:
        return groupSums<3, N>(run, factors, out);
    case 4:
        return groupSums<4, N>(run, factors, out);
    default:
        return groupSums<5, N>(run, factors, out);
    }
}
void sums1(unsigned int bits, const GroupRun& run, const signed char* const* factors, std::int64_t* out) {
    sums<1>(bits, run, factors, out);
}
void sums2(unsigned int bits, const GroupRun& run, const signed char* const* factors, std::int64_t* out) {
    sums<2>(bits, run, factors, out);
}
void sums3(unsigned int bits, const GroupRun& run, const signed char* const* factors, std::int64_t* out) {
    sums<3>(bits, run, factors, out);
}
void sums4(unsigned int bits, const GroupRun& run, const signed char* const* factors, std::int64_t* out) {
    sums<4>(bits, run, factors, out);
}
void sums5(unsigned int bits, const GroupRun& run, const signed char* const* factors, std::int64_t* out) {
    sums<5>(bits, run, factors, out);
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

constexpr std::size_t wholeVectors(std::size_t words) {
    return (words + vectorWords - 1) / vectorWords * vectorWords;
}

} // namespace

PackedProducts::PackedProducts(const Blocks& blocks) {
    std::size_t words = 0;
    for (const auto& block : blocks) {
        if (block->bits() < 3 || block->bits() > 5) FN_THROW(FNEBadArg, "Products of blocks of other bits");
        if (groups_.empty() || groups_.back().bits != block->bits())
            groups_.push_back({block->bits(), words, 0, {}});
        Group& group = groups_.back();
        group.blocks.push_back({block->count(), block->size() / 4, int{block->wordOffset()}});
        group.words += block->size() / 4;
        words += block->size() / 4;
    }
    if (groups_.size() > mostGroups) FN_THROW(FNEBadArg, "Products of more groups of blocks than expected");
    for (Group& group : groups_) {
        // Vectors reach over the end of a group, or over its beginning where a feature ends with it.
        const std::size_t rest = wholeVectors(group.words) - group.words;
        const bool before = group.begin + group.words + rest > words;
        if (before && rest > group.begin) FN_THROW(FNEBadArg, "Products of features that are too short");
        group.pad = before ? rest : 0;
        group.weights = weights_.size();
        group.factors = factors_;
        weights_.resize(weights_.size() + 2 * wholeVectors(group.words));
        factors_ += 4 * planesOf(group.bits).shifts.size() * wholeVectors(group.words);
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
                weights_[group.weights + 2 * word + half] = static_cast<short>(weight);
            lanes[word % 4] += weight * planes.scale * most * most * (32 / group.bits);
        }
        if (weight > 0x7fff || *std::ranges::max_element(lanes) > 0x7fffffff)
            FN_THROW(FNEBadArg, "Products of features do not fit");
    }
}

PackedProducts::Probe PackedProducts::prepare(const unsigned char* packed) const {
    Probe probe;
    probe.factors.resize(factors_);
    for (std::size_t g = 0; g < groups_.size(); ++g) {
        const Group& group = groups_[g];
        const int codes = 1 << group.bits, scale = planesOf(group.bits).scale;
        const std::size_t planeSize = 4 * wholeVectors(group.words);
        const std::vector<Place> places = placesOf(group.bits);
        signed char* out = probe.factors.data() + group.factors + 4 * group.pad;
        std::int64_t sum = 0;
        for (const Block& block : group.blocks)
            for (std::size_t w = 0; w < block.words; ++w, packed += 4, out += 4) {
                std::uint32_t word;
                std::memcpy(&word, packed, sizeof word);
                for (const Place& place : places) {
                    if (w * (32 / group.bits) + place.code >= block.count) continue;
                    const int code = static_cast<int>(word >> group.bits * place.code) & (codes - 1);
                    const int odd = 2 * code + 1 - codes;
                    out[place.plane * planeSize + place.byte] =
                        static_cast<signed char>(odd * scale / place.power);
                    sum += odd * block.offset * block.offset;
                }
            }
        probe.subtrahends[g] = (codes - 1) * sum;
    }
    return probe;
}

void PackedProducts::sums(const unsigned char* packed, std::span<const Probe> probes, Sums* out,
                          const unsigned char* ahead) const {
    while (!probes.empty()) {
        const std::size_t n = std::min(probesAtOnce, probes.size());
        for (std::size_t g = 0; g < groups_.size(); ++g) {
            const Group& group = groups_[g];
            const std::size_t begin = 4 * (group.begin - group.pad);
            const GroupRun run{packed + begin, wholeVectors(group.words), weights_.data() + group.weights,
                               ahead ? ahead + begin : nullptr};
            const signed char* factors[probesAtOnce];
            std::int64_t sums[probesAtOnce];
            for (std::size_t i = 0; i < n; ++i) factors[i] = probes[i].factors.data() + group.factors;
            switch (n) {
            case 1:
                HWY_DYNAMIC_DISPATCH(sums1)(group.bits, run, factors, sums);
                break;
            case 2:
                HWY_DYNAMIC_DISPATCH(sums2)(group.bits, run, factors, sums);
                break;
            case 3:
                HWY_DYNAMIC_DISPATCH(sums3)(group.bits, run, factors, sums);
                break;
            case 4:
                HWY_DYNAMIC_DISPATCH(sums4)(group.bits, run, factors, sums);
                break;
            default:
                HWY_DYNAMIC_DISPATCH(sums5)(group.bits, run, factors, sums);
            }
            const int scale = planesOf(group.bits).scale;
            for (std::size_t i = 0; i < n; ++i) out[i][g] = 2 * (sums[i] / scale) - probes[i].subtrahends[g];
        }
        probes = probes.subspan(n);
        out += n;
        ahead = nullptr;
    }
}

} // namespace Cmp::B7
#endif
