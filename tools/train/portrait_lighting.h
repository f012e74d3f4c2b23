#pragma once

#include "cmp/portrait/sphar_transformator.h"
#include "train/portrait_samples.h"

#include <random>

namespace Train {

/// Faces under known light, and the light as spherical harmonics. Each face is a mean over several persons of
/// the train part, so that it shows none of them: under each light that there are pictures of, and under
/// mixtures of these lights.
Cmp::Portrait::SpharTransformator::Data trainLighting(const PortraitSet& light, std::mt19937_64& random);

/// The window that a vector of columns was made from.
FNImage<float> lightingWindow(std::span<const float> columns);

} // namespace Train
