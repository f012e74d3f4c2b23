#include "fn/vector3.h"
#include "img/affine/perspective.h"
#include "img/affine/turns.h"

#include "random_images.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

namespace {

using namespace Img::Affine;

template <class T> void checkTurns(int w, int h) {
    RandomImages random(1);
    const FNImage<T> src = random.image<T>(w, h);
    const FNImage<T> left = leftRotation(src), right = rightRotation(src);
    ASSERT_EQ(left.w(), src.h());
    ASSERT_EQ(right.h(), src.w());
    for (std::uint32_t y = 0; y < src.h(); ++y)
        for (std::uint32_t x = 0; x < src.w(); ++x) {
            ASSERT_EQ(left(y, src.w() - 1 - x), src(x, y));
            ASSERT_EQ(right(src.h() - 1 - y, x), src(x, y));
        }
}

TEST(QuarterTurns, MoveEveryPixel) {
    for (const auto& [w, h] : {std::pair(1, 1), {1, 9}, {33, 32}, {70, 41}}) {
        checkTurns<unsigned char>(w, h);
        checkTurns<int>(w, h);
        checkTurns<Fn::Bgra32>(w, h);
        checkTurns<Fn::Rgb48>(w, h);
    }
    EXPECT_TRUE(leftRotation(FNImage<int>()).empty());
    EXPECT_TRUE(rightRotation(FNImage<int>()).empty());
}

template <class T> void checkReflections() {
    RandomImages random(2);
    const FNImage<T> src = random.image<T>(9, 7);
    const FNImage<T> hor = horReflection(src, {-3, 2, 5, 100}), vert = vertReflection(src, {-3, 2, 5, 100});
    ASSERT_EQ(hor.box(), (FNBox{0, 0, 5, 5}));
    ASSERT_EQ(vert.box(), (FNBox{0, 0, 5, 5}));
    for (std::uint32_t y = 0; y < 5; ++y)
        for (std::uint32_t x = 0; x < 5; ++x) {
            ASSERT_EQ(hor(x, y), src(x, 6 - y));
            ASSERT_EQ(vert(x, y), src(4 - x, 2 + y));
        }
    EXPECT_EQ(horReflection(src, {9, 0, 12, 7}).size(), 1u);
    EXPECT_EQ(vertReflection(src, {9, 0, 12, 7}).size(), 1u);
}

TEST(Reflections, ExchangeSidesOfThePartInside) {
    checkReflections<float>();
    checkReflections<unsigned short>();
    checkReflections<unsigned char>();
    checkReflections<Fn::Bgra32>();
    checkReflections<Fn::Rgb48>();

    FNImage<FN3Vector<double>> points(2, 1);
    points.set({0, 0}, {1, 2, 3});
    points.set({1, 0}, {4, 5, 6});
    EXPECT_EQ(vertReflection(points, points.box())(0, 0), (FN3Vector<double>{4, 5, 6}));
}

FNPos apply(const FN3Matrix<float>& T, FNPos p) {
    const FN3Vector<float> q = FN3Vector<float>{p.x, p.y, 1} * T;
    return {q.x / q.z, q.y / q.z};
}
void expectMaps(const FN3Matrix<float>& T, FNPos from, FNPos to) {
    const FNPos p = apply(T, from);
    EXPECT_NEAR(p.x, to.x, 1e-3);
    EXPECT_NEAR(p.y, to.y, 1e-3);
}

TEST(Perspective, MapsCornersOntoCorners) {
    const FNPos general[4] = {{3, 4}, {90, 10}, {80, 70}, {-5, 60}};
    const FNPos parallel[4] = {{3, 4}, {53, 14}, {63, 44}, {13, 34}};
    const FNPos square[4] = {{0, 0}, {1, 0}, {1, 1}, {0, 1}},
                rect[4] = {{10, 20}, {30, 20}, {30, 25}, {10, 25}};
    for (const auto& [quad, mode] : {std::pair(&general, MapProjective), std::pair(&parallel, MapAffine)}) {
        const auto& q = *quad;
        FN3Matrix<float> fromSquare, fromRect, fromQuad;
        EXPECT_EQ(MapSquareQuad(q[0], q[1], q[2], q[3], fromSquare), mode);
        EXPECT_EQ(MapRectQuad(rect[0], rect[2], q[0], q[1], q[2], q[3], fromRect), mode);
        EXPECT_EQ(MapQuadQuad(general, q, fromQuad), MapProjective);
        EXPECT_EQ(MapQuadQuad(parallel, q, fromQuad), mode);
        for (int i = 0; i < 4; ++i) {
            expectMaps(fromSquare, square[i], q[i]);
            expectMaps(fromRect, rect[i], q[i]);
            expectMaps(fromQuad, parallel[i], q[i]);
        }
    }
    // A projective map keeps cross ratios: the diagonals' intersection maps onto the diagonals' intersection.
    FN3Matrix<float> T;
    MapSquareQuad({0, 0}, {4, 0}, {3, 2}, {1, 2}, T);
    expectMaps(T, {0.5f, 0.5f}, {2, 4.0f / 3});
}

TEST(Perspective, RefusesDegenerateFigures) {
    FN3Matrix<float> T;
    EXPECT_EQ(thrownText<FNEBadArg>([&] {
                  MapSquareQuad({0, 0}, {1, 1}, {2, 2}, {4, 4}, T);
              }),
              "MapSquareQuad: Bad Mapping!");
    EXPECT_EQ(thrownText<FNEBadArg>([&] {
                  MapRectQuad({1, 1}, {1, 5}, {0, 0}, {1, 0}, {1, 1}, {0, 1}, T);
              }),
              "MapRectQuad: Bad Mapping! Null Rectangle.");
    const FNPos line[4] = {{0, 0}, {1, 1}, {2, 2}, {1, 1}}, square[4] = {{0, 0}, {1, 0}, {1, 1}, {0, 1}};
    EXPECT_THROW(MapQuadQuad(line, square, T), FNEBadArg);
}

TEST(Perspective, ResamplesThroughTheMap) {
    RandomImages random(3);
    const FNImage<float> src = random.image<float>(30, 20);
    const FNPos all[4] = {{0, 0}, {30, 0}, {30, 20}, {0, 20}}, part[4] = {{3, 4}, {13, 4}, {13, 9}, {3, 9}};
    FNImage<float> same(30, 20), window(10, 5), pasted(40, 30), moved(30, 20);
    EXPECT_EQ(imgMapQuadToRect(src, same, all), MapAffine);
    EXPECT_EQ(imgMapQuadToRect(src, window, part), MapAffine);
    const FNPos place[4] = {{5, 6}, {35, 6}, {35, 26}, {5, 26}};
    EXPECT_EQ(imgMapRectToQuad(src, pasted, place), MapAffine);
    const FNPos target[4] = {{1, 1}, {11, 1}, {11, 6}, {1, 6}};
    EXPECT_EQ(imgMapQuadToQuad(src, moved, part, target), MapAffine);
    for (std::uint32_t y = 0; y < 20; ++y)
        for (std::uint32_t x = 0; x < 30; ++x) {
            const bool edge = x == 29 || y == 19; // no neighbour to the right or below
            ASSERT_NEAR(same(x, y), edge ? 0 : src(x, y), 1e-4);
            ASSERT_NEAR(pasted(x + 5, y + 6), edge ? 0 : src(x, y), 1e-4);
            if (x < 10 && y < 5) {
                ASSERT_NEAR(window(x, y), src(x + 3, y + 4), 1e-4);
                ASSERT_NEAR(moved(x + 1, y + 1), src(x + 3, y + 4), 1e-4);
            }
        }
    EXPECT_EQ(pasted(4, 10), 0);

    FNImage<unsigned char> bytes(3, 2), between(1, 1);
    std::copy_n(std::array<unsigned char, 6>{10, 20, 30, 11, 22, 33}.data(), 6, bytes.getExclusive());
    imgMapQuadToRect(bytes, between, {{0.5f, 0.5f}, {1.5f, 0.5f}, {1.5f, 1.5f}, {0.5f, 1.5f}});
    EXPECT_EQ(between(0, 0), 15) << "63 / 4, truncated";
}

} // namespace
