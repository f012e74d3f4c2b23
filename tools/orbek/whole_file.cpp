#include "whole_file.h"

#include <filesystem>
#include <fstream>
#include <stdexcept>

namespace Orbek::Tool {

void writeWhole(const std::string& file, const std::string& bytes) {
    const std::string unfinished = file + ".part";
    std::ofstream stream(unfinished, std::ios::binary);
    stream << bytes;
    stream.close();
    std::error_code failure;
    if (stream) std::filesystem::rename(unfinished, file, failure);
    if (stream && !failure) return;
    std::filesystem::remove(unfinished, failure);
    throw std::runtime_error(file + ": cannot be written");
}

} // namespace Orbek::Tool
