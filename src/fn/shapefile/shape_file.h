#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_limits.h"
#include "fn/vertex_image.h"

#include <iosfwd>
#include <string>

/// Reading and writing of vertex images. docs/scan_formats.md tells the forms of the files.

namespace Fn {

enum class ShapeFormat { ViaLux, Echo, Frgc, Vrml, Unknown };

/// Tells the format by the first line, which stays in the stream. @throws FNEIOError with the texts
/// "<caller>: can not read <name>" if the stream is bad, "<caller>: premature eof condition" if it is at its
/// end.
ShapeFormat shapeFormatOf(std::istream& stream, const std::string& name, const char* caller);

/// Reads a ViaLux table, a Cyberware echo file or an FRGC text, told apart by the first line.
/// @param name of the stream: for messages, and for the texture, which lies beside the scan under its name
/// with the ending of a picture
/// @param texture where the texture is put if there is one; it stays as it is if not
/// @param textureRequired whether a texture that is not there is a failure
/// @throws FNEBadArg for another format, a damaged file, or a missing texture; FNEIOError if the file cannot
/// be read; what Fn::readImage() throws for the texture.
VertexImage readShapeImage(std::istream& stream, const std::string& name = "stream",
                           FNImageReference* texture = nullptr, bool textureRequired = false,
                           const ImageLimits& limits = {});
VertexImage readShapeImage(const std::string& fileName, FNImageReference* texture = nullptr,
                           bool textureRequired = false, const ImageLimits& limits = {});

/// Writes FRGC text. @throws FNEIOError
void writeShapeImage(const VertexImage& image, const std::string& fileName);

} // namespace Fn
