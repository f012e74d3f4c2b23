#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/tiff.h"
#include "fn/shapefile/scan_text.h"
#include "shapeimg/scanfile/scan_file.h"

#include <algorithm>
#include <array>
#include <sstream>

namespace ShapeImage {

namespace {

constexpr const char* calibrationMark = "IntCalib";

/// A pinhole camera, and what a range value says about the distance along its axis.
struct Calibration {
    double fx, fy;        ///< focal lengths, pixels
    double cx, cy;        ///< where the axis meets the image, pixels
    double scale, offset; ///< distance = offset + scale * value, millimetres
};

/// The numbers behind the mark, up to the end of the line.
Calibration readCalibration(const FNImageAttributes& attributes) {
    const auto description = attributes.find(Fn::tiffDescriptionAttribute);
    if (description == attributes.end()) FN_THROW(FNEBadArg, "No image description found in TIFF image");
    const auto mark = description->second.find(calibrationMark);
    if (mark == std::string::npos) FN_THROW(FNEBadArg, "Cannot find calibration data");
    std::string line = description->second.substr(mark + std::string(calibrationMark).size());
    line = line.substr(0, line.find_first_of("\r\n"));
    for (char& c : line)
        if (c == '=' || c == ':' || c == ',' || c == ';') c = ' ';

    std::array<double, 6> items{};
    std::size_t n = 0;
    std::istringstream words(line);
    for (std::string word; words >> word; ++n)
        if (n >= items.size() || !Fn::parseNumber(word, items[n])) FN_THROW(FNEBadArg, "Item count mismatch");
    if (n != items.size()) FN_THROW(FNEBadArg, "Item count mismatch");
    const Calibration result{items[0], items[1], items[2], items[3], items[4], items[5]};
    if (result.fx == 0 || result.fy == 0) FN_THROW(FNEBadArg, "Cannot find calibration data");
    return result;
}

FNImage<unsigned short> readRanges(const FNRMem<unsigned char>& file, const std::string& name,
                                   const Fn::ImageLimits& limits) {
    const auto refuse = [&] { FN_THROW(FNEBadArg, "No range data found in " + name); };
    Fn::MemoryStream stream(file);
    try {
        const FNImageReference ranges = Fn::readTiff(stream, name, 1, {}, limits);
        if (ranges.native() != FNImageReference::MONO16) refuse();
        return ranges.toMono16();
    } catch (const FNEBadFormat&) {
        refuse();
    }
    return {};
}

/// The camera looks along -z, so that the face is seen from +z; y points up. A value of 0 is no point.
Fn::VertexImage pointsOf(const FNImage<unsigned short>& ranges, const Calibration& camera) {
    Fn::VertexImage image(ranges.w(), ranges.h());
    for (std::uint32_t y = 0; y < ranges.h(); ++y)
        for (std::uint32_t x = 0; x < ranges.w(); ++x) {
            if (ranges(x, y) == 0) continue;
            const double distance = camera.offset + camera.scale * ranges(x, y);
            image.setVertex({static_cast<std::int32_t>(x), static_cast<std::int32_t>(y)},
                            {(x + 0.5 - camera.cx) * distance / camera.fx,
                             (camera.cy - (y + 0.5)) * distance / camera.fy, -distance});
        }
    return image;
}

} // namespace

TexturedPointSet readIGDScan(std::istream& stream, bool removeOutliers, const std::string& name,
                             const Fn::ImageLimits& limits) {
    const FNRMem<unsigned char> file = Fn::readRest(stream, limits.maxBytes, "ShapeImage::readIGDScan");
    Fn::MemoryStream first(file);
    const FNImageReference texture = Fn::readTiff(first, name, 0, {}, limits);
    const Calibration camera = readCalibration(texture.attributes());
    return TexturedPointSet(pointsOf(readRanges(file, name, limits), camera), texture, removeOutliers);
}

TexturedPointSet readIGDScan(const std::string& fileName, bool removeOutliers,
                             const Fn::ImageLimits& limits) {
    std::ifstream file = Fn::openForReading(fileName);
    return readIGDScan(file, removeOutliers, fileName, limits);
}

} // namespace ShapeImage
