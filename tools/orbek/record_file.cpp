#include "record_file.h"

#include "command.h"
#include "whole_file.h"

#include <cstdint>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <vector>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

namespace fs = std::filesystem;

} // namespace

FIR readRecord(const FIRBuilder& builder, const std::string& file) {
    std::ifstream stream(file, std::ios::binary);
    if (!stream || fs::is_directory(file)) throw UnreadableInput(file + ": cannot be opened");
    try {
        return builder.build(stream);
    } catch (const std::exception& e) {
        throw UnreadableInput(file + ": is not a record of this configuration (" + e.what() + ")");
    }
}

void writeRecord(const FIR& record, const std::string& file) {
    std::ostringstream bytes;
    bytes << record;
    writeWhole(file, bytes.str());
}

std::uint32_t numberOfFeatures(const FIR& record) {
    // The flat form begins with it.
    std::vector<unsigned char> flat(record.flatSize());
    unsigned char* memory = flat.data();
    record.writeTo(memory);
    std::uint32_t count = 0;
    std::memcpy(&count, flat.data(), sizeof count);
    return count;
}

nlohmann::ordered_json describeRecord(const FIR& record, const std::string& file) {
    return {{"file", file},
            {"version", record.version()},
            {"features", numberOfFeatures(record)},
            {"bytes", record.size()}};
}

} // namespace Orbek::Tool
