#pragma once

#include "orbek/configuration.h"

#include <string>

namespace Orbek::Tool {

/// A configuration file. @param fileName empty for the one that was installed with the program
/// @throws std::runtime_error if that is not there
std::string configurationFile(const std::string& fileName);

/// Opens a configuration for reading; what a command sets in it is not written back.
/// @param fileName empty for the one that was installed with the program
/// @throws std::runtime_error naming the file and what is wrong with it
Configuration openConfiguration(const std::string& fileName);

} // namespace Orbek::Tool
