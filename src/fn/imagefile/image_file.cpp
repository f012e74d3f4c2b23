#include "fn/imagefile/image_file.h"

#include "fn/imagefile/bmp.h"
#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/gunzip.h"
#include "fn/imagefile/j2k.h"
#include "fn/imagefile/jpeg.h"
#include "fn/imagefile/pbm.h"
#include "fn/imagefile/png.h"
#include "fn/imagefile/tiff.h"
#include "fn/whole_file.h"

#include <filesystem>

namespace Fn {

namespace {

constexpr const char* streamName = "input stream";

/// @param fileName looked at again if the stream turns out to be gzip; empty if there is no file or it was so
/// already
FNImageReference readAnyFormat(std::istream& stream, const std::string& name, const std::string& fileName,
                               const ReadImagePropertiesFeedback& feedback, const ImageLimits& limits) {
    if (checkIfIsJpeg(stream)) return readJpeg(stream, feedback, limits, name);
    if (checkIfIsPng(stream)) return readPng(stream, feedback, limits);
    if (checkIfIsJ2k(stream)) return readJ2k(stream, feedback, limits);
    if (checkIfIsTiff(stream)) return readTiff(stream, streamName, 0, feedback, limits);
    if (checkIfIsPbm(stream)) return readPbm(stream, feedback, limits);
    const std::string start = peekBytes(stream, 2, "Fn::readImage");
    if (limits.rareVariants && isRarePbm(start)) return readPbm(stream, feedback, limits);
    if (start.empty()) FN_THROW(FNEBadArg, "Fn::readImage: cannot read " + name);
    if (start == "BM") return readBMP(stream, feedback, limits);
    if (start == "\x1F\x8B" && !fileName.empty()) {
        // Formats that are read as a whole are held in memory: in proportion to the file, since photos are
        // never compressed as much as zeros are.
        constexpr std::uint64_t alwaysHeld = 1u << 26, heldForEachByte = 64;
        GunzipStream content(fileName, limits);
        try {
            if (checkIfIsJ2k(content) || checkIfIsTiff(content))
                content.limitTo(alwaysHeld + heldForEachByte * std::filesystem::file_size(fileName));
            const FNImageReference image = readAnyFormat(content, name, {}, feedback, limits);
            content.throwFailure();
            return image;
        } catch (const FNException&) {
            content.throwFailure(); // tells more than what a reader makes of it
            throw;
        }
    }
    FN_THROW(FNEBadArg, "Fn::readImage: Not a known image format in " + name);
}

} // namespace

FNImageReference readImage(const std::string& fileName, const ReadImagePropertiesFeedback& feedback,
                           const ImageLimits& limits) {
    std::ifstream file = openForReading(fileName);
    return readAnyFormat(file, fileName, fileName, feedback, limits);
}

FNImageReference readImage(std::istream& stream, const ReadImagePropertiesFeedback& feedback,
                           const ImageLimits& limits) {
    return readAnyFormat(stream, streamName, {}, feedback, limits);
}

FNImageReference readImage(const char* data, unsigned long size, const ReadImagePropertiesFeedback& feedback,
                           const ImageLimits& limits) {
    MemoryStream stream(data, size);
    return readImage(stream, feedback, limits);
}

void writeImage(const FNImageReference& image, const std::string& fileName, FNImageCompressor::Mode mode) {
    if (mode != FNImageCompressor::LOSSLESS) return saveJpeg(image, fileName, mode);
    writeWholeFile(fileName, [&](std::ostream& file) {
        image.isColor() ? writePpm(image, file) : writePgm(image, file);
    });
}

} // namespace Fn
