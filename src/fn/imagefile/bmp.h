#pragma once

#include "fn/image_reference.h"
#include "fn/imagefile/image_limits.h"
#include "fn/imagefile/properties_feedback.h"

#include <array>
#include <iosfwd>
#include <vector>

/// Windows bitmaps, as files and as what capture devices deliver. Own reader and writer.

namespace Fn {

/// The header BITMAPINFOHEADER behind its size, in stored order. Later headers, of 52 to 124 bytes, begin
/// with it; masks of red, green, blue and alpha follow, and what tells of colour spaces.
struct BitmapInfo {
    std::int32_t width;
    std::int32_t height; ///< negative: rows lie top to bottom
    std::uint16_t planes;
    std::uint16_t bitCount;    ///< of one pixel
    std::uint32_t compression; ///< a small number or four characters, see BitmapCoding
    std::uint32_t sizeImage;   ///< bytes of the pixels, 0 if not given
    std::int32_t xPixelsPerMeter;
    std::int32_t yPixelsPerMeter;
    std::uint32_t colorsUsed; ///< entries of the colour table, 0 stands for all that bitCount allows
    std::uint32_t colorsImportant;
};

/// The values of BitmapInfo::compression, without the high bit of each character.
enum class BitmapCoding : std::uint32_t {
    Rgb = 0,
    Rle8 = 1,
    Rle4 = 2,
    BitFields = 3,
    Rgb5 = 0x35424752, // "RGB5"
    Yuy2 = 0x32595559,
    Yvyu = 0x55595659,
    Uyvy = 0x59565955,
    Yvu9 = 0x39555659,
    Yv12 = 0x32315659,
    I420 = 0x30323449,
    Iyuv = 0x56555949,
    Y800 = 0x30303859,
    Y8 = 0x20203859
};

/// A bitmap in memory.
struct Bitmap {
    BitmapInfo info;
    std::vector<unsigned char> colorTable; ///< entries of blue, green, red, 0; or three masks of 4 bytes
    std::vector<unsigned char> pixels;
    std::uint32_t alphaMask = 0; ///< with three masks: of the alpha; 0 if all is opaque

    BitmapCoding coding() const { return static_cast<BitmapCoding>(info.compression & 0x7F7F7F7F); }
    std::uint32_t w() const { return static_cast<std::uint32_t>(info.width); }
    std::uint32_t h() const {
        return info.height < 0 ? 0u - static_cast<std::uint32_t>(info.height)
                               : static_cast<std::uint32_t>(info.height);
    }
};

/// Bytes of the pixels as the header gives them. @throws FNEIOError if that is none.
std::uint64_t getBitmapSize(const BitmapInfo& info);

/// Gray values: of a bitmap of 8 bits, of the luma plane of planar and Y800 bitmaps, or the luminance of
/// colours.
/// @throws FNEBadArg for another coding.
FNImage<unsigned char> bmp2ByteImg(const Bitmap& bitmap);
/// @throws FNEBadArg for an unknown coding; FNESysError for a wrong one of 32-bit pixels.
FNImage<Bgra32> bmp2ColorImg(const Bitmap& bitmap);

/// Reads a file. 8 bits without a colour table of their own, "Y800" and "Y8  " give mono8, all else bgra32.
/// The first two bytes are not looked at. The pixels begin where the file header tells, unless that is within
/// the headers or the colour table; then they follow these. Rare variants are RLE4, RLE8 and later headers
/// than that of 40 bytes.
/// @throws FNESysError for a header of another size; FNEBadArg for an unknown coding; FNEIOError if the
/// stream ends too early; what the conversions throw.
FNImageReference readBMP(std::istream& stream, const ReadImagePropertiesFeedback& feedback = {},
                         const ImageLimits& limits = {});
/// @throws FNEIOError if the file cannot be opened.
FNImageReference loadBMP(const std::string& fileName, const ReadImagePropertiesFeedback& feedback = {},
                         const ImageLimits& limits = {});

/// Writes colour with 24 bits for each pixel, all else with 8 and a table of grays, top to bottom.
/// @throws FNEIOError if the target fails; FNEBadArg if the image has no pixels or more than such a file can
/// hold.
void dumpBMP(const FNImageReference& image, std::ostream& stream);
void saveBMP(const FNImageReference& image, const std::string& fileName);

/// The header's fields as text for people, one a line.
void dumpBMPInfo(const BitmapInfo& info, std::ostream& stream);

} // namespace Fn
