#pragma once

#include "fn/image.h"
#include "fn/image_attributes.h"
#include "fn/serialize.h"
#include "fn/vector3.h"

namespace Fn {

/// A 3D scan as a grid of points.
///
/// Position (x, y) of the grid holds a point in millimetres: x points right, y up and z toward the scanner as
/// one looks at the face; rows lie top to bottom. Positions where the scanner saw nothing are not valid, and
/// the point that stands there means nothing. Copies share the points until one is changed.
///
///     Fn::VertexImage scan = Fn::readShapeImage("face.abs");
///     if (scan.valid({x, y})) use(scan.vertex({x, y}));
class VertexImage {
public:
    using Vertex = FN3Vector<double>;

    VertexImage() = default;
    /// Of points at the origin, none of them valid.
    VertexImage(std::uint32_t width, std::uint32_t height);
    /// @throws FNEBadArg if the sizes differ.
    VertexImage(const FNImage<Vertex>& vertices, const FNImage<bool>& validity,
                const FNImageAttributes& attributes = {});
    explicit VertexImage(const Package& package) : VertexImage(deserialize(package)) {}

    std::uint32_t w() const noexcept { return vertices_.w(); }
    std::uint32_t h() const noexcept { return vertices_.h(); }
    const FNImage<Vertex>& vertices() const noexcept { return vertices_; }
    const FNImage<bool>& validity() const noexcept { return validity_; }
    const FNImageAttributes& attributes() const noexcept { return attributes_; }
    FNImageAttributes& attributes() noexcept { return attributes_; }

    /// Whether there is a point. @throws FNEOutOfRange for a position outside of the grid; so do the next
    /// three.
    bool valid(FNGridPos pos) const { return validity_.get(pos); }
    void setValidity(FNGridPos pos, bool valid) { validity_.set(pos, valid); }
    const Vertex& vertex(FNGridPos pos) const { return vertices_.get(pos); }
    /// Puts a valid point.
    void setVertex(FNGridPos pos, const Vertex& vertex);

    /// Moves all points.
    void translate(const Vertex& by);
    /// Multiplies each point and each normal with the matrix from the left.
    void rotate(const FN3Matrix<double>& rotation);
    /// Multiplies the coordinates of all points.
    void scale(double factor);
    /// Rows become columns, and columns rows.
    VertexImage transposed() const;

    /// One normal for each position of the grid; 1 by 1 and zero if none are set.
    const FNImage<Vertex>& normals() const noexcept { return normals_; }
    bool hasNormals() const noexcept;
    /// @throws FNEBadArg if there is not one for each position.
    void setNormals(const FNImage<Vertex>& normals);
    /// Mean of the normals at valid positions, not normalised; zero if there are none.
    /// @throws FNEBadFunCall if no normals are set.
    Vertex avgNormal() const;

    /// The z of each position.
    FNImage<double> rangeImage() const;

    /// A list of the vertices, the normals, the validity and the attributes (see image_package.h).
    Package serialize() const;
    explicit operator Package() const { return serialize(); }
    /// @throws FNEBadArg if the package does not hold a vertex image.
    static VertexImage deserialize(const Package& package);

private:
    static FNImage<Vertex> noNormals();

    FNImage<Vertex> vertices_;
    FNImage<Vertex> normals_ = noNormals();
    FNImage<bool> validity_;
    FNImageAttributes attributes_;
};

} // namespace Fn
