// orbek: the command line of the library. Each command lives in a file of its own, see command.h.

#include "command.h"

#include <iostream>
#include <vector>

using namespace Orbek::Tool;

int main(int argc, char** argv) {
    CLI::App program("Finds and tracks faces in images. Results are printed as JSON, one object a line.\n"
                     "Exit status: 0 done, 1 failed, 2 an input could not be read (the others are done).",
                     "orbek");
    program.require_subcommand(1);
    const std::vector<Command> commands = {findCommand(program), trackCommand(program)};
    try {
        program.parse(argc, argv);
    } catch (const CLI::ParseError& e) {
        return program.exit(e) == 0 ? done : failed;
    }
    try {
        for (const Command& command : commands)
            if (command.app->parsed()) {
                const int status = command.run();
                if (std::cout.flush()) return status;
                throw std::runtime_error("cannot write the results");
            }
    } catch (const std::exception& e) {
        std::cerr << "orbek: " << e.what() << std::endl;
    }
    return failed;
}
