#pragma once

#include "options.h"

#include <functional>
#include <stdexcept>
#include <vector>

#include <CLI/CLI.hpp>

namespace Orbek::Tool {

/// What the program returns.
enum ExitStatus : int {
    done = 0,
    failed = 1,     ///< wrong usage, a broken configuration, a file or folder that cannot be written
    unreadable = 2, ///< an input could not be read; the others are done where there are others
};

/// An input without which a command cannot go on: the program returns `unreadable`.
class UnreadableInput : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// A command of the program.
struct Command {
    CLI::App* app;            ///< its options
    std::function<int()> run; ///< @return the exit status. @throws std::exception for what stops it
    int stopped = failed;     ///< exit status of what is stopped
};

/// Each adds one command to the program, or a group of them, and lives in a file of its own.
Command compareCommand(CLI::App& program);
Command enrolCommand(CLI::App& program);
Command findCommand(CLI::App& program);
Command identifyCommand(CLI::App& program);
Command manPagesCommand(CLI::App& program);
Command mergeCommand(CLI::App& program);
Command portraitCommand(CLI::App& program);
Command showCommand(CLI::App& program);
Command trackCommand(CLI::App& program);
Command verifyCommand(CLI::App& program);
std::vector<Command> configCommands(CLI::App& program);
std::vector<Command> cropCommands(CLI::App& program);
std::vector<Command> galleryCommands(CLI::App& program);
std::vector<Command> modelsCommands(CLI::App& program);
std::vector<Command> recordCommands(CLI::App& program);

} // namespace Orbek::Tool
