#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_limits.h"
#include "fn/imagefile/properties_feedback.h"

#include <iosfwd>

/// TIFF files (TIFF 6.0), read with libtiff.

namespace Fn {

/// Attribute under which readTiff() keeps the tag ImageDescription.
inline constexpr const char* tiffDescriptionAttribute = "TIFF_IMAGEDESCRIPTION";

/// Whether the next two bytes, which stay in the stream, begin a TIFF file. @throws FNEIOError if the stream
/// is bad.
bool checkIfIsTiff(std::istream& stream);

/// Gray becomes mono8 or mono16, RGB with or without alpha bgra32 or rgb48. The rest of the stream is taken.
/// @param name of the stream, for messages
/// @param directory number of the image in the file, from 0
/// Rare variants are palettes, tiles, planes, inks and other numbers of bits, all of which become 8 bits.
/// @throws FNEBadFormat for what is not a TIFF file, a damaged one, or one of another kind
FNImageReference readTiff(std::istream& stream, const std::string& name, unsigned int directory,
                          const ReadImagePropertiesFeedback& feedback = {}, const ImageLimits& limits = {});
/// The first image of a file. @throws FNEIOError if the file is not there, cannot be opened or is no TIFF
/// file.
FNImageReference loadTiff(const std::string& fileName, const ReadImagePropertiesFeedback& feedback = {},
                          const ImageLimits& limits = {});

} // namespace Fn
