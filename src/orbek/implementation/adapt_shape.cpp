#include "orbek/implementation/adapt_shape.h"

#include <cstddef>

namespace Orbek {
namespace {

using InnerVertex = Fn::VertexImage::Vertex;

static_assert(sizeof(Vertex) == sizeof(InnerVertex) && offsetof(Vertex, x) == offsetof(InnerVertex, x) &&
              offsetof(Vertex, y) == offsetof(InnerVertex, y) &&
              offsetof(Vertex, z) == offsetof(InnerVertex, z));

Fn::VertexImage copyOf(const Vertex* vertices, const bool* mask, unsigned int w, unsigned int h) {
    FNImage<InnerVertex> points(w, h);
    FNImage<bool> validity(w, h);
    if (!points.empty()) {
        if (!vertices || !mask) FN_THROW(FNEBadArg, "The scan gives no vertices or no mask");
        std::copy_n(reinterpret_cast<const InnerVertex*>(vertices), points.size(), points.getExclusive());
        std::copy_n(mask, validity.size(), validity.getExclusive());
    }
    return Fn::VertexImage(points, validity);
}

} // namespace

PointSet adapt(const ::ShapeImage::TexturedPointSet& points) {
    return PointSet(new TexturedPointSetBody(points));
}

::ShapeImage::TexturedPointSet adapt(const PointSet& points) {
    const auto* const body = dynamic_cast<const TexturedPointSetBody*>(points.get());
    if (!body) FN_THROW(FNEBadArg, "There is no point set of the library behind the handle");
    return body->points();
}

ShapeImage adapt(const Fn::VertexImage& image) {
    return createImageBody(reinterpret_cast<const Vertex*>(image.vertices().data()), image.validity().data(),
                           image.w(), image.h(), false);
}

Fn::VertexImage adapt(const ShapeImage& image) {
    if (!image) FN_THROW(FNEBadArg, "There is no scan behind the handle");
    if (const auto* const own = dynamic_cast<const MemoryShapeImageBody*>(image.get()))
        return own->implementation().image();
    return copyOf(image->vertices(), image->mask(), image->width(), image->height());
}

MemoryShapeImageBody::MemoryShapeImageBody(const Vertex* vertices, const bool* mask, unsigned int width,
                                           unsigned int height, bool transpose) {
    const Fn::VertexImage image = copyOf(vertices, mask, width, height);
    implementation_ = CountedPtr<Implementation>(new Implementation(transpose ? image.transposed() : image));
}
MemoryShapeImageBody::~MemoryShapeImageBody() = default;

unsigned int MemoryShapeImageBody::width() const {
    return implementation_->image().w();
}
unsigned int MemoryShapeImageBody::height() const {
    return implementation_->image().h();
}
const Vertex* MemoryShapeImageBody::vertices() const {
    return reinterpret_cast<const Vertex*>(implementation_->image().vertices().data());
}
const bool* MemoryShapeImageBody::mask() const {
    return implementation_->image().validity().data();
}

} // namespace Orbek
