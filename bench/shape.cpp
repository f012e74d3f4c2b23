// Queries of neighbours in a cloud of points.

#include "shapeimg/point_set.h"

#include <benchmark/benchmark.h>

#include "shape_cloud.h"

namespace {

void makeTree(benchmark::State& state) {
    const auto points = scanOf200000Points();
    for (auto _ : state) {
        ShapeImage::PointSet set(points);
        benchmark::DoNotOptimize(set);
    }
}
BENCHMARK(makeTree)->Unit(benchmark::kMillisecond);

void makeTreeWithoutOutliers(benchmark::State& state) {
    const auto points = scanOf200000Points();
    for (auto _ : state) {
        ShapeImage::PointSet set(points, 32, true);
        benchmark::DoNotOptimize(set);
    }
}
BENCHMARK(makeTreeWithoutOutliers)->Unit(benchmark::kMillisecond);

/// As many neighbours as the argument says; positions beside the surface.
void findClosest(benchmark::State& state) {
    const ShapeImage::PointSet set(scanOf200000Points());
    const auto positions = queryPositions();
    std::size_t i = 0;
    for (auto _ : state) {
        auto found = set.findClosest(positions[i++ % positions.size()], 1e9,
                                     static_cast<unsigned int>(state.range(0)));
        benchmark::DoNotOptimize(found);
    }
}
BENCHMARK(findClosest)->Arg(1)->Arg(8)->Arg(32)->Arg(128);

void estimateRayIntersection(benchmark::State& state) {
    const ShapeImage::PointSet set(scanOf200000Points());
    const auto positions = queryPositions();
    std::size_t i = 0;
    for (auto _ : state) {
        const auto& p = positions[i++ % positions.size()];
        auto hit = set.estimateRayIntersection({p.x, p.y, 1000}, {0, 0, -1}, 1.5);
        benchmark::DoNotOptimize(hit);
    }
}
BENCHMARK(estimateRayIntersection);

} // namespace
