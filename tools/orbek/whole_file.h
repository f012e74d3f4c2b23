#pragma once

#include <string>

namespace Orbek::Tool {

/// Writes the whole file or, if that fails, none. @throws std::runtime_error naming the file
void writeWhole(const std::string& file, const std::string& bytes);

} // namespace Orbek::Tool
