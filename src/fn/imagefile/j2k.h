#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_limits.h"
#include "fn/imagefile/properties_feedback.h"

#include <iosfwd>
#include <vector>

/// JPEG 2000 images (ISO/IEC 15444-1), as JP2 files or bare code streams, read and written with OpenJPEG.

namespace Fn {

/// Whether the next bytes, which stay in the stream, begin a JPEG 2000 image.
/// @throws FNEIOError if the stream is bad or the file cannot be opened.
bool checkIfIsJ2k(std::istream& stream);
bool checkIfIsJ2k(const std::string& fileName);
bool checkIfIsJ2k(const char* data, unsigned long size);

/// The names of the formats: "jp2" (file) and "jpc" (code stream).
std::vector<std::string> j2kFormats();

/// Gray becomes mono8 or, above 8 bits, mono16; RGB and YCbCr become bgra32 or, above 8 bits in a component,
/// rgb48. Samples of other than 8 or 16 bits are stretched to the full range. The rest of the stream is
/// taken.
/// @throws FNEBadFormat for what is not a JPEG 2000 image or not of these kinds.
FNImageReference readJ2k(std::istream& stream, const ReadImagePropertiesFeedback& feedback = {},
                         const ImageLimits& limits = {});
/// @throws FNEIOError if the file cannot be opened.
FNImageReference loadJ2k(const std::string& fileName, const ReadImagePropertiesFeedback& feedback = {},
                         const ImageLimits& limits = {});
FNImageReference loadJ2k(const char* data, unsigned long size,
                         const ReadImagePropertiesFeedback& feedback = {}, const ImageLimits& limits = {});

/// Writes without loss, but for alpha and the float form (written with 16 bits).
/// @param formatName one of j2kFormats()
/// @throws FNEBadArg for another name; FNESysError if the encoder fails; FNEIOError if the target does.
void writeJ2k(const FNImageReference& image, const std::string& formatName, std::ostream& target);
void writeJ2k(const FNImageReference& image, const std::string& formatName, const std::string& fileName);

/// Reads a JPEG 2000 file and writes it in the format that is named by the ending of `outFile`.
void readWriteJ2k(const std::string& inFile, const std::string& outFile);

} // namespace Fn
