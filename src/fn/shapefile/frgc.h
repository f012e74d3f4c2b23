#pragma once

#include "fn/imagefile/image_limits.h"
#include "fn/vertex_image.h"

#include <iosfwd>
#include <string>

/// The text form of vertex images: "<n> rows", "<n> columns", "pixels (flag X Y Z):", and then a line each of
/// all flags (1 for a valid position), x, y and z, row by row.

namespace Fn {

/// @throws FNEBadArg for a damaged text; FNEBadFormat for one that exceeds the limits.
VertexImage readFRGC(std::istream& stream, const ImageLimits& limits = {});
/// @throws FNEIOError if the file cannot be opened.
VertexImage readFRGC(const std::string& fileName, const ImageLimits& limits = {});

/// Coordinates have 12 significant digits; normals and attributes are not written.
/// @throws FNEIOError if the stream does not take all.
void writeFRGC(const VertexImage& image, std::ostream& stream);

} // namespace Fn
