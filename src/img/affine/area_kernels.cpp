#include "img/affine/area_kernels.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "img/affine/area_kernels.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

#include <algorithm>

HWY_BEFORE_NAMESPACE();
namespace Img::Affine::Kernels::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

/// Loads elements as vectors of the accumulator's type.
template <class D> HWY_INLINE hn::Vec<D> loadAs(D d, const std::uint16_t* from) {
    return hn::PromoteTo(d, hn::LoadU(hn::Rebind<std::uint16_t, D>(), from));
}
template <class D, class T> HWY_INLINE hn::Vec<D> loadAs(D d, const T* from) {
    return hn::LoadU(d, from);
}

template <class T, class Acc>
void combine(const T* const* rows, std::size_t count, const std::uint32_t* weights, Acc* out, std::size_t n) {
    const hn::ScalableTag<Acc> d;
    const std::size_t lanes = hn::Lanes(d);
    std::size_t i = 0;
    for (; i + lanes <= n; i += lanes) {
        auto sum = hn::Mul(loadAs(d, rows[0] + i), hn::Set(d, static_cast<Acc>(weights[0])));
        for (std::size_t k = 1; k < count; ++k)
            sum = hn::Add(sum, hn::Mul(loadAs(d, rows[k] + i), hn::Set(d, static_cast<Acc>(weights[k]))));
        hn::StoreU(sum, d, out + i);
    }
    for (; i < n; ++i) {
        Acc sum{};
        for (std::size_t k = 0; k < count; ++k) sum += static_cast<Acc>(weights[k]) * rows[k][i];
        out[i] = sum;
    }
}

void combineU16(const std::uint16_t* const* rows, std::size_t count, const std::uint32_t* weights,
                std::uint32_t* out, std::size_t n) {
    combine(rows, count, weights, out, n);
}
void combineU32(const std::uint32_t* const* rows, std::size_t count, const std::uint32_t* weights,
                std::uint32_t* out, std::size_t n) {
    combine(rows, count, weights, out, n);
}
void combineF32(const float* const* rows, std::size_t count, const std::uint32_t* weights, float* out,
                std::size_t n) {
    combine(rows, count, weights, out, n);
}

#if HWY_TARGET == HWY_SCALAR

void narrowSums(const NarrowWindows& windows, const std::uint16_t* row, std::uint32_t* out) {
    for (std::size_t x = 0; x < windows.paddedSize(); ++x) {
        const std::uint16_t* const from = row + windows.starts()[x / 4] + windows.shuffles()[4 * x] / 2;
        out[x] = 0;
        for (int k = 0; k < 2; ++k) {
            out[x] += static_cast<std::uint32_t>(windows.weights01()[2 * x + k]) * from[k];
            out[x] += static_cast<std::uint32_t>(windows.weights23()[2 * x + k]) * from[k + 2];
        }
    }
}

#else

/// 8 pixels for each of 1 or 2 blocks.
template <class D>
HWY_INLINE hn::Vec<D> loadBlocks(D d, const std::int16_t* row, const std::uint32_t* starts) {
    if constexpr (hn::MaxLanes(D()) == 8) {
        return hn::LoadU(d, row + starts[0]);
    } else {
        const hn::Half<D> half;
        return hn::Combine(d, hn::LoadU(half, row + starts[1]), hn::LoadU(half, row + starts[0]));
    }
}

/// Two blocks (AVX2 and up) or one at a time. Pixels become signed by subtracting 2^15, since the pairwise
/// multiplication is a signed one; the offsets put it right.
template <bool pairsSuffice>
HWY_INLINE void narrowSumsOf(const NarrowWindows& windows, const std::uint16_t* pixels, std::uint32_t* out) {
    const hn::CappedTag<std::int16_t, 16> d16;
    const hn::Repartition<std::int32_t, decltype(d16)> d32;
    const hn::Repartition<std::uint8_t, decltype(d16)> d8;
    const std::size_t blocks = windows.paddedSize() / 4, step = hn::Lanes(d16) / 8;
    const auto* const row = reinterpret_cast<const std::int16_t*>(pixels);
    const auto toSigned = hn::Set(d16, -32768);

    for (std::size_t b = 0; b < blocks; b += step) {
        const auto shuffle = hn::LoadU(d8, windows.shuffles() + 16 * b);
        const auto pairs = [&](const std::int16_t* from) HWY_ATTR {
            const auto eight = hn::Xor(loadBlocks(d16, from, windows.starts() + b), toSigned);
            return hn::BitCast(d16, hn::TableLookupBytes(hn::BitCast(d8, eight), shuffle));
        };
        auto odd = hn::Zero(d32);
        auto sum = hn::LoadU(d32, windows.offsets() + 4 * b);
        sum = hn::ReorderWidenMulAccumulate(d32, pairs(row), hn::LoadU(d16, windows.weights01() + 8 * b), sum,
                                            odd);
        if constexpr (!pairsSuffice)
            sum = hn::ReorderWidenMulAccumulate(d32, pairs(row + 2),
                                                hn::LoadU(d16, windows.weights23() + 8 * b), sum, odd);
        sum = hn::RearrangeToOddPlusEven(sum, odd);
        hn::StoreU(sum, d32, reinterpret_cast<std::int32_t*>(out) + 4 * b);
    }
}

