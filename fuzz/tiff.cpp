// TIFF files.

#include "fn/imagefile/tiff.h"

#include "image_reader.h"

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    return fuzzImageReader(data, size, [](std::istream& stream, const auto& feedback, const auto& limits) {
        return Fn::readTiff(stream, "fuzz", 0, feedback, limits);
    });
}
