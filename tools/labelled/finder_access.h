#pragma once

#include "eye/bridge_finder.h"
#include "eye/eyes_finder.h"
#include "eye/face_finder.h"
#include "eye/mouth_finder.h"

#include <filesystem>
#include <string>

namespace Labelled {

/// The finders with their default settings on the model files below `etc`.
/// @throws FNEIOError naming the file that is missing or damaged
FaceFinder makeFaceFinder(const std::filesystem::path& etc);
/// @param settings "Strict" or "Tolerant"
EyesFinder makeEyesFinder(const std::filesystem::path& etc, const std::string& settings);
MouthFinder makeMouthFinder(const std::filesystem::path& etc);
BridgeFinder makeBridgeFinder(const std::filesystem::path& etc);

} // namespace Labelled
