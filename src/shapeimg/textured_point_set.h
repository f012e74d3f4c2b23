#pragma once

#include "fn/image_reference.h"
#include "fn/vertex_image.h"
#include "shapeimg/point_set.h"

namespace ShapeImage {

/// A scan with its texture: a cloud of points, a picture, and what leads from the picture to the points.
class TexturedPointSet {
public:
    /// Leads from pixels of the texture to points.
    class Texture2VertexMapper {
    public:
        static constexpr std::int32_t noVertex = -1;

        virtual ~Texture2VertexMapper() = default;
        /// @return the number of the point at a pixel, `noVertex` where there is none or outside of the
        /// texture
        virtual std::int32_t mapTexture2Vertex(FNGridPos pos) const = 0;
    };

    /// For a grid of points and a texture of the same size: pixel (x, y) belongs to the point x + y * width.
    class GridAlignedTextureMapper;
    /// For points with texture coordinates: a pixel belongs to the point with the nearest ones.
    class CoordinateTextureMapper;

    /// Without points, with a texture of one black pixel.
    TexturedPointSet();
    TexturedPointSet(const PointSet& points, const FNImageReference& texture,
                     const FNCountedPtr<Texture2VertexMapper>& mapper)
        : points_(points), texture_(texture), mapper_(mapper) {}
    /// The points of a grid, numbered row by row.
    /// @throws FNEBadArg if the texture does not have the grid's size.
    TexturedPointSet(const Fn::VertexImage& image, const FNImageReference& texture,
                     bool removeOutliers = false);
    /// @throws FNEBadArg, always: there is no serialized form.
    explicit TexturedPointSet(const Fn::Package& package);
    Fn::Package serialize() const;
    explicit operator Fn::Package() const { return serialize(); }

    const PointSet& points() const noexcept { return points_; }
    PointSet& points() noexcept { return points_; }
    const FNImageReference& texture() const noexcept { return texture_; }

    /// The point at a pixel of the texture; nothing where there is no valid one.
    Fn::Optional<FN3Vector<double>> mapTexture2Vertex(FNGridPos pos) const;

private:
    PointSet points_;
    FNImageReference texture_;
    FNCountedPtr<Texture2VertexMapper> mapper_;
};

class TexturedPointSet::GridAlignedTextureMapper final : public Texture2VertexMapper {
public:
    GridAlignedTextureMapper(std::uint32_t width, std::uint32_t height) : width_(width), height_(height) {}
    std::int32_t mapTexture2Vertex(FNGridPos pos) const override;

private:
    std::uint32_t width_, height_;
};

class TexturedPointSet::CoordinateTextureMapper final : public Texture2VertexMapper {
public:
    struct Coordinate {
        FN2Vector<double> pos; ///< pixels, continuous: the middle of the first one is (0.5, 0.5)
        std::int32_t vertex;   ///< number of a point, of which any number of coordinates may tell
    };

    /// A pixel has a point if there is a coordinate within two times the mean distance of coordinates, as if
    /// they were spread evenly over the texture.
    CoordinateTextureMapper(const std::vector<Coordinate>& coordinates, std::uint32_t width,
                            std::uint32_t height);
    std::int32_t mapTexture2Vertex(FNGridPos pos) const override;

private:
    PointSet coordinates_; ///< in the plane z = 0
    std::vector<std::int32_t> vertices_;
    FNBox box_;
    double reach_ = 0;
};

} // namespace ShapeImage
