#pragma once

#include "orbek/configuration.h"

#include <string>

namespace Orbek::Tool {

/// Opens a configuration for reading; what a command sets in it is not written back.
/// @param fileName empty for the one that was installed with the program
/// @throws std::runtime_error naming the file and what is wrong with it
Configuration openConfiguration(const std::string& fileName);

} // namespace Orbek::Tool
