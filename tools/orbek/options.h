#pragma once

#include <optional>
#include <string>
#include <vector>

/// Options that several commands have, each declared in one place.

namespace CLI {
class App;
class Option;
} // namespace CLI

namespace Orbek::Tool {

/// What every command takes.
struct CommonOptions {
    std::string configuration; ///< file; empty for the one that was installed
    bool json = false;         ///< results as JSON, one object a line
    bool quiet = false;        ///< no progress bar
};

/// Adds a command, with the common options, to the program or to a group of commands.
CLI::App* addCommand(CLI::App& parent, const std::string& name, const std::string& description,
                     CommonOptions& options);
/// Adds a group of commands.
CLI::App* addGroup(CLI::App& program, const std::string& name, const std::string& description);

/// Adds the pictures that a command works on, see pictureFiles().
void addImages(CLI::App& command, std::vector<std::string>& images,
               const std::string& description = "Image files, or folders of them; - for standard input");
/// Adds how many threads share the work: as many as there are processors, unless told otherwise.
void addJobs(CLI::App& command, unsigned int& jobs);

/// Adds an option for a rate, a score or a share of a picture: a number from 0 to 1, and nothing that is no
/// number.
CLI::Option* addShare(CLI::App& command, const std::string& name, float& share,
                      const std::string& description);
CLI::Option* addShare(CLI::App& command, const std::string& name, std::optional<float>& share,
                      const std::string& description);

} // namespace Orbek::Tool
