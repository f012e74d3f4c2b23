#include "cmp/pcld/gabor_processors.h"

#include "cmp/pcld/rank_tables.h"

#include <cmath>

namespace Cmp::Pcld {

namespace {

GaborPyramidParams pyramidParams(const auto& p) {
    return {p.width,     p.height,  p.firstScale, p.endScale,        p.angles,
            p.gridScale, p.marginX, p.marginY,    p.filterThreshold, p.sigma};
}

/// The places of an axis within one step of a place.
struct Neighbourhood {
    Neighbourhood(const GaborPyramid::Axis& axis, unsigned int place)
        : first(place - axis.first >= axis.step ? place - axis.step : axis.first),
          end(place + axis.step < axis.end ? place + axis.step + 1 : place + 1) {}

    unsigned int first, end;
};

} // namespace

GaborPyrProcessor::GaborPyrProcessor(const Params& params)
    : pyramid_(pyramidParams(params), GaborPyramid::Places::ofOwnGrid) {
    if (params.variant != 0) FN_THROW(FNEBadArg, "Gabor pyramid: invalid parameters");
}

FNVector<float> GaborPyrProcessor::operator()(const FNImage<float>& image) const {
    const GaborPyramid::Responses responses = pyramid_.respond(image);
    const float scale =
        1 / (static_cast<float>(image.w()) * static_cast<float>(image.h())); // of the transforms
    FNVector<float> features(pyramid_.featureSize());
    float* out = features.getExclusive();
    pyramid_.forEachFeature([&](std::size_t s, unsigned int x, unsigned int y, unsigned int a) {
        *out++ = std::sqrt(responses(s, a, x, y)) * scale;
    });
    return features;
}

GaborPyrRankNormProcessor::GaborPyrRankNormProcessor(const Params& params)
    : pyramid_(pyramidParams(params), GaborPyramid::Places::ofAllGrids),
      rankTable_({params.rankTable, rankTableSize}, rankTableSize) {
    for (const unsigned int radius : {params.scaleRadius, params.angleRadius, params.xRadius, params.yRadius})
        if (radius != 1) FN_THROW(FNEBadArg, "Gabor pyramid: invalid parameters");
    if (params.angles < 3) FN_THROW(FNEBadArg, "Gabor pyramid: invalid parameters");
}

FNVector<float> GaborPyrRankNormProcessor::operator()(const FNImage<float>& image) const {
    const GaborPyramid::Responses responses = pyramid_.respond(image);
    const std::vector<GaborPyramid::Grid>& grids = pyramid_.grids();
    const unsigned int angles = pyramid_.params().angles;
    FNVector<float> features(pyramid_.featureSize());
    float* out = features.getExclusive();
    pyramid_.forEachFeature([&](std::size_t s, unsigned int x, unsigned int y, unsigned int a) {
        const float value = responses(s, a, x, y);
        const Neighbourhood columns(grids[s].x, x), rows(grids[s].y, y);
        const unsigned int neighbourAngles[] = {(a + angles - 1) % angles, a, (a + 1) % angles};
        unsigned int total = 0, greater = 0;
        for (std::size_t s2 = s == 0 ? 0 : s - 1; s2 <= std::min(s + 1, grids.size() - 1); ++s2)
            for (const unsigned int a2 : neighbourAngles)
                for (unsigned int y2 = rows.first; y2 < rows.end; y2 += grids[s].y.step)
                    for (unsigned int x2 = columns.first; x2 < columns.end; x2 += grids[s].x.step) {
                        ++total;
                        greater += responses(s2, a2, x2, y2) > value; // the value itself is not
                    }
        *out++ = rankTable_(greater, total);
    });
    return features;
}

} // namespace Cmp::Pcld
