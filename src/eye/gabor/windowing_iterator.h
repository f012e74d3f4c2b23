#pragma once

#include "eye/gabor/patch_convolver.h"
#include "fn/sign_value_vector.h"

namespace Eye::Ojo::T8 {

/// Walks the windows of C by R grid points over the four phases of a patch: phase by phase, in each row by
/// row, in each from left to right. A phase of no more than C columns or R rows has none.
///
/// The vector of a window has C columns of R points of 8 bytes each. Pairs that reach out of the window are
/// clear: in its first row only those to the left stay, in its first column only those above.
template <std::uint32_t C, std::uint32_t R, std::uint32_t D> class GSodWindowingIterator {
    static_assert(D == 6, "a point's 8 bytes are those of six directions");

public:
    /// The phases must outlive the iterator.
    explicit GSodWindowingIterator(const std::vector<RowOrientedGaborSods>& phases)
        : phases_(phases), window_(8 * C * columnBytes) {
        if (seekPhase()) fill(0);
    }

    bool atEnd() const noexcept { return phase_ == phases_.size(); }

    GSodWindowingIterator& operator++() {
        if (++x_ < windowColumns()) {
            unsigned char* const bytes = window_.exclusiveBytes();
            std::memmove(bytes, bytes + columnBytes, (C - 1) * columnBytes);
            maskFirstColumn(bytes);
            fill(C - 1);
            return *this;
        }
        x_ = 0;
        if (++y_ == windowRows()) {
            y_ = 0;
            ++phase_;
            if (!seekPhase()) return *this;
        }
        fill(0);
        return *this;
    }

    /// The signs of the present window.
    const Fn::SignValueVector<int>& operator*() const noexcept { return window_; }

    /// Place of the window in its phase, in points.
    std::uint32_t windowX() const noexcept { return x_; }
    std::uint32_t windowY() const noexcept { return y_; }
    const RowOrientedGaborSods& phase() const noexcept { return phases_[phase_]; }
    /// The upper left pixel of the window in the patch.
    FNGridPos position() const noexcept {
        return {static_cast<std::int32_t>(2 * x_ + phase().px),
                static_cast<std::int32_t>(2 * y_ + phase().py)};
    }

private:
    static constexpr std::uint32_t pointBytes = RowOrientedGaborSods::bytesPerPoint;
    static constexpr std::uint32_t columnBytes = R * pointBytes;

    std::uint32_t windowColumns() const { return phase().columns > C ? phase().columns - C + 1 : 0; }
    std::uint32_t windowRows() const { return phase().rows > R ? phase().rows - R + 1 : 0; }

    /// Goes on to the next phase with windows. @return whether there is one
    bool seekPhase() {
        while (!atEnd() && (windowColumns() == 0 || windowRows() == 0)) ++phase_;
        return !atEnd();
    }

    static void maskDirections(unsigned char* point, unsigned char mask) {
        for (std::uint32_t d = 0; d < D; ++d) point[d] &= mask;
    }
    static void maskFirstColumn(unsigned char* bytes) {
        for (std::uint32_t r = 0; r < R; ++r) maskDirections(bytes + r * pointBytes, 0xC0);
    }

    /// Fetches the columns of the window from number `column` on.
    void fill(std::uint32_t column) {
        unsigned char* const bytes = window_.exclusiveBytes();
        for (std::uint32_t c = column; c < C; ++c)
            for (std::uint32_t r = 0; r < R; ++r) {
                unsigned char* const point = bytes + c * columnBytes + r * pointBytes;
                std::memcpy(point, phase().point(x_ + c, y_ + r), pointBytes);
                if (r == 0) maskDirections(point, 0x03);
            }
        if (column == 0) maskFirstColumn(bytes);
    }

    const std::vector<RowOrientedGaborSods>& phases_;
    std::size_t phase_ = 0;
    std::uint32_t x_ = 0, y_ = 0;
    Fn::SignValueVector<int> window_;
};

} // namespace Eye::Ojo::T8
