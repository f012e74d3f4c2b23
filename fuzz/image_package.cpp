// Serialized image references: what is read is written again and then reads as the same.

#include "fn/image_reference.h"

#include <cstdlib>
#include <vector>

namespace {

std::vector<unsigned char> bytesOf(const Fn::Package& package) {
    std::vector<unsigned char> bytes(package.size());
    package.write(bytes.data());
    return bytes;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    try {
        const FNImageReference image(Fn::Package(data, size));
        image.w(); // decodes a file
        const Fn::Package written = image.serialize();
        if (bytesOf(FNImageReference(written).serialize()) != bytesOf(written)) std::abort();
    } catch (const FNException&) {
    }
    return 0;
}
