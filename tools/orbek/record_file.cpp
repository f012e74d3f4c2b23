#include "record_file.h"

#include "command.h"

#include <cstdint>
#include <cstring>
#include <filesystem>
#include <fstream>
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
        throw UnreadableInput(file + ": " + e.what());
    }
}

void writeRecord(const FIR& record, const std::string& file) {
    const std::string unfinished = file + ".part";
    std::ofstream stream(unfinished, std::ios::binary);
    stream << record;
    stream.close();
    std::error_code failure;
    if (stream) fs::rename(unfinished, file, failure);
    if (stream && !failure) return;
    fs::remove(unfinished, failure);
    throw std::runtime_error(file + ": cannot be written");
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
