#pragma once

#include <cstdint>
#include <filesystem>

namespace Train {

/// Prints how close the finders of eyes, mouth and nose bridge come to the labels of the test images, given
/// faces and eyes with the errors of feature_samples.h.
/// @param etc holds the folders ojo, boca and raiz
void measureFeatureFinders(const std::filesystem::path& data, const std::filesystem::path& etc,
                           std::uint64_t seed);

} // namespace Train
