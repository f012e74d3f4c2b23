#include "eye/gabor/responses.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "eye/gabor/responses.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

HWY_BEFORE_NAMESPACE();
namespace Eye::Gabor::HWY_NAMESPACE {

#if HWY_TARGET == HWY_SCALAR

void computeResponsesOfTarget(const KernelTable& kernels, const unsigned short* pixels,
                              std::size_t pixelStride, std::uint32_t step, Responses& responses) {
    Plain::computeResponses(kernels, pixels, pixelStride, step, responses);
}
void compareInWindowOfTarget(const Responses& responses, unsigned d, std::uint32_t y, std::int32_t* codes) {
    Plain::compareInWindow(responses, d, y, codes);
}
void compareInPatchOfTarget(const Responses& responses, std::uint32_t y, unsigned char* const bytes[8]) {
    Plain::compareInPatch(responses, y, bytes);
}

#else

namespace hn = hwy::HWY_NAMESPACE;
using D32 = hn::CappedTag<std::int32_t, 16>;
using V32 = hn::VFromD<D32>;

/// Columns rounded up to the widest vector.
constexpr std::size_t padded(std::size_t columns) {
    return (columns + 15) / 16 * 16;
}

/// Divides by 2^16, toward zero.
HWY_INLINE V32 shifted(V32 v) {
    const D32 d;
    return hn::ShiftRight<16>(hn::Add(v, hn::And(hn::ShiftRight<31>(v), hn::Set(d, 0xFFFF))));
}

/// Five numbers, added and subtracted across the middle one: the kernels are even or odd, and need no more.
struct Mirrored {
    V32 middle, sum1, sum2, difference1, difference2;

    HWY_INLINE Mirrored(V32 a, V32 b, V32 c, V32 d, V32 e)
        : middle(c), sum1(hn::Add(b, d)), sum2(hn::Add(a, e)), difference1(hn::Sub(b, d)),
          difference2(hn::Sub(a, e)) {}

    HWY_INLINE V32 even(const KernelTable::Taps& weights) const {
        const D32 d;
        return hn::Add(hn::Mul(middle, hn::Set(d, weights[2])),
                       hn::Add(hn::Mul(sum1, hn::Set(d, weights[1])), hn::Mul(sum2, hn::Set(d, weights[0]))));
    }
    HWY_INLINE V32 odd(const KernelTable::Taps& weights) const {
        const D32 d;
        return hn::Add(hn::Mul(difference1, hn::Set(d, weights[1])),
                       hn::Mul(difference2, hn::Set(d, weights[0])));
    }
};

/// One row of pixels in 32 bits, sorted such that tap t of all grid columns lies together, at tap(t).
class WidenedRow {
public:
    WidenedRow(std::uint32_t step, std::size_t width) : step_(step), half_(width), values_(2 * width) {}

