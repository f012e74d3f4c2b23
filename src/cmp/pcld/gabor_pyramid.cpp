#include "cmp/pcld/gabor_pyramid.h"

#include <cmath>
#include <numbers>
#include <set>

namespace Cmp::Pcld {

namespace {

using Implementation::GaborBank;

constexpr unsigned int scaleLimit = 40; // wave lengths of two million pixels

double waveNumber(unsigned int scale) {
    return std::numbers::pi * std::pow(std::numbers::sqrt2, -static_cast<double>(scale));
}

std::vector<GaborPyramid::Grid> makeGrids(const GaborPyramidParams& params) {
    if (params.firstScale >= params.endScale || params.endScale > scaleLimit || params.angles == 0 ||
        !(params.gridScale >= 1) || !(params.sigma > 0))
        FN_THROW(FNEBadArg, "Gabor pyramid: invalid parameters");
    const auto axis = [](unsigned int size, unsigned int margin, unsigned int step) {
        return GaborPyramid::Axis{step / 2 + margin, step, size > margin ? size - margin : 0};
    };
    std::vector<GaborPyramid::Grid> grids;
    for (unsigned int s = params.firstScale; s < params.endScale; ++s) {
        const double ratio = waveNumber(params.firstScale) / waveNumber(s);
        // Powers of two come out a little too small.
        const auto step = static_cast<unsigned int>(params.gridScale * ratio * (1 + 1e-12));
        grids.push_back(
            {axis(params.width, params.marginX, step), axis(params.height, params.marginY, step)});
    }
    return grids;
}

std::vector<GaborBank::Scale> scalesOf(const GaborPyramidParams& params,
                                       const std::vector<GaborPyramid::Grid>& grids,
                                       GaborPyramid::Places places) {
    const auto add = [](std::set<std::uint32_t>& columns, const GaborPyramid::Grid& grid) {
        for (unsigned int i = 0; i < grid.x.count(); ++i) columns.insert(grid.x.place(i));
    };
    std::set<std::uint32_t> all;
    for (const GaborPyramid::Grid& grid : grids) add(all, grid);
    std::vector<GaborBank::Scale> scales;
    for (unsigned int s = params.firstScale; s < params.endScale; ++s) {
        std::set<std::uint32_t> own;
        add(own, grids[s - params.firstScale]);
        const auto& columns = places == GaborPyramid::Places::ofAllGrids ? all : own;
        scales.push_back({waveNumber(s), {columns.begin(), columns.end()}});
    }
    return scales;
}

} // namespace

GaborPyramid::GaborPyramid(const GaborPyramidParams& params, Places places)
    : params_(params), grids_(makeGrids(params)),
      bank_(params.width, params.height, scalesOf(params, grids_, places), params.angles,
            static_cast<double>(params.sigma), params.filterThreshold) {}

std::size_t GaborPyramid::featureSize() const {
    std::size_t places = 0;
    for (const Grid& grid : grids_) places += std::size_t{grid.x.count()} * grid.y.count();
    return places * params_.angles;
}

} // namespace Cmp::Pcld
