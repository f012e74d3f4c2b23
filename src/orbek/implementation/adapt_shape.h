#pragma once

#include "fn/vertex_image.h"
#include "orbek/implementation/adapt.h"
#include "orbek/point_set.h"
#include "orbek/shape_image.h"
#include "shapeimg/textured_point_set.h"

/// Translation of scans between their public and their inner form.

namespace Orbek {

/// The inner form of the library's own scans.
class MemoryShapeImageBody::Implementation {
public:
    explicit Implementation(const Fn::VertexImage& image) : image_(image) {}
    const Fn::VertexImage& image() const { return image_; }

private:
    Fn::VertexImage image_;
};

class TexturedPointSetBody final : public PointSetBody {
public:
    explicit TexturedPointSetBody(const ::ShapeImage::TexturedPointSet& points) : points_(points) {}
    const ::ShapeImage::TexturedPointSet& points() const { return points_; }

private:
    ::ShapeImage::TexturedPointSet points_;
};

PointSet adapt(const ::ShapeImage::TexturedPointSet& points);
/// @throws FNEBadArg for a null handle or a body that is not the library's own
::ShapeImage::TexturedPointSet adapt(const PointSet& points);

/// Copies the points and the mask.
ShapeImage adapt(const Fn::VertexImage& image);
/// Shares the points of the library's own scans, and copies those of an application's.
/// @throws FNEBadArg for a null handle, or if there are no arrays
Fn::VertexImage adapt(const ShapeImage& image);

} // namespace Orbek
