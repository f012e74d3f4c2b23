#pragma once

#include "fn/image.h"

namespace Cmp::B7 {

/// Side of a warped face, pixels.
inline constexpr std::uint32_t warpedSize = 160;

/// Unrolls a face as from an upright half-ellipse onto a square of warpedSize: the eyes come to stand in
/// columns 48 and 112 of row 58.67, the middle of the mouth in row 120. What the head's turn has made narrow
/// becomes wide again; the turn is told by where the bridge of the nose lies between the eyes.
///
/// @param leftEye,rightEye the one on the left of the image first
/// @param mouth middle of the mouth
/// @param bridge of the nose, between the eyes
/// @param paddingRatio becomes the share of the result that lies outside of the image, where it is 0
/// @throws FNEBadArg if the mouth is not below the eyes, or for positions that no face can have
FNImage<float> reshapeWarp(FNImage<float> const& image, FNPos const& leftEye, FNPos const& rightEye,
                           FNPos const& mouth, FNPos const& bridge, float& paddingRatio);

} // namespace Cmp::B7
