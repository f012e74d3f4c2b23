#include "fn/imagefile/jpeg.h"

#include "fn/imagefile/byte_stream.h"
#include "fn/whole_file.h"

namespace Fn {

namespace {

constexpr const char* writeFailure = "writeJpeg: Error writing JPEG bytes to stream";

} // namespace

bool checkIfIsJpeg(std::istream& stream) {
    return peekBytes(stream, 2, "Fn::checkIfIsJpeg") == "\xFF\xD8";
}

FNImageReference readJpeg(std::istream& stream, const ReadImagePropertiesFeedback& feedback,
                          const ImageLimits& limits, const std::string& name) {
    if (!checkIfIsJpeg(stream))
        FN_THROW(FNEBadArg, "Fn::readJpeg: got a stream  not containing a jpeg image.");
    return FNImageCompressor::decompressJpeg(stream, feedback, limits, name);
}

FNImageReference readJpeg(const char* data, unsigned long size, const ReadImagePropertiesFeedback& feedback,
                          const ImageLimits& limits) {
    MemoryStream stream(data, size);
    return readJpeg(stream, feedback, limits);
}

FNImageReference loadJpeg(const std::string& fileName, const ReadImagePropertiesFeedback& feedback,
                          const ImageLimits& limits) {
    std::ifstream file = openForReading(fileName);
    return readJpeg(file, feedback, limits, fileName);
}

FNRMem<unsigned char> writeJpeg(const FNImageReference& image, int quality) {
    return image.isColor() ? FNImageCompressor::compressJpeg(image.toBgra32(), quality)
                           : FNImageCompressor::compressJpeg(image.toMono8(), quality);
}

void writeJpeg(const FNImageReference& image, std::ostream& stream, int quality) {
    writeBytes(stream, writeJpeg(image, quality).span(), writeFailure);
}

void saveJpeg(const FNImageReference& image, const std::string& fileName, FNImageCompressor::Mode mode) {
    const FNRMem<unsigned char> bytes = writeJpeg(image, FNImageCompressor::jpegQuality(mode));
    writeWholeFile(fileName, [&](std::ostream& file) { writeBytes(file, bytes.span(), writeFailure); });
}

SizedJpeg writeJpegWithSizeConstraint(const FNImageReference& image, int maxBytes) {
    constexpr int best = 100, step = 5;
    for (int quality = best;; quality -= step) {
        const FNRMem<unsigned char> bytes = writeJpeg(image, quality);
        if (maxBytes >= 0 && bytes.size() <= static_cast<unsigned int>(maxBytes)) return {bytes, quality};
        if (quality - step < 1)
            FN_THROW(FNEGeneric, "Image size " + std::to_string(bytes.size()) + " exceeded limit of " +
                                     std::to_string(maxBytes) +
                                     " bytes under lowest available jpeg quality " + std::to_string(quality));
    }
}

FNPair<unsigned int, int> writeJpegWithSizeConstraint(const FNImageReference& image, std::ostream& stream,
                                                      int maxBytes) {
    const SizedJpeg jpeg = writeJpegWithSizeConstraint(image, maxBytes);
    writeBytes(stream, jpeg.bytes.span(), writeFailure);
    return {static_cast<unsigned int>(jpeg.bytes.size()), jpeg.quality};
}

} // namespace Fn
