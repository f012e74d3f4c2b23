// Prints every key of a configuration with its type, its value, its default and its description.
//
//     print_configuration [orbek.conf]
//
// Without a file it shows an empty configuration, which is all defaults.

#include "orbek/configuration.h"

#include <exception>
#include <iostream>
#include <sstream>

namespace {

Orbek::Configuration open(int argc, char** argv) {
    if (argc > 1) return Orbek::Configuration(std::string(argv[1]));
    std::istringstream nothing;
    return Orbek::Configuration(nothing);
}

} // namespace

int main(int argc, char** argv) try {
    const Orbek::Configuration configuration = open(argc, argv);
    std::cout << "liborbek " << configuration.version() << "\n";
    for (const auto& setting : configuration.settings()) {
        std::cout << "\n" << setting.key << "\n    type         " << setting.type << "\n";
        if (setting.hasValue)
            std::cout << "    value        " << configuration.getValue(setting.key) << "\n    default      "
                      << setting.defaultValue << "\n";
        std::cout << "    description  " << setting.description << "\n";
    }
} catch (const std::exception& e) {
    std::cerr << "print_configuration: " << e.what() << "\n";
    return 1;
}
