#include "labelled/labels.h"

#include "fn/exception.h"

#include <charconv>
#include <cstdint>
#include <fstream>
#include <string_view>

namespace Labelled {
namespace {

std::vector<std::string> cells(const std::string& line) {
    std::vector<std::string> parts;
    std::size_t begin = 0;
    for (std::size_t tab; (tab = line.find('\t', begin)) != std::string::npos; begin = tab + 1)
        parts.push_back(line.substr(begin, tab - begin));
    parts.push_back(line.substr(begin, line.find('\r', begin) - begin));
    return parts;
}

} // namespace

std::string Row::text(const std::string& column) const {
    const auto field = fields_.find(column);
    return field == fields_.end() ? std::string() : field->second;
}

std::optional<double> Row::number(const std::string& column) const {
    const std::string value = text(column);
    double result = 0;
    const auto [end, error] = std::from_chars(value.data(), value.data() + value.size(), result);
    if (error != std::errc() || end != value.data() + value.size()) return {};
    return result;
}

std::optional<FNPos> Row::position(const std::string& name) const {
    const auto x = number(name + "_x"), y = number(name + "_y");
    if (!x || !y) return {};
    return FNPos{static_cast<float>(*x), static_cast<float>(*y)};
}

std::string Row::splitKey() const {
    const std::string person = text("person");
    if (!person.empty()) return person;
    // In these sets several files can be cut from one photo, which the first parts of the name tell.
    struct CutSet {
        std::string_view prefix;
        int partsOfPhoto;
    };
    constexpr CutSet cutSets[] = {{"helen_", 1}, {"net_7876__", 2}, {"net_7876_", 1}};
    const std::string stem = image_.stem().string();
    // Neighbouring pictures of single eyes often show one person.
    for (const std::string_view prefix : {"open_", "closed_"}) {
        constexpr int run = 40;
        int number = 0;
        const char* const end = stem.data() + stem.size();
        if (stem.starts_with(prefix) && std::from_chars(stem.data() + prefix.size(), end, number).ptr == end)
            return std::string(prefix) + std::to_string(number / run);
    }
    for (const auto& [prefix, parts] : cutSets) {
        if (!stem.starts_with(prefix)) continue;
        std::size_t end = prefix.size() - 1;
        for (int i = 0; i < parts && end != std::string::npos; ++i) end = stem.find('_', end + 1);
        return stem.substr(0, end);
    }
    return stem;
}

std::vector<Row> readLabels(const std::filesystem::path& tsv) {
    std::ifstream file(tsv);
    std::string line;
    if (!std::getline(file, line)) FN_THROW(FNEIOError, "Cannot read labels from " + tsv.string());
    const std::vector<std::string> columns = cells(line);
    std::vector<Row> rows;
    for (int number = 2; std::getline(file, line); ++number) {
        const std::vector<std::string> values = cells(line);
        if (values.size() != columns.size() || values.front().empty())
            FN_THROW(FNEIOError, tsv.string() + ", line " + std::to_string(number) + ": " +
                                     std::to_string(values.size()) + " fields, expected " +
                                     std::to_string(columns.size()));
        std::map<std::string, std::string> fields;
        for (std::size_t i = 0; i < columns.size(); ++i) fields.emplace(columns[i], values[i]);
        rows.emplace_back(tsv.parent_path() / fields["file"], std::move(fields));
    }
    return rows;
}

Split splitOf(const std::string& key) {
    constexpr std::uint64_t offset = 14695981039346656037u, prime = 1099511628211u; // FNV-1a, 64 bits
    constexpr std::uint64_t parts = 20, trainParts = 14, devParts = 3;
    std::uint64_t hash = offset;
    for (const char c : key) hash = (hash ^ static_cast<unsigned char>(c)) * prime;
    const std::uint64_t part = (hash >> 32) % parts;
    return part < trainParts ? Split::train : part < trainParts + devParts ? Split::dev : Split::test;
}

} // namespace Labelled
