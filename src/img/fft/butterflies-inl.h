// The stages of a line transform, per target: include after hwy/highway.h.

#if defined(IMG_FFT_BUTTERFLIES_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef IMG_FFT_BUTTERFLIES_INL_H
#undef IMG_FFT_BUTTERFLIES_INL_H
#else
#define IMG_FFT_BUTTERFLIES_INL_H
#endif

#include "img/fft/line_plan.h"

HWY_BEFORE_NAMESPACE();
namespace Img::Fft::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

/// What differs between floats and fixed point.
template <class T> struct Arithmetic;

template <> struct Arithmetic<float> {
    template <class V> static HWY_INLINE V shifted(V v, std::uint32_t) { return v; }
    template <class D, class V> static HWY_INLINE V scaled(D d, V v, float factor) {
        return hn::Mul(v, hn::Set(d, factor));
    }
    /// (re, im) * (c, s)
    template <class D, class V> static HWY_INLINE void rotate(D d, V& re, V& im, float c, float s) {
        const auto vc = hn::Set(d, c), vs = hn::Set(d, s);
        const auto x = re;
        re = hn::MulSub(x, vc, hn::Mul(im, vs));
        im = hn::MulAdd(x, vs, hn::Mul(im, vc));
    }
};

template <> struct Arithmetic<std::int32_t> {
    /// v / 2^shift, rounded, without overflow at the ends of the range.
    template <class V> static HWY_INLINE V shifted(V v, std::uint32_t shift) {
        const hn::DFromV<V> d;
        const auto half = hn::And(hn::ShiftRightSame(v, static_cast<int>(shift) - 1), hn::Set(d, 1));
        return hn::Add(hn::ShiftRightSame(v, static_cast<int>(shift)), half);
    }

#if HWY_TARGET == HWY_SCALAR
    template <class D, class V> static HWY_INLINE V scaled(D d, V v, std::int32_t factor) {
        return hn::Set(d, rounded(std::int64_t{hn::GetLane(v)} * factor));
    }
    template <class D, class V>
    static HWY_INLINE void rotate(D d, V& re, V& im, std::int32_t c, std::int32_t s) {
        const std::int64_t x = hn::GetLane(re), y = hn::GetLane(im);
        re = hn::Set(d, rounded(x * c - y * s));
        im = hn::Set(d, rounded(x * s + y * c));
    }

private:
    static std::int32_t rounded(std::int64_t product) {
        return static_cast<std::int32_t>((product + (1 << 30)) >> 31);
    }
#else
    template <class D, class V> static HWY_INLINE V scaled(D d, V v, std::int32_t factor) {
        const auto f = hn::Set(d, factor);
        return merged(d, hn::MulEven(v, f), hn::MulEven(odd(d, v), f));
    }
    template <class D, class V>
    static HWY_INLINE void rotate(D d, V& re, V& im, std::int32_t c, std::int32_t s) {
        const auto vc = hn::Set(d, c), vs = hn::Set(d, s);
        const auto oddRe = odd(d, re), oddIm = odd(d, im);
        const auto x = merged(d, hn::Sub(hn::MulEven(re, vc), hn::MulEven(im, vs)),
                              hn::Sub(hn::MulEven(oddRe, vc), hn::MulEven(oddIm, vs)));
        im = merged(d, hn::Add(hn::MulEven(re, vs), hn::MulEven(im, vc)),
                    hn::Add(hn::MulEven(oddRe, vs), hn::MulEven(oddIm, vc)));
        re = x;
    }

private:
    /// The odd lanes in place of the even ones.
    template <class D, class V> static HWY_INLINE V odd(D d, V v) {
        const hn::RepartitionToWide<hn::RebindToUnsigned<D>> wide;
        return hn::BitCast(d, hn::ShiftRight<32>(hn::BitCast(wide, v)));
    }
    /// Bits 31 to 62 of the products of even and odd lanes, rounded.
    template <class D, class W> static HWY_INLINE hn::Vec<D> merged(D d, W even, W odd) {
        const hn::RepartitionToWide<hn::RebindToUnsigned<D>> wide;
        const auto half = hn::Set(wide, std::uint64_t{1} << 30);
        return hn::OddEven(hn::BitCast(d, hn::ShiftLeft<1>(hn::Add(hn::BitCast(wide, odd), half))),
                           hn::BitCast(d, hn::ShiftRight<31>(hn::Add(hn::BitCast(wide, even), half))));
    }
#endif
};

template <class V> struct Point { V re, im; };
template <class V> HWY_INLINE Point<V> operator+(const Point<V>& a, const Point<V>& b) {
    return {hn::Add(a.re, b.re), hn::Add(a.im, b.im)};
}
template <class V> HWY_INLINE Point<V> operator-(const Point<V>& a, const Point<V>& b) {
    return {hn::Sub(a.re, b.re), hn::Sub(a.im, b.im)};
}
/// a - i b and a + i b
template <class V> HWY_INLINE Point<V> minusI(const Point<V>& a, const Point<V>& b) {
    return {hn::Add(a.re, b.im), hn::Sub(a.im, b.re)};
}
template <class V> HWY_INLINE Point<V> plusI(const Point<V>& a, const Point<V>& b) {
    return {hn::Sub(a.re, b.im), hn::Add(a.im, b.re)};
}

