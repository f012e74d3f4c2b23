#pragma once

#include <filesystem>
#include <iosfwd>

/// From the compact sources of trained content to the files that the library reads.
///
/// A source `models/DIR/FILE.gz` unpacks to `etc/DIR/FILE`, one that ends in `.factors` is multiplied out
/// (b7_factors.h); a source without a suffix that is known here is
/// copied. `models/SHA256SUMS` lists the sum of each unpacked file in the format of sha256sum, with its path
/// below etc. Markdown is no source.

namespace Orbek::Models {

/// Unpacks all sources, one line to `log` for each. A file is in its place only once it is complete and has
/// its sum.
/// @return number of files
/// @throws FNEBadFormat for a sum that differs or is missing, or a listed file without a source; FNEIOError
/// for failures of the file system and damaged sources. All name the path.
std::size_t build(const std::filesystem::path& models, const std::filesystem::path& etc, std::ostream& log);

} // namespace Orbek::Models
