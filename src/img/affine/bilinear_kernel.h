#pragma once

#include "fn/image.h"

#include <cstddef>
#include <cstdint>

namespace Img::Affine::Kernels {

/// Equally spaced sampling positions; pixel indexes are where the fraction is 0.
struct SampleLine {
    FNPos start;
    FN2Vector<float> step;

    float x(std::uint32_t i) const { return start.x + (static_cast<float>(i) + 0.5f) * step.x; }
    float y(std::uint32_t i) const { return start.y + (static_cast<float>(i) + 0.5f) * step.y; }
};

/// out[i] = the bilinear interpolation at sample i, for begin <= i < end, all of whose neighbours lie in the
/// image with rows of `stride` pixels.
void sampleInside(const float* pixels, std::size_t stride, const SampleLine& line, std::uint32_t begin,
                  std::uint32_t end, float* out);

/// Equally spaced sampling positions in 2^-15 of a pixel; pixel indexes are where the fraction is 0.
struct FixedSampleLine {
    std::int64_t x, y; ///< of sample 0
    std::int64_t xStep, yStep;
};

/// The same in colour, opaque, for at least two samples. The products of fractions and differences are
/// rounded down, as those of integers are.
void sampleInside(const Fn::Bgra32* pixels, std::size_t stride, const FixedSampleLine& line,
                  std::int64_t begin, std::int64_t end, Fn::Bgra32* out);

} // namespace Img::Affine::Kernels