/// Transforms `radix` points in place. An odd radix pairs the points i and radix - i, whose unit roots are
/// conjugates; `roots` are pairs of cosine and sine of -2 pi k / radix.
template <class T, std::uint32_t maximum, class D, class V = hn::Vec<D>>
HWY_INLINE void butterfly(D d, Point<V>* x, std::uint32_t radix, const T* roots) {
    if constexpr (maximum == 2) {
        const Point<V> a = x[0];
        x[0] = a + x[1];
        x[1] = a - x[1];
    } else if constexpr (maximum == 4) {
        const Point<V> sum02 = x[0] + x[2], difference02 = x[0] - x[2];
        const Point<V> sum13 = x[1] + x[3], difference13 = x[1] - x[3];
        x[0] = sum02 + sum13;
        x[1] = minusI(difference02, difference13);
        x[2] = sum02 - sum13;
        x[3] = plusI(difference02, difference13);
    } else {
        const std::uint32_t half = (radix - 1) / 2;
        Point<V> sums[maximum / 2], differences[maximum / 2];
        const Point<V> first = x[0];
        for (std::uint32_t i = 1; i <= half; ++i) {
            sums[i - 1] = x[i] + x[radix - i];
            differences[i - 1] = x[i] - x[radix - i];
            x[0] = x[0] + sums[i - 1];
        }
        for (std::uint32_t k = 1; k <= half; ++k) {
            Point<V> even = first, odd{hn::Zero(d), hn::Zero(d)};
            for (std::uint32_t i = 1, power = k; i <= half; ++i, power += k) {
                power = power >= radix ? power - radix : power;
                const T c = roots[2 * power], s = roots[2 * power + 1];
                const Point<V>&sum = sums[i - 1], &difference = differences[i - 1];
                even =
                    even + Point<V>{Arithmetic<T>::scaled(d, sum.re, c), Arithmetic<T>::scaled(d, sum.im, c)};
                odd = odd + Point<V>{Arithmetic<T>::scaled(d, difference.re, s),
                                     Arithmetic<T>::scaled(d, difference.im, s)};
            }
            x[k] = plusI(even, odd);
            x[radix - k] = minusI(even, odd);
        }
    }
}

/// One stage with butterflies of `radix` points, `maximum` at compile time: result k of the points q + stride
/// * (p + groups * i), turned by the k-th power of the p-th twiddle factor, goes to q + stride * (radix * p +
/// k).
template <class T, std::uint32_t maximum>
HWY_NOINLINE void stageOf(const LinePlan<T>& plan, const typename LinePlan<T>::Stage& stage, const T* in,
                          T* out) {
    const hn::ScalableTag<T> d;
    using V = hn::Vec<decltype(d)>;
    const std::uint32_t radix = maximum <= 7 ? maximum : stage.radix;
    const std::size_t lanes = hn::Lanes(d), point = 2 * lanes, stride = stage.stride;
    const T* const roots = plan.factors.data() + stage.rotations;
    const T* twiddle = plan.factors.data() + stage.twiddles;
    for (std::size_t p = 0; p < stage.groups; ++p, twiddle += 2 * (radix - 1))
        for (std::size_t q = 0; q < stride; ++q) {
            Point<V> x[maximum];
            std::uint32_t i = 0;
            do {
                const T* const from = in + (q + stride * (p + stage.groups * i)) * point;
                x[i] = {Arithmetic<T>::shifted(hn::Load(d, from), stage.shift),
                        Arithmetic<T>::shifted(hn::Load(d, from + lanes), stage.shift)};
            } while (++i < radix);
            butterfly<T, maximum>(d, x, radix, roots);
            if (p != 0)
                for (std::uint32_t k = 1; k < radix; ++k)
                    Arithmetic<T>::rotate(d, x[k].re, x[k].im, twiddle[2 * k - 2], twiddle[2 * k - 1]);
            T* const to = out + (q + stride * radix * p) * point;
            for (std::uint32_t k = 0; k < radix; ++k) {
                hn::Store(x[k].re, d, to + stride * k * point);
                hn::Store(x[k].im, d, to + stride * k * point + lanes);
            }
        }
}

template <class T>
void butterflies(const LinePlan<T>& plan, const typename LinePlan<T>::Stage& stage, const T* in, T* out) {
    switch (stage.radix) {
    case 2:
        return stageOf<T, 2>(plan, stage, in, out);
    case 3:
        return stageOf<T, 3>(plan, stage, in, out);
    case 4:
        return stageOf<T, 4>(plan, stage, in, out);
    case 5:
        return stageOf<T, 5>(plan, stage, in, out);
    case 7:
        return stageOf<T, 7>(plan, stage, in, out);
    default:
        return stageOf<T, LinePlan<T>::largestRadix>(plan, stage, in, out);
    }
}

} // namespace
} // namespace Img::Fft::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
