#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_limits.h"
#include "fn/imagefile/properties_feedback.h"

#include <iosfwd>

/// PNG files (ISO/IEC 15948), read and written with libpng.

namespace Fn {

/// Whether the next bytes, which stay in the stream, begin a PNG file. @throws FNEIOError if the stream is
/// bad.
bool checkIfIsPng(std::istream& stream);

/// Gray becomes mono8 or, with 16 bits, mono16. Colour, palettes and gray with alpha become bgra32 or, with
/// 16 bits, rgb48 without alpha. Leaves the stream behind the image.
/// @throws FNESysError for what is not a whole PNG file.
FNImageReference readPng(std::istream& stream, const ReadImagePropertiesFeedback& feedback = {},
                         const ImageLimits& limits = {});
FNImageReference readPng(const char* data, unsigned long size,
                         const ReadImagePropertiesFeedback& feedback = {}, const ImageLimits& limits = {});
/// @throws FNEIOError if the file cannot be opened.
FNImageReference readPng(const std::string& fileName, const ReadImagePropertiesFeedback& feedback = {},
                         const ImageLimits& limits = {});

/// Writes gray of 8 or 16 bits, RGB of 16 bits, or RGB with alpha of 8 bits.
/// @param level of compression: 0 (none) to 9 (best), more counts as 9, negative stands for zlib's default
/// @throws FNESysError if the image has no pixels or the stream fails.
void writePng(const FNImageReference& image, std::ostream& stream, int level);
void writePng(const FNImage<unsigned char>& image, std::ostream& stream, int level);
void writePng(const FNImage<unsigned short>& image, std::ostream& stream, int level);
void writePng(const FNImage<float>& image, std::ostream& stream, int level);
void writePng(const FNImage<Bgra32>& image, std::ostream& stream, int level);
void writePng(const FNImage<Rgb48>& image, std::ostream& stream, int level);

} // namespace Fn
