#include "cmp/multiply_digitized.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "cmp/left_multiply.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

HWY_BEFORE_NAMESPACE();
namespace Cmp::HWY_NAMESPACE {
namespace {
namespace hn = hwy::HWY_NAMESPACE;

#if HWY_TARGET != HWY_SCALAR
/// Products of a vector with several columns at once: the vector comes from the second cache, the columns
/// from memory, and the more of these are on their way the better.
/// @param size of the vector and of each column
/// @return how many elements were summed: all, or none of those that do not fill one register
template <std::size_t... n>
HWY_INLINE std::size_t columnProducts(std::index_sequence<n...>, const short* v, const signed char* columns,
                                      std::size_t size, std::int32_t* out) {
    const hn::ScalableTag<std::int16_t> d;
    const hn::Rebind<std::int8_t, decltype(d)> bytes;
    const hn::RepartitionToWide<decltype(d)> wide;
    const std::size_t lanes = hn::Lanes(d);
    hn::Vec<decltype(wide)> sums[] = {(static_cast<void>(n), hn::Zero(wide))...};
    hn::Vec<decltype(wide)> others[] = {(static_cast<void>(n), hn::Zero(wide))...};
    const auto* const weights = reinterpret_cast<const std::int8_t*>(columns);
    if (size < lanes) {
        ((out[n] = 0), ...);
        return 0;
    }
    const auto add = [&](std::size_t i, auto digits) HWY_ATTR {
        ((sums[n] = hn::ReorderWidenMulAccumulate(
              wide, hn::PromoteTo(d, hn::LoadU(bytes, weights + n * size + i)), digits, sums[n], others[n])),
         ...);
    };
    std::size_t i = 0;
    for (; i + lanes <= size; i += lanes) add(i, hn::LoadU(d, v + i));
    // The last register begins among elements that are in the sums already.
    if (i < size)
        add(size - lanes,
            hn::IfThenZeroElse(hn::FirstN(d, i - (size - lanes)), hn::LoadU(d, v + size - lanes)));
    // In 64 bits: lanes may wrap, but sums of signed numbers outside of vectors must not.
    const hn::RepartitionToWide<decltype(wide)> widest;
    const hn::Half<decltype(wide)> half;
    const auto total = [&](auto sum) HWY_ATTR {
        const auto both = hn::Add(hn::PromoteTo(widest, hn::LowerHalf(half, sum)),
                                  hn::PromoteTo(widest, hn::UpperHalf(half, sum)));
        return static_cast<std::int32_t>(hn::GetLane(hn::SumOfLanes(widest, both)));
    };
    ((out[n] = total(hn::Add(sums[n], others[n]))), ...);
    return size;
}
#else
template <std::size_t... n>
std::size_t columnProducts(std::index_sequence<n...>, const short*, const signed char*, std::size_t,
                           std::int32_t* out) {
    ((out[n] = 0), ...);
    return 0;
}
#endif

/// Sums may pass 32 bits, as long as they are cut to them: what is lost on the way is lost in the end.
template <std::size_t N>
void productsOf(const short* v, const signed char* columns, std::size_t size, std::int32_t* out) {
    std::size_t i = columnProducts(std::make_index_sequence<N>(), v, columns, size, out);
    for (; i < size; ++i)
        for (std::size_t c = 0; c < N; ++c)
            out[c] = static_cast<std::int32_t>(static_cast<std::uint32_t>(out[c]) +
                                               static_cast<std::uint32_t>(columns[c * size + i] * v[i]));
}

void products(const short* v, const signed char* columns, std::size_t size, std::size_t count,
              std::int32_t* out) {
    constexpr std::size_t atOnce = 4;
    std::size_t c = 0;
    for (; c + atOnce <= count; c += atOnce) productsOf<atOnce>(v, columns + c * size, size, out + c);
    for (; c < count; ++c) productsOf<1>(v, columns + c * size, size, out + c);
}

} // namespace
} // namespace Cmp::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Cmp {

namespace {
HWY_EXPORT(products);
} // namespace

FNVector<int> FPMatVecMultiplier::leftMultiply(FNVector<short> const& v,
                                               Fn::Matrix<signed char> const& m) const {
    if (v.size() != m.rows()) FN_THROW(FNEBadArg, "Invalid Size for digitized vector");
    FNVector<int> result(m.cols());
    HWY_DYNAMIC_DISPATCH(products)(v.get(), m.get(), m.rows(), m.cols(), result.getExclusive());
    return result;
}

} // namespace Cmp
#endif
