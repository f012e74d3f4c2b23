#pragma once

#include "fn/rmem.h"

#include <cstdint>
#include <vector>

namespace Eye::Implementation {

/// The kernel (v + offset)^2 of a scalar product v in integers: the sum, its square in 32 bits, the square
/// shifted right, and of that the low 16 bits.
struct FpKernelDeg2 {
    float scale = 1;
    std::int32_t offset = 0;
    bool hasOffset = false;
    std::uint32_t shift = 0;

    std::int16_t operator()(std::int32_t product) const {
        const std::int32_t v = product + offset; // the offset is 0 where there is none
        return static_cast<std::int16_t>(static_cast<std::int32_t>(static_cast<std::int64_t>(v) * v) >>
                                         shift);
    }
};

/// The scalar product itself.
struct DotKernel {
    std::int16_t operator()(std::int32_t product) const { return static_cast<std::int16_t>(product); }
};

/// What the evaluation of a cascade reads, in the order in which it reads it.
struct CascadeTables {
    /// A limit on the number of support vectors, and what the sum has to reach there.
    struct Step {
        std::uint32_t limit;
        std::int32_t threshold;
    };

    std::uint32_t dimension = 0; ///< values of a vector
    std::uint32_t stride = 0;    ///< bytes from one support vector to the next, a multiple of 64
    /// The bits of the support vectors, each padded with zeros to the stride, at a multiple of 64.
    FNRMem<unsigned char> vectors;
    std::vector<std::int16_t> alphas;
    std::int32_t bias = 0;
    std::uint32_t alphaShift = 0;
    std::vector<Step> steps; ///< ascending limits
    bool earlyExit = false;
    bool firstStepShortcut = false;
    std::int16_t firstStepThreshold = 0;
};

/// Longest vector that any kernel takes in 32-bit arithmetic, bytes; the root of 2^31 values.
inline constexpr std::uint32_t largestStride = 5824;

/// Runs the cascade on `x`, the bits of a vector padded with zeros to the stride.
/// @param sum receives the sum after the last step that was evaluated
/// @return whether all steps are passed; after a rejection by the shortcut of the first step `sum` is
/// unchanged
bool evaluateCascade(const CascadeTables& tables, const FpKernelDeg2& kernel, const unsigned char* x,
                     std::int64_t& sum);
bool evaluateCascade(const CascadeTables& tables, const DotKernel& kernel, const unsigned char* x,
                     std::int64_t& sum);

namespace Plain {

/// The same with a table of the bits in a byte.
bool evaluateCascade(const CascadeTables& tables, const FpKernelDeg2& kernel, const unsigned char* x,
                     std::int64_t& sum);
bool evaluateCascade(const CascadeTables& tables, const DotKernel& kernel, const unsigned char* x,
                     std::int64_t& sum);

} // namespace Plain

} // namespace Eye::Implementation
