#include "picture_lines.h"

namespace Orbek::Tool {

std::list<Sample> samplesOf(const std::vector<std::filesystem::path>& files) {
    std::list<Sample> samples;
    for (const std::filesystem::path& file : files) samples.emplace_back(Image(new PictureFile(file)));
    return samples;
}

} // namespace Orbek::Tool
