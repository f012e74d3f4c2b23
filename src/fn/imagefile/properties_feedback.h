#pragma once

#include "fn/cptr.h"

#include <string>

namespace Fn {

/// How the pixels of a file are coded.
enum class FNImageDataCompressionMode {
    Unknown = 0,
    Rgb = 1,
    Rgba = 2,
    Alpha = 3,
    Intensity = 4,
    Palette = 5,
    YCbCr = 6,
    Yuy2 = 7,
    YCbCrK = 8,
    Cmyk = 9,
    Yvyu = 10,
    Uyvy = 11,
    Rle8 = 12,
    Rle4 = 13,
    BitFields = 14,
    Yvu9 = 15,
    Yv12 = 16,
    I420 = 17,
    Iyuv = 18,
    Y800 = 19,
    Y8 = 20,
    CieLab = 21,
    IccLab = 22,
    ItuLab = 23,
    LogL = 24,
    LogLuv = 25,
    Mask = 26,
    Separated = 27
};

/// A text for people; that of Unknown for a value that is none of the above.
std::string compressionModeToString(FNImageDataCompressionMode mode);

/// Told by the readers of image files how the pixels are stored, before they decode them.
class ReadImagePropertiesFeedback {
public:
    class Body {
    public:
        virtual ~Body() = default;
        virtual void compressionMode(const FNImageDataCompressionMode& mode) = 0;
        /// Bits of one pixel over all its samples.
        virtual void pixelDepth(unsigned int bits) = 0;
    };

    /// Ignores what it is told.
    class DummyFeedback final : public Body {
    public:
        void compressionMode(const FNImageDataCompressionMode&) override {}
        void pixelDepth(unsigned int) override {}
    };

    ReadImagePropertiesFeedback() : body_(new DummyFeedback) {}
    explicit ReadImagePropertiesFeedback(const FNCountedPtr<Body>& body) : body_(body) {}

    void compressionMode(FNImageDataCompressionMode mode) const { body_->compressionMode(mode); }
    void pixelDepth(unsigned int bits) const { body_->pixelDepth(bits); }

private:
    FNCountedPtr<Body> body_;
};

} // namespace Fn
