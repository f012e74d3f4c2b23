#include "shapeimg/scanfile/mesh.h"

#include <algorithm>

namespace ShapeImage {

void appendCoordinates(const Mesh& mesh, std::uint32_t width, std::uint32_t height, std::uint32_t top,
                       std::int32_t firstVertex,
                       std::vector<TexturedPointSet::CoordinateTextureMapper::Coordinate>& coordinates) {
    std::vector<Mesh::Corner> corners = mesh.corners;
    if (corners.empty()) {
        const std::size_t n = std::min(mesh.vertices.size(), mesh.textureCoordinates.size());
        for (std::int32_t i = 0; i < static_cast<std::int32_t>(n); ++i) corners.push_back({i, i});
    }
    std::sort(corners.begin(), corners.end());
    corners.erase(std::unique(corners.begin(), corners.end()), corners.end());
    for (const Mesh::Corner& corner : corners) {
        const auto vertex = static_cast<std::size_t>(corner.vertex),
                   number = static_cast<std::size_t>(corner.coordinates);
        if (vertex >= mesh.vertices.size() || number >= mesh.textureCoordinates.size())
            FN_THROW(FNEBadArg, "Face refers to a vertex or texture coordinates that are not there");
        const auto& c = mesh.textureCoordinates[number];
        coordinates.push_back({{c.x * width, (1 - c.y) * height + top}, corner.vertex + firstVertex});
    }
}

} // namespace ShapeImage
