#include "eye/cara/frame_scale_sequencer.h"

#include <algorithm>
#include <cmath>
#include <span>

namespace Eye::Implementation {
namespace {

struct Offset {
    signed char x, y;
};

// Permutations of the cells of 3x3, 5x5 and 7x7, ordered by hand.
constexpr Offset pattern3[] = {{0, 0}, {1, 2}, {2, 0}, {0, 1}, {2, 2}, {1, 0}, {0, 2}, {2, 1}, {1, 1}};
constexpr Offset pattern5[] = {{0, 0}, {2, 1}, {4, 2}, {1, 3}, {3, 4}, {1, 0}, {3, 1}, {0, 2}, {2, 3},
                               {4, 4}, {2, 0}, {4, 1}, {1, 2}, {3, 3}, {0, 4}, {3, 0}, {0, 1}, {2, 2},
                               {4, 3}, {1, 4}, {4, 0}, {1, 1}, {3, 2}, {0, 3}, {2, 4}};
constexpr Offset pattern7[] = {{5, 3}, {4, 6}, {1, 5}, {2, 0}, {3, 2}, {3, 4}, {6, 5}, {5, 1}, {1, 3}, {6, 1},
                               {0, 1}, {0, 5}, {5, 0}, {1, 1}, {3, 3}, {4, 5}, {2, 6}, {6, 4}, {0, 2}, {5, 2},
                               {3, 0}, {0, 6}, {3, 5}, {2, 2}, {5, 4}, {0, 0}, {3, 1}, {6, 3}, {2, 5}, {4, 0},
                               {0, 4}, {4, 2}, {3, 6}, {4, 4}, {2, 3}, {4, 1}, {1, 0}, {6, 6}, {1, 2}, {6, 0},
                               {2, 1}, {1, 6}, {6, 2}, {5, 6}, {2, 4}, {5, 5}, {0, 3}, {4, 3}, {1, 4}};

std::span<const Offset> orderedPattern(std::uint32_t n) {
    switch (n) {
    case 3:
        return pattern3;
    case 5:
        return pattern5;
    case 7:
        return pattern7;
    default:
        return {};
    }
}

/// Cells of this width on small levels, where a larger one would hardly see anything.
constexpr std::uint32_t smallLevelSubsampling = 3;
constexpr std::uint32_t largestSmallLevel = 49;

} // namespace

SamplingScheme::SamplingScheme(std::uint32_t n) : n_(n > 1 ? n : 0) {
    for (const Offset& offset : orderedPattern(n_)) pattern_.push_back({offset.x, offset.y});
    if (!pattern_.empty()) return;
    for (std::uint32_t i = 0; i < n_ * n_; ++i)
        pattern_.push_back({static_cast<std::int32_t>(i % n_), static_cast<std::int32_t>(i / n_)});
}

FrameScaleSequencer::FrameScaleSequencer(std::uint32_t subsampling, float eyeDistance)
    : subsampling_(subsampling > 1 ? subsampling : 0), minWidth_(0.7f * eyeDistance),
      maxWidth_(1.4f * eyeDistance) {}

void FrameScaleSequencer::prepare(const Img::Affine::Mapping& toImage, std::uint32_t w, std::uint32_t h) {
    const bool resized = w != w_ || h != h_;
    w_ = w;
    h_ = h;
    activeNow_ = subsampling_ != 0 && w != 0 && h != 0;
    if (!activeNow_) return;
    toLevel_ = toImage.inverse();
    const bool small = w <= largestSmallLevel || h <= largestSmallLevel;
    const std::uint32_t cell = small ? smallLevelSubsampling : subsampling_;
    if (scheme_.width() != cell) scheme_ = SamplingScheme(cell);
    if (!resized) return;
    for (FNImage<unsigned char>* const image : {&status_, &interest_}) {
        *image = FNImage<unsigned char>(w, h);
        image->fill(notSeen);
    }
}

void FrameScaleSequencer::setStatus(std::uint32_t x, std::uint32_t y, Status status) {
    if (active()) status_.getExclusive()[std::size_t{y} * w_ + x] = status;
}

void FrameScaleSequencer::markFace(FNPos centre, float width) {
    if (!active() || width < minWidth_ || width > maxWidth_) return;
    const FNPos place = toLevel_(centre) - FNPos{maskshift, maskshift};
    const FNGridPos grid(FNPos{std::floor(place.x), std::floor(place.y)});
    if (status_.box().contains(grid)) status_.set(grid, face);
}

void FrameScaleSequencer::finalizeFrame() {
    if (!active()) return;
    constexpr std::int32_t reach = 2;
    interest_.fill(notSeen);
    unsigned char* const interest = interest_.getExclusive();
    for (std::uint32_t y = 0; y < h_; ++y)
        for (std::uint32_t x = 0; x < w_; ++x) {
            const unsigned char status = status_(x, y);
            if (status == notSeen || status == nothing) continue;
            if (status != candidate && status != face) FN_THROW(FNEGeneric, "Unknown face probability value");
            const auto cx = static_cast<std::int32_t>(x), cy = static_cast<std::int32_t>(y);
            const FNBox block =
                FNBox{cx - reach, cy - reach, cx + reach + 1, cy + reach + 1} & interest_.box();
            for (std::int32_t by = block.y0; by < block.y1; ++by)
                std::fill_n(interest + static_cast<std::size_t>(by) * w_ + block.x0, block.width(), face);
        }
    status_.fill(notSeen);
    scheme_.nextFrame();
}

void FrameSequencer::markFace(FNPos centre, float width) {
    for (FrameScaleSequencer& scale : scales_) scale.markFace(centre, width);
}

void FrameSequencer::finalizeFrame() {
    for (FrameScaleSequencer& scale : scales_) scale.finalizeFrame();
}

} // namespace Eye::Implementation
