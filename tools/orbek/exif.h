#pragma once

#include <iosfwd>
#include <span>

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

/// Of a TIFF structure as it lies in an Exif block; Upright for a damaged one or one that does not tell.
Orientation orientationInTiff(std::span<const unsigned char> tiff);

/// Of a file that begins at the stream's position; Upright if it is no JPEG file with an Exif block. Moves
/// the stream.
Orientation orientationInJpeg(std::istream& stream);

} // namespace Orbek::Tool
