#pragma once

#include "img/histogram_equalizer.h"

/// Overlapping tiles that cover an image: at multiples of a step and, where that does not reach the end, one
/// more that ends with the image.
template <class T> class NearlyRegularGrid {
public:
    /// @throws FNEBadArg if a size or a step is not positive, or a tile larger than the image.
    NearlyRegularGrid(const FNImage<T>& image, int dx, int dy, int tileWidth, int tileHeight);

    /// Number of tiles along each axis.
    int nx() const { return nx_; }
    int ny() const { return ny_; }
    /// Upper left corner of tile (i, j).
    FNGridPos corner(int i, int j) const;
    /// The pixels of tile (i, j).
    FNBox box(int i, int j) const;

    /// The two tiles between whose middles a pixel lies, along one axis: it takes 1 - weight of the first and
    /// `weight` of the second. Pixels before the first middle and behind the last one have one tile only,
    /// twice, and weight 0.
    struct Neighbours {
        int first, second;
        float weight;
    };
    Neighbours alongX(int x) const;
    Neighbours alongY(int y) const;

private:
    static Neighbours neighbours(int x, int size, int tile, float halfTile, int step, int tiles);

    FNImage<T> image_;
    int dx_, dy_, tileWidth_, tileHeight_;
    float halfTileWidth_, halfTileHeight_;
    int nx_, ny_;
};

/// Equalises each pixel with the histograms of the tiles around it, of which bilinear interpolation makes one
/// mapping.
/// @throws FNEBadArg as NearlyRegularGrid and HistogramEqualizer do.
FNImage<float> imgLocalAdaptiveHistogramEqualization(const FNImage<float>& image, int dx, int dy,
                                                     unsigned tileWidth, unsigned tileHeight, float min,
                                                     float max);
/// Rounds to the nearest integer. Tiles have a power of two of pixels.
FNImage<short> imgLocalAdaptiveHistogramEqualization(const FNImage<short>& image, int dx, int dy,
                                                     unsigned tileWidth, unsigned tileHeight, short min,
                                                     short max);
