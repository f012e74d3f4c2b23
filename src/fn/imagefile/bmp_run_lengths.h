#pragma once

#include "fn/imagefile/bmp.h"

namespace Fn {

/// Reads the pixels of a bitmap in the codings RLE4 and RLE8, and makes it an uncompressed one of 8 bits with
/// the same colour table. Pixels that the runs leave out have the index 0; what they put outside is dropped.
/// @throws FNEIOError if the stream ends before the picture does; FNEBadArg for another number of bits than
/// the coding's
void expandRunLengths(std::istream& stream, Bitmap& bitmap);

} // namespace Fn
