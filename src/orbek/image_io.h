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
/// Readers take files up to 65535 columns, 65535 rows and 2^27 pixels. All failures are exceptions derived
/// from std::exception whose text names what is wrong.

namespace Orbek {

namespace [[gnu::visibility("default")]] ImageIO {

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

/// Reads JPEG, PNG, JPEG 2000, TIFF, PGM, PPM and BMP, told apart by their first bytes; the file form also
/// looks into a gzip file.
Image load(const std::string& fileName, const PropertiesFeedback& feedback = noFeedback());
Image load(std::istream& stream, const PropertiesFeedback& feedback = noFeedback());

} // namespace gnu::visibility("default")]]ImageIO

using ImageIO::noFeedback;
using ImageIO::PropertiesFeedback;

namespace [[gnu::visibility("default")]] Bmp {

Image load(const std::string& fileName, const PropertiesFeedback& feedback = noFeedback());
Image load(std::istream& stream, const PropertiesFeedback& feedback = noFeedback());
/// 24 bits a pixel for colour, 8 for gray.
void save(const Image& image, const std::string& fileName);

} // namespace gnu::visibility("default")]]Bmp

namespace [[gnu::visibility("default")]] Jpeg {

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

} // namespace gnu::visibility("default")]]Jpeg

namespace [[gnu::visibility("default")]] Jpeg2000 {

Image load(const std::string& fileName, const PropertiesFeedback& feedback = noFeedback());
Image load(std::istream& stream, const PropertiesFeedback& feedback = noFeedback());
Image load(const char* data, unsigned int size, const PropertiesFeedback& feedback = noFeedback());

} // namespace gnu::visibility("default")]]Jpeg2000

namespace [[gnu::visibility("default")]] Pgm {

Image load(const std::string& fileName, const PropertiesFeedback& feedback = noFeedback());
/// A PPM file for colour, a PGM file for gray, of 8 bits.
void save(const Image& image, const std::string& fileName);

} // namespace gnu::visibility("default")]]Pgm

namespace [[gnu::visibility("default")]] Png {

Image load(const std::string& fileName, const PropertiesFeedback& feedback = noFeedback());
Image load(std::istream& stream, const PropertiesFeedback& feedback = noFeedback());
/// @param level of compression: 0 (none) to 9 (best), negative for the usual one
void save(const Image& image, std::ostream& stream, int level);
void save(const Image& image, const std::string& fileName, int level = -1);

} // namespace gnu::visibility("default")]]Png

} // namespace Orbek
