// Siemens grids, with a picture beside them.

#include "scan_reader.h"

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    return fuzzScanReader(data, size, [](std::istream& stream, const std::string& name, const auto& limits) {
        return ShapeImage::readSiemensData(stream, false, name, limits);
    });
}
