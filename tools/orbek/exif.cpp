#include "exif.h"

#include "fn/imagefile/byte_stream.h"

#include <cstdint>
#include <cstring>
#include <limits>
#include <optional>
#include <vector>

namespace Orbek::Tool {
namespace {

/// The numbers of a TIFF structure that begins at the stream's position, in its byte order.
class TiffNumbers {
public:
    explicit TiffNumbers(std::istream& stream) : stream_(stream), start_(stream.tellg()) {
        littleEndian_ = at(0, 2) == 0x4949; // "II", which reads the same either way
    }
    /// None behind the end.
    std::optional<std::uint64_t> at(std::uint64_t offset, std::size_t size) {
        unsigned char bytes[8];
        constexpr auto farthest = static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max()) / 2;
        if (start_ == std::istream::pos_type(-1) || offset > farthest) return {};
        stream_.clear();
        stream_.seekg(start_ + static_cast<std::streamoff>(offset));
        if (!stream_.read(reinterpret_cast<char*>(bytes), static_cast<std::streamsize>(size))) return {};
        std::uint64_t value = 0;
        for (std::size_t i = 0; i < size; ++i) value = value << 8 | bytes[littleEndian_ ? size - 1 - i : i];
        return value;
    }

private:
    std::istream& stream_;
    const std::istream::pos_type start_;
    bool littleEndian_ = false;
};

/// Where things lie in the two kinds of TIFF files: bytes of offsets and of the number of entries, and of an
/// entry.
struct TiffKind {
    std::uint64_t version;
    std::size_t directoryAt, offsetSize, countSize, entrySize, valueAt;
};
constexpr TiffKind classicTiff{42, 4, 4, 2, 12, 8}, bigTiff{43, 8, 8, 8, 20, 12};

constexpr std::uint64_t orientationTag = 274, typeShort = 3;
/// More than a directory of 16 bits can have.
constexpr std::uint64_t mostEntries = 65535;

Orientation orientationInTiff(std::istream& stream) {
    TiffNumbers numbers(stream);
    const std::optional<std::uint64_t> version = numbers.at(2, 2);
    const TiffKind& kind = version == bigTiff.version ? bigTiff : classicTiff;
    const auto directory = numbers.at(kind.directoryAt, kind.offsetSize);
    if (version != kind.version || !directory) return Orientation::Upright;
    const auto entries = numbers.at(*directory, kind.countSize);
    for (std::uint64_t i = 0; i < std::min(entries.value_or(0), mostEntries); ++i) {
        const std::uint64_t entry = *directory + kind.countSize + i * kind.entrySize;
        const auto value = numbers.at(entry + kind.valueAt, 2);
        if (!value) break;
        if (numbers.at(entry, 2) != orientationTag || numbers.at(entry + 2, 2) != typeShort) continue;
        return *value >= 1 && *value <= 8 ? static_cast<Orientation>(*value) : Orientation::Upright;
    }
    return Orientation::Upright;
}

Orientation orientationInBlock(const std::string& block) {
    Fn::MemoryStream stream(block.data(), block.size());
    return orientationInTiff(stream);
}

/// The next bytes; fewer at the end of the stream.
std::string nextBytes(std::istream& stream, std::size_t size) {
    std::string bytes(size, '\0');
    stream.read(bytes.data(), static_cast<std::streamsize>(size));
    bytes.resize(static_cast<std::size_t>(stream.gcount()));
    return bytes;
}

constexpr int markerStart = 0xFF, startOfScan = 0xDA, endOfImage = 0xD9, exifSegment = 0xE1;
const std::string exifName("Exif\0\0", 6), pngSignature("\x89PNG\r\n\x1A\n", 8);

/// Behind the start of the image.
Orientation orientationInJpeg(std::istream& stream) {
    for (;;) {
        if (stream.get() != markerStart) return Orientation::Upright;
        int marker = markerStart;
        while (marker == markerStart) marker = stream.get(); // fill bytes
        if (marker <= 0 || marker == startOfScan || marker == endOfImage) return Orientation::Upright;
        const int high = stream.get(), low = stream.get();
        const int size = (high << 8 | low) - 2;
        if (!stream || size < 0) return Orientation::Upright;
        const std::string segment = nextBytes(stream, static_cast<std::size_t>(size));
        if (!stream) return Orientation::Upright;
        if (marker == exifSegment && segment.starts_with(exifName))
            return orientationInBlock(segment.substr(exifName.size()));
    }
}

/// Behind the signature.
Orientation orientationInPng(std::istream& stream) {
    constexpr std::uint32_t longestBlock = 1u << 20;
    constexpr std::streamsize checkSum = 4;
    for (;;) {
        const std::string head = nextBytes(stream, 8);
        if (head.size() < 8 || head.ends_with("IEND")) return Orientation::Upright;
        std::uint32_t size = 0;
        for (int i = 0; i < 4; ++i)
            size = size << 8 | static_cast<unsigned char>(head[static_cast<unsigned>(i)]);
        if (head.ends_with("eXIf"))
            return size > longestBlock ? Orientation::Upright : orientationInBlock(nextBytes(stream, size));
        stream.ignore(std::streamsize{size} + checkSum);
    }
}

} // namespace

Orientation orientationIn(std::istream& stream) {
    const std::string start = Fn::peekBytes(stream, pngSignature.size(), "orientationIn");
    if (start.starts_with("II") || start.starts_with("MM")) return orientationInTiff(stream);
    if (start.starts_with("\xFF\xD8")) {
        nextBytes(stream, 2);
        return orientationInJpeg(stream);
    }
    if (start != pngSignature) return Orientation::Upright;
    nextBytes(stream, pngSignature.size());
    return orientationInPng(stream);
}

} // namespace Orbek::Tool
