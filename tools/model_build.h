#pragma once

#include <filesystem>
#include <iosfwd>
#include <map>
#include <memory>
#include <string>

/// From the compact sources of trained content to the files that the library reads.
///
/// A source `models/DIR/FILE.gz` unpacks to `etc/DIR/FILE`, one that ends in `.factors` is multiplied out
/// (b7_factors.h); a source without a suffix that is known here is
/// copied. `models/SHA256SUMS` lists the sum of each unpacked file in the format of sha256sum, with its path
/// below etc. Markdown is no source.

namespace Orbek::Models {

/// SHA-256 of a file in hexadecimal digits. @throws FNEIOError
std::string sha256(const std::filesystem::path& file);

/// Sums by path below etc, from a list in the format of sha256sum. @throws FNEIOError, FNEBadFormat
std::map<std::string, std::string> readSums(const std::filesystem::path& list);

/// Unpacks all sources, one line to `log` for each. A file is in its place only once it is complete and has
/// its sum.
/// @return number of files
/// @throws FNEBadFormat for a sum that differs or is missing, or a listed file without a source; FNEIOError
/// for failures of the file system and damaged sources. All name the path.
std::size_t build(const std::filesystem::path& models, const std::filesystem::path& etc, std::ostream& log);

} // namespace Orbek::Models
