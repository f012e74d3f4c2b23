#include "shapeimg/ray.h"

#include "support/thrown.h"

#include <gtest/gtest.h>

namespace {

using ShapeImage::Ray;

TEST(Ray, MeasuresDistancesFromAHalfLine) {
    const Ray ray({0, 0, 10}, {0, 0, -1e-200});
    EXPECT_EQ(ray.direction(), (Ray::Vector{0, 0, -1}));
    EXPECT_DOUBLE_EQ(ray.squaredDistance({3, 4, -100}), 25);
    EXPECT_DOUBLE_EQ(ray.squaredDistance({3, 0, 14}), 25) << "behind the start";
    EXPECT_DOUBLE_EQ(ray.parameter({3, 0, 14}), -4);
}

TEST(Ray, NeedsADirection) {
    EXPECT_EQ(thrownBy([] {
                  Ray({1, 2, 3}, {0, 0, 0});
              }),
              "FNEBadArg: Zero direction vector in ray instantiation");
    EXPECT_THROW(Ray({}, {1, std::nan(""), 0}), FNEBadArg);
    EXPECT_THROW(Ray({}, {1, INFINITY, 0}), FNEBadArg);
}

} // namespace
