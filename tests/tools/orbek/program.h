#pragma once

#include "support/scratch_folder.h"

#include <sstream>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>
#include <sys/wait.h>

/// What one run of the program gave.
struct ProgramRun {
    int status;
    std::string output, complaints;

    /// Of results as JSON.
    std::vector<nlohmann::json> lines() const {
        std::vector<nlohmann::json> lines;
        std::istringstream stream(output);
        for (std::string line; std::getline(stream, line);) lines.push_back(nlohmann::json::parse(line));
        return lines;
    }
};

/// Runs the built program `orbek` with arguments of which none has a quote.
inline ProgramRun runOrbek(const std::vector<std::string>& arguments) {
    const ScratchFolder scratch;
    std::string command = "'" ORBEK_BINARY_DIR "/bin/orbek'";
    for (const std::string& argument : arguments) command += " '" + argument + "'";
    command += " >'" + scratch.file("out") + "' 2>'" + scratch.file("err") + "'";
    const int status = std::system(command.c_str());
    return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, scratch.read("out"), scratch.read("err")};
}

/// The same with results as JSON.
inline ProgramRun runOrbekJson(std::vector<std::string> arguments) {
    arguments.emplace_back("--json");
    return runOrbek(arguments);
}
