// Rows and columns into the lanes of vectors and back, per target: include after hwy/highway.h.
//
// A point of the lanes is a vector of real parts and one of imaginary parts; lane i belongs to line i.

#if defined(IMG_FFT_TRANSPOSITION_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef IMG_FFT_TRANSPOSITION_INL_H
#undef IMG_FFT_TRANSPOSITION_INL_H
#else
#define IMG_FFT_TRANSPOSITION_INL_H
#endif

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace Img::Fft::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

/// Bounds of fixed-point input, such that no point is farther than 2^31 - 2^16 from 0.
template <class T> constexpr T boundOf(bool complex) {
    return complex ? T{1518453915} : T{2147418112};
}
template <class T> HWY_INLINE T bounded(T value, bool complex) {
    if constexpr (std::is_floating_point_v<T>)
        return value;
    else
        return std::clamp(value, -boundOf<T>(complex), boundOf<T>(complex));
}

#if HWY_TARGET != HWY_SCALAR

template <class T, class D> HWY_INLINE hn::Vec<D> boundedVector(D d, hn::Vec<D> v, bool complex) {
    if constexpr (std::is_floating_point_v<T>)
        return v;
    else
        return hn::Min(hn::Max(v, hn::Set(d, -boundOf<T>(complex))), hn::Set(d, boundOf<T>(complex)));
}

/// 4 values, `offset` values into it, of every fourth row.
template <class T, class D> HWY_INLINE hn::Vec<D> gatherQuads(D d, const T* const* rows, std::size_t offset) {
    if constexpr (hn::MaxLanes(D()) == 4) {
        return hn::LoadU(d, rows[0] + offset);
    } else {
        const hn::Half<D> half;
        return hn::Combine(d, gatherQuads<T>(half, rows + hn::MaxLanes(half), offset),
                           gatherQuads<T>(half, rows, offset));
    }
}

template <class T, class D, class V>
HWY_INLINE void scatterQuads(D d, V v, T* const* rows, std::size_t offset) {
    if constexpr (hn::MaxLanes(D()) == 4) {
        hn::StoreU(v, d, rows[0] + offset);
    } else {
        const hn::Half<D> half;
        scatterQuads<T>(half, hn::LowerHalf(half, v), rows, offset);
        scatterQuads<T>(half, hn::UpperHalf(half, v), rows + hn::MaxLanes(half), offset);
    }
}

/// Within each block of 4 lanes, exchanges lane and vector.
template <class D, class V> HWY_INLINE void transpose(D d, V& a, V& b, V& c, V& e) {
    const hn::RepartitionToWide<D> wide;
    const auto ab = hn::BitCast(wide, hn::InterleaveLower(d, a, b));
    const auto ce = hn::BitCast(wide, hn::InterleaveLower(d, c, e));
    const auto upperAb = hn::BitCast(wide, hn::InterleaveUpper(d, a, b));
    const auto upperCe = hn::BitCast(wide, hn::InterleaveUpper(d, c, e));
    a = hn::BitCast(d, hn::InterleaveLower(wide, ab, ce));
    b = hn::BitCast(d, hn::InterleaveUpper(wide, ab, ce));
    c = hn::BitCast(d, hn::InterleaveLower(wide, upperAb, upperCe));
    e = hn::BitCast(d, hn::InterleaveUpper(wide, upperAb, upperCe));
}
#endif

/// Pairs of all rows, from `offset` values on, to the points begin, begin + 1, ...; `swap` exchanges their
/// parts.
template <class T>
void packPoints(const T* const* rows, std::size_t offset, std::size_t begin, std::size_t count, bool swap,
                T* to) {
    const hn::ScalableTag<T> d;
    const std::size_t lanes = hn::Lanes(d), re = swap ? lanes : 0, im = lanes - re;
    std::size_t i = 0;
#if HWY_TARGET != HWY_SCALAR
    for (; i + 2 <= count; i += 2) {
        auto a = gatherQuads<T>(d, rows, offset + 2 * i), b = gatherQuads<T>(d, rows + 1, offset + 2 * i);
        auto c = gatherQuads<T>(d, rows + 2, offset + 2 * i), e = gatherQuads<T>(d, rows + 3, offset + 2 * i);
        transpose(d, a, b, c, e);
        T* const point = to + 2 * (begin + i) * lanes;
        hn::Store(boundedVector<T>(d, a, true), d, point + re);
        hn::Store(boundedVector<T>(d, b, true), d, point + im);
        hn::Store(boundedVector<T>(d, c, true), d, point + 2 * lanes + re);
        hn::Store(boundedVector<T>(d, e, true), d, point + 2 * lanes + im);
    }
#endif
    for (; i < count; ++i)
        for (std::size_t lane = 0; lane < lanes; ++lane) {
            T* const point = to + 2 * (begin + i) * lanes + lane;
            point[re] = bounded(rows[lane][offset + 2 * i], true);
            point[im] = bounded(rows[lane][offset + 2 * i + 1], true);
        }
}

