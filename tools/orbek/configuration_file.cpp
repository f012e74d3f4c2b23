#include "configuration_file.h"

#include <filesystem>
#include <fstream>
#include <stdexcept>

namespace Orbek::Tool {
namespace {

namespace fs = std::filesystem;

/// Where the configuration lies, seen from the program's folder: in an installed and in a built tree.
constexpr const char* placesBesideProgram[] = {"../share/orbek/orbek.conf", "../orbek.conf"};

std::string installedFile() {
    const fs::path folder = fs::read_symlink("/proc/self/exe").parent_path();
    for (const char* place : placesBesideProgram)
        if (const fs::path file = folder / place; fs::exists(file)) return file.lexically_normal().string();
    throw std::runtime_error("There is no orbek.conf beside " + folder.string() + "; name one with --config");
}

} // namespace

std::string configurationFile(const std::string& fileName) {
    return fileName.empty() ? installedFile() : fileName;
}

Configuration openConfiguration(const std::string& fileName) {
    const std::string name = configurationFile(fileName);
    std::ifstream file(name);
    if (!file || fs::is_directory(name)) throw std::runtime_error(name + ": cannot be opened for reading");
    try {
        return Configuration(file);
    } catch (const std::exception& e) {
        throw std::runtime_error(name + ": " + e.what());
    }
}

} // namespace Orbek::Tool
