#include "orbek/image_io.h"

#include "fn/imagefile/bmp.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/j2k.h"
#include "fn/imagefile/jpeg.h"
#include "fn/imagefile/png.h"
#include "fn/whole_file.h"
#include "orbek/implementation/adapt.h"

namespace Orbek {

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

Image load(const std::string& fileName, const PropertiesFeedback& feedback) {
    return adapt(Fn::readImage(fileName, adapt(feedback)), fileName);
}

Image load(std::istream& stream, const PropertiesFeedback& feedback) {
    return adapt(Fn::readImage(stream, adapt(feedback)), "fromStream");
}

} // namespace ImageIO

namespace Bmp {

Image load(const std::string& fileName, const PropertiesFeedback& feedback) {
    return adapt(Fn::loadBMP(fileName, adapt(feedback)), fileName);
}

Image load(std::istream& stream, const PropertiesFeedback& feedback) {
    return adapt(Fn::readBMP(stream, adapt(feedback)), "std::istream");
}

void save(const Image& image, const std::string& fileName) {
    Fn::saveBMP(adapt(image), fileName);
}

} // namespace Bmp

namespace Jpeg {

Image load(const std::string& fileName, const PropertiesFeedback& feedback) {
    return adapt(Fn::loadJpeg(fileName, adapt(feedback)), fileName);
}

Image load(std::istream& stream, const PropertiesFeedback& feedback) {
    return adapt(Fn::readJpeg(stream, adapt(feedback)), "fromStream");
}

Image load(const char* data, unsigned int size, const PropertiesFeedback& feedback) {
    return adapt(Fn::readJpeg(data, size, adapt(feedback)), "fromBuffer");
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
    return adapt(Fn::loadJ2k(fileName, adapt(feedback)), fileName);
}

Image load(std::istream& stream, const PropertiesFeedback& feedback) {
    return adapt(Fn::readJ2k(stream, adapt(feedback)), "Stream");
}

Image load(const char* data, unsigned int size, const PropertiesFeedback& feedback) {
    return adapt(Fn::loadJ2k(data, size, adapt(feedback)), "Buffer");
}

} // namespace Jpeg2000

namespace Pgm {

Image load(const std::string& fileName, const PropertiesFeedback& feedback) {
    return adapt(Fn::readImage(fileName, adapt(feedback)), fileName);
}

void save(const Image& image, const std::string& fileName) {
    Fn::writeImage(adapt(image), fileName, FNImageCompressor::LOSSLESS);
}

} // namespace Pgm

namespace Png {

Image load(const std::string& fileName, const PropertiesFeedback& feedback) {
    return adapt(Fn::readPng(fileName, adapt(feedback)), fileName);
}

Image load(std::istream& stream, const PropertiesFeedback& feedback) {
    return adapt(Fn::readPng(stream, adapt(feedback)), "");
}

void save(const Image& image, std::ostream& stream, int level) {
    Fn::writePng(adapt(image), stream, level);
}

void save(const Image& image, const std::string& fileName, int level) {
    Fn::writeWholeFile(fileName, [&](std::ostream& stream) { save(image, stream, level); });
}

} // namespace Png

} // namespace Orbek
