#pragma once

#include "fn/complex.h"
#include "fn/geometry.h"
#include "fn/image.h"
#include "fn/sparse_image.h"

namespace Img {

/// Fills an image with a Gabor filter in the frequency domain, frequency zero at (0, 0) as an FFT has it. All
/// values are real.
///
/// The filter is a Gaussian around the frequency of the wave vector, less one around frequency zero that
/// makes the filter blind to the mean, both summed over the aliases from -3 to 3 in each axis: with f = (X /
/// w, Y / h) and C = 2 pi^2 sigma^2 / |k|^2,
///
///     2 pi sum over n, m of exp(-C |f + (n, m) - k / 2 pi|^2) - exp(-sigma^2 / 2 - C |f + (n, m)|^2)
///
/// @param sigma width of the filter in space, in units of the wave length divided by 2 pi
/// @param k wave vector in radians per pixel, not zero
/// @param eps a term counts as 0 if it is not above eps / (w * h)
void gaborInFourier(double sigma, FN2Vector<double> k, FNImage<FNComplex<float>>& image, double eps);

/// The real parts that are not 0 and not below `threshold` in magnitude, on the blocks of columns and rows
/// that hold any.
SparseImage<float> pruneGaborImage(const FNImage<FNComplex<float>>& filter, float threshold);

} // namespace Img
