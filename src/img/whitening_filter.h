#pragma once

#include "img/fft/img_fft.h"

/// Makes the spectrum of a natural image flat, but for high frequencies: the spectrum is multiplied with
///
///     H(r) = r * exp(-(r / cutoff)^4)
///
/// at r cycles per pixel. The mean is removed. Results are not divided by the number of pixels.
class ImgWhiteningFilter {
public:
    /// @param cutoff in cycles per pixel. @throws FNEBadArg for a size below 2.
    ImgWhiteningFilter(int width, int height, float cutoff);

    /// @throws FNEBadArg for an image of another size.
    FNImage<float> operator()(const FNImage<float>& image) const;
    /// Of pixels (v + 0.5) / 256.
    FNImage<float> operator()(const FNImage<unsigned char>& image) const;

private:
    FNCountedPtr<ImgFFTFloat> fft_;
    FNImage<float> filter_;
};

namespace Img {

/// The same filter in fixed point, with a cutoff of 0.390625 and values in bytes.
class IntWhiteningFilter {
public:
    /// Sizes are 16x16, 64x64, 80x64, 80x96, 108x108 and 160x160; any other one is reported on standard error
    /// and cannot filter.
    IntWhiteningFilter(int width, int height);

    /// @throws FNEBadArg for an image of another size, or without a filter.
    FNImage<short> operator()(const FNImage<short>& image) const;

private:
    FNCountedPtr<ImgFFTInt> fft_;
    FNImage<unsigned char> table_;
    unsigned width_, height_;
};

} // namespace Img
