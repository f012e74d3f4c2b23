#include "picture_lines.h"

#include "pictures.h"

namespace Orbek::Tool {

std::list<Sample> readSamples(const std::vector<std::filesystem::path>& files, Output& output) {
    std::list<Sample> samples;
    for (const std::filesystem::path& file : files) {
        try {
            samples.emplace_back(readPicture(file));
        } catch (const std::exception& e) {
            output.complaint(file.string(), e.what());
        }
        output.step();
    }
    return samples;
}

} // namespace Orbek::Tool
