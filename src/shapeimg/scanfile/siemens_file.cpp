#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/image_file.h"
#include "fn/shapefile/texture_file.h"
#include "shapeimg/scanfile/mesh.h"
#include "shapeimg/scanfile/scan_file.h"

#include <bit>

namespace ShapeImage {

namespace {

/// x, y, z, and possibly u and v; whatever else a vector holds is passed over.
constexpr std::uint32_t leastElements = 3, elementsWithTexture = 5, mostElements = 64;

std::uint32_t littleEndian(const unsigned char* bytes) {
    return bytes[0] | bytes[1] << 8 | bytes[2] << 16 | static_cast<std::uint32_t>(bytes[3]) << 24;
}
double realOf(const unsigned char* bytes) {
    return static_cast<double>(std::bit_cast<float>(littleEndian(bytes)));
}

void readBytes(std::istream& stream, std::vector<unsigned char>& bytes) {
    if (!stream.read(reinterpret_cast<char*>(bytes.data()), static_cast<std::streamsize>(bytes.size())))
        FN_THROW(FNEBadArg, "Premature EOF in Siemens 3D data input stream");
}

struct SiemensGrid {
    std::uint32_t width, height, elements;
    Mesh mesh; ///< one vertex for each position; texture coordinates if the vectors hold them
    std::vector<bool> valid;
};

SiemensGrid readGrid(std::istream& stream, const Fn::ImageLimits& limits) {
    constexpr std::size_t wordSize = 4, headWords = 3;
    std::vector<unsigned char> bytes(headWords * wordSize);
    readBytes(stream, bytes);
    SiemensGrid grid{
        littleEndian(bytes.data()), littleEndian(bytes.data() + 4), littleEndian(bytes.data() + 8), {}, {}};
    if (grid.elements < leastElements)
        FN_THROW(FNEBadArg, "Number of elements per vector (" + std::to_string(grid.elements) +
                                ") too small (3 expected)");
    if (grid.elements > mostElements)
        FN_THROW(FNEBadArg,
                 "Number of elements per vector (" + std::to_string(grid.elements) + ") too large");
    limits.check(grid.width, grid.height, sizeof(FN3Vector<double>) + sizeof(FN2Vector<double>),
                 "ShapeImage::readSiemensData");

    const bool withTexture = grid.elements >= elementsWithTexture;
    bytes.resize(std::size_t{grid.width} * grid.elements * wordSize);
    for (std::uint32_t y = 0; y < grid.height; ++y) {
        readBytes(stream, bytes);
        for (std::uint32_t x = 0; x < grid.width; ++x) {
            const unsigned char* const vector = bytes.data() + std::size_t{x} * grid.elements * wordSize;
            const auto element = [&](std::size_t i) { return realOf(vector + i * wordSize); };
            const FN3Vector<double> v{element(0), element(1), element(2)};
            grid.mesh.vertices.push_back(v);
            grid.valid.push_back(v != FN3Vector<double>() && std::isfinite(dot(v, v)));
            if (withTexture) grid.mesh.textureCoordinates.emplace_back(element(3), element(4));
        }
    }
    return grid;
}

} // namespace

TexturedPointSet readSiemensData(std::istream& stream, bool removeOutliers, const std::string& name,
                                 const Fn::ImageLimits& limits) {
    using Set = TexturedPointSet;
    SiemensGrid grid = readGrid(stream, limits);
    const auto textureName = Fn::textureBeside(name, "bmp");
    if (!textureName.isSet()) FN_THROW(FNEBadArg, "Cannot find texture file for " + name);
    const FNImageReference texture = Fn::readImage(*textureName, {}, limits);

    FNRMem<bool> mask(grid.valid.size());
    std::copy(grid.valid.begin(), grid.valid.end(), mask.getExclusive());
    if (grid.elements < elementsWithTexture && (texture.w() != grid.width || texture.h() != grid.height))
        FN_THROW(FNEBadArg, "Size of vertex and texture image do not match");
    const PointSet points(grid.mesh.vertices, mask, PointSet::defaultNeighbourhoodSize, removeOutliers);
    if (grid.elements < elementsWithTexture)
        return Set(points, texture,
                   FNCountedPtr<Set::Texture2VertexMapper>(
                       new Set::GridAlignedTextureMapper(grid.width, grid.height)));
    for (std::int32_t i = 0; i < static_cast<std::int32_t>(grid.valid.size()); ++i)
        if (grid.valid[static_cast<std::size_t>(i)]) grid.mesh.corners.push_back({i, i});
    std::vector<Set::CoordinateTextureMapper::Coordinate> coordinates;
    if (!grid.mesh.corners.empty()) appendCoordinates(grid.mesh, texture.w(), texture.h(), 0, 0, coordinates);
    return Set(points, texture,
               FNCountedPtr<Set::Texture2VertexMapper>(
                   new Set::CoordinateTextureMapper(coordinates, texture.w(), texture.h())));
}

TexturedPointSet readSiemensData(const std::string& fileName, bool removeOutliers,
                                 const Fn::ImageLimits& limits) {
    std::ifstream file = Fn::openForReading(fileName);
    return readSiemensData(file, removeOutliers, fileName, limits);
}

} // namespace ShapeImage
