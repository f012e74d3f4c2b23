#pragma once

#include "fn/image.h"

#include <array>
#include <concepts>

/// Small filters in the neighbourhood of each pixel. Boxes are cut to the image; nothing left gives an empty
/// image.

/// Median of the 3 by 3 pixels around each pixel of the box that lies at least 1 inside of the image; the
/// result has the size of those. For `float`, `unsigned char`, `unsigned short`, `short` and `int`.
template <class T> FNImage<T> imgMedian3x3(const FNImage<T>& image, const FNBox& box);

/// Mean over a window of width / 2 pixels to the left and width - width / 2 - 1 to the right of each pixel of
/// the box, and rows likewise; the window is cut at the box. Integer means drop the fraction. For `float`,
/// `unsigned char` and `unsigned short`. @throws FNEBadArg for a window without pixels.
template <class T> FNImage<T> imgMean(const FNImage<T>& image, int width, int height, const FNBox& box);

/// Census transform (R. Zabih, J. Woodfill, 1994): for each pixel of the box at least 1 inside of the image,
/// a bit for each neighbour that is less. Neighbours go row by row from the upper left one (the highest bit).
/// The result has the size of those pixels. For `float`, `unsigned char` and `unsigned short`.
template <class T> FNImage<unsigned char> imgCensusTransform3x3(const FNImage<T>& image, const FNBox& box);

/// Number of pixels of each value.
std::array<int, 256> imgGrayHistogram(const FNImage<unsigned char>& image);

/// Number of pixels of each value, of those whose position `accepts`.
template <std::predicate<FNGridPos> Predicate>
std::array<int, 256> imgGrayHistogram(const FNImage<unsigned char>& image, Predicate accepts) {
    std::array<int, 256> bins{};
    for (std::uint32_t y = 0; y < image.h(); ++y)
        for (std::uint32_t x = 0; x < image.w(); ++x)
            if (accepts(FNGridPos(FN2Vector<std::uint32_t>(x, y)))) ++bins[image(x, y)];
    return bins;
}
