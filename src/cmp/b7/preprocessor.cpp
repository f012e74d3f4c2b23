#include "cmp/b7/preprocessor.h"

#include "cmp/b7/reshape_warp.h"
#include "img/histogram_equalizer.h"

#include <cmath>
#include <numbers>
#include <set>

namespace Cmp::B7 {

namespace {

using Implementation::GaborBank;

constexpr unsigned int firstScale = 6;
constexpr double scaleRatio = 1.18920708; // fourth root of 2
constexpr double filterSigma = 6.2831854820251465;
constexpr float filterThreshold = 1e-5f;

} // namespace

PreProcessor::PreProcessor(float const* rankTable_)
    : rank_({rankTable_, rankTableSize}, fullNeighbourhood), supportNorm_(4.0f, 6, 0.007f, 1.007f),
      bank_(warpedSize, warpedSize, setupColumnSelections(), orientations, filterSigma, filterThreshold) {}

/// A scale needs the columns of its own grid and of those that look at it.
std::vector<GaborBank::Scale> PreProcessor::setupColumnSelections() {
    std::vector<GaborBank::Scale> scales;
    for (unsigned int s = 0; s < NUM_SHAPED_GRIDS; ++s) {
        std::set<std::uint32_t> columns;
        const Range grids = scalesAround(s);
        for (unsigned int grid = grids.begin; grid < grids.end; ++grid)
            for (unsigned int j = 0; j < ShapedGridLinesHoriz_[grid]; ++j)
                if (pixelX(grid, j) < warpedSize) columns.insert(pixelX(grid, j));
        scales.push_back({std::numbers::pi * std::pow(scaleRatio, -static_cast<double>(firstScale + s)),
                          {columns.begin(), columns.end()}});
    }
    return scales;
}

std::vector<FNPos> PreProcessor::gridPoints() {
    std::vector<FNPos> points;
    for (std::size_t s = 0; s < NUM_SHAPED_GRIDS; ++s)
        for (unsigned int l = 0; l < ShapedGridLinesVert_[s]; ++l)
            for (unsigned int j = line(s, l).begin; j < line(s, l).end; ++j)
                points.push_back({static_cast<float>(pixelX(s, j)), static_cast<float>(pixelY(s, l))});
    return points;
}

std::size_t PreProcessor::computeFeatureVectorSize() {
    return gridPoints().size() * orientations;
}

FNImage<float> PreProcessor::normalize(FNImage<float> const& image) const {
    return imgEqualizeHistogram(supportNorm_(image), -1.0f, 1.0f);
}

FNVector<float> PreProcessor::operator()(FNImage<float> const& image) const {
    return extract(bank_.respond(normalize(image)));
}

FNVector<float> PreProcessor::extractPlain(const GaborBank::Responses& responses) const {
    FNVector<float> ranks(computeFeatureVectorSize());
    float* out = ranks.getExclusive();
    for (unsigned int s = 0; s < NUM_SHAPED_GRIDS; ++s)
        for (unsigned int l = 0; l < ShapedGridLinesVert_[s]; ++l)
            for (unsigned int j = line(s, l).begin; j < line(s, l).end; ++j)
                for (unsigned int o = 0; o < orientations; ++o) {
                    const float value = responses(s, o, pixelX(s, j), pixelY(s, l));
                    unsigned int total = 0, greater = 0;
                    const Range scales = scalesAround(s), lines = linesAround(s, l);
                    for (unsigned int ss = scales.begin; ss < scales.end; ++ss)
                        for (unsigned int l2 = lines.begin; l2 < lines.end; ++l2) {
                            const Range columns = around(j, 1, line(s, l2));
                            for (unsigned int j2 = columns.begin; j2 < columns.end; ++j2)
                                for (const unsigned int turn : {orientations - 1, 0u, 1u}) {
                                    ++total;
                                    // The value itself is not greater.
                                    greater += responses(ss, (o + turn) % orientations, pixelX(s, j2),
                                                         pixelY(s, l2)) > value;
                                }
                        }
                    *out++ = rank_(greater, total);
                }
    return ranks;
}

} // namespace Cmp::B7
