#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/image_file.h"
#include "fn/shapefile/scan_text.h"
#include "fn/shapefile/texture_file.h"
#include "shapeimg/scanfile/mesh.h"
#include "shapeimg/scanfile/scan_file.h"

#include <map>
#include <sstream>

namespace ShapeImage {

namespace {

constexpr const char* damaged = "Format error in OBJ file";

/// What stands behind the first word of a line.
std::string restOf(std::istringstream& line) {
    std::string rest;
    std::getline(line >> std::ws, rest);
    return rest.substr(0, rest.find_last_not_of(" \t") + 1);
}

/// Pictures of the materials of a library, by name, and the first of them.
struct Materials {
    std::map<std::string, std::string> pictures;
    std::string first;

    void read(const std::string& fileName) {
        std::ifstream file = Fn::openForReading(fileName);
        Fn::ScanText text(file);
        std::string line, material;
        while (text.line(line)) {
            std::istringstream words(line);
            std::string key;
            words >> key;
            if (key == "newmtl") material = restOf(words);
            if (key != "map_Kd" && key != "map_kd") continue;
            std::string picture = restOf(words);
            // Options stand before the name.
            if (!picture.empty() && picture[0] == '-')
                picture = picture.substr(picture.find_last_of(" \t") + 1);
            pictures.emplace(material, picture);
            if (first.empty()) first = picture;
        }
    }
};

class ObjReader {
public:
    ObjReader(std::istream& stream, const std::string& name) : text_(stream), name_(name) {}

    Mesh read() {
        std::string line;
        while (text_.line(line)) readLine(line);
        return mesh_;
    }

    /// The picture of the first material in use that has one, or else of the first that has one, or else what
    /// lies beside the scan.
    std::string textureName() const {
        Materials materials;
        if (!library_.empty())
            if (const auto file = Fn::fileReferredTo(name_, library_); file.isSet()) materials.read(*file);
        const auto used = materials.pictures.find(material_);
        const std::string picture = used == materials.pictures.end() ? materials.first : used->second;
        const auto referred = Fn::fileReferredTo(name_, picture);
        const auto found = referred.isSet() ? referred : Fn::textureBeside(name_);
        if (!found.isSet()) FN_THROW(FNEBadArg, "No texture file available");
        return *found;
    }

private:
    void readLine(const std::string& line) {
        std::istringstream words(line);
        std::string key;
        words >> key;
        if (key == "mtllib" && library_.empty()) library_ = restOf(words);
        if (key == "usemtl" && material_.empty()) material_ = restOf(words);
        if (key != "v" && key != "vt" && key != "f") return;
        Fn::ScanText rest(words);
        if (key == "v") {
            FN3Vector<double>& v = mesh_.vertices.emplace_back();
            for (int axis = 0; axis < 3; ++axis) v[axis] = rest.number(damaged);
        } else if (key == "vt") {
            FN2Vector<double>& t = mesh_.textureCoordinates.emplace_back();
            t.x = rest.number(damaged);
            t.y = rest.number(damaged);
        } else {
            std::string corner;
            while (rest.word(corner)) addCorner(corner);
        }
    }

    /// "v", "v/vt", "v//vn" or "v/vt/vn"; numbers count from 1, or backwards from -1. Only those with texture
    /// coordinates are of use.
    void addCorner(const std::string& corner) {
        const auto slash = corner.find('/');
        if (slash == std::string::npos) return;
        const auto end = std::min(corner.find('/', slash + 1), corner.size());
        if (end == slash + 1) return;
        mesh_.corners.push_back(
            {numberOf(corner.substr(0, slash), mesh_.vertices.size()),
             numberOf(corner.substr(slash + 1, end - slash - 1), mesh_.textureCoordinates.size())});
    }
    static std::int32_t numberOf(const std::string& text, std::size_t n) {
        std::int64_t number = 0;
        if (!Fn::parseNumber(text, number)) FN_THROW(FNEBadArg, damaged);
        if (number < 0) number += static_cast<std::int64_t>(n) + 1;
        if (number <= 0 || number > std::numeric_limits<std::int32_t>::max()) FN_THROW(FNEBadArg, damaged);
        return static_cast<std::int32_t>(number - 1);
    }

    Fn::ScanText text_;
    std::string name_, library_, material_;
    Mesh mesh_;
};

} // namespace

TexturedPointSet readOBJFile(std::istream& stream, bool removeOutliers, const std::string& name,
                             const Fn::ImageLimits& limits) {
    using Set = TexturedPointSet;
    if (!stream) FN_THROW(FNEIOError, "readOBJFile: can not read " + name);
    ObjReader reader(stream, name);
    const Mesh mesh = reader.read();
    const FNImageReference texture = Fn::readImage(reader.textureName(), {}, limits);
    const PointSet points(mesh.vertices, PointSet::defaultNeighbourhoodSize, removeOutliers);
    if (mesh.textureCoordinates.empty()) {
        // Vertices without coordinates are those of a grid.
        if (mesh.vertices.size() != std::uint64_t{texture.w()} * texture.h())
            FN_THROW(FNEBadArg, "Size of vertex and texture image do not match");
        return Set(points, texture,
                   FNCountedPtr<Set::Texture2VertexMapper>(
                       new Set::GridAlignedTextureMapper(texture.w(), texture.h())));
    }
    if (mesh.textureCoordinates.size() != mesh.vertices.size())
        FN_THROW(FNEBadArg, "Number of vertices and texture coordinates do not match");
    std::vector<Set::CoordinateTextureMapper::Coordinate> coordinates;
    appendCoordinates(mesh, texture.w(), texture.h(), 0, 0, coordinates);
    return Set(points, texture,
               FNCountedPtr<Set::Texture2VertexMapper>(
                   new Set::CoordinateTextureMapper(coordinates, texture.w(), texture.h())));
}

} // namespace ShapeImage
