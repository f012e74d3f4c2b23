#pragma once

#include "fn/imagefile/image_limits.h"
#include "fn/vertex_image.h"

#include <iosfwd>

/// Range tables in cylindrical coordinates ("Cyberware" echo files).
///
/// A text header of lines "key=value" ends with a line that begins "DATA="; behind it stands the table, row
/// by row: `nlg` rows of `nlt` values of 16 bits, signed, most significant byte first.

namespace Fn {

/// The keys of the header, in lower case.
struct EchoHeader {
    std::int64_t nlg = 0; ///< rows of the table
    std::int64_t nlt = 0; ///< columns
    std::int64_t lgmin = 0, lgmax = 0;
    std::int64_t lgincr = 0; ///< height between rows, micrometres
    std::int64_t ltmin = 0, ltmax = 0;
    std::int64_t ltincr = 0; ///< angle between columns, microradians
    std::int64_t rshift = 0; ///< bits by which values are shifted left to give a radius in micrometres
};

/// Reads up to the line end behind "DATA=". @throws FNEBadArg
EchoHeader readEchoHeader(std::istream& stream);

/// Position (column, row) holds the point (radius * sin(angle), height, radius * cos(angle)); a value of 0 or
/// below stands for no point. @throws FNEBadArg for a damaged file; FNEBadFormat for one that exceeds the
/// limits.
VertexImage readEchoFile(std::istream& stream, const ImageLimits& limits = {});

} // namespace Fn
