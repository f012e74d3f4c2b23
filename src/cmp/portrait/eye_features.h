#pragma once

#include "fn/exception.h"
#include "img/gabor/components_extractor.h"

#include <string>

/// Features of one eye, a patch of 16 by 16 pixels of the standard portrait.

namespace Cmp::Portrait {

/// Gabor responses on a grid of the patch, in blocks that do not depend on contrast. `Kind` has a name, the
/// parameters of the transformation and the grid. Immutable.
template <class Kind> class EyeFeatureExtractor {
public:
    static constexpr std::size_t featureSize =
        std::size_t{(Kind::Grid::endX - Kind::Grid::firstX + Kind::Grid::step - 1) / Kind::Grid::step} *
        ((Kind::Grid::endY - Kind::Grid::firstY + Kind::Grid::step - 1) / Kind::Grid::step) * 3 *
        Kind::Parameters::filters;

    /// @throws FNEBadArg for a patch of another size
    FNVector<float> extract(const FNImage<float>& patch) const {
        const FNVector<float> features =
            Img::Gabor::MRIComponentsExtractor::extract<typename Kind::Grid>(gabor_.transform(patch))
                .values();
        if (features.size() != featureSize)
            FN_THROW(FNEBadArg, std::string(Kind::name) + "::extract: invalid extractor!");
        return features;
    }

private:
    Img::Gabor::GaborFourierTransformation<float, typename Kind::Parameters> gabor_;
};

struct ClosedEye {
    static constexpr const char* name = "ClosedEyeFeatureExtractor";
    using Parameters = Img::Gabor::TransformationParameters<16, 16, 0, 2, 6>;
    using Grid = Img::MaskGridParameters<16, 16, 3, 6, 1>;
};
using ClosedEyeFeatureExtractor = EyeFeatureExtractor<ClosedEye>;
static_assert(ClosedEyeFeatureExtractor::featureSize == 1440);

struct GazeAway {
    static constexpr const char* name = "GazeAwayFeatureExtractor";
    using Parameters = Img::Gabor::TransformationParameters<16, 16, 1, 3, 3>;
    using Grid = Img::MaskGridParameters<16, 16, 3, 6, 2>;
};
using GazeAwayFeatureExtractor = EyeFeatureExtractor<GazeAway>;
static_assert(GazeAwayFeatureExtractor::featureSize == 180);

} // namespace Cmp::Portrait
