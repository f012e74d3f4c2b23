#pragma once

#include "eye/discriminator/cascade_tables.h"

namespace Eye::Implementation {

/// The order of evaluation of a cascade, for any way of counting the bits in which x differs from a support
/// vector: `differingBits(j)`. It is a template so that each instruction set gets its own copy with the
/// counting inlined.
///
/// The early exit relies on the order of the vectors: within a step those of positive alpha come first, and a
/// kernel value is never negative, so that behind the first that is not positive the sum cannot rise.
template <class Kernel, class DifferingBits>
#if defined(__GNUC__)
[[gnu::always_inline]]
#endif
inline bool
walkCascade(const CascadeTables& tables, const Kernel& kernel, std::int64_t& sum,
            DifferingBits differingBits) {
    const auto kernelValue = [&](std::uint32_t j) -> std::int32_t {
        return kernel(static_cast<std::int32_t>(tables.dimension) -
                      2 * static_cast<std::int32_t>(differingBits(j)));
    };
    const std::int16_t* const alphas = tables.alphas.data();

    const std::int32_t first = kernelValue(0);
    if (tables.firstStepShortcut && first < tables.firstStepThreshold) return false;
    sum = std::int64_t{first * alphas[0] >> tables.alphaShift} - tables.bias;
    std::uint32_t j = 1;
    for (const CascadeTables::Step& step : tables.steps) {
        for (; j < step.limit; ++j) {
            sum += kernelValue(j) * alphas[j] >> tables.alphaShift;
            if (tables.earlyExit && alphas[j] <= 0 && sum < step.threshold) return false;
        }
        if (sum < step.threshold) return false;
    }
    return true;
}

} // namespace Eye::Implementation
