#include "exif.h"

#include <cstdint>
#include <cstring>
#include <istream>
#include <vector>

namespace Orbek::Tool {
namespace {

/// The numbers of a TIFF structure, in its byte order.
class TiffNumbers {
public:
    explicit TiffNumbers(std::span<const unsigned char> bytes) : bytes_(bytes) {
        littleEndian_ = bytes.size() > 1 && bytes[0] == 'I' && bytes[1] == 'I';
    }
    bool has(std::size_t offset, std::size_t size) const {
        return offset <= bytes_.size() && size <= bytes_.size() - offset;
    }
    std::uint32_t at(std::size_t offset, std::size_t size) const {
        std::uint32_t value = 0;
        for (std::size_t i = 0; i < size; ++i)
            value = value << 8 | bytes_[littleEndian_ ? offset + size - 1 - i : offset + i];
        return value;
    }

private:
    std::span<const unsigned char> bytes_;
    bool littleEndian_;
};

constexpr std::uint32_t orientationTag = 274, typeShort = 3;
constexpr std::size_t entrySize = 12;

constexpr unsigned char markerStart = 0xFF, startOfImage = 0xD8, startOfScan = 0xDA, endOfImage = 0xD9,
                        exifSegment = 0xE1;
constexpr unsigned char exifName[] = {'E', 'x', 'i', 'f', 0, 0};

/// The next marker of a JPEG file, 0 if there is none.
unsigned char nextMarker(std::istream& stream) {
    if (stream.get() != markerStart) return 0;
    int marker = markerStart;
    while (marker == markerStart) marker = stream.get(); // fill bytes
    return stream ? static_cast<unsigned char>(marker) : 0;
}

} // namespace

Orientation orientationInTiff(std::span<const unsigned char> tiff) {
    const TiffNumbers numbers(tiff);
    if (!numbers.has(0, 8) || numbers.at(2, 2) != 42) return Orientation::Upright;
    const std::size_t directory = numbers.at(4, 4);
    if (!numbers.has(directory, 2)) return Orientation::Upright;
    const std::size_t entries = numbers.at(directory, 2);
    for (std::size_t i = 0; i < entries; ++i) {
        const std::size_t entry = directory + 2 + i * entrySize;
        if (!numbers.has(entry, entrySize)) break;
        if (numbers.at(entry, 2) != orientationTag || numbers.at(entry + 2, 2) != typeShort) continue;
        const std::uint32_t value = numbers.at(entry + 8, 2);
        return value >= 1 && value <= 8 ? static_cast<Orientation>(value) : Orientation::Upright;
    }
    return Orientation::Upright;
}

Orientation orientationInJpeg(std::istream& stream) {
    if (nextMarker(stream) != startOfImage) return Orientation::Upright;
    for (;;) {
        const unsigned char marker = nextMarker(stream);
        if (marker == 0 || marker == startOfScan || marker == endOfImage) return Orientation::Upright;
        const int high = stream.get(), low = stream.get();
        const int size = (high << 8 | low) - 2;
        if (!stream || size < 0) return Orientation::Upright;
        std::vector<unsigned char> segment(static_cast<std::size_t>(size));
        if (!stream.read(reinterpret_cast<char*>(segment.data()), size)) return Orientation::Upright;
        if (marker == exifSegment && segment.size() > sizeof exifName &&
            std::memcmp(segment.data(), exifName, sizeof exifName) == 0)
            return orientationInTiff(std::span(segment).subspan(sizeof exifName));
    }
}

} // namespace Orbek::Tool