    void load(const unsigned short* pixels, std::size_t n) {
        if (step_ == 1)
            for (std::size_t x = 0; x < n; ++x) values_[x] = pixels[x];
        else
            for (std::size_t x = 0; x < n; ++x) values_[x % 2 * half_ + x / 2] = pixels[x];
    }
    const std::int32_t* tap(unsigned t) const {
        return values_.data() + (step_ == 1 ? t : t % 2 * half_ + t / 2);
    }

private:
    std::uint32_t step_;
    std::size_t half_;
    std::vector<std::int32_t> values_;
};

/// The row passes of all kernels: number 0 of the Gaussian, 1 + 2m and 2 + 2m of cosine and sine of direction
/// m.
std::vector<std::int32_t> rowPasses(const KernelTable& k, const unsigned short* pixels,
                                    std::size_t pixelStride, std::uint32_t step, const Responses& r) {
    const D32 d;
    const std::size_t width = padded(r.columns()), rows = maskSize(r.rows(), step), pass = rows * width;
    std::vector<std::int32_t> result(pass * (k.directions + 1));
    WidenedRow row(step, width + 16);
    for (std::size_t y = 0; y < rows; ++y) {
        row.load(pixels + y * pixelStride, maskSize(r.columns(), step));
        for (std::size_t x = 0; x < r.columns(); x += hn::Lanes(d)) {
            const auto tap = [&](unsigned t) HWY_ATTR { return hn::LoadU(d, row.tap(t) + x); };
            const Mirrored p(tap(0), tap(1), tap(2), tap(3), tap(4));
            std::int32_t* out = result.data() + y * width + x;
            hn::StoreU(shifted(p.even(k.gauss)), d, out);
            for (unsigned m = 0; m < k.directions / 2; ++m) {
                hn::StoreU(shifted(p.even(k.cosX[m])), d, out += pass);
                hn::StoreU(shifted(p.odd(k.sinX[m])), d, out += pass);
            }
        }
    }
    return result;
}

void computeResponsesOfTarget(const KernelTable& k, const unsigned short* pixels, std::size_t pixelStride,
                              std::uint32_t step, Responses& r) {
    const D32 d;
    const unsigned D = k.directions;
    const std::size_t width = padded(r.columns()), pass = maskSize(r.rows(), step) * width;
    const std::vector<std::int32_t> passes = rowPasses(k, pixels, pixelStride, step, r);

    for (std::uint32_t y = 0; y < r.rows(); ++y)
        for (std::size_t x = 0; x < r.columns(); x += hn::Lanes(d)) {
            const std::int32_t* const first = passes.data() + std::size_t{y} * step * width + x;
            const auto columnOf = [&](unsigned number) HWY_ATTR {
                const std::int32_t* const p = first + number * pass;
                return Mirrored(hn::LoadU(d, p), hn::LoadU(d, p + width), hn::LoadU(d, p + 2 * width),
                                hn::LoadU(d, p + 3 * width), hn::LoadU(d, p + 4 * width));
            };
            const auto store = [&](unsigned direction, V32 reSum, V32 imSum) HWY_ATTR {
                const std::size_t i = r.row(direction, y) + x;
                const V32 re = shifted(reSum), im = shifted(imSum);
                hn::StoreU(re, d, r.re() + i);
                hn::StoreU(im, d, r.im() + i);
                hn::StoreU(hn::Add(hn::Mul(re, re), hn::Mul(im, im)), d, r.mag() + i);
            };
            const Mirrored gauss = columnOf(0), c0 = columnOf(1), s0 = columnOf(2);
            const V32 dc = gauss.even(k.dc);
            store(D / 2, hn::Add(dc, gauss.even(k.cosY[D / 2])), gauss.odd(k.sinY[D / 2]));
            store(0, hn::Add(dc, c0.even(k.gauss)), s0.even(k.gauss));
            for (unsigned m = 1; m < D / 2; ++m) {
                const Mirrored c = columnOf(1 + 2 * m), s = columnOf(2 + 2 * m);
                const V32 A = hn::Add(dc, c.even(k.cosY[m])), B = s.odd(k.sinY[m]);
                const V32 E = s.even(k.cosY[m]), F = c.odd(k.sinY[m]);
                store(m, hn::Sub(A, B), hn::Add(F, E));
                store(D - m, hn::Add(A, B), hn::Sub(F, E));
            }
        }
}

struct Points {
    V32 re, im, mag;