void narrowSums(const NarrowWindows& windows, const std::uint16_t* row, std::uint32_t* out) {
    windows.pairsSuffice() ? narrowSumsOf<true>(windows, row, out) : narrowSumsOf<false>(windows, row, out);
}

#endif

/// Applies `op` to n sums (given as an index) and stores what it gives as 16-bit words.
template <class VectorOp, class ScalarOp>
HWY_INLINE void toWords(std::uint16_t* out, std::size_t n, VectorOp vectorOp, ScalarOp scalarOp) {
    const hn::ScalableTag<std::int32_t> d;
    const hn::Rebind<std::uint16_t, decltype(d)> d16;
    std::size_t i = 0;
    for (; i + hn::Lanes(d) <= n; i += hn::Lanes(d))
        hn::StoreU(hn::DemoteTo(d16, hn::BitCast(d, vectorOp(i))), d16, out + i);
    for (; i < n; ++i) out[i] = static_cast<std::uint16_t>(scalarOp(i));
}

void shiftWords(const std::uint32_t* sums, int shift, std::uint16_t* out, std::size_t n) {
    const hn::ScalableTag<std::uint32_t> d;
    toWords(
        out, n, [&](std::size_t i) HWY_ATTR { return hn::ShiftRightSame(hn::LoadU(d, sums + i), shift); },
        [&](std::size_t i) { return sums[i] >> shift; });
}

void multiplyWords(const std::uint32_t* sums, const std::uint32_t* reciprocals, std::uint16_t* out,
                   std::size_t n) {
    const hn::ScalableTag<std::uint32_t> d;
    const auto low = hn::Set(d, 0xFFFF);
    toWords(
        out, n,
        [&](std::size_t i) HWY_ATTR {
            const auto s = hn::LoadU(d, sums + i), r = hn::LoadU(d, reciprocals + i);
            const auto sHigh = hn::ShiftRight<16>(s), rHigh = hn::ShiftRight<16>(r);
            const auto mixed = hn::Add(hn::ShiftRight<16>(hn::Mul(sHigh, hn::And(r, low))),
                                       hn::ShiftRight<16>(hn::Mul(hn::And(s, low), rHigh)));
            return hn::Add(mixed, hn::Mul(sHigh, rHigh));
        },
        [&](std::size_t i) {
            const std::uint32_t sHigh = sums[i] >> 16, sLow = sums[i] & 0xFFFF;
            const std::uint32_t rHigh = reciprocals[i] >> 16, rLow = reciprocals[i] & 0xFFFF;
            return ((sHigh * rLow) >> 16) + ((sLow * rHigh) >> 16) + sHigh * rHigh;
        });
}

void splitPixels(const Fn::Bgra32* pixels, const std::array<std::uint16_t*, 3>& planes, std::size_t n) {
    const hn::ScalableTag<std::uint16_t> d;
    const hn::Rebind<std::uint8_t, decltype(d)> bytes;
    const std::size_t lanes = hn::Lanes(d);
    const auto store = [&](auto channel, std::uint16_t* out) {
        hn::StoreU(hn::Or(hn::ShiftLeft<8>(hn::PromoteTo(d, channel)), hn::Set(d, 128)), d, out);
    };
    std::size_t i = 0;
    for (; i + lanes <= n; i += lanes) {
        hn::Vec<decltype(bytes)> b, g, r, a;
        hn::LoadInterleaved4(bytes, reinterpret_cast<const std::uint8_t*>(pixels + i), b, g, r, a);
        store(b, planes[0] + i);
        store(g, planes[1] + i);
        store(r, planes[2] + i);
    }
    const auto wide = [](unsigned char v) { return static_cast<std::uint16_t>(v << 8 | 128); };
    for (; i < n; ++i) {
        planes[0][i] = wide(pixels[i].b);
        planes[1][i] = wide(pixels[i].g);
        planes[2][i] = wide(pixels[i].r);
    }
}

