#pragma once

#include "orbek/image.h"

#include <cstdint>
#include <iosfwd>
#include <string>

/// Reading and writing images, one namespace for each format.
///
///     const Orbek::Image image = Orbek::ImageIO::load("portrait.jpg");
///     Orbek::Jpeg::save(image, "copy.jpg", 90);
///
/// Readers take files up to 65535 columns, 65535 rows and 2^27 pixels, unless ImageIO::setLimits() says
/// otherwise. A file that is saved appears whole or not at all: after a failure, what was there before is
/// there still. All failures are exceptions derived from std::exception whose text names what is wrong.

namespace Orbek {

#pragma GCC visibility push(default)

namespace ImageIO {

/// How the pixels of a file are coded.
enum class ColorMode {
    Unknown,
    Rgb,
    Rgba,
    Alpha,
    Intensity,
    Palette,
    YCbCr,
    Yuy2,
    YCbCrK,
    Cmyk,
    Yvyu,
    Uyvy,
    Rle8,
    Rle4,
    BitFields,
    Yvu9,
    Yv12,
    I420,
    Iyuv,
    Y800,
    Y8,
    CieLab,
    IccLab,
    ItuLab,
    LogL,
    LogLuv,
    Mask,
    Separated
};

/// Told by a reader how the pixels of the file are stored, before they are decoded.
class PropertiesFeedbackBody {
public:
    PropertiesFeedbackBody();
    PropertiesFeedbackBody(const PropertiesFeedbackBody&) = delete;
    PropertiesFeedbackBody& operator=(const PropertiesFeedbackBody&) = delete;
    virtual ~PropertiesFeedbackBody();

    virtual void compressionMode(const ColorMode& mode) = 0;
    /// @param bits of one pixel over all its samples
    virtual void pixelDepth(unsigned int bits) = 0;
};

using PropertiesFeedback = CountedPtr<PropertiesFeedbackBody>;

/// Ignores what it is told.
class DummyPropertiesFeedback : public PropertiesFeedbackBody {
public:
    DummyPropertiesFeedback();
    ~DummyPropertiesFeedback() override;
    void compressionMode(const ColorMode&) override;
    void pixelDepth(unsigned int) override;
};

/// A DummyPropertiesFeedback.
PropertiesFeedback noFeedback();

/// What a file may make its reader do. A file that announces more is refused before memory is taken for it.
struct Limits {
    /// Columns, rows and pixels of an image. Formats have limits of their own, such as 65500 columns and rows
    /// in JPEG.
    std::uint32_t maxWidth = 65535;
    std::uint32_t maxHeight = 65535;
    std::uint64_t maxPixels = 1u << 27;
    /// Memory for an image while it is decoded. A colour image takes 4 bytes for each pixel, or 6 with 16
    /// bits for each sample; JPEG 2000 takes 24, and TIFF and JPEG 2000 hold the file beside it.
    std::uint64_t maxBytes = 1u << 30;
};
/// The limits of the process.
Limits limits();
/// Sets the limits for all that the process reads from now on. May be called while other threads read: these
/// go on with the limits that they began with.
/// @throws std::exception for a limit of 0, or more than 2^31 - 1 columns or rows
void setLimits(const Limits& limits);

/// Reads JPEG, PNG, JPEG 2000, TIFF, PBM, PGM, PPM and BMP, told apart by their first bytes; the file form
/// also looks into a gzip file.
Image load(const std::string& fileName, const PropertiesFeedback& feedback = noFeedback());
Image load(std::istream& stream, const PropertiesFeedback& feedback = noFeedback());

} // namespace ImageIO

using ImageIO::noFeedback;
using ImageIO::PropertiesFeedback;

namespace Bmp {

Image load(const std::string& fileName, const PropertiesFeedback& feedback = noFeedback());
Image load(std::istream& stream, const PropertiesFeedback& feedback = noFeedback());
/// 24 bits a pixel for colour, 8 for gray.
void save(const Image& image, const std::string& fileName);

} // namespace Bmp

namespace Jpeg {

Image load(const std::string& fileName, const PropertiesFeedback& feedback = noFeedback());
Image load(std::istream& stream, const PropertiesFeedback& feedback = noFeedback());
Image load(const char* data, unsigned int size, const PropertiesFeedback& feedback = noFeedback());
/// @param quality 1 to 100
void save(const Image& image, std::ostream& stream, int quality);
void save(const Image& image, const std::string& fileName, int quality);

struct SizeAndQuality {
    std::int32_t size; ///< bytes
    std::int32_t quality;
};
/// Writes with the first of the qualities 100, 95, ..., 5 at which the file is no larger than `maxBytes`.
/// @throws std::exception if there is none; the stream is untouched then
SizeAndQuality saveWithSizeConstraint(const Image& image, std::ostream& stream, int maxBytes);

} // namespace Jpeg

namespace Jpeg2000 {

Image load(const std::string& fileName, const PropertiesFeedback& feedback = noFeedback());
Image load(std::istream& stream, const PropertiesFeedback& feedback = noFeedback());
Image load(const char* data, unsigned int size, const PropertiesFeedback& feedback = noFeedback());

} // namespace Jpeg2000

namespace Pgm {

Image load(const std::string& fileName, const PropertiesFeedback& feedback = noFeedback());
/// A PPM file for colour, a PGM file for gray, of 8 bits.
void save(const Image& image, const std::string& fileName);

} // namespace Pgm

namespace Png {

Image load(const std::string& fileName, const PropertiesFeedback& feedback = noFeedback());
Image load(std::istream& stream, const PropertiesFeedback& feedback = noFeedback());
/// @param level of compression: 0 (none) to 9 (best), negative for the usual one
void save(const Image& image, std::ostream& stream, int level);
void save(const Image& image, const std::string& fileName, int level = -1);

} // namespace Png

#pragma GCC visibility pop

} // namespace Orbek
