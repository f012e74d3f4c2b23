#pragma once

#include <cstdint>
#include <filesystem>

namespace Train {

/// Trains the eleven files of the face finder in rounds: each stage learns from what the stages before let
/// through on pictures without faces.
/// @param data root of the labelled images @param out gets the files
/// @throws FNException naming the file that cannot be read or written
void trainFaceFinder(const std::filesystem::path& data, const std::filesystem::path& out, std::uint64_t seed);

} // namespace Train
