#pragma once

#include <span>
#include <string>

namespace Orbek::Models {

/// A file of trained content: where it lies by default and who reads it. A new file is one row of the table.
struct ModelFile {
    const char* directory; ///< below etc
    const char* name;
    const char* reader; ///< class
    /// Opens `directory`/`name` with the reader, whose exception names the path and what is wrong; null for a
    /// reader that this version does not have.
    void (*open)(const std::string& directory, const std::string& name);

    std::string path() const { return std::string(directory) + "/" + name; }
};

/// All files that the default configuration names.
std::span<const ModelFile> modelFiles();

} // namespace Orbek::Models
