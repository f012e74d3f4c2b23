#include "orbek/shape_image.h"

#include "fn/shapefile/shape_file.h"
#include "orbek/implementation/adapt_shape.h"

namespace Orbek {

ShapeImageBody::ShapeImageBody() = default;
ShapeImageBody::~ShapeImageBody() = default;
PointSetBody::PointSetBody() = default;
PointSetBody::~PointSetBody() = default;

CountedPtr<ShapeImageBody> createImageBody(const Vertex* vertices, const bool* mask, unsigned int width,
                                           unsigned int height, bool transpose) {
    return CountedPtr<ShapeImageBody>(new MemoryShapeImageBody(vertices, mask, width, height, transpose));
}

ShapeImage loadShapeImage(const std::string& fileName) {
    return adapt(Fn::readShapeImage(fileName));
}

ShapeImage loadShapeImage(std::istream& stream) {
    return adapt(Fn::readShapeImage(stream));
}

} // namespace Orbek
