#pragma once

#include "fn/image_reference.h"
#include "shapeimg/textured_point_set.h"

#include <cstdint>
#include <vector>

namespace ShapeImage {

/// Points with texture coordinates, as files of meshes hold them.
struct Mesh {
    std::vector<FN3Vector<double>> vertices;
    /// From 0 to 1 across the texture: x from left to right, y from bottom to top.
    std::vector<FN2Vector<double>> textureCoordinates;

    /// A corner of a face: numbers of a vertex and of its texture coordinates.
    struct Corner {
        std::int32_t vertex, coordinates;
        friend auto operator<=>(const Corner&, const Corner&) = default;
    };
    std::vector<Corner> corners;
};

/// The texture coordinates of a mesh's corners, each pair once, in pixels of a texture that is `height`
/// pixels high and lies `top` pixels below the top of a picture; vertices are counted from `firstVertex`.
/// Without corners, vertices and texture coordinates of the same number belong together.
/// @throws FNEBadArg for a number beyond the end of its list.
void appendCoordinates(const Mesh& mesh, std::uint32_t width, std::uint32_t height, std::uint32_t top,
                       std::int32_t firstVertex,
                       std::vector<TexturedPointSet::CoordinateTextureMapper::Coordinate>& coordinates);

} // namespace ShapeImage
