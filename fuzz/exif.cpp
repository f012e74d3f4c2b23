// The orientation in TIFF, JPEG and PNG files.

#include "exif.h"

#include "fn/imagefile/byte_stream.h"

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    Fn::MemoryStream stream(reinterpret_cast<const char*>(data), size);
    Orbek::Tool::orientationIn(stream);
    return 0;
}
