// Vertex images from FRGC, echo and ViaLux files and from packages: what is accepted is written and read to
// the same size.

#include "fn/shapefile/frgc.h"
#include "fn/shapefile/shape_file.h"
#include "scan_reader.h"

#include <sstream>

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    try {
        const Fn::VertexImage packed(Fn::Package(data, size));
        if (Fn::VertexImage(packed.serialize()).serialize() != packed.serialize()) std::abort();
    } catch (const FNException&) {
    }
    fuzzScanReader(data, size, [](std::istream& stream, const std::string&, const auto& limits) {
        const Fn::VertexImage image = Fn::readShapeImage(stream, "scan", nullptr, false, limits);
        std::stringstream text;
        Fn::writeFRGC(image, text);
        const Fn::VertexImage back = Fn::readFRGC(text, limits);
        if (back.w() != image.w() || back.validity() != image.validity()) std::abort();
        return ShapeImage::TexturedPointSet(
            image, FNImageReferenceFactory::create(FNImage<unsigned char>(image.w(), image.h())), true);
    });
    return 0;
}
