#pragma once

#include "cmp/gabor_bank.h"
#include "fn/vector.h"

#include <vector>

namespace Cmp::Pcld {

/// What the Gabor pyramid processors have in common: a bank of filters, and one grid of places for each
/// scale.
struct GaborPyramidParams {
    unsigned int width, height;        ///< of the images, pixels
    unsigned int firstScale, endScale; ///< wave numbers are pi * sqrt(2)^-scale
    unsigned int angles;               ///< orientations k * pi / angles
    float gridScale;                   ///< spacing of the first grid, pixels
    unsigned int marginX, marginY;     ///< pixels beside the grids
    float filterThreshold;             ///< filters are cut off below it
    float sigma;                       ///< width of the filters, see Img::gaborInFourier()
};

/// The responses of a bank of Gabor filters, at the places of the grids. Immutable.
///
/// Grids get wider as the wave number gets smaller: the spacing S of a scale is gridScale times the ratio of
/// the first wave number to its own, truncated. The places of a grid are the lattice from margin + S / 2 (in
/// integers) with step S, as far as it lies inside of the margins.
class GaborPyramid {
public:
    /// One axis of a grid: first, first + step and so on below `end`.
    struct Axis {
        unsigned int first, step, end;
        unsigned int count() const { return first < end ? (end - first - 1) / step + 1 : 0; }
        unsigned int place(unsigned int i) const { return first + i * step; }
    };
    struct Grid {
        Axis x, y;
    };

    using Responses = Implementation::GaborBank::Responses;

    /// In which columns a scale responds.
    enum class Places { ofOwnGrid, ofAllGrids };

    /// @throws FNEBadArg for parameters without any filter, scales above 40 or a size that has no transform
    GaborPyramid(const GaborPyramidParams& params, Places places);

    /// @throws FNEBadArg for an image of another size
    Responses respond(const FNImage<float>& image) const { return bank_.respond(image); }

    const GaborPyramidParams& params() const { return params_; }
    /// By scale from the first one.
    const std::vector<Grid>& grids() const { return grids_; }
    /// Number of places of all grids times that of angles.
    std::size_t featureSize() const;

    /// Calls use(scale, x, y, angle) in the order of features.
    template <class Use> void forEachFeature(Use use) const {
        for (std::size_t s = 0; s < grids_.size(); ++s)
            for (unsigned int y = grids_[s].y.first; y < grids_[s].y.end; y += grids_[s].y.step)
                for (unsigned int x = grids_[s].x.first; x < grids_[s].x.end; x += grids_[s].x.step)
                    for (unsigned int a = 0; a < params_.angles; ++a) use(s, x, y, a);
    }

private:
    GaborPyramidParams params_;
    std::vector<Grid> grids_;
    Implementation::GaborBank bank_;
};

} // namespace Cmp::Pcld
