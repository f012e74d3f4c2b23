#pragma once

#include <filesystem>
#include <string>
#include <vector>

/// The files that a command writes.

namespace Orbek::Tool {

/// Writes the whole file or, if that fails, none. @throws std::exception naming the file and the reason
void writeWhole(const std::string& file, const std::string& bytes);

/// Inputs are never written over, under whatever name: a folder of results may be the folder of the photos.
/// @throws std::runtime_error naming the first of the outputs that is one of the inputs, or leads to one
void refuseInputs(const std::vector<std::filesystem::path>& outputs,
                  const std::vector<std::filesystem::path>& inputs);

} // namespace Orbek::Tool
