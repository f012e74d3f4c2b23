#pragma once

#include <filesystem>
#include <map>
#include <string>

/// Lists of checksums of trained content.

namespace Orbek::Models {

/// The name of the list, which lies beside the sources and beside the unpacked files.
inline const std::string sumsName = "SHA256SUMS";

/// SHA-256 of a file in hexadecimal digits. @throws FNEIOError
std::string sha256(const std::filesystem::path& file);

/// Sums by path below etc, from a list in the format of sha256sum. @throws FNEIOError, FNEBadFormat
std::map<std::string, std::string> readSums(const std::filesystem::path& list);

} // namespace Orbek::Models
