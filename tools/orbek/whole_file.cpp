#include "whole_file.h"

#include "fn/whole_file.h"

#include <ostream>
#include <set>
#include <stdexcept>
#include <utility>

#include <sys/stat.h>

namespace Orbek::Tool {

void writeWhole(const std::string& file, const std::string& bytes) {
    Fn::writeWholeFile(file, [&](std::ostream& stream) { stream << bytes; });
}

void refuseInputs(const std::vector<std::filesystem::path>& outputs,
                  const std::vector<std::filesystem::path>& inputs) {
    std::set<std::pair<dev_t, ino_t>> files;
    struct stat status {};
    for (const auto& input : inputs)
        if (::stat(input.c_str(), &status) == 0) files.emplace(status.st_dev, status.st_ino);
    for (const auto& output : outputs)
        if (::stat(output.c_str(), &status) == 0 && S_ISREG(status.st_mode) &&
            files.contains({status.st_dev, status.st_ino}))
            throw std::runtime_error(output.string() + ": is an input too, and is not written over");
}

} // namespace Orbek::Tool
