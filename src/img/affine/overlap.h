#pragma once

#include <cstdint>
#include <span>
#include <vector>

namespace Img::Affine {

/// How the pixels of a result overlap those of its source along one axis.
///
/// Source pixels of given widths are laid end to end from 0, and so are the result's pixels; the weight of a
/// source pixel in a result pixel is the length of their common part. Result pixel x takes `taps` source
/// pixels from first[x] on, with the weights weight(x)[0..taps); those that do not overlap have the weight 0
/// and may lie beyond the source's end.
struct Overlap {
    /// @param sourceWidths, resultWidths in the same units; a result pixel that reaches beyond the source's
    /// end
    ///        loses what lies there.
    Overlap(std::span<const std::uint32_t> sourceWidths, std::span<const std::uint32_t> resultWidths);

    std::uint32_t size() const { return static_cast<std::uint32_t>(first.size()); }
    const std::uint32_t* weight(std::uint32_t x) const { return weights.data() + std::uint64_t{x} * taps; }

    std::uint32_t taps = 1;           ///< source pixels per result pixel
    std::vector<std::uint32_t> first; ///< by result pixel
    std::vector<std::uint32_t> count; ///< by result pixel: source pixels with a weight above 0, at least 1
    std::vector<std::uint32_t> width; ///< by result pixel: its full width
    std::vector<std::uint32_t> weights;
};

} // namespace Img::Affine
