// The orientation in Exif blocks, alone and in JPEG files.

#include "exif.h"

#include "fn/imagefile/byte_stream.h"

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    Orbek::Tool::orientationInTiff({data, size});
    Fn::MemoryStream stream(reinterpret_cast<const char*>(data), size);
    Orbek::Tool::orientationInJpeg(stream);
    return 0;
}
