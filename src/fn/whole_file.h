#pragma once

#include <functional>
#include <iosfwd>
#include <string>

namespace Fn {

/// Writes a file that appears whole or not at all: a reader finds either what was there before or all of the
/// new content, also when the disk is full or the program ends halfway.
///
///     Fn::writeWholeFile("copy.jpg", [&](std::ostream& stream) { Fn::writeJpeg(image, stream, 90); });
///
/// The content goes to a hidden file in the same folder, which then takes the name; it is removed if that
/// fails. A file that is there already keeps its permissions. A link stays one, and the file that it leads to
/// is written. What is no regular file (/dev/stdout, a pipe) is written to directly.
/// @param write puts the content into the stream. What it throws passes on, with the name of the file in
/// front if it is the stream that failed
/// @throws FNEIOError naming the file and the reason
void writeWholeFile(const std::string& fileName, const std::function<void(std::ostream&)>& write);

} // namespace Fn
