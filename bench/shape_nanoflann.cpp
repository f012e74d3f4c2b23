// The yardstick of the queries: nanoflann.

#include "shape_cloud.h"

#include <benchmark/benchmark.h>
#include <nanoflann.hpp>

namespace {

struct Cloud {
    std::vector<FN3Vector<double>> points = scanOf200000Points();

    std::size_t kdtree_get_point_count() const { return points.size(); }
    double kdtree_get_pt(std::size_t i, std::size_t axis) const { return points[i][static_cast<int>(axis)]; }
    template <class Box> bool kdtree_get_bbox(Box&) const { return false; }
};
using Tree =
    nanoflann::KDTreeSingleIndexAdaptor<nanoflann::L2_Simple_Adaptor<double, Cloud>, Cloud, 3, std::uint32_t>;

void nanoflannMakeTree(benchmark::State& state) {
    const Cloud cloud;
    for (auto _ : state) {
        Tree tree(3, cloud);
        tree.buildIndex();
        const void* made = &tree;
        benchmark::DoNotOptimize(made);
    }
}
BENCHMARK(nanoflannMakeTree)->Unit(benchmark::kMillisecond);

void nanoflannFindClosest(benchmark::State& state) {
    const Cloud cloud;
    Tree tree(3, cloud);
    tree.buildIndex();
    const auto positions = queryPositions();
    const auto n = static_cast<std::size_t>(state.range(0));
    std::vector<std::uint32_t> indexes(n);
    std::vector<double> distances(n);
    std::size_t i = 0;
    for (auto _ : state) {
        const auto& p = positions[i++ % positions.size()];
        const double query[3] = {p.x, p.y, p.z};
        tree.knnSearch(query, n, indexes.data(), distances.data());
        benchmark::DoNotOptimize(distances.data());
    }
}
BENCHMARK(nanoflannFindClosest)->Arg(1)->Arg(8)->Arg(32)->Arg(128);

} // namespace
