#pragma once

#include "orbek/configuration.h"

#include <string>

namespace Orbek::Tool {

/// A configuration file. @param fileName empty for the one that was installed with the program
/// @throws std::runtime_error if that is not there
std::string configurationFile(const std::string& fileName);

/// Opens a configuration for reading; what a command sets in it is not written back. Its faults are not
/// looked at.
/// @param fileName empty for the one that was installed with the program
/// @throws std::runtime_error naming the file and what is wrong with it
Configuration readConfiguration(const std::string& fileName);

/// The same, and a fault is an error: what somebody has set by a wrong key would not be in force.
/// @param except a key whose faults do not matter
Configuration openConfiguration(const std::string& fileName, const std::string& except = {});

} // namespace Orbek::Tool
