#include "orbek/image_io.h"

#include "fn/imagefile/bmp.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/j2k.h"
#include "fn/imagefile/jpeg.h"
#include "fn/imagefile/png.h"
#include "fn/whole_file.h"
#include "orbek/implementation/adapt.h"

namespace Orbek {

namespace {

/// What people have in their files is read in all its variants.
Fn::ImageLimits variants() {
    return Fn::ImageLimits::withRareVariants();
}

} // namespace

namespace ImageIO {

PropertiesFeedbackBody::PropertiesFeedbackBody() = default;
PropertiesFeedbackBody::~PropertiesFeedbackBody() = default;
DummyPropertiesFeedback::DummyPropertiesFeedback() = default;
DummyPropertiesFeedback::~DummyPropertiesFeedback() = default;
void DummyPropertiesFeedback::compressionMode(const ColorMode&) {}
void DummyPropertiesFeedback::pixelDepth(unsigned int) {}

PropertiesFeedback noFeedback() {
    return PropertiesFeedback(new DummyPropertiesFeedback);
}

Limits limits() {
    const Fn::ImageLimits present;
    return {present.maxWidth, present.maxHeight, present.maxPixels, present.maxBytes};
}

void setLimits(const Limits& limits) {
    constexpr std::uint32_t mostRows = 0x7FFFFFFF;
    for (const std::uint32_t side : {limits.maxWidth, limits.maxHeight})
        if (side == 0 || side > mostRows)
            FN_THROW(FNEBadArg, "ImageIO::setLimits: maxWidth and maxHeight must be 1 to 2147483647");
    if (limits.maxPixels == 0 || limits.maxBytes == 0)
        FN_THROW(FNEBadArg, "ImageIO::setLimits: maxPixels and maxBytes must be above 0");
    Fn::ImageLimits changed;
    changed.maxWidth = limits.maxWidth;
    changed.maxHeight = limits.maxHeight;
    changed.maxPixels = limits.maxPixels;
    changed.maxBytes = limits.maxBytes;
    Fn::ImageLimits::setDefaults(changed);
}

Image load(const std::string& fileName, const PropertiesFeedback& feedback) {
    return adapt(Fn::readImage(fileName, adapt(feedback), variants()), fileName);
}

Image load(std::istream& stream, const PropertiesFeedback& feedback) {
    return adapt(Fn::readImage(stream, adapt(feedback), variants()), "fromStream");
}

} // namespace ImageIO

namespace Bmp {

Image load(const std::string& fileName, const PropertiesFeedback& feedback) {
    return adapt(Fn::loadBMP(fileName, adapt(feedback), variants()), fileName);
}

Image load(std::istream& stream, const PropertiesFeedback& feedback) {
    return adapt(Fn::readBMP(stream, adapt(feedback), variants()), "std::istream");
}

void save(const Image& image, const std::string& fileName) {
    Fn::saveBMP(adapt(image), fileName);
}

} // namespace Bmp

namespace Jpeg {

Image load(const std::string& fileName, const PropertiesFeedback& feedback) {
    return adapt(Fn::loadJpeg(fileName, adapt(feedback), variants()), fileName);
}

Image load(std::istream& stream, const PropertiesFeedback& feedback) {
    return adapt(Fn::readJpeg(stream, adapt(feedback), variants()), "fromStream");
}

Image load(const char* data, unsigned int size, const PropertiesFeedback& feedback) {
    return adapt(Fn::readJpeg(data, size, adapt(feedback), variants()), "fromBuffer");
}

void save(const Image& image, std::ostream& stream, int quality) {
    Fn::writeJpeg(adapt(image), stream, quality);
}

void save(const Image& image, const std::string& fileName, int quality) {
    Fn::writeWholeFile(fileName, [&](std::ostream& stream) { save(image, stream, quality); });
}

SizeAndQuality saveWithSizeConstraint(const Image& image, std::ostream& stream, int maxBytes) {
    const auto [size, quality] = Fn::writeJpegWithSizeConstraint(adapt(image), stream, maxBytes);
    return {static_cast<std::int32_t>(size), quality};
}

} // namespace Jpeg

namespace Jpeg2000 {

Image load(const std::string& fileName, const PropertiesFeedback& feedback) {
    return adapt(Fn::loadJ2k(fileName, adapt(feedback), variants()), fileName);
}

Image load(std::istream& stream, const PropertiesFeedback& feedback) {
    return adapt(Fn::readJ2k(stream, adapt(feedback), variants()), "Stream");
}

Image load(const char* data, unsigned int size, const PropertiesFeedback& feedback) {
    return adapt(Fn::loadJ2k(data, size, adapt(feedback), variants()), "Buffer");
}

} // namespace Jpeg2000

namespace Pgm {

Image load(const std::string& fileName, const PropertiesFeedback& feedback) {
    return adapt(Fn::readImage(fileName, adapt(feedback), variants()), fileName);
}

void save(const Image& image, const std::string& fileName) {
    Fn::writeImage(adapt(image), fileName, FNImageCompressor::LOSSLESS);
}

} // namespace Pgm

namespace Png {

Image load(const std::string& fileName, const PropertiesFeedback& feedback) {
    return adapt(Fn::readPng(fileName, adapt(feedback), variants()), fileName);
}

Image load(std::istream& stream, const PropertiesFeedback& feedback) {
    return adapt(Fn::readPng(stream, adapt(feedback), variants()), "");
}

void save(const Image& image, std::ostream& stream, int level) {
    Fn::writePng(adapt(image), stream, level);
}

void save(const Image& image, const std::string& fileName, int level) {
    Fn::writeWholeFile(fileName, [&](std::ostream& stream) { save(image, stream, level); });
}

} // namespace Png

} // namespace Orbek
