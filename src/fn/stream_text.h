#pragma once

#include <iosfwd>
#include <string>

namespace Fn::Stream {

/// Whether `text` stands at the present position of the stream. If so it is read; if not, nothing is.
bool contains(std::istream& stream, const std::string& text);

} // namespace Fn::Stream
