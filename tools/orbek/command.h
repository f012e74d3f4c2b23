#pragma once

#include <functional>

#include <CLI/CLI.hpp>

namespace Orbek::Tool {

/// What the program returns.
enum ExitStatus : int {
    done = 0,
    failed = 1,     ///< wrong usage, a broken configuration, a folder that cannot be written
    unreadable = 2, ///< an input could not be read; the others are done
};

/// A command of the program.
struct Command {
    CLI::App* app;            ///< its options
    std::function<int()> run; ///< @return the exit status. @throws std::exception for what stops it
    int stopped = failed;     ///< exit status of what is stopped
};

/// Each adds one command to the program, and lives in a file of its own.
Command compareCommand(CLI::App& program);
Command enrolCommand(CLI::App& program);
Command findCommand(CLI::App& program);
Command mergeCommand(CLI::App& program);
Command showCommand(CLI::App& program);
Command trackCommand(CLI::App& program);
Command verifyCommand(CLI::App& program);

} // namespace Orbek::Tool
