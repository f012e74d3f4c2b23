#include "shapeimg/point_set.h"

#include "shapeimg/ray.h"
#include "support/recorded_dialog.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>

namespace {

using ShapeImage::PointSet;
using Vector = PointSet::Vector;

/// Uniform in a box, with some points repeated and some in a plane.
std::vector<Vector> cloud(std::size_t n, unsigned seed) {
    std::mt19937 random(seed);
    std::uniform_real_distribution<double> along(-10, 10);
    std::vector<Vector> points;
    for (std::size_t i = 0; i < n; ++i) {
        points.push_back({along(random), along(random), i % 3 == 0 ? 2 : along(random)});
        if (i % 5 == 4) points.back() = points[i / 2];
    }
    return points;
}

/// Distances that a search of all points finds, nearest first.
template <class Distance>
std::vector<float> plainSearch(const PointSet& set, double radius, std::size_t most, Distance squared) {
    std::vector<float> distances;
    for (std::int32_t i = 0; i < static_cast<std::int32_t>(set.size()); ++i) {
        const double d = squared(set.point(i), i);
        if (set.valid(i) && d >= 0 && d <= radius * radius)
            distances.push_back(std::sqrt(static_cast<float>(d)));
    }
    std::sort(distances.begin(), distances.end());
    distances.resize(std::min(distances.size(), most));
    return distances;
}

std::vector<float> distancesOf(const PointSet::Neighbourhood& neighbours) {
    std::vector<float> distances;
    for (const auto& n : neighbours) distances.push_back(n.distance);
    return distances;
}

TEST(PointSet, FindsWhatASearchOfAllPointsFinds) {
    for (const std::size_t n : {0, 1, 8, 9, 100, 3000}) {
        FNRMem<bool> mask(n);
        for (std::size_t i = 0; i < n; ++i) mask.getExclusive()[i] = i % 7 != 2;
        const PointSet set(cloud(n, 1), mask, 20);
        const auto even = [](std::int32_t i) { return i % 2 == 0; };
        for (const Vector& q : cloud(40, 2))
            for (const double radius : {0.0, 1.0, 3.5, 1e9}) {
                const auto squared = [&](const Vector& p, int) { return dot(p - q, p - q); };
                ASSERT_EQ(distancesOf(set.findClosest(q, radius)), plainSearch(set, radius, 20, squared));
                ASSERT_EQ(distancesOf(set.findClosest(q, radius, 3)), plainSearch(set, radius, 3, squared));
                ASSERT_EQ(distancesOf(set.findClosest(q, even, radius)),
                          plainSearch(set, radius, 20,
                                      [&](const Vector& p, int i) { return even(i) ? squared(p, i) : -1; }));
                const Vector start = q * 0.5, direction{q.z, q.x, 1};
                const ShapeImage::Ray ray(start, direction);
                ASSERT_EQ(distancesOf(set.findClosestToRay(start, direction, radius)),
                          plainSearch(set, radius, 20,
                                      [&](const Vector& p, int) { return ray.squaredDistance(p); }));
            }
    }
    const PointSet set(cloud(50, 3));
    EXPECT_TRUE(set.findClosest({0, 0, 0}, -1).empty());
    EXPECT_TRUE(set.findClosest({std::nan(""), 0, 0}, 1).empty());
    EXPECT_TRUE(set.findClosest({0, 0, 0}, 100, 0).empty());
    EXPECT_EQ(set.findClosest(set.point(17), 0)[0].point, set.point(17));
}

TEST(PointSet, KnowsItsExtent) {
    FNRMem<bool> mask(5);
    std::fill_n(mask.getExclusive(), 5, true);
    mask[1] = false;
    const std::vector<Vector> points{{1, 2, 3}, {99, 99, 99}, {-1, 5, 3}, {std::nan(""), 0, 0}, {3, -1, 0}};
    const PointSet set(points, mask);
    EXPECT_FALSE(mask[3]) << "not finite";
    EXPECT_EQ(set.size(), 5u);
    EXPECT_EQ(set.validSize(), 3u);
    EXPECT_EQ(set.center(), (Vector{1, 2, 2}));
    EXPECT_EQ(set.lowBoundingBoxCorner(), (Vector{-1, -1, 0}));
    EXPECT_EQ(set.highBoundingBoxCorner(), (Vector{3, 5, 3}));
    EXPECT_EQ(set.maxZPoint(), (Vector{1, 2, 3})) << "the first of two";
    EXPECT_EQ(set.minXPoint(), (Vector{-1, 5, 3}));
    EXPECT_THROW(PointSet().center(), FNEBadFunCall);
    EXPECT_THROW(set.point(5), FNEOutOfRange);
    FNRMem<bool> tooFew(4);
    EXPECT_THROW(PointSet(points, tooFew), FNEBadArg);
}

TEST(PointSet, IsTransformedWithoutItsCopies) {
    const PointSet before(cloud(500, 4));
    PointSet after = before;
    const FN3Matrix<double> quarterTurn{{{0, -1, 0}, {1, 0, 0}, {0, 0, 1}}};
    after.affineTransform({1, 2, 3}, quarterTurn);
    for (const Vector& q : cloud(20, 5)) {
        const auto a = before.findClosest(q, 4), b = after.findClosest(quarterTurn * q + Vector{1, 2, 3}, 4);
        ASSERT_EQ(a.size(), b.size());
        for (std::size_t i = 0; i < a.size(); ++i) ASSERT_NEAR(a[i].distance, b[i].distance, 1e-5f);
    }
    after.setNeighbourhoodSize(1);
    EXPECT_EQ(before.neighbourhoodSize(), PointSet::defaultNeighbourhoodSize);
}

TEST(PointSet, EstimatesWhereARayMeetsTheFirstLayer) {
    std::vector<Vector> layers;
    for (int y = -20; y <= 20; ++y)
        for (int x = -20; x <= 20; ++x) {
            layers.push_back({x * 0.5, y * 0.5, 0.2 * x * 0.5});
            layers.push_back({x * 0.5, y * 0.5, -40});
        }
    const PointSet set(layers);
    const auto hit = set.estimateRayIntersection({2.1, 1.2, 100}, {0, 0, -1}, 1.5);
    ASSERT_TRUE(hit.isSet());
    EXPECT_NEAR(hit->x, 2.1, 1e-12);
    EXPECT_NEAR(hit->z, 0.42, 0.05);
    EXPECT_NEAR(set.estimateRayIntersection({0, 0, -20}, {0, 0, -1}, 1.5)->z, -40, 1e-9);
    EXPECT_FALSE(set.estimateRayIntersection({0, 0, 10}, {0, 0, 1}, 1.5).isSet()) << "looks away";
    EXPECT_FALSE(set.estimateRayIntersection({30, 0, 100}, {0, 0, -1}, 1.5).isSet());
    EXPECT_EQ(thrownBy([&] {
                  set.findClosestToRay({0, 0, 0}, {0, 0, 0}, 1);
              }),
              "FNEBadArg: Zero direction vector in ray instantiation");
}

/// A bent surface of 60 by 60 points, in millimetres.
std::vector<Vector> surface() {
    std::vector<Vector> points;
    for (int y = 0; y < 60; ++y)
        for (int x = 0; x < 60; ++x) points.push_back({x - 30.0, y - 30.0, -0.02 * (x - 30) * (x - 30)});
    return points;
}

TEST(PointSet, RemovesOutliersInThreeRuns) {
    std::vector<Vector> points = surface();
    const std::size_t good = points.size();
    points.push_back({0, 0, 500}); // 1st run
    points.push_back({0, 5, 30});  // 2nd run: alone, but not far away
    points.push_back({4, -5, 25});
    for (int i = 0; i < 200; ++i) // 3rd run: a dense patch apart from the surface
        points.push_back({i % 20 - 10.0, i / 20 * 1.0, -38});
    FNRMem<bool> mask(points.size());
    std::fill_n(mask.getExclusive(), points.size(), true);

    RecordedDialog dialog;
    const PointSet set(points, mask, 8, true);
    for (std::size_t i = 0; i < points.size(); ++i) ASSERT_EQ(mask[i], i < good) << i;
    EXPECT_TRUE(set.findClosest({0, 5, 30}, 3).empty());
    EXPECT_EQ(set.point(static_cast<std::int32_t>(good)), (Vector{0, 0, 500}));
    EXPECT_EQ(dialog.messages(), (std::vector<std::string>{
                                     "log: Tree has 3600 points (1 removed in 1st run; 2 removed in 2nd run; "
                                     "200 removed in 3rd run) "}));

    // Degenerate clouds stay, and nothing divides by zero.
    EXPECT_EQ(PointSet(std::vector<Vector>(100, Vector{1, 2, 3}), 8, true).validSize(), 100u);
    EXPECT_EQ(PointSet({{1, 2, 3}}, 8, true).validSize(), 1u);
    EXPECT_EQ(PointSet(std::vector<Vector>(), 8, true).validSize(), 0u);
    PointSet(std::vector<Vector>{{1e99, 0, 0}, {0, 0, 0}, {0, 0, 1e-99}}, 8, true);
}

} // namespace
