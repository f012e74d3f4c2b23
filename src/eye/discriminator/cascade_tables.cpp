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

template <class Kernel>
HWY_INLINE bool evaluate(const CascadeTables& tables, const Kernel& kernel, const unsigned char* x,
                         std::int64_t& sum) {
    const unsigned char* const vectors = tables.vectors.data();
    const std::size_t stride = tables.stride;
    return walkCascade(tables, kernel, sum, [=](std::uint32_t j) HWY_ATTR {
        return Fn::Numeric::HWY_NAMESPACE::differingBitsOfBlocks(x, vectors + j * stride, stride / 64);
    });
}

bool evaluatePolynomial(const CascadeTables& tables, const FpKernelDeg2& kernel, const unsigned char* x,
                        std::int64_t& sum) {
    return evaluate(tables, kernel, x, sum);
}

bool evaluateDot(const CascadeTables& tables, const DotKernel& kernel, const unsigned char* x,
                 std::int64_t& sum) {
    return evaluate(tables, kernel, x, sum);
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
