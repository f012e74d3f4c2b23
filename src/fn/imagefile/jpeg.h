#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_compressor.h"
#include "fn/serialize.h"

/// JPEG files (ITU-T T.81), read and written with libjpeg.

namespace Fn {

/// Whether the next two bytes, which stay in the stream, begin a JPEG file. @throws FNEIOError if the stream
/// is bad.
bool checkIfIsJpeg(std::istream& stream);

/// A gray file becomes mono8, a colour file bgra32. Damage that the decoder can bridge gives an image with a
/// warning. Four components (CMYK, YCCK) are a rare variant.
/// @throws FNEBadArg if the stream does not begin with a JPEG image, or for a file that cannot be decoded, or
/// is of another number of components.
/// @param name of the stream in warnings; empty if it has none
FNImageReference readJpeg(std::istream& stream, const ReadImagePropertiesFeedback& feedback = {},
                          const ImageLimits& limits = {}, const std::string& name = {});
FNImageReference readJpeg(const char* data, unsigned long size,
                          const ReadImagePropertiesFeedback& feedback = {}, const ImageLimits& limits = {});
/// @throws FNEIOError if the file cannot be opened.
FNImageReference loadJpeg(const std::string& fileName, const ReadImagePropertiesFeedback& feedback = {},
                          const ImageLimits& limits = {});

/// A colour image becomes a file of three components, another one a gray file.
/// @param quality 1 to 100
/// @throws FNEBadArg for another quality; FNEIOError if the stream does not take the bytes.
FNRMem<unsigned char> writeJpeg(const FNImageReference& image, int quality);
void writeJpeg(const FNImageReference& image, std::ostream& stream, int quality);
void saveJpeg(const FNImageReference& image, const std::string& fileName, FNImageCompressor::Mode mode);

/// A JPEG file of limited size.
struct SizedJpeg {
    FNRMem<unsigned char> bytes;
    int quality;
};

/// The first of the qualities 100, 95, ..., 5 at which the file is no larger than `maxBytes`.
/// @throws FNEGeneric if there is none.
SizedJpeg writeJpegWithSizeConstraint(const FNImageReference& image, int maxBytes);
/// @return size in bytes and quality
FNPair<unsigned int, int> writeJpegWithSizeConstraint(const FNImageReference& image, std::ostream& stream,
                                                      int maxBytes);

} // namespace Fn
