#pragma once

#include <cstdint>
#include <filesystem>

namespace Train {

/// Each trains one file for a finder of facial features: windows at the labelled place against the other
/// windows of the same areas, in rounds that add what the machine so far takes for the feature.
/// @param data root of the labelled images @param out gets the file
/// @throws FNException naming the file that cannot be read or written
void trainEyesFinder(const std::filesystem::path& data, const std::filesystem::path& out, std::uint64_t seed);
void trainMouthFinder(const std::filesystem::path& data, const std::filesystem::path& out,
                      std::uint64_t seed);
void trainBridgeFinder(const std::filesystem::path& data, const std::filesystem::path& out,
                       std::uint64_t seed);

} // namespace Train
