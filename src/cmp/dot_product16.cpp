#include "cmp/dot_product16.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "cmp/dot_product16.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

#include "fn/numeric/vector_primitives.h"

HWY_BEFORE_NAMESPACE();
namespace Cmp::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

/// The products of all xs with all ys over the whole number of vectors of `D` in [begin, n).
/// @return where they end
template <std::size_t X, std::size_t Y, class D>
HWY_INLINE std::size_t addProducts(D d16, const short* const* x, const short* const* y, std::size_t begin,
                                   std::size_t n, std::size_t run, long* out) {
#if HWY_TARGET != HWY_SCALAR
    const hn::RepartitionToWide<D> d32;
    const hn::RepartitionToWide<decltype(d32)> d64;
    const hn::Half<decltype(d32)> half;
    const std::size_t lanes = hn::Lanes(d16);
    while (begin + lanes <= n) {
        hn::Vec<decltype(d32)> sums[X][Y], others[X][Y];
        for (std::size_t i = 0; i < X; ++i)
            for (std::size_t j = 0; j < Y; ++j) sums[i][j] = others[i][j] = hn::Zero(d32);
        for (std::size_t k = 0; k < run && begin + lanes <= n; ++k, begin += lanes) {
            hn::Vec<D> right[Y];
            for (std::size_t j = 0; j < Y; ++j) right[j] = hn::LoadU(d16, y[j] + begin);
            for (std::size_t i = 0; i < X; ++i) {
                const auto left = hn::LoadU(d16, x[i] + begin);
                for (std::size_t j = 0; j < Y; ++j)
                    sums[i][j] = hn::ReorderWidenMulAccumulate(d32, left, right[j], sums[i][j], others[i][j]);
            }
        }
        const auto widen = [&](auto v) HWY_ATTR {
            return hn::Add(hn::PromoteTo(d64, hn::LowerHalf(half, v)),
                           hn::PromoteTo(d64, hn::UpperHalf(half, v)));
        };
        for (std::size_t i = 0; i < X; ++i)
            for (std::size_t j = 0; j < Y; ++j)
                out[i * Y + j] +=
                    hn::GetLane(hn::SumOfLanes(d64, hn::Add(widen(sums[i][j]), widen(others[i][j]))));
    }
#else
    (void)d16;
    (void)run;
    for (std::size_t i = 0; i < X; ++i)
        for (std::size_t j = 0; j < Y; ++j)
            out[i * Y + j] += Fn::Numeric::Plain::dot(x[i] + begin, y[j] + begin, n - begin);
    begin = n;
#endif
    return begin;
}

template <std::size_t X, std::size_t Y>
HWY_INLINE void products(const short* const* x, const short* const* y, std::size_t n, std::size_t maxSteps,
                         long* out) {
    for (std::size_t i = 0; i < X * Y; ++i) out[i] = 0;
    if (maxSteps < 2) {
        for (std::size_t i = 0; i < X * Y; ++i) out[i] = Fn::Numeric::dot(x[i / Y], y[i % Y], n);
        return;
    }
    // A lane takes two products from each vector.
    const std::size_t run = maxSteps / 2;
    const std::size_t end = addProducts<X, Y>(hn::ScalableTag<short>(), x, y, 0, n, run, out);
    if (end < n) addProducts<X, Y>(hn::CappedTag<short, 8>(), x, y, end, n, run, out);
}

void products1x1(const short* const* x, const short* const* y, std::size_t n, std::size_t steps, long* out) {
    products<1, 1>(x, y, n, steps, out);
}
void products2x1(const short* const* x, const short* const* y, std::size_t n, std::size_t steps, long* out) {
    products<2, 1>(x, y, n, steps, out);
}
void products2x2(const short* const* x, const short* const* y, std::size_t n, std::size_t steps, long* out) {
    products<2, 2>(x, y, n, steps, out);
}

} // namespace
} // namespace Cmp::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Cmp {

namespace {
HWY_EXPORT(products1x1);
HWY_EXPORT(products2x1);
HWY_EXPORT(products2x2);
} // namespace

long dotProd16(const short* x, const short* y, unsigned int n, unsigned int maxSteps) {
    long result;
    HWY_DYNAMIC_DISPATCH(products1x1)(&x, &y, n, maxSteps, &result);
    return result;
}

void dotProd16x2(const short* x0, const short* x1, const short* y, unsigned int n, unsigned int maxSteps,
                 long* out) {
    const short* const x[] = {x0, x1};
    HWY_DYNAMIC_DISPATCH(products2x1)(x, &y, n, maxSteps, out);
}

void dotProd162x2(const short* x0, const short* x1, const short* y0, const short* y1, unsigned int n,
                  unsigned int maxSteps, long* out) {
    const short *const x[] = {x0, x1}, *const y[] = {y0, y1};
    HWY_DYNAMIC_DISPATCH(products2x2)(x, y, n, maxSteps, out);
}

} // namespace Cmp
#endif
