#pragma once

#include "eye/cara/face_finder.h"

#include <filesystem>

namespace Eval {

/// The face finder with its default settings on the model files below `etc`.
/// @throws FNEIOError naming the file that is missing or damaged
FaceFinder makeFaceFinder(const std::filesystem::path& etc);

} // namespace Eval
