#pragma once

#include "fn/image.h"
#include "synth/face_mesh.h"

#include <cstdint>

/// What drawn surfaces are made of.

namespace Synth {

/// 0 up to `from`, 1 from `to` on, smooth between; falls if `to` is smaller.
float smoothStep(float from, float to, float x);

/// Noise between -1 and 1 that is smooth over distances of about 1.
float noise(float x, float y, std::uint32_t seed);

/// The image between the middles of its pixels; beyond them as at its rim.
float bilinear(const FNImage<float>& image, FNPos pos);

/// Corners of a curve that passes through the corners of a closed polygon (Catmull-Rom).
Points smoothed(const Points& polygon);

/// Distance to the closed polygon, positive inside.
float depth(const Points& polygon, FNPos p);

} // namespace Synth
