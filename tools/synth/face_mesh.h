#pragma once

#include "fn/geometry.h"

#include <array>
#include <cstdint>
#include <functional>
#include <span>
#include <vector>

/// Faces as meshes of triangles over their landmarks, so that one can be drawn in the shape of another.

namespace Synth {

using Points = std::vector<FNPos>;
using Triangle = std::array<std::uint16_t, 3>;

/// Jaw 0-16, brows 17-26, nose 27-35, image-left eye 36-41, image-right eye 42-47, mouth 48-67.
constexpr std::size_t landmarkCount = 68;

/// Axes of a head in the picture: positions in eye distances right of and above the middle of the eyes.
class HeadAxes {
public:
    explicit HeadAxes(std::span<const FNPos> landmarks);

    float eyeDistance() const { return unit_; }
    FNPos local(FNPos picture) const;
    FNPos picture(FNPos local) const { return origin_ + (right_ * local.x + up_ * local.y) * unit_; }

private:
    FNPos origin_, right_, up_;
    float unit_;
};

FNPos leftEye(std::span<const FNPos> landmarks); ///< mean of the six points of its lids
FNPos rightEye(std::span<const FNPos> landmarks);
FNPos mouth(std::span<const FNPos> landmarks); ///< mean of the twelve points of its outline

/// The landmarks and, behind them, points around the forehead, image-left to image-right.
Points withForehead(std::span<const FNPos> landmarks);
/// The outline of the face: jaw and forehead of withForehead().
Points outline(std::span<const FNPos> meshPoints);

/// Delaunay triangulation (Bowyer 1981, Watson 1981).
std::vector<Triangle> delaunay(std::span<const FNPos> points);

/// Visits each pixel of `box` whose middle lies in the mesh drawn at `target` once, with the place that
/// belongs to it in the mesh at `source`.
void forEachPixel(std::span<const Triangle> triangles, std::span<const FNPos> target,
                  std::span<const FNPos> source, const FNBox& box,
                  const std::function<void(FNGridPos pixel, FNPos source)>& visit);

/// The similarity that brings points closest to others in the sense of least squares.
class Similarity {
public:
    Similarity(std::span<const FNPos> from, std::span<const FNPos> to);
    FNPos operator()(FNPos p) const {
        return FNPos{cos_ * p.x - sin_ * p.y, sin_ * p.x + cos_ * p.y} + shift_;
    }
    /// The way back.
    FNPos inverse(FNPos p) const;

private:
    float cos_, sin_; ///< times the scale
    FNPos shift_;
};

} // namespace Synth
