#pragma once

#include <filesystem>
#include <optional>

namespace Orbek {

/// The folder with the trained models and the other data that belong to this library, as seen from the file
/// that the library (or the program that holds it) was loaded from: in an installed tree, wherever it lies
/// now, and in a built one. Nothing if there is none.
std::optional<std::filesystem::path> ownDataFolder();

/// The same for a file at a given place.
std::optional<std::filesystem::path> dataFolderBeside(const std::filesystem::path& file);

} // namespace Orbek
