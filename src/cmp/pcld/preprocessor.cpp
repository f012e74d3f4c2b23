#include "cmp/pcld/preprocessor.h"

#include "img/contrast.h"
#include "img/histogram_equalizer.h"
#include "img/local_equalization.h"

namespace Cmp::Pcld {

namespace {

constexpr float whiteningCutoff = 0.390625f; // cycles per pixel

} // namespace

Normalizer::Normalizer(unsigned int width, unsigned int height, Normalization normalization)
    : normalization_(normalization),
      whitening_(static_cast<int>(width), static_cast<int>(height), whiteningCutoff) {}

FNImage<float> Normalizer::operator()(const FNImage<float>& image) const {
    if (normalization_ == Normalization::none) return image;
    FNImage<float> result = whitening_(image);
    if (normalization_ == Normalization::localAndGlobal)
        result = imgLocalAdaptiveHistogramEqualization(result, 8, 8, 16, 16, -1.0f, 1.0f);
    return Img::normalizeContrast(imgEqualizeHistogram(result, -1.0f, 1.0f));
}

} // namespace Cmp::Pcld
