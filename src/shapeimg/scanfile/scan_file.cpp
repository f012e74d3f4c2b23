#include "shapeimg/scanfile/scan_file.h"

#include "fn/imagefile/byte_stream.h"
#include "fn/shapefile/shape_file.h"

#include <algorithm>

namespace ShapeImage {

namespace {

/// Whether a name ends in a text of small letters, whatever the name's are.
bool endsIn(const std::string& name, const std::string& ending) {
    const auto same = [](char a, char b) { return (a >= 'A' && a <= 'Z' ? a - 'A' + 'a' : a) == b; };
    return name.size() >= ending.size() && std::equal(ending.rbegin(), ending.rend(), name.rbegin(),
                                                      [&](char e, char n) { return same(n, e); });
}

TexturedPointSet readGrid(std::istream& stream, bool removeOutliers, const std::string& name,
                          const Fn::ImageLimits& limits) {
    FNImageReference texture = FNImageReferenceFactory::create(FNImage<unsigned char>());
    const Fn::VertexImage image = Fn::readShapeImage(stream, name, &texture, false, limits);
    if (texture.w() == 0) {
        FNImage<unsigned char> black(image.w(), image.h());
        black.fill(0);
        texture = FNImageReferenceFactory::create(black);
    }
    return TexturedPointSet(image, texture, removeOutliers);
}

} // namespace

TexturedPointSet readTexturedPointSet(std::istream& stream, bool removeOutliers, const std::string& name,
                                      const Fn::ImageLimits& limits) {
    if (endsIn(name, "tif")) return readIGDScan(name, removeOutliers, limits);
    if (endsIn(name, "obj")) return readOBJFile(stream, removeOutliers, name, limits);
    if (endsIn(name, ".3d")) return readSiemensData(name, removeOutliers, limits);
    switch (Fn::shapeFormatOf(stream, name, "readTexturedPointSet")) {
    case Fn::ShapeFormat::Vrml:
        return readVRMLFile(stream, removeOutliers, name, limits);
    case Fn::ShapeFormat::Unknown:
        FN_THROW(FNEBadArg, "Unknown vertex image format in " + name);
    default:
        return readGrid(stream, removeOutliers, name, limits);
    }
}

TexturedPointSet readTexturedPointSet(const std::string& fileName, bool removeOutliers,
                                      const Fn::ImageLimits& limits) {
    std::ifstream file = Fn::openForReading(fileName, "readTexturedPointSet: can not read ");
    TexturedPointSet result = readTexturedPointSet(file, removeOutliers, fileName, limits);
    if (result.points().empty()) FN_THROW(FNEBadArg, "Empty Pointset found in: " + fileName);
    return result;
}

} // namespace ShapeImage
