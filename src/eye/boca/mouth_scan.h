#pragma once

#include "eye/ojo/feature_scan.h"

namespace Eye::Boca {

/// How the middle of the mouth is looked for: one level, at which a pixel is a sixteenth of the eye distance.
struct MouthScan : Ojo::T8::FeatureScan<MConvolverSettings> {
    static constexpr std::array<float, 1> scaleFactors{1.0f};
    static constexpr FNPos windowCentre{9.5f, 7.5f};
    static constexpr Ojo::T8::Placement placement{2.3125f, 2.5f, 1.2f};
};

} // namespace Eye::Boca
