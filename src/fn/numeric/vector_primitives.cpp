#include "fn/numeric/vector_primitives.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "fn/numeric/vector_primitives.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

#include "fn/numeric/partial_sums.h"

#include <algorithm>
#include <cmath>

#ifndef ORBEK_VECTOR_PRIMITIVE_FORMS
#define ORBEK_VECTOR_PRIMITIVE_FORMS
namespace Fn::Numeric {
namespace {

/// One form of the primitives on floats or doubles.
template <class T> struct RealForms {
    void (*add)(const T*, const T*, T*, std::size_t);
    void (*subtract)(const T*, const T*, T*, std::size_t);
    void (*multiply)(const T*, const T*, T*, std::size_t);
    void (*scale)(const T*, T, T*, std::size_t);
    void (*squareRoot)(const T*, T*, std::size_t);
    T (*dot)(const T*, const T*, std::size_t);
    double (*sum)(const T*, std::size_t);
};

/// One form of all primitives: what an instruction set has to offer.
struct Forms {
    RealForms<float> ofFloat;
    RealForms<double> ofDouble;
    std::int64_t (*dotInt16)(const std::int16_t*, const std::int16_t*, std::size_t);
    std::int64_t (*dotInt8Int16)(const std::int8_t*, const std::int16_t*, std::size_t);
};

} // namespace
} // namespace Fn::Numeric
#endif

