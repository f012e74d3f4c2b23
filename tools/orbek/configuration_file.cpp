#include "configuration_file.h"

#include "fn/message/dialog.h"

#include <filesystem>
#include <fstream>
#include <stdexcept>

namespace Orbek::Tool {
namespace {

namespace fs = std::filesystem;

/// Where the configuration lies, seen from the program's folder: in an installed and in a built tree.
constexpr const char* placesBesideProgram[] = {"../share/orbek/orbek.conf", "../orbek.conf"};

class Silence final : public FNDialog::Body {
    void log(const std::string&) override {}
    void info(const std::string&) override {}
    void warn(const std::string&) override {}
    void error(const std::string&) override {}
    std::string name() const override { return "Silence"; }
};

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

Configuration readConfiguration(const std::string& fileName) {
    const std::string name = configurationFile(fileName);
    std::ifstream file(name);
    if (!file || fs::is_directory(name)) throw std::runtime_error(name + ": cannot be opened for reading");
    const FNCountedPtr<FNDialog::Body> before = FNDialog::get();
    FNDialog::set(FNCountedPtr<FNDialog::Body>(new Silence)); // faults are told by whoever asks for them
    try {
        const Configuration configuration(file);
        FNDialog::set(before);
        return configuration;
    } catch (const std::exception& e) {
        FNDialog::set(before);
        throw std::runtime_error(name + ": " + e.what());
    }
}

Configuration openConfiguration(const std::string& fileName, const std::string& except) {
    const std::string name = configurationFile(fileName);
    Configuration configuration = readConfiguration(name);
    std::vector<Configuration::Fault> faults = configuration.faults();
    std::erase_if(faults, [&](const Configuration::Fault& fault) { return fault.key == except; });
    if (faults.empty()) return configuration;
    const std::string others = std::to_string(faults.size() - 1);
    throw std::runtime_error(name + ": line " + std::to_string(faults.front().line) + ": " +
                             faults.front().key + ": " + faults.front().reason +
                             (faults.size() == 1 ? "" : "; 'orbek config check' tells " + others + " more"));
}

} // namespace Orbek::Tool
