#pragma once

#include "fn/image.h"

#include <vector>

/// Maps the values of an image so that they spread evenly over a range: a value goes to its rank among the
/// pixels of a box. The rank is the mean position of equal values in the sorted order; values between two
/// that occur are interpolated.
template <class T> class HistogramEqualizer;

template <> class HistogramEqualizer<float> {
public:
    struct Item {
        float value;
        double rank; ///< 0 to N - 1
    };

    /// @throws FNEBadArg unless min < max.
    HistogramEqualizer(const FNImage<float>& image, const FNBox& box, float min, float max);

    /// In [min, max]; the value itself if the box has no pixels.
    float operator()(float value) const;

    const std::vector<Item>& items() const { return items_; }

private:
    std::vector<Item> items_; ///< values ascend
    float min_, max_;
    double scale_;
};

/// In integers, for boxes whose number of pixels is a power of two, by which ranks are divided with a shift.
/// With any other number, values hit the ends of the range.
template <> class HistogramEqualizer<short> {
public:
    struct Item {
        short value;
        unsigned rank;
    };

    /// @throws FNEBadArg unless min < max.
    HistogramEqualizer(const FNImage<short>& image, const FNBox& box, short min, short max);

    short operator()(short value) const;

    const std::vector<Item>& items() const { return items_; }

private:
    std::int64_t scaled(std::int64_t rank) const { return (std::int64_t{max_} - min_) * rank >> shift_; }

    std::vector<Item> items_; ///< values ascend
    short min_, max_;
    int shift_ = 0;
};

/// Equalises all pixels with the histogram of the whole image, or of the rectangle between two points.
/// @param useBox whether there is a rectangle: from the smaller to below the greater of the coordinates
/// @throws FNEBadArg unless min < max.
FNImage<float> imgEqualizeHistogram(const FNImage<float>& image, float min, float max, bool useBox = false,
                                    int x0 = 0, int y0 = 0, int x1 = 0, int y1 = 0);

/// Maps a value to min + (max - min) times the fraction of the pixels that are less, plus half the fraction
/// of those that are equal. @throws FNEBadArg unless min < max.
FNImage<short> imgEqualizeHistogram(const FNImage<short>& image, short min, short max);
