#include "orbek/implementation/own_place.h"

#include <dlfcn.h>

namespace Orbek {

namespace fs = std::filesystem;

std::optional<fs::path> dataFolderBeside(const fs::path& file) {
    const fs::path marker = fs::path("etc") / "SHA256SUMS"; // the list of the models
    std::error_code ignored;
    fs::path folder = fs::weakly_canonical(file, ignored).parent_path();
    // The library may lie in lib/ or deeper, as in lib/x86_64-linux-gnu.
    for (int up = 0; up < 4 && folder.has_relative_path(); ++up, folder = folder.parent_path())
        for (const fs::path& data : {folder / ORBEK_DATA, folder})
            if (fs::exists(data / marker, ignored)) return data;
    return {};
}

std::optional<fs::path> ownDataFolder() {
    Dl_info place{};
    if (dladdr(reinterpret_cast<const void*>(&dataFolderBeside), &place) == 0 || !place.dli_fname) return {};
    std::error_code error;
    // The name of a program may be relative to a folder that is no more the current one.
    const fs::path program = fs::read_symlink("/proc/self/exe", error);
    const fs::path file = place.dli_fname;
    return dataFolderBeside(file.is_absolute() || error ? file : program);
}

} // namespace Orbek
