// orbek: the command line of the library. Each command lives in a file of its own, see command.h.

#include "command.h"

#include <algorithm>
#include <iostream>

using namespace Orbek::Tool;

int main(int argc, char** argv) {
    CLI::App program(
        "Finds, tracks and recognizes faces in images.\n"
        "Results go to standard output, as JSON with --json; everything else to standard error.\n"
        "Exit status: 0 done, 1 failed, 2 an input could not be read (the others are done).",
        "orbek");
    program.require_subcommand(1);
    std::vector<Command> commands = {
        enrolCommand(program),    verifyCommand(program),  identifyCommand(program), showCommand(program),
        mergeCommand(program),    compareCommand(program), findCommand(program),     trackCommand(program),
        portraitCommand(program), manPagesCommand(program)};
    for (const auto& group : {galleryCommands, recordCommands, cropCommands, configCommands, modelsCommands})
        std::ranges::copy(group(program), std::back_inserter(commands));
    const auto parsed = [&] {
        return std::ranges::find_if(commands, [](const Command& command) { return command.app->parsed(); });
    };
    const auto stopped = [&] { return parsed() == commands.end() ? failed : parsed()->stopped; };
    try {
        program.parse(argc, argv);
    } catch (const CLI::ParseError& e) {
        return program.exit(e) == 0 ? done : stopped();
    }
    const auto complain = [](const std::exception& e) { std::cerr << "orbek: " << e.what() << std::endl; };
    try {
        const int status = parsed()->run();
        if (std::cout.flush()) return status;
        throw std::runtime_error("cannot write the results");
    } catch (const UnreadableInput& e) {
        complain(e);
        return unreadable;
    } catch (const std::exception& e) {
        complain(e);
        return stopped();
    }
}
