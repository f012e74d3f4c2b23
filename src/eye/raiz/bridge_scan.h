#pragma once

#include "eye/ojo/feature_scan.h"

namespace Eye::Raiz {

/// How the bridge of the nose is looked for: one level, at which a pixel is a sixteenth of the eye distance.
struct BridgeScan : Ojo::T8::FeatureScan<MConvolverSettings> {
    static constexpr std::array<float, 1> scaleFactors{1.0f};
    static constexpr FNPos windowCentre{9.5f, 7.6f};
    static constexpr Ojo::T8::Placement placement{2.25f, 2.25f, 0.1f};
};

} // namespace Eye::Raiz