/// Values of all rows to one part (0 real, 1 imaginary) of the points begin, begin + 1, ...
template <class T>
void packReals(const T* const* rows, std::size_t offset, std::size_t begin, std::size_t count, int part,
               T* to) {
    const hn::ScalableTag<T> d;
    const std::size_t lanes = hn::Lanes(d), point = 2 * lanes;
    to += begin * point + static_cast<std::size_t>(part) * lanes;
    std::size_t i = 0;
#if HWY_TARGET != HWY_SCALAR
    for (; i + 4 <= count; i += 4) {
        auto a = gatherQuads<T>(d, rows, offset + i), b = gatherQuads<T>(d, rows + 1, offset + i);
        auto c = gatherQuads<T>(d, rows + 2, offset + i), e = gatherQuads<T>(d, rows + 3, offset + i);
        transpose(d, a, b, c, e);
        hn::Store(boundedVector<T>(d, a, false), d, to + i * point);
        hn::Store(boundedVector<T>(d, b, false), d, to + (i + 1) * point);
        hn::Store(boundedVector<T>(d, c, false), d, to + (i + 2) * point);
        hn::Store(boundedVector<T>(d, e, false), d, to + (i + 3) * point);
    }
#endif
    for (; i < count; ++i)
        for (std::size_t lane = 0; lane < lanes; ++lane)
            to[i * point + lane] = bounded(rows[lane][offset + i], false);
}

/// The points that `pointAt(c)` gives, c < count, to pairs of all rows.
template <class T, class PointAt>
HWY_INLINE void scatterPoints(std::size_t count, T* const* rows, PointAt pointAt) {
    const hn::ScalableTag<T> d;
    const std::size_t lanes = hn::Lanes(d);
    std::size_t c = 0;
#if HWY_TARGET != HWY_SCALAR
    for (; c + 2 <= count; c += 2) {
        auto p = pointAt(c), q = pointAt(c + 1);
        transpose(d, p.re, p.im, q.re, q.im);
        scatterQuads<T>(d, p.re, rows, 2 * c);
        scatterQuads<T>(d, p.im, rows + 1, 2 * c);
        scatterQuads<T>(d, q.re, rows + 2, 2 * c);
        scatterQuads<T>(d, q.im, rows + 3, 2 * c);
    }
#endif
    HWY_ALIGN T re[hn::MaxLanes(d)], im[hn::MaxLanes(d)];
    for (; c < count; ++c) {
        const auto p = pointAt(c);
        hn::Store(p.re, d, re);
        hn::Store(p.im, d, im);
        for (std::size_t lane = 0; lane < lanes; ++lane) {
            rows[lane][2 * c] = re[lane];
            rows[lane][2 * c + 1] = im[lane];
        }
    }
}

template <class T, class Columns>
void unpackPoints(const T* from, const Columns& columns, bool swap, T* const* rows) {
    const hn::ScalableTag<T> d;
    const std::size_t lanes = hn::Lanes(d), re = swap ? lanes : 0, im = lanes - re;
    scatterPoints<T>(columns.count(), rows, [&](std::size_t c) HWY_ATTR {
        const T* const point = from + 2 * columns[static_cast<std::uint32_t>(c)] * lanes;
        return Point<hn::Vec<decltype(d)>>{hn::Load(d, point + re), hn::Load(d, point + im)};
    });
}

/// The spectrum of the real (0) or the imaginary (1) parts that went in: half the sum or the difference of
/// Z[k] and the conjugate of Z[n - k].
template <class T, int part, class Columns>
void unpackPairs(const T* from, std::uint32_t n, const Columns& columns, T* const* rows) {
    const hn::ScalableTag<T> d;
    const std::size_t lanes = hn::Lanes(d);
    scatterPoints<T>(columns.count(), rows, [&](std::size_t c) HWY_ATTR {
        const std::uint32_t k = columns[static_cast<std::uint32_t>(c)];
        const T *const p = from + 2 * k * lanes, *const q = from + 2 * ((n - k) % n) * lanes;
        const auto pRe = hn::Load(d, p), pIm = hn::Load(d, p + lanes);
        const auto qRe = hn::Load(d, q), qIm = hn::Load(d, q + lanes);
        if constexpr (part == 0)
            return Point<hn::Vec<decltype(d)>>{Arithmetic<T>::scaled(d, hn::Add(pRe, qRe), T(0.5)),
                                               Arithmetic<T>::scaled(d, hn::Sub(pIm, qIm), T(0.5))};
        else
            return Point<hn::Vec<decltype(d)>>{Arithmetic<T>::scaled(d, hn::Add(pIm, qIm), T(0.5)),
                                               Arithmetic<T>::scaled(d, hn::Sub(qRe, pRe), T(0.5))};
    });
}

/// The pairs of `used` neighbouring columns to one point of the lanes.
template <class T> HWY_INLINE void loadPoints(const T* pairs, std::size_t used, bool swap, T* point) {
    const hn::ScalableTag<T> d;
    const std::size_t lanes = hn::Lanes(d), re = swap ? lanes : 0, im = lanes - re;
    if (used == lanes) {
        hn::Vec<decltype(d)> a, b;
        hn::LoadInterleaved2(d, pairs, a, b);
        hn::Store(a, d, point + re);
        hn::Store(b, d, point + im);
        return;
    }
    for (std::size_t i = 0; i < used; ++i) {
        point[re + i] = pairs[2 * i];
        point[im + i] = pairs[2 * i + 1];
    }
}

template <class T> HWY_INLINE void storePoints(const T* point, std::size_t used, bool swap, T* pairs) {
    const hn::ScalableTag<T> d;
    const std::size_t lanes = hn::Lanes(d), re = swap ? lanes : 0, im = lanes - re;
    if (used == lanes)
        return hn::StoreInterleaved2(hn::Load(d, point + re), hn::Load(d, point + im), d, pairs);
    for (std::size_t i = 0; i < used; ++i) {
        pairs[2 * i] = point[re + i];
        pairs[2 * i + 1] = point[im + i];
    }
}

} // namespace
} // namespace Img::Fft::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
