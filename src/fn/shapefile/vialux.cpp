#include "fn/shapefile/vialux.h"

#include "fn/shapefile/scan_text.h"

#include <sstream>
#include <vector>

namespace Fn {

namespace {

constexpr const char* damaged = "Format Error reading in vialux file";

/// A grid may have this many positions whatever it holds, and beyond that as many for each point.
constexpr std::uint64_t freePositions = 1u << 20, positionsPerPoint = 64;

struct Row {
    std::uint32_t i, j;
    VertexImage::Vertex vertex;
};

} // namespace

VertexImage readViaLuxFile(std::istream& stream, const ImageLimits& limits) {
    ScanText text(stream);
    std::string line;
    const std::string header = viaLuxHeaderLine;
    if (!text.line(line) || line.size() < header.size())
        FN_THROW(FNEBadArg, "Error reading vialux file header line; line too short");
    if (line.compare(0, header.size(), header) != 0) FN_THROW(FNEBadArg, damaged);

    std::vector<Row> rows;
    std::uint64_t width = 0, height = 0;
    while (text.line(line)) {
        if (line.find_first_not_of(" \t") == std::string::npos) continue;
        std::istringstream words(line);
        ScanText row(words);
        Row& point = rows.emplace_back();
        point.i = row.unsignedNumber(damaged);
        point.j = row.unsignedNumber(damaged);
        point.vertex.z = row.number(damaged);
        point.vertex.x = row.number(damaged);
        point.vertex.y = row.number(damaged);
        width = std::max(width, std::uint64_t{point.i} + 1);
        height = std::max(height, std::uint64_t{point.j} + 1);
    }
    limits.check(width, height, sizeof(VertexImage::Vertex) + sizeof(bool), "Fn::readViaLuxFile");
    if (width * height > freePositions + positionsPerPoint * rows.size()) FN_THROW(FNEBadArg, damaged);

    VertexImage image(static_cast<std::uint32_t>(width), static_cast<std::uint32_t>(height));
    for (const Row& row : rows)
        image.setVertex({static_cast<std::int32_t>(row.i), static_cast<std::int32_t>(row.j)}, row.vertex);
    return image;
}

} // namespace Fn
