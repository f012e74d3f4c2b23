// How a Fn::Shape is configured: as a container of rectangles.

#include "fn/deployment/component.h"
#include "fn/deployment/composite_values.h"
#include "fn/deployment/leaf_values.h"
#include "fn/shape.h"

namespace Fn {

using namespace Deployment;

Type Shape::Rectangle::define() {
    return Type(typeId(), "Half open Rectangle, the greater coordinates are open",
                properties(property<Int>::create("x0", "Least column"),
                           property<Int>::create("y0", "Least row"),
                           property<Int>::create("x1", "Column behind the greatest one"),
                           property<Int>::create("y1", "Row below the greatest one")),
                "", false);
}

std::string Shape::typeId() {
    return Container<Rectangle>::typeId();
}

Type Shape::define() {
    return Container<Rectangle>::define();
}

Shape Shape::get(const Component& component) {
    Shape shape;
    for (const Component& rectangle : component.subComponents()) {
        const auto bound = [&](const char* name) { return Value<Int>::get(rectangle.subComponent(name)); };
        shape += Shape(FNBox{bound("x0"), bound("y0"), bound("x1"), bound("y1")});
    }
    return shape;
}

} // namespace Fn
