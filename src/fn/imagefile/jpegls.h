#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_limits.h"
#include "fn/imagefile/properties_feedback.h"

#include <iosfwd>

/// JPEG-LS images (ISO/IEC 14495-1), read and written with CharLS. Fn::readImage() does not look for them.

namespace Fn {

/// Whether the next bytes, which stay in the stream, begin a JPEG-LS image. @throws FNEBadFormat if the
/// stream is bad.
bool checkIfIsJpegLS(std::istream& stream);

/// One component becomes mono8 or, above 8 bits, mono16; three or four become bgra32 or, above 8 bits, rgb48.
/// Samples of other than 8 or 16 bits are stretched to the full range. The rest of the stream is taken.
/// @throws FNEBadFormat for what is not a whole JPEG-LS image.
FNImageReference readJpegLS(std::istream& stream, const ReadImagePropertiesFeedback& feedback = {},
                            const ImageLimits& limits = {});
FNImageReference readJpegLS(const char* data, unsigned long size,
                            const ReadImagePropertiesFeedback& feedback = {}, const ImageLimits& limits = {});

/// Writes without loss, but for alpha and the float form (written with 16 bits).
/// @throws FNESysError if CharLS refuses the image (it has no pixels).
FNRMem<unsigned char> writeJpegLS(const FNImageReference& image);
/// @throws FNEIOError if the stream does not take the bytes.
void writeJpegLS(const FNImageReference& image, std::ostream& stream);

} // namespace Fn
