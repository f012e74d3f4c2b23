#include "fn/shapefile/texture_file.h"

#include <algorithm>
#include <array>
#include <filesystem>

namespace Fn {

namespace {

namespace fs = std::filesystem;

constexpr std::array endings{"bmp", "png", "ppm", "pgm", "jpg", "jpeg", "tif"};

Optional<std::string> plainFile(const fs::path& path) {
    std::error_code ignored;
    if (!fs::is_regular_file(path, ignored)) return {};
    return path.string();
}

std::string upperCase(std::string text) {
    std::transform(text.begin(), text.end(), text.begin(),
                   [](char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c; });
    return text;
}

} // namespace

Optional<std::string> textureBeside(const std::string& scanName, const std::string& ending) {
    for (const std::string& each : {ending, upperCase(ending)}) {
        const fs::path path = fs::path(scanName).replace_extension(each);
        if (path == fs::path(scanName)) continue;
        if (const auto found = plainFile(path); found.isSet()) return found;
    }
    return {};
}

Optional<std::string> textureBeside(const std::string& scanName) {
    for (const char* ending : endings)
        if (const auto found = textureBeside(scanName, ending); found.isSet()) return found;
    return {};
}

Optional<std::string> fileReferredTo(const std::string& scanName, const std::string& reference) {
    std::string name = reference;
    std::replace(name.begin(), name.end(), '\\', '/');
    // Names with a NUL would end there for the system.
    if (name.empty() || name.find('\0') != std::string::npos) return {};
    const fs::path folder = fs::path(scanName).parent_path(), path(name);
    const bool leadsElsewhere = path.is_absolute() || name.find(':') != std::string::npos ||
                                std::find(path.begin(), path.end(), fs::path("..")) != path.end();
    if (!leadsElsewhere)
        if (const auto found = plainFile(folder / path); found.isSet()) return found;
    return plainFile(folder / path.filename());
}

} // namespace Fn
