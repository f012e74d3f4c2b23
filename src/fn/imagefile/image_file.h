#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_compressor.h"
#include "fn/imagefile/image_limits.h"
#include "fn/imagefile/properties_feedback.h"

#include <iosfwd>
#include <string>

/// Reading an image of whatever format, and writing one.

namespace Fn {

/// Reads JPEG, PNG, JPEG 2000, TIFF, PGM, PPM and BMP, told apart by their first bytes; the file form also
/// looks into a gzip file. With limits.rareVariants also PBM and what else each reader's header tells.
/// @throws FNEBadArg if the bytes are of no known format; FNEIOError if the file or stream cannot be read;
/// what the format's reader throws.
FNImageReference readImage(const std::string& fileName, const ReadImagePropertiesFeedback& feedback = {},
                           const ImageLimits& limits = {});
FNImageReference readImage(std::istream& stream, const ReadImagePropertiesFeedback& feedback = {},
                           const ImageLimits& limits = {});
FNImageReference readImage(const char* data, unsigned long size,
                           const ReadImagePropertiesFeedback& feedback = {}, const ImageLimits& limits = {});

/// Lossless mode writes a PPM file for colour and a PGM file otherwise, of 8 bits, with the attributes; the
/// other modes write a JPEG file.
void writeImage(const FNImageReference& image, const std::string& fileName, FNImageCompressor::Mode mode);

} // namespace Fn
