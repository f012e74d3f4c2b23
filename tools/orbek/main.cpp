// orbek: the command line of the library. Each command lives in a file of its own, see command.h.

#include "command.h"

#include <algorithm>
#include <iostream>
#include <span>

using namespace Orbek::Tool;

namespace {

/// The first word that stands where a command should and names none; null if there is none.
const char* unknownCommand(const CLI::App* app, std::span<char* const> words) {
    for (const char* const word : words) {
        const auto commands = app->get_subcommands([](const CLI::App*) { return true; });
        if (commands.empty() || *word == '-') return nullptr;
        const auto named =
            std::ranges::find(commands, word, [](const CLI::App* command) { return command->get_name(); });
        if (named == commands.end()) return word;
        app = *named;
    }
    return nullptr;
}

} // namespace

int main(int argc, char** argv) {
    CLI::App program(
        "Finds, tracks and recognizes faces in images.\n"
        "Results go to standard output, as JSON with --json; everything else to standard error.\n"
        "Exit status: 0 done, 1 failed, 2 an input could not be read (the others are done).",
        "orbek");
    program.require_subcommand(1);
    program.set_version_flag("--version", "orbek " ORBEK_VERSION, "Print the version and exit");
    std::vector<Command> commands = {enrolCommand(program), verifyCommand(program),  identifyCommand(program),
                                     showCommand(program),  mergeCommand(program),   compareCommand(program),
                                     findCommand(program),  trackCommand(program),   portraitCommand(program),
                                     demoCommand(program),  manPagesCommand(program)};
    for (const auto& group : {galleryCommands, recordCommands, cropCommands, configCommands, modelsCommands})
        std::ranges::copy(group(program), std::back_inserter(commands));
    const auto parsed = [&] {
        return std::ranges::find_if(commands, [](const Command& command) { return command.app->parsed(); });
    };
    const auto stopped = [&] { return parsed() == commands.end() ? failed : parsed()->stopped; };
    if (const char* const unknown = unknownCommand(&program, std::span(argv, argv + argc).subspan(1))) {
        std::cerr << "orbek: there is no command \"" << unknown << "\"; see orbek --help" << std::endl;
        return failed;
    }
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
