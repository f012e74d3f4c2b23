#pragma once

#include "fn/image.h"
#include "fn/matrix.h"

#include <list>
#include <vector>

namespace Cmp::Portrait {

/// 1 if what is behind the head has one colour, with at most a slow change of brightness and nothing in it; 0
/// otherwise. A portrait that ends less than about 1.5 eye distances below the eyes gives 0, as do eyes so
/// close to each other that the picture would have to be enlarged beyond 2^25 pixels.
float backgroundUniformity(const FNImage<Fn::Bgra32>& image, FNPos eye0, FNPos eye1);

/// The steps of that, on labels: element (y, x) of the matrix is the label of pixel (x, y), `masked` for one
/// that is left out. Regions are the pixels of each label in raster order, by label.
class BackgroundUniformity {
public:
    using Image = FNImage<Fn::Bgra32>;
    using Labels = Fn::Matrix<int>;
    using Region = std::list<FNGridPos>;

    static constexpr int masked = -1;

    /// Gives neighbours one label where their colours differ by less than the tolerance in each channel.
    /// Labels go from 0 on without gaps, in raster order of their first pixels.
    /// @param mask not 0 for pixels to leave out
    static Labels segment(const Image& image, const FNImage<unsigned char>& mask, int tolerance);

    /// Gives regions the background's label that have the brightness which the background, by its mean and
    /// slope, would have at their centroid. @return the regions after that
    static std::vector<Region> mergeRegionsToBackground(const Image& image, Labels& labels, int background);

    /// Whether a region of more than 8 pixels reaches the last row that is neither background nor joined to
    /// the head.
    static bool thereAreObjectsTouchingShoulders(const Labels& labels, const std::vector<Region>& regions,
                                                 int background, int head);

    /// Whether one can get from region `a` to label `b` without crossing background or masked pixels.
    static bool regionsAreConnected(const Labels& labels, const std::vector<Region>& regions, int background,
                                    int a, int b);

    /// Whether the background has one hue, one saturation and no texture.
    static bool newRegionGradient(const Image& image, const Region& background, const Labels& labels);

    /// Whether there is something of more than 14 pixels in the background that does not touch what is
    /// masked.
    static bool thereAreIsolatedRegionsInsideBackground(const Labels& labels, int background);
};

} // namespace Cmp::Portrait
