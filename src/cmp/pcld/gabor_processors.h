#pragma once

#include "cmp/pcld/gabor_pyramid.h"
#include "cmp/rank_table.h"

namespace Cmp::Pcld {

/// The magnitudes of filter responses: by scale, row, column and angle. Immutable.
class GaborPyrProcessor {
public:
    struct Params {
        unsigned int width, height;
        unsigned int firstScale, endScale;
        unsigned int angles;
        float gridScale;
        unsigned int marginX, marginY;
        unsigned int variant; ///< only 0 is known
        float filterThreshold;
        float sigma;
    };

    /// @throws FNEBadArg as GaborPyramid, or for another variant than 0
    explicit GaborPyrProcessor(const Params& params);
    /// @throws FNEBadArg for an image of another size
    FNVector<float> operator()(const FNImage<float>& image) const;
    std::size_t featureSize() const { return pyramid_.featureSize(); }

private:
    GaborPyramid pyramid_;
};

/// Ranks of filter responses among their neighbours in scale, angle and place, turned into numbers by a
/// table: what is left does not depend on brightness and contrast. Order as of GaborPyrProcessor. Immutable.
class GaborPyrRankNormProcessor {
public:
    struct Params {
        unsigned int width, height;
        unsigned int firstScale, endScale;
        unsigned int angles; ///< at least 3, so that neighbours are different ones
        float gridScale;
        unsigned int marginX, marginY;
        float filterThreshold;
        float sigma;
        unsigned int scaleRadius, angleRadius, xRadius, yRadius; ///< only 1 is known
        const float* rankTable;                                  ///< rankTableSize values
    };

    /// @throws FNEBadArg as GaborPyramid, or for other radii than 1
    explicit GaborPyrRankNormProcessor(const Params& params);
    /// @throws FNEBadArg for an image of another size
    FNVector<float> operator()(const FNImage<float>& image) const;
    std::size_t featureSize() const { return pyramid_.featureSize(); }

private:
    GaborPyramid pyramid_;
    Implementation::RankTable rankTable_;
};

} // namespace Cmp::Pcld