HWY_BEFORE_NAMESPACE();
namespace Fn::Numeric::HWY_NAMESPACE {
namespace {
#if HWY_TARGET == HWY_SCALAR

constexpr Forms forms = {
    {Plain::add, Plain::subtract, Plain::multiply, Plain::scale, Plain::squareRoot, Plain::dot, Plain::sum},
    {Plain::add, Plain::subtract, Plain::multiply, Plain::scale, Plain::squareRoot, Plain::dot, Plain::sum},
    Plain::dot,
    Plain::dot};

#else

namespace hn = hwy::HWY_NAMESPACE;

/// Applies a vector operation with the same scalar operation for what does not fill a vector.
template <class T, class VectorOp, class ScalarOp>
HWY_INLINE void map(const T* a, const T* b, T* out, std::size_t n, VectorOp vectorOp, ScalarOp scalarOp) {
    const hn::ScalableTag<T> d;
    const std::size_t lanes = hn::Lanes(d);
    std::size_t i = 0;
    for (; i + lanes <= n; i += lanes)
        hn::StoreU(vectorOp(hn::LoadU(d, a + i), hn::LoadU(d, b + i)), d, out + i);
    for (; i < n; ++i) out[i] = scalarOp(a[i], b[i]);
}

template <class T> void addOf(const T* a, const T* b, T* out, std::size_t n) {
    map(
        a, b, out, n, [](auto x, auto y) HWY_ATTR { return hn::Add(x, y); }, [](T x, T y) { return x + y; });
}
template <class T> void subtractOf(const T* a, const T* b, T* out, std::size_t n) {
    map(
        a, b, out, n, [](auto x, auto y) HWY_ATTR { return hn::Sub(x, y); }, [](T x, T y) { return x - y; });
}
template <class T> void multiplyOf(const T* a, const T* b, T* out, std::size_t n) {
    map(
        a, b, out, n, [](auto x, auto y) HWY_ATTR { return hn::Mul(x, y); }, [](T x, T y) { return x * y; });
}
template <class T> void scaleOf(const T* a, T factor, T* out, std::size_t n) {
    const auto factors = hn::Set(hn::ScalableTag<T>(), factor);
    map(
        a, a, out, n, [=](auto x, auto) HWY_ATTR { return hn::Mul(x, factors); },
        [=](T x, T) { return x * factor; });
}
template <class T> void squareRootOf(const T* a, T* out, std::size_t n) {
    map(
        a, a, out, n, [](auto x, auto) HWY_ATTR { return hn::Sqrt(x); }, [](T x, T) { return std::sqrt(x); });
}

/// Sum of `n` terms in `partialSums` partial sums: `terms(d, i)` gives the terms from i on as a vector of tag
/// d, `term(i)` gives one.
template <class Sum, std::size_t partialSums, class Terms, class Term>
HWY_INLINE Sum sumOf(std::size_t n, Terms terms, Term term) {
    // At most 16 vectors hold the partial sums, on the narrowest target; the loops over them unroll.
    const hn::CappedTag<Sum, partialSums / 2> d;
    constexpr std::size_t lanes = hn::MaxLanes(hn::CappedTag<Sum, partialSums / 2>());
    constexpr std::size_t vectors = partialSums / lanes;
    hn::VFromD<decltype(d)> sums[vectors];
    for (auto& s : sums) s = hn::Zero(d);
    std::size_t i = 0;
    for (; i + partialSums <= n; i += partialSums)
        for (std::size_t v = 0; v < vectors; ++v) sums[v] = hn::Add(sums[v], terms(d, i + v * lanes));

    alignas(64) Sum partial[partialSums];
    for (std::size_t v = 0; v < vectors; ++v) hn::Store(sums[v], d, partial + v * lanes);
    for (std::size_t k = 0; i < n; ++i, ++k) partial[k] += term(i);
    return foldPartialSums(partial);
}

template <class T, std::size_t partialSums> T dotOf(const T* a, const T* b, std::size_t n) {
    return sumOf<T, partialSums>(
        n, [=](auto d, std::size_t i) HWY_ATTR { return hn::Mul(hn::LoadU(d, a + i), hn::LoadU(d, b + i)); },
        [=](std::size_t i) { return a[i] * b[i]; });
}

double sumOfFloats(const float* a, std::size_t n) {
    return sumOf<double, doublePartialSums>(
        n,
        [=](auto d, std::size_t i)
            HWY_ATTR { return hn::PromoteTo(d, hn::LoadU(hn::Rebind<float, decltype(d)>(), a + i)); },
        [=](std::size_t i) { return static_cast<double>(a[i]); });
}
double sumOfDoubles(const double* a, std::size_t n) {
    return sumOf<double, doublePartialSums>(
        n, [=](auto d, std::size_t i) HWY_ATTR { return hn::LoadU(d, a + i); },
        [=](std::size_t i) { return a[i]; });
}

/// Sum of the lanes of 32 bits, each below 2^31 in magnitude except that -2^31 stands for 2^31: the sum of
/// two products of 16-bit numbers wraps only if all four are -32768, and is never -2^31.
template <class D32, class V32> HWY_INLINE auto widenPairSums(D32 d32, V32 pairs) {
    const hn::RepartitionToWide<D32> d64;
    const hn::Half<D32> half;
    const auto wide = hn::Add(hn::PromoteTo(d64, hn::LowerHalf(half, pairs)),
                              hn::PromoteTo(d64, hn::UpperHalf(half, pairs)));
    const auto lowest = hn::Set(d32, INT32_MIN);
    if (HWY_LIKELY(hn::AllFalse(d32, hn::Eq(pairs, lowest)))) return wide;
    const auto wrapped = hn::IfThenElseZero(hn::Eq(pairs, lowest), hn::Set(d32, 1));
    const auto count = hn::Add(hn::PromoteTo(d64, hn::LowerHalf(half, wrapped)),
                               hn::PromoteTo(d64, hn::UpperHalf(half, wrapped)));
    return hn::Add(wide, hn::ShiftLeft<32>(count));
}

std::int64_t dotInt16(const std::int16_t* a, const std::int16_t* b, std::size_t n) {
    const hn::ScalableTag<std::int16_t> d16;
    const hn::RepartitionToWide<decltype(d16)> d32;
    const hn::RepartitionToWide<decltype(d32)> d64;
    const std::size_t lanes = hn::Lanes(d16);
    auto sums = hn::Zero(d64);
    std::size_t i = 0;
    for (; i + lanes <= n; i += lanes) {
        auto second = hn::Zero(d32);
        const auto first = hn::ReorderWidenMulAccumulate(d32, hn::LoadU(d16, a + i), hn::LoadU(d16, b + i),
                                                         hn::Zero(d32), second);
        sums = hn::Add(sums, hn::Add(widenPairSums(d32, first), widenPairSums(d32, second)));
    }
    std::int64_t result = hn::GetLane(hn::SumOfLanes(d64, sums));
    for (; i < n; ++i) result += std::int32_t{a[i]} * std::int32_t{b[i]};
    return result;
}

std::int64_t dotInt8Int16(const std::int8_t* a, const std::int16_t* b, std::size_t n) {
    // A product is at most 2^22 in magnitude, a pair of them 2^23: 255 pairs fit a 32-bit lane.
    constexpr std::size_t longestRun = 255;
    const hn::ScalableTag<std::int16_t> d16;
    const hn::Rebind<std::int8_t, decltype(d16)> d8;
    const hn::RepartitionToWide<decltype(d16)> d32;
    const hn::RepartitionToWide<decltype(d32)> d64;
    const hn::Half<decltype(d32)> half;
    const std::size_t lanes = hn::Lanes(d16);
    const auto widen = [=](auto v) HWY_ATTR {
        return hn::Add(hn::PromoteTo(d64, hn::LowerHalf(half, v)),
                       hn::PromoteTo(d64, hn::UpperHalf(half, v)));
    };

    auto sums = hn::Zero(d64);
    std::size_t i = 0;
    while (i + lanes <= n) {
        const std::size_t end = std::min(n - n % lanes, i + 2 * longestRun * lanes);
        auto first0 = hn::Zero(d32), second0 = hn::Zero(d32), first1 = hn::Zero(d32), second1 = hn::Zero(d32);
        for (; i + 2 * lanes <= end; i += 2 * lanes) {
            first0 = hn::ReorderWidenMulAccumulate(d32, hn::PromoteTo(d16, hn::LoadU(d8, a + i)),
                                                   hn::LoadU(d16, b + i), first0, second0);
            first1 = hn::ReorderWidenMulAccumulate(d32, hn::PromoteTo(d16, hn::LoadU(d8, a + i + lanes)),
                                                   hn::LoadU(d16, b + i + lanes), first1, second1);
        }
        if (i + lanes <= end) {
            first0 = hn::ReorderWidenMulAccumulate(d32, hn::PromoteTo(d16, hn::LoadU(d8, a + i)),
                                                   hn::LoadU(d16, b + i), first0, second0);
            i += lanes;
        }
        sums = hn::Add(
            sums, hn::Add(hn::Add(widen(first0), widen(second0)), hn::Add(widen(first1), widen(second1))));
    }
    std::int64_t result = hn::GetLane(hn::SumOfLanes(d64, sums));
    for (; i < n; ++i) result += std::int32_t{a[i]} * std::int32_t{b[i]};
    return result;
}

constexpr Forms forms = {{addOf<float>, subtractOf<float>, multiplyOf<float>, scaleOf<float>,
                          squareRootOf<float>, dotOf<float, floatPartialSums>, sumOfFloats},
                         {addOf<double>, subtractOf<double>, multiplyOf<double>, scaleOf<double>,
                          squareRootOf<double>, dotOf<double, doublePartialSums>, sumOfDoubles},
                         dotInt16,
                         dotInt8Int16};

#endif // HWY_SCALAR

const Forms& formsOfTarget() {
    return forms;
}

} // namespace
} // namespace Fn::Numeric::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Fn::Numeric {
namespace {

HWY_EXPORT(formsOfTarget);
const Forms& chosen() {
    return HWY_DYNAMIC_DISPATCH(formsOfTarget)();
}

} // namespace