    HWY_INLINE Points(const Responses& r, std::size_t i)
        : re(hn::LoadU(D32(), r.re() + i)), im(hn::LoadU(D32(), r.im() + i)),
          mag(hn::LoadU(D32(), r.mag() + i)) {}
};

/// The two bits of pairs, shifted to a place.
template <int place> HWY_INLINE V32 compare(const Points& a, const Points& b) {
    const D32 d;
    const V32 cross = hn::Sub(hn::Mul(b.re, a.im), hn::Mul(b.im, a.re));
    const V32 stronger = hn::IfThenZeroElse(hn::Lt(a.mag, b.mag), hn::Set(d, 1 << place));
    const V32 positive = hn::IfThenZeroElse(hn::Lt(cross, hn::Zero(d)), hn::Set(d, 2 << place));
    return hn::Or(stronger, positive);
}

void compareInWindowOfTarget(const Responses& r, unsigned direction, std::uint32_t y, std::int32_t* codes) {
    const D32 d;
    const std::size_t row = r.row(direction, y), below = r.row(direction, y + 1);
    const std::size_t next = r.row((direction + 1) % r.directions(), y);
    for (std::size_t x = 0; x < r.columns(); x += hn::Lanes(d)) {
        const Points p(r, row + x), right(r, row + x + 1), down(r, below + x), downRight(r, below + x + 1);
        V32 code = compare<WindowBits::right>(p, right);
        code = hn::Or(code, compare<WindowBits::diagonal>(right, down));
        code = hn::Or(code, compare<WindowBits::downRight>(p, downRight));
        code = hn::Or(code, compare<WindowBits::down>(p, down));
        code = hn::Or(code, compare<WindowBits::next>(p, Points(r, next + x)));
        hn::StoreU(code, d, codes + x);
    }
}

void compareInPatchOfTarget(const Responses& r, std::uint32_t y, unsigned char* const bytes[8]) {
    const D32 d;
    const hn::Rebind<std::uint8_t, D32> d8;
    constexpr unsigned directions = 6;
    const auto storeBytes = [=](V32 code, unsigned char* out)
                                HWY_ATTR { hn::StoreU(hn::DemoteTo(d8, code), d8, out); };
    for (std::size_t x = 0; x < r.columns(); x += hn::Lanes(d)) {
        const auto at = [&](unsigned o) HWY_ATTR { return Points(r, r.row(o, y) + x); };
        const auto withBytes = [&](unsigned o, const Points& cur) HWY_ATTR {
            const std::size_t row = r.row(o, y) + x;
            const Points left(r, row - 2);
            V32 code = compare<0>(left, cur);
            if (y >= 2) {
                const std::size_t above = r.row(o, y - 2) + x;
                const Points up(r, above);
                code = hn::Or(code, compare<2>(up, left));
                code = hn::Or(code, compare<4>(Points(r, above - 2), cur));
                code = hn::Or(code, compare<6>(up, cur));
            }
            storeBytes(code, bytes[o] + x);
        };
        for (unsigned o = 0; o < directions; ++o) withBytes(o, at(o));

        V32 low = compare<0>(at(5), at(0));
        low = hn::Or(low, compare<2>(at(0), at(1)));
        low = hn::Or(low, compare<4>(at(1), at(2)));
        low = hn::Or(low, compare<6>(at(2), at(3)));
        storeBytes(low, bytes[6] + x);
        storeBytes(hn::Or(compare<0>(at(3), at(4)), compare<2>(at(4), at(5))), bytes[7] + x);
    }
    for (unsigned o = 0; o < directions; ++o) // nothing lies left of the first two columns
        for (std::size_t x = 0; x < 2; ++x) bytes[o][x] &= 0xC0;
}

#endif

} // namespace Eye::Gabor::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Eye::Gabor {

HWY_EXPORT(computeResponsesOfTarget);
HWY_EXPORT(compareInWindowOfTarget);
HWY_EXPORT(compareInPatchOfTarget);

void computeResponses(const KernelTable& kernels, const unsigned short* pixels, std::size_t pixelStride,
                      std::uint32_t step, Responses& responses) {
    HWY_DYNAMIC_DISPATCH(computeResponsesOfTarget)(kernels, pixels, pixelStride, step, responses);
}

void compareInWindow(const Responses& responses, unsigned d, std::uint32_t y, std::int32_t* codes) {
    HWY_DYNAMIC_DISPATCH(compareInWindowOfTarget)(responses, d, y, codes);
}

void compareInPatch(const Responses& responses, std::uint32_t y, unsigned char* const bytes[8]) {
    HWY_DYNAMIC_DISPATCH(compareInPatchOfTarget)(responses, y, bytes);
}

} // namespace Eye::Gabor
#endif