void joinPixels(const std::array<const std::uint16_t*, 3>& planes, Fn::Bgra32* pixels, std::size_t n) {
    const hn::ScalableTag<std::uint16_t> d;
    const hn::RebindToSigned<decltype(d)> words;
    const hn::Rebind<std::uint8_t, decltype(d)> bytes;
    const std::size_t lanes = hn::Lanes(d);
    const auto load = [&](const std::uint16_t* plane) {
        return hn::DemoteTo(bytes, hn::BitCast(words, hn::ShiftRight<8>(hn::LoadU(d, plane))));
    };
    std::size_t i = 0;
    for (; i + lanes <= n; i += lanes)
        hn::StoreInterleaved4(load(planes[0] + i), load(planes[1] + i), load(planes[2] + i),
                              hn::Set(bytes, 255), bytes, reinterpret_cast<std::uint8_t*>(pixels + i));
    const auto high = [&](const std::uint16_t* plane) { return static_cast<unsigned char>(plane[i] >> 8); };
    for (; i < n; ++i) pixels[i] = {high(planes[2]), high(planes[1]), high(planes[0])};
}

} // namespace
} // namespace Img::Affine::Kernels::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Img::Affine::Kernels {

namespace {
HWY_EXPORT(combineU16);
HWY_EXPORT(combineU32);
HWY_EXPORT(combineF32);
HWY_EXPORT(narrowSums);
HWY_EXPORT(shiftWords);
HWY_EXPORT(multiplyWords);
HWY_EXPORT(splitPixels);
HWY_EXPORT(joinPixels);
} // namespace

void combineRows(std::span<const std::uint16_t* const> rows, const std::uint32_t* weights, std::uint32_t* out,
                 std::size_t n) {
    HWY_DYNAMIC_DISPATCH(combineU16)(rows.data(), rows.size(), weights, out, n);
}
void combineRows(std::span<const std::uint32_t* const> rows, const std::uint32_t* weights, std::uint32_t* out,
                 std::size_t n) {
    HWY_DYNAMIC_DISPATCH(combineU32)(rows.data(), rows.size(), weights, out, n);
}
void combineRows(std::span<const float* const> rows, const std::uint32_t* weights, float* out,
                 std::size_t n) {
    HWY_DYNAMIC_DISPATCH(combineF32)(rows.data(), rows.size(), weights, out, n);
}
void shiftDown(const std::uint32_t* sums, int shift, std::uint16_t* out, std::size_t n) {
    HWY_DYNAMIC_DISPATCH(shiftWords)(sums, shift, out, n);
}
void multiplyHigh(const std::uint32_t* sums, const std::uint32_t* reciprocals, std::uint16_t* out,
                  std::size_t n) {
    HWY_DYNAMIC_DISPATCH(multiplyWords)(sums, reciprocals, out, n);
}
void multiply(const float* sums, const float* factors, float* out, std::size_t n) {
    for (std::size_t i = 0; i < n; ++i) out[i] = sums[i] * factors[i];
}
void splitColor(const Fn::Bgra32* pixels, const std::array<std::uint16_t*, 3>& planes, std::size_t n) {
    HWY_DYNAMIC_DISPATCH(splitPixels)(pixels, planes, n);
}
void joinColor(const std::array<const std::uint16_t*, 3>& planes, Fn::Bgra32* pixels, std::size_t n) {
    HWY_DYNAMIC_DISPATCH(joinPixels)(planes, pixels, n);
}

bool NarrowWindows::suits(const Overlap& overlap) {
    if (overlap.taps > 4) return false;
    for (std::uint32_t x = 0; x < overlap.size(); ++x)
        if (overlap.first[x] - overlap.first[x - x % block] > 6) return false;
    return true;
}

NarrowWindows::NarrowWindows(const Overlap& overlap) {
    const std::size_t blocks = (overlap.size() + 7) / 8 * 2;
    starts_.assign(blocks, 0);
    shuffles_.assign(16 * blocks, 0);
    weights01_.assign(8 * blocks, 0);
    weights23_.assign(8 * blocks, 0);
    offsets_.assign(4 * blocks, 0);
    for (std::uint32_t x = 0; x < overlap.size(); ++x) {
        if (x % block == 0) starts_[x / block] = overlap.first[x];
        const std::uint32_t byte = 2 * (overlap.first[x] - starts_[x / block]);
        for (std::uint32_t i = 0; i < 4; ++i) shuffles_[4 * x + i] = static_cast<std::uint8_t>(byte + i);
        for (std::uint32_t k = 0; k < overlap.taps; ++k) {
            const std::uint32_t weight = overlap.weight(x)[k];
            (k < 2 ? weights01_ : weights23_)[2 * x + k % 2] = static_cast<std::int16_t>(weight);
            offsets_[x] += static_cast<std::int32_t>(weight << 15);
            if (k >= 2 && weight != 0) pairsSuffice_ = false;
        }
    }
}

void NarrowWindows::sums(const std::uint16_t* row, std::uint32_t* out) const {
    HWY_DYNAMIC_DISPATCH(narrowSums)(*this, row, out);
}

} // namespace Img::Affine::Kernels
#endif
