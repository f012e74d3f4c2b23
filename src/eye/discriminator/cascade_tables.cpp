#include "eye/discriminator/cascade_tables.h"

#define HWY_WANT_AVX3_DL
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "eye/discriminator/cascade_tables.cpp"
#include <hwy/foreach_target.h>

#include <hwy/highway.h>

#include "eye/discriminator/cascade_walk.h"
#include "fn/numeric/sign_bits-inl.h"

HWY_BEFORE_NAMESPACE();
namespace Eye::Implementation::HWY_NAMESPACE {

/// Of the many vectors of a polynomial machine eight are counted at a time, when the first of them is asked
/// for.
bool evaluatePolynomial(const CascadeTables& tables, const FpKernelDeg2& kernel, const unsigned char* x,
                        std::int64_t& sum) {
    constexpr std::uint32_t batch = 8;
    const unsigned char* const vectors = tables.vectors.data();
    const std::size_t stride = tables.stride, blocks = stride / 64;
    const auto total = static_cast<std::uint32_t>(tables.alphas.size());
    std::uint32_t begin = 0, end = 0, counts[batch];
    return walkCascade(tables, kernel, sum, [&](std::uint32_t j) HWY_ATTR {
        if (j < end) return counts[j - begin];
        begin = j;
        if (j + batch <= total) {
            Fn::Numeric::HWY_NAMESPACE::differingBitsOfEight(x, vectors + j * stride, stride, blocks, counts);
            end = j + batch;
        } else {
            counts[0] = Fn::Numeric::HWY_NAMESPACE::differingBitsOfBlocks(x, vectors + j * stride, blocks);
            end = j + 1;
        }
        return counts[0];
    });
}

/// Of these, most windows meet only the first.
bool evaluateDot(const CascadeTables& tables, const DotKernel& kernel, const unsigned char* x,
                 std::int64_t& sum) {
    const unsigned char* const vectors = tables.vectors.data();
    const std::size_t stride = tables.stride;
    return walkCascade(tables, kernel, sum, [=](std::uint32_t j) HWY_ATTR {
        return Fn::Numeric::HWY_NAMESPACE::differingBitsOfBlocks(x, vectors + j * stride, stride / 64);
    });
}

} // namespace Eye::Implementation::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace Eye::Implementation {

HWY_EXPORT(evaluatePolynomial);
HWY_EXPORT(evaluateDot);

bool evaluateCascade(const CascadeTables& tables, const FpKernelDeg2& kernel, const unsigned char* x,
                     std::int64_t& sum) {
    return HWY_DYNAMIC_DISPATCH(evaluatePolynomial)(tables, kernel, x, sum);
}

bool evaluateCascade(const CascadeTables& tables, const DotKernel& kernel, const unsigned char* x,
                     std::int64_t& sum) {
    return HWY_DYNAMIC_DISPATCH(evaluateDot)(tables, kernel, x, sum);
}

namespace {

template <class Kernel>
bool evaluateWithTable(const CascadeTables& tables, const Kernel& kernel, const unsigned char* x,
                       std::int64_t& sum) {
    return walkCascade(tables, kernel, sum, [&](std::uint32_t j) {
        return Fn::Numeric::Plain::differingBits(x, tables.vectors.data() + std::size_t{j} * tables.stride,
                                                 tables.stride);
    });
}

} // namespace

bool Plain::evaluateCascade(const CascadeTables& tables, const FpKernelDeg2& kernel, const unsigned char* x,
                            std::int64_t& sum) {
    return evaluateWithTable(tables, kernel, x, sum);
}

bool Plain::evaluateCascade(const CascadeTables& tables, const DotKernel& kernel, const unsigned char* x,
                            std::int64_t& sum) {
    return evaluateWithTable(tables, kernel, x, sum);
}

} // namespace Eye::Implementation
#endif
