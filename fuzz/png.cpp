// PNG files. Mutations of a chunk mostly end at its checksum.

#include "fn/imagefile/png.h"

#include "image_reader.h"

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    return fuzzImageReader(data, size, [](std::istream& stream, const auto& feedback, const auto& limits) {
        return Fn::readPng(stream, feedback, limits);
    });
}
