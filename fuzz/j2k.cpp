// JPEG 2000 files and code streams.

#include "fn/imagefile/j2k.h"

#include "image_reader.h"

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    return fuzzImageReader(data, size, [](std::istream& stream, const auto& feedback, const auto& limits) {
        return Fn::readJ2k(stream, feedback, limits);
    });
}
