#include "fn/deployment/app_config_db.h"
#include "fn/deployment/component.h"
#include "fn/deployment/composite_values.h"
#include "fn/shape.h"

#include <gtest/gtest.h>

namespace {

using namespace Fn::Deployment;

TEST(ShapeDefinition, AShapeIsTheUnionOfItsConfiguredRectangles) {
    const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB);
    const Component component(db, Property(type<Fn::Shape>(), "Area", "", "", false));
    EXPECT_TRUE(isContainer(component.type()));
    EXPECT_EQ(containedType(component.type()).id(), "Shape::Rectangle");
    EXPECT_EQ(containedType(component.type()).doc(), "Half open Rectangle, the greater coordinates are open");
    EXPECT_TRUE(Fn::Shape::get(component).empty());
    for (const auto& [key, value] :
         {std::pair("Area", "left right"), std::pair("Area.left.x1", "2"), std::pair("Area.left.y1", "4"),
          std::pair("Area.right.x0", "1"), std::pair("Area.right.x1", "5"), std::pair("Area.right.y1", "4")})
        db->set(key, value);
    EXPECT_EQ(Fn::Shape::get(component), Fn::Shape(FNBox{0, 0, 5, 4}));
}

} // namespace
