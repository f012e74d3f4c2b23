#include "fn/shape.h"

#include <gtest/gtest.h>

#include <random>
#include <set>
#include <sstream>

namespace {

using Fn::Shape;

/// The same set as its pixels, in a small window: the plain truth for every operation.
using Pixels = std::set<std::pair<int, int>>;

constexpr int window = 24;

Pixels pixelsOf(const Shape& shape) {
    Pixels pixels;
    for (int y = -window; y < 2 * window; ++y)
        for (int x = -window; x < 2 * window; ++x)
            if (shape.contains({x, y})) pixels.emplace(x, y);
    return pixels;
}

Shape randomShape(std::mt19937& random) {
    Shape shape;
    for (unsigned i = random() % 6; i > 0; --i) {
        const int x = static_cast<int>(random() % 16), y = static_cast<int>(random() % 16);
        const FNBox box{x, y, x + static_cast<int>(random() % 9), y + static_cast<int>(random() % 9)};
        random() % 4 ? shape += Shape(box) : shape -= Shape(box);
    }
    return shape;
}

/// Whether spans and segments are ordered and touch nowhere without need.
bool isCanonical(const Shape& shape) {
    const auto& spans = shape.spans();
    for (std::size_t i = 0; i < spans.size(); ++i) {
        const auto& s = spans[i].segments;
        if (s.empty() || spans[i].y0 >= spans[i].y1) return false;
        for (std::size_t k = 0; k < s.size(); ++k)
            if (s[k].x0 >= s[k].x1 || (k && s[k - 1].x1 >= s[k].x0)) return false;
        if (i &&
            (spans[i - 1].y1 > spans[i].y0 || (spans[i - 1].y1 == spans[i].y0 && spans[i - 1].segments == s)))
            return false;
    }
    return true;
}

template <class Choose> Pixels chosen(Choose choose) {
    Pixels pixels;
    for (int y = -window; y < 2 * window; ++y)
        for (int x = -window; x < 2 * window; ++x)
            if (choose(x, y)) pixels.emplace(x, y);
    return pixels;
}

TEST(Shape, OperationsAreThoseOfSets) {
    std::mt19937 random(1);
    for (int i = 0; i < 60; ++i) {
        const Shape a = randomShape(random), b = randomShape(random);
        const Pixels inA = pixelsOf(a), inB = pixelsOf(b);
        const auto is = [&](int x, int y) { return inA.contains({x, y}); };
        const int n = i % 3;
        const auto near = [&](int x, int y, bool all) {
            for (int dy = -n; dy <= n; ++dy)
                for (int dx = -n; dx <= n; ++dx)
                    if (is(x + dx, y + dy) != all) return !all;
            return all;
        };
        EXPECT_EQ(pixelsOf(a + b), chosen([&](int x, int y) { return is(x, y) || inB.contains({x, y}); }));
        EXPECT_EQ(pixelsOf(a * b), chosen([&](int x, int y) { return is(x, y) && inB.contains({x, y}); }));
        EXPECT_EQ(pixelsOf(a - b), chosen([&](int x, int y) { return is(x, y) && !inB.contains({x, y}); }));
        EXPECT_EQ(pixelsOf(a.dilation(n)), chosen([&](int x, int y) { return near(x, y, false); }));
        EXPECT_EQ(pixelsOf(a.erosion(n)), chosen([&](int x, int y) { return near(x, y, true); }));
        EXPECT_EQ(a.area(), inA.size());
        EXPECT_EQ(a + b, b + (a - b)) << "equal sets have equal forms";
        for (const Shape& shape : {a, a + b, a * b, a - b, a.dilation(n), a.erosion(n)})
            EXPECT_TRUE(isCanonical(shape)) << shape;
    }
}

TEST(Shape, EnclosesItsPixels) {
    EXPECT_EQ(Shape().enclosing(), FNBox());
    EXPECT_EQ((Shape(FNBox{5, 1, 6, 2}) + Shape(FNBox{-3, 7, 2, 9})).enclosing(), (FNBox{-3, 1, 6, 9}));
    EXPECT_TRUE(Shape(FNBox{3, 3, 3, 9}).empty());
}

TEST(Shape, ScalesAroundAPoint) {
    const Shape box(FNBox{2, 4, 6, 8});
    EXPECT_EQ(box.scale(2), Shape(FNBox{4, 8, 12, 16}));
    EXPECT_EQ(box.scale(0.5f, 1), Shape(FNBox{1, 4, 3, 8}));
    EXPECT_EQ(box.scale(-1), Shape(FNBox{-6, -8, -2, -4}));
    EXPECT_EQ(box.inflation({4, 6}, 2), Shape(FNBox{0, 2, 8, 10}));
    EXPECT_EQ(box.inflation({4, 6}, 0), Shape());
    EXPECT_EQ((box + Shape(FNBox{6, 4, 7, 6})).inflation({2, 4}, 3),
              Shape(FNBox{2, 4, 14, 16}) + Shape(FNBox{14, 4, 17, 10}));
}

TEST(Shape, RowsReachInfinityAndStayThere) {
    const Shape rows = (Shape(FNBox{0, 0, 1, 2}) + Shape(FNBox{5, 1, 6, 3})).expandXToInfinity();
    ASSERT_EQ(rows.spans().size(), 1u);
    EXPECT_TRUE(rows.contains({-2000000000, 2}));
    EXPECT_EQ(rows.dilation(1).enclosing().x0, rows.enclosing().x0);
    EXPECT_EQ(rows.scale(2).enclosing().x1, rows.enclosing().x1);
    EXPECT_EQ(rows * Shape(FNBox{0, 0, 9, 9}), Shape(FNBox{0, 0, 9, 3}));
}

TEST(Shape, AParallelogramHoldsThePixelsWithTheirMiddleInside) {
    EXPECT_EQ(Shape::parallelogram({1, 2}, {5, 2}, {1, 4}), Shape(FNBox{1, 2, 5, 4}));
    EXPECT_EQ(Shape::parallelogram({1, 2}, {1, 4}, {5, 2}), Shape(FNBox{1, 2, 5, 4}));
    EXPECT_EQ(Shape::parallelogram({0.6f, 0}, {2.4f, 0}, {0.6f, 1}), Shape(FNBox{1, 0, 2, 1}));
    const FNPos corner(10, 1), u(7.3f, 4.1f), v(-5.2f, 8.9f);
    const Pixels expected = chosen([&](int x, int y) {
        const FNPos d = FNPos(static_cast<float>(x) + 0.5f, static_cast<float>(y) + 0.5f) - corner;
        const float area = u.x * v.y - u.y * v.x;
        const float s = (d.x * v.y - d.y * v.x) / area, t = (u.x * d.y - u.y * d.x) / area;
        return s >= 0 && s < 1 && t >= 0 && t < 1;
    });
    EXPECT_EQ(pixelsOf(Shape::parallelogram(corner, corner + u, corner + v)), expected);
    EXPECT_EQ(pixelsOf(Shape::parallelogram(corner + u + v, corner + v, corner + u)), expected);
    EXPECT_TRUE(Shape::parallelogram({0, 0}, {9, 9}, {3, 3}).empty());
    EXPECT_TRUE(Shape::parallelogram({0, std::nanf("")}, {9, 9}, {3, 3}).empty());
}

TEST(Shape, IteratorsGiveRectanglesSpansAndSegments) {
    const Shape shape = Shape(FNBox{0, 0, 2, 2}) + Shape(FNBox{4, 0, 6, 2}) + Shape(FNBox{0, 3, 6, 4});
    std::vector<FNBox> boxes;
    for (Fn::ShapeIter it(shape); !it.atEnd(); ++it) boxes.push_back(*it);
    EXPECT_EQ(boxes, (std::vector<FNBox>{{0, 0, 2, 2}, {4, 0, 6, 2}, {0, 3, 6, 4}}));
    Fn::ShapeIter2 span(shape);
    EXPECT_EQ(span.rectangles().back(), (FNBox{4, 0, 6, 2}));
    EXPECT_EQ((++span)->y0, 3);
    EXPECT_TRUE((++span).atEnd());
    Fn::ShapeLineIter segment(shape, 1);
    EXPECT_EQ((++segment)->x0, 4);
    EXPECT_TRUE((++segment).atEnd());
    for (const int y : {-1, 2, 4}) EXPECT_TRUE(Fn::ShapeLineIter(shape, y).atEnd());
}

TEST(Shape, HasATextForm) {
    std::ostringstream text;
    text << Shape() << Shape(FNBox{-1, 2, 3, 4});
    EXPECT_EQ(text.str(), "Shape = {}\nShape = {\n  (-1, 2) - (3, 4)\n}\n");
}

} // namespace
