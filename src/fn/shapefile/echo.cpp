#include "fn/shapefile/echo.h"

#include "fn/shapefile/scan_text.h"

#include <array>
#include <istream>
#include <vector>

namespace Fn {

namespace {

/// Lines of the header are short; anything longer is no header.
constexpr std::size_t longestHeaderLine = 255;
constexpr std::size_t mostHeaderLines = 1000;
constexpr std::int64_t greatestShift = 31;

struct Key {
    const char* name;
    std::int64_t EchoHeader::*value;
};
constexpr std::array keys{
    Key{"NLG", &EchoHeader::nlg},     Key{"NLT", &EchoHeader::nlt},       Key{"LGMIN", &EchoHeader::lgmin},
    Key{"LGMAX", &EchoHeader::lgmax}, Key{"LGINCR", &EchoHeader::lgincr}, Key{"LTMIN", &EchoHeader::ltmin},
    Key{"LTMAX", &EchoHeader::ltmax}, Key{"LTINCR", &EchoHeader::ltincr}, Key{"RSHIFT", &EchoHeader::rshift},
};
constexpr const char* spaceKey = "SPACE";

/// One line without its end.
std::string readLine(std::istream& stream) {
    std::string line;
    std::streambuf& buffer = *stream.rdbuf();
    for (int c = buffer.sbumpc(); c != '\n'; c = buffer.sbumpc()) {
        if (c == std::char_traits<char>::eof())
            FN_THROW(FNEBadArg, "Error reading eko file header; header lines missing");
        if (line.size() == longestHeaderLine)
            FN_THROW(FNEBadArg, "Error reading eko file header; line too long");
        line += static_cast<char>(c);
    }
    if (!line.empty() && line.back() == '\r') line.pop_back();
    return line;
}

std::string trimmed(const std::string& text) {
    const auto first = text.find_first_not_of(" \t");
    return first == std::string::npos ? "" : text.substr(first, text.find_last_not_of(" \t") - first + 1);
}

} // namespace

EchoHeader readEchoHeader(std::istream& stream) {
    EchoHeader header;
    std::size_t missing = keys.size() + 1;
    std::array<bool, keys.size() + 1> seen{};
    const auto see = [&](std::size_t i) {
        missing -= !seen[i];
        seen[i] = true;
    };
    for (std::size_t lines = 0;; ++lines) {
        const std::string line = readLine(stream);
        if (line.rfind("DATA=", 0) == 0) break;
        if (line.empty()) FN_THROW(FNEBadArg, "Error reading eko file header; line too short");
        if (lines == mostHeaderLines) FN_THROW(FNEBadArg, "Error reading eko file header; line too long");
        const auto equals = line.find('=');
        if (equals == std::string::npos) continue; // the title
        const std::string name = trimmed(line.substr(0, equals)), value = trimmed(line.substr(equals + 1));
        if (name == spaceKey) {
            if (value != "CYLINDRICAL") FN_THROW(FNEBadArg, "Unknown cyberware data format");
            see(keys.size());
        }
        for (std::size_t i = 0; i < keys.size(); ++i) {
            if (name != keys[i].name) continue;
            if (value.empty() || !parseNumber(value, header.*keys[i].value))
                FN_THROW(FNEBadArg, "Error reading eko file header; line too short");
            see(i);
        }
    }
    if (missing != 0) FN_THROW(FNEBadArg, "Error reading eko file header; header lines missing");
    return header;
}

VertexImage readEchoFile(std::istream& stream, const ImageLimits& limits) {
    const EchoHeader header = readEchoHeader(stream);
    const auto refuse = [] { FN_THROW(FNEBadArg, "Error reading eko file table"); };
    if (header.nlg < 0 || header.nlt < 0 || header.rshift < 0 || header.rshift > greatestShift) refuse();
    const auto rows = static_cast<std::uint64_t>(header.nlg),
               columns = static_cast<std::uint64_t>(header.nlt);
    limits.check(columns, rows, sizeof(VertexImage::Vertex) + sizeof(bool), "Fn::readEchoFile");

    // Memory for the points follows the table, which is read first.
    std::vector<unsigned char> table, row(2 * columns);
    for (std::uint64_t y = 0; y < rows; ++y) {
        if (!stream.read(reinterpret_cast<char*>(row.data()), static_cast<std::streamsize>(row.size())))
            refuse();
        table.insert(table.end(), row.begin(), row.end());
    }
    constexpr double radiansPerMicro = 1e-6, millimetresPerMicro = 0.001;
    VertexImage image(static_cast<std::uint32_t>(columns), static_cast<std::uint32_t>(rows));
    FNImage<VertexImage::Vertex> vertices = image.vertices();
    FNImage<bool> validity = image.validity();
    VertexImage::Vertex* vertex = vertices.getExclusive();
    bool* valid = validity.getExclusive();
    const unsigned char* stored = table.data();
    for (std::uint64_t y = 0; y < rows; ++y)
        for (std::uint64_t x = 0; x < columns; ++x, stored += 2, ++vertex, ++valid) {
            const auto value = static_cast<std::int16_t>(stored[0] << 8 | stored[1]);
            *valid = value > 0;
            if (!*valid) continue;
            const double angle =
                static_cast<double>(x) * static_cast<double>(header.ltincr) * radiansPerMicro;
            const double radius =
                static_cast<double>(static_cast<std::int64_t>(value) << header.rshift) * millimetresPerMicro;
            *vertex = {radius * std::sin(angle),
                       static_cast<double>(y) * static_cast<double>(header.lgincr) * millimetresPerMicro,
                       radius * std::cos(angle)};
        }
    return VertexImage(vertices, validity);
}

} // namespace Fn
