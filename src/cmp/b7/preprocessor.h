#pragma once

#include "cmp/gabor_bank.h"
#include "cmp/rank_table.h"
#include "fn/vector.h"
#include "img/support_norm.h"

#include <array>

namespace Cmp::B7 {

/// From a warped face to its raw vector: contrast normalization, Gabor filters of 10 scales and 12
/// orientations, and at the points of a grid for each scale the rank of each response among its neighbours in
/// scale, orientation and place. Immutable; may be used by any number of threads.
///
/// Components run over scales, in each over the lines of its grid from top to bottom, the columns and the
/// orientations.
class PreProcessor {
public:
    static constexpr unsigned int NUM_SHAPED_GRIDS = 10;
    static constexpr unsigned int orientations = 12;
    /// Scales up and down that neighbours are in; they are one line, column and orientation away at most.
    static constexpr unsigned int scaleRadius = 2;
    static constexpr unsigned int fullNeighbourhood = (2 * scaleRadius + 1) * 27;
    static constexpr std::size_t rankTableSize = fullNeighbourhood + 1;
    static const std::array<float, rankTableSize> rankTable;

    /// @param rankTable_ rankTableSize values, which must outlive this
    explicit PreProcessor(float const* rankTable_ = rankTable.data());

    /// @throws FNEBadArg for an image of another size than warpedSize squared
    FNVector<float> operator()(FNImage<float> const& image) const;

    /// 20604
    static std::size_t computeFeatureVectorSize();

    /// Where the grid points are in the warped face, in the order of the raw vector: pixels.
    static std::vector<FNPos> gridPoints();

    /// The first half: values spread evenly over -1 to 1.
    FNImage<float> normalize(FNImage<float> const& image) const;
    const Implementation::GaborBank& bank() const { return bank_; }
    /// The ranks of responses of bank().
    FNVector<float> extract(const Implementation::GaborBank::Responses& responses) const;
    /// The same, without vectors.
    FNVector<float> extractPlain(const Implementation::GaborBank::Responses& responses) const;

private:
    static constexpr unsigned int maxLines = 26;

    using GridTable = std::array<unsigned int, NUM_SHAPED_GRIDS>;
    using LineTable = std::array<unsigned int, NUM_SHAPED_GRIDS * maxLines>;

    static const GridTable ShapedGridOffsX_, ShapedGridOffsY_;          ///< pixel of grid point (0, 0)
    static const GridTable ShapedGridLinesHoriz_, ShapedGridLinesVert_; ///< columns and lines
    static const GridTable ShapedGridSpacing_;                          ///< pixels
    /// Element s * maxLines + l: columns of line l of grid s, the end not included.
    static const LineTable ShapedGridBegin_, ShapedGridEnd_;

    static unsigned int pixelX(std::size_t s, unsigned int j) {
        return ShapedGridOffsX_[s] + j * ShapedGridSpacing_[s];
    }
    static unsigned int pixelY(std::size_t s, unsigned int l) {
        return ShapedGridOffsY_[s] + l * ShapedGridSpacing_[s];
    }
    static std::vector<Implementation::GaborBank::Scale> setupColumnSelections();

    /// Scales, lines of a grid, or columns of a line.
    struct Range {
        unsigned int begin, end;
    };
    static Range around(unsigned int place, unsigned int radius, Range all) {
        return {std::max(place, all.begin + radius) - radius, std::min(place + radius + 1, all.end)};
    }
    static Range scalesAround(unsigned int s) { return around(s, scaleRadius, {0, NUM_SHAPED_GRIDS}); }
    static Range linesAround(std::size_t s, unsigned int l) {
        return around(l, 1, {0, ShapedGridLinesVert_[s]});
    }
    static Range line(std::size_t s, unsigned int l) {
        return {ShapedGridBegin_[s * maxLines + l], ShapedGridEnd_[s * maxLines + l]};
    }

    class Neighbourhoods;

    Implementation::RankTable rank_;
    Img::SupportNorm supportNorm_;
    Implementation::GaborBank bank_;
};

} // namespace Cmp::B7