void add(const float* a, const float* b, float* out, std::size_t n) {
    chosen().ofFloat.add(a, b, out, n);
}
void subtract(const float* a, const float* b, float* out, std::size_t n) {
    chosen().ofFloat.subtract(a, b, out, n);
}
void multiply(const float* a, const float* b, float* out, std::size_t n) {
    chosen().ofFloat.multiply(a, b, out, n);
}
void scale(const float* a, float factor, float* out, std::size_t n) {
    chosen().ofFloat.scale(a, factor, out, n);
}
void squareRoot(const float* a, float* out, std::size_t n) {
    chosen().ofFloat.squareRoot(a, out, n);
}
float dot(const float* a, const float* b, std::size_t n) {
    return chosen().ofFloat.dot(a, b, n);
}
double sum(const float* a, std::size_t n) {
    return chosen().ofFloat.sum(a, n);
}

void add(const double* a, const double* b, double* out, std::size_t n) {
    chosen().ofDouble.add(a, b, out, n);
}
void subtract(const double* a, const double* b, double* out, std::size_t n) {
    chosen().ofDouble.subtract(a, b, out, n);
}
void multiply(const double* a, const double* b, double* out, std::size_t n) {
    chosen().ofDouble.multiply(a, b, out, n);
}
void scale(const double* a, double factor, double* out, std::size_t n) {
    chosen().ofDouble.scale(a, factor, out, n);
}
void squareRoot(const double* a, double* out, std::size_t n) {
    chosen().ofDouble.squareRoot(a, out, n);
}
double dot(const double* a, const double* b, std::size_t n) {
    return chosen().ofDouble.dot(a, b, n);
}
double sum(const double* a, std::size_t n) {
    return chosen().ofDouble.sum(a, n);
}

std::int64_t dot(const std::int16_t* a, const std::int16_t* b, std::size_t n) {
    return chosen().dotInt16(a, b, n);
}
std::int64_t dot(const std::int8_t* a, const std::int16_t* b, std::size_t n) {
    return chosen().dotInt8Int16(a, b, n);
}

} // namespace Fn::Numeric
#endif
