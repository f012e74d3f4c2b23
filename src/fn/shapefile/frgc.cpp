#include "fn/shapefile/frgc.h"

#include "fn/imagefile/byte_stream.h"
#include "fn/shapefile/scan_text.h"

#include <charconv>
#include <vector>

namespace Fn {

namespace {

constexpr const char* damaged = "Format Error reading in FRGC file";

/// "<n> <unit>".
std::uint32_t readSize(ScanText& text, const char* unit) {
    const std::uint32_t n = text.unsignedNumber(damaged);
    std::string word;
    if (!text.word(word) || word != unit) FN_THROW(FNEBadArg, damaged);
    return n;
}

/// Collects lines of values and writes them in blocks.
class LineWriter {
public:
    explicit LineWriter(std::ostream& stream) : stream_(stream) {}

    void value(double v) {
        constexpr int significantDigits = 12;
        char digits[32];
        const auto end =
            std::to_chars(digits, digits + sizeof digits, v, std::chars_format::general, significantDigits)
                .ptr;
        block_ += ' ';
        block_.append(digits, end);
        constexpr std::size_t blockSize = 1u << 16;
        if (block_.size() >= blockSize) flush();
    }
    void endLine() {
        block_ += '\n';
        flush();
    }

private:
    void flush() {
        stream_.write(block_.data(), static_cast<std::streamsize>(block_.size()));
        block_.clear();
    }

    std::ostream& stream_;
    std::string block_;
};

} // namespace

VertexImage readFRGC(std::istream& stream, const ImageLimits& limits) {
    ScanText text(stream);
    const std::uint32_t rows = readSize(text, "rows"), columns = readSize(text, "columns");
    std::string rest;
    if (!text.line(rest) || !text.line(rest) || rest.rfind("pixels (flag X Y Z)", 0) != 0)
        FN_THROW(FNEBadArg, damaged);
    limits.check(columns, rows, sizeof(VertexImage::Vertex) + sizeof(bool), "Fn::readFRGC");

    // Memory follows the flags, of which each takes two bytes of the text.
    std::vector<bool> flags;
    for (std::uint64_t i = 0; i < std::uint64_t{rows} * columns; ++i)
        flags.push_back(text.number(damaged) == 1);
    FNImage<VertexImage::Vertex> vertices(columns, rows);
    FNImage<bool> validity(columns, rows);
    std::copy(flags.begin(), flags.end(), validity.getExclusive());
    VertexImage::Vertex* const all = vertices.getExclusive();
    for (int axis = 0; axis < 3; ++axis)
        for (std::uint64_t i = 0; i < flags.size(); ++i) all[i][axis] = text.number(damaged);
    return VertexImage(vertices, validity);
}

VertexImage readFRGC(const std::string& fileName, const ImageLimits& limits) {
    std::ifstream file(fileName, std::ios::binary);
    // A folder opens, but gives nothing.
    if (!file || file.peek() == std::ifstream::traits_type::eof())
        FN_THROW(FNEIOError, fileName + " is not a valid file");
    return readFRGC(file, limits);
}

void writeFRGC(const VertexImage& image, std::ostream& stream) {
    stream << image.h() << " rows\n" << image.w() << " columns\npixels (flag X Y Z):\n";
    LineWriter out(stream);
    const auto valid = image.validity().span();
    const auto vertices = image.vertices().span();
    for (const bool flag : valid) out.value(flag);
    out.endLine();
    for (int axis = 0; axis < 3; ++axis) {
        for (std::size_t i = 0; i < valid.size(); ++i) out.value(valid[i] ? vertices[i][axis] : 0);
        out.endLine();
    }
    if (!stream.flush()) FN_THROW(FNEIOError, "Fn::writeFRGC: cannot write");
}

} // namespace Fn
