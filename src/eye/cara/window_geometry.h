#pragma once

#include <cstdint>

/// Where a face lies in the windows that the face finder looks at. The trained discriminators suppose it, so
/// the finder and its training share these numbers.

namespace Eye::Cara::T8 {

/// Eye distance in the window of the scan, pixels.
inline constexpr float trainedEyeDistance = 7.0f;
/// Centre of that window of 17 by 17 pixels, along both axes.
inline constexpr float windowCentre = 8.5f;
/// From one scale to the next an eye distance grows by the square of this, 4/3.
inline constexpr double scaleStepRoot = 1.154700538379;
/// Side of the square of the final test in eye distances: 23 pixels, of which the eyes are 10 apart.
inline constexpr float finalPatchSide = 2.3f;
inline constexpr float finalEyeDistance = 10.0f;
/// From the line of the eyes to the middle of the window, in eye distances.
inline constexpr float eyeLineToCentre = 0.35888943f;

} // namespace Eye::Cara::T8
