#pragma once

#include "fn/image.h"
#include "img/affine/mapping.h"

#include <cstdint>
#include <list>
#include <vector>

namespace Eye::Implementation {

/// Which of the N by N positions of a lattice cell are looked at in which frame: each once in N * N frames,
/// spread so that neighbours in time are no neighbours in place.
class SamplingScheme {
public:
    /// For n below 2 there is no pattern: every frame looks at everything.
    explicit SamplingScheme(std::uint32_t n = 0);

    std::uint32_t width() const noexcept { return n_; }
    /// The position of this frame, (0, 0) without a pattern.
    FNGridPos offset() const noexcept { return pattern_.empty() ? FNGridPos{} : pattern_[index_]; }
    void nextFrame() noexcept { index_ = pattern_.empty() ? 0 : (index_ + 1) % pattern_.size(); }

private:
    std::uint32_t n_;
    std::vector<FNGridPos> pattern_;
    std::size_t index_ = 0;
};

/// Chooses the positions of one pyramid level that are looked at in a frame of a video: a sparse lattice that
/// moves from frame to frame, and all positions around what was found in the frame before.
///
/// Inactive, it visits every position: that is how still images are searched.
class FrameScaleSequencer {
public:
    /// What a position turned out to be in this frame.
    enum Status : unsigned char { notSeen = 0, nothing = 100, candidate = 200, face = 255 };

    /// @param subsampling width of a lattice cell, below 2 for an inactive sequencer
    /// @param eyeDistance of the level, image pixels
    FrameScaleSequencer(std::uint32_t subsampling, float eyeDistance);

    /// Begins a frame. @param toImage from positions of windows to the image @param w,h number of windows
    void prepare(const Img::Affine::Mapping& toImage, std::uint32_t w, std::uint32_t h);
    bool active() const noexcept { return activeNow_; }

    /// Calls visit(x, y) for each position to look at.
    template <class Visit> void forEachPosition(Visit visit) const {
        if (!active()) {
            for (std::uint32_t y = 0; y < h_; ++y)
                for (std::uint32_t x = 0; x < w_; ++x) visit(x, y);
            return;
        }
        visitLattice(visit);
        for (std::uint32_t y = 0; y < h_; ++y)
            for (std::uint32_t x = 0; x < w_; ++x)
                if (interesting(x, y)) visit(x, y);
    }

    /// Whether a candidate here counts at once; on the lattice it first draws attention for the next frame.
    bool isDense(std::uint32_t x, std::uint32_t y) const { return !active() || interesting(x, y); }
    void setStatus(std::uint32_t x, std::uint32_t y, Status status);
    /// Marks an accepted face, if its size is one of this level's. @param centre of the mask, image pixels
    void markFace(FNPos centre, float width);
    /// Ends a frame: the places of candidates and faces are looked at densely in the next one.
    /// @throws FNEGeneric for a status that is none
    void finalizeFrame();

private:
    static constexpr float maskshift = 8.5f;

    bool interesting(std::uint32_t x, std::uint32_t y) const { return interest_(x, y) == face; }
    template <class Visit> void visitLattice(Visit visit) const {
        const FNGridPos offset = scheme_.offset();
        bool first = true;
        for (std::uint32_t y = static_cast<std::uint32_t>(offset.y); y < h_; y += scheme_.width())
            for (std::uint32_t x = static_cast<std::uint32_t>(offset.x); x < w_; x += scheme_.width()) {
                if (first || !interesting(x, y)) visit(x, y);
                first = false;
            }
    }

    std::uint32_t subsampling_; // 0 when off
    SamplingScheme scheme_;
    bool activeNow_ = false;
    std::uint32_t w_ = 0, h_ = 0;
    FNImage<unsigned char> status_, interest_;
    Img::Affine::Mapping toLevel_;
    float minWidth_, maxWidth_; // of the faces that concern this level
};

/// The sequencers of all levels of one stream.
class FrameSequencer {
public:
    std::list<FrameScaleSequencer>& scales() noexcept { return scales_; }
    void markFace(FNPos centre, float width);
    void finalizeFrame();

private:
    std::list<FrameScaleSequencer> scales_;
};

} // namespace Eye::Implementation
