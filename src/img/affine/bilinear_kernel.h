#pragma once

#include "fn/geometry.h"

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

} // namespace Img::Affine::Kernels
