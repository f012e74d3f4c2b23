#pragma once

#include <iosfwd>

namespace Orbek::Tool {

/// How the stored rows and columns of a picture lie to the scene (tag 274 of TIFF 6.0, as Exif uses it).
enum class Orientation {
    Upright = 1,
    Mirrored = 2,
    HalfTurned = 3,
    UpsideDown = 4,    ///< mirrored top to bottom
    Transposed = 5,    ///< rows and columns exchanged
    TurnClockwise = 6, ///< upright after a quarter turn clockwise
    Transversed = 7,   ///< as Transposed, and half turned
    TurnCounterClockwise = 8,
};

/// Of a file that begins at the stream's position: in the first directory of a TIFF file (BigTIFF too), or in
/// the Exif block of a JPEG or PNG file. Upright for any other file, a damaged one, and one that does not
/// tell. Moves the stream, which must be able to seek for TIFF only.
Orientation orientationIn(std::istream& stream);

} // namespace Orbek::Tool
