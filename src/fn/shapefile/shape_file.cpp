#include "fn/shapefile/shape_file.h"

#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/image_file.h"
#include "fn/shapefile/echo.h"
#include "fn/shapefile/frgc.h"
#include "fn/shapefile/texture_file.h"
#include "fn/shapefile/vialux.h"

namespace Fn {

ShapeFormat shapeFormatOf(std::istream& stream, const std::string& name, const char* caller) {
    constexpr std::size_t longestFirstLine = 512;
    if (!stream) FN_THROW(FNEIOError, caller + (": can not read " + name));
    const std::string bytes = peekBytes(stream, longestFirstLine, caller);
    if (bytes.empty()) FN_THROW(FNEIOError, std::string(caller) + ": premature eof condition");
    const std::string line = bytes.substr(0, bytes.find('\n'));
    const auto begins = [&](const char* text) { return line.rfind(text, 0) == 0; };
    if (begins(viaLuxHeaderLine)) return ShapeFormat::ViaLux;
    if (begins("Cyberware")) return ShapeFormat::Echo;
    if (line.find("rows") != std::string::npos) return ShapeFormat::Frgc;
    if (begins("#VRML V2.0")) return ShapeFormat::Vrml;
    return ShapeFormat::Unknown;
}

VertexImage readShapeImage(std::istream& stream, const std::string& name, FNImageReference* texture,
                           bool textureRequired, const ImageLimits& limits) {
    const auto read = [&] {
        switch (shapeFormatOf(stream, name, "readShapeImage")) {
        case ShapeFormat::ViaLux:
            return readViaLuxFile(stream, limits);
        case ShapeFormat::Echo:
            return readEchoFile(stream, limits);
        case ShapeFormat::Frgc:
            return readFRGC(stream, limits);
        default:
            FN_THROW(FNEBadArg, "Unknown vertex image format in " + name);
        }
    };
    const VertexImage image = read();
    const Optional<std::string> textureName = textureBeside(name);
    if (textureRequired && !textureName.isSet()) FN_THROW(FNEBadArg, "Cannot find texture file for " + name);
    if (texture && textureName.isSet()) *texture = readImage(*textureName, {}, limits);
    return image;
}

VertexImage readShapeImage(const std::string& fileName, FNImageReference* texture, bool textureRequired,
                           const ImageLimits& limits) {
    std::ifstream file = openForReading(fileName, "readShapeImage: can not read ");
    return readShapeImage(file, fileName, texture, textureRequired, limits);
}

void writeShapeImage(const VertexImage& image, const std::string& fileName) {
    std::ofstream file(fileName, std::ios::binary);
    if (!file) FN_THROW(FNEIOError, "writeShapeImage: can not open " + fileName + " for writing");
    writeFRGC(image, file);
}

} // namespace Fn
