#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_limits.h"
#include "fn/imagefile/properties_feedback.h"

#include <iosfwd>
#include <string>

/// Portable anymaps: PGM (gray, "P5") and PPM (colour, "P6") of 8 or 16 bits. Attributes travel in comment
/// lines that begin with "# cache:", see attribute_text.h. Rare variants are PBM (black and white, "P4") and
/// the plain forms of all three, with numbers as text ("P1" to "P3").

namespace Fn {

/// Whether the next two bytes, which stay in the stream, begin such a file. @throws FNEIOError if the stream
/// is bad.
bool checkIfIsPbm(std::istream& stream);
/// Whether these two bytes begin one of the rare variants.
bool isRarePbm(const std::string& start);

/// Gray, black and white become mono8 or, for a greatest value above 255, mono16; colour bgra32 or rgb48.
/// Samples are stretched to the full range. Leaves the stream behind the image.
/// @throws FNEIOError if the stream ends too early or the attributes are damaged; FNEBadFormat for a wrong
/// header.
FNImageReference readPbm(std::istream& stream, const ReadImagePropertiesFeedback& feedback = {},
                         const ImageLimits& limits = {});
/// As readPbm(), for gray or colour files only.
FNImageReference readPgm(std::istream& stream, const ReadImagePropertiesFeedback& feedback = {},
                         const ImageLimits& limits = {});
FNImageReference readPpm(std::istream& stream, const ReadImagePropertiesFeedback& feedback = {},
                         const ImageLimits& limits = {});

/// Writes the part of the image inside `box`, with its attributes: colour as PPM and the rest as PGM, with 16
/// bits if the stored pixels have more than 8.
/// @throws FNEIOError if nothing of the image lies in the box, or the target fails.
void writePbm(const FNImageReference& image, std::ostream& target, const FNBox& box);
void writePbm(const FNImageReference& image, const std::string& fileName, const FNBox& box);
/// The whole image, gray or colour of 8 bits whatever is stored.
void writePgm(const FNImageReference& image, std::ostream& target);
void writePpm(const FNImageReference& image, std::ostream& target);

} // namespace Fn
