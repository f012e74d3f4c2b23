#include "fn/imagefile/properties_feedback.h"

#include <array>

namespace Fn {

namespace {

constexpr std::array modeTexts{
    "Unknown",
    "RGB",
    "RGBA",
    "Alpha",
    "Intensity",
    "Palette",
    "Y/Cb/Cr (YUV)",
    "YUY2 ( YUV422, YCbCr422)",
    "Y/Cb/Cr/K (K is black)",
    "C/M/Y/K",
    "YVYU (subclass of YUV coding, YUV422",
    "UYVY (subclass of YUV coding, YUV422",
    "RLE8 (BMP)",
    "RLE4 (BMP)",
    "BITFIELDS (BMP)",
    "YVU9 (BMP)",
    "YV12 (BMP)",
    "I420 (BMP)",
    "IYUV (BMP)",
    "Y800 (single Y plane for monochrome images)",
    "Y8 (single Y plane for monochrome images)",
    "CIELAB (CIE L*a*b*)",
    "ICCLAB (ICC L*a*b* Adobe TIFF Technote 4",
    "ITULAB (ITU L*a*b*)",
    "LOGL (CIE Log2(L))",
    "LOGLUV (CIE Log2(L) (u',v'))",
    "MASK  (TIFF COLOR: holdout mask)",
    "SEPARATED (tiff color: color separations)",
};
static_assert(modeTexts.size() == static_cast<std::size_t>(FNImageDataCompressionMode::Separated) + 1);

} // namespace

std::string compressionModeToString(FNImageDataCompressionMode mode) {
    const auto index = static_cast<std::size_t>(mode);
    return modeTexts[index < modeTexts.size() ? index : 0];
}

} // namespace Fn
