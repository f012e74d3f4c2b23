#pragma once

#include "fn/imagefile/image_limits.h"
#include "fn/vertex_image.h"

#include <iosfwd>

namespace Fn {

/// How a ViaLux table begins.
inline constexpr const char* viaLuxHeaderLine = "i\tj\tz\tx\ty";

/// Reads a table of points: the line "i j z x y" with tabs between, and for each point a row with its column
/// i and row j of the grid, counted from 0, and z, x and y. Further words of a row are passed over; positions
/// without a row are not valid. @throws FNEBadArg for a damaged table or one whose points are too far apart
/// for a grid; FNEBadFormat for one that exceeds the limits.
VertexImage readViaLuxFile(std::istream& stream, const ImageLimits& limits = {});

} // namespace Fn
