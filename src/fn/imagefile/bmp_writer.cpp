#include "fn/imagefile/bmp.h"

#include "fn/whole_file.h"

#include <ostream>

namespace Fn {

namespace {

constexpr std::size_t headersSize = 14 + 40, grayTableSize = 4 * 256;

void storeLittle(std::vector<unsigned char>& bytes, std::uint32_t value, int n) {
    for (int i = 0; i < n; ++i) bytes.push_back(static_cast<unsigned char>(value >> 8 * i));
}

/// Both headers and, for 8 bits, the table of grays.
std::vector<unsigned char> head(const FNImageReference& image, std::uint16_t bitCount,
                                std::uint64_t pixelBytes) {
    const std::size_t offset = headersSize + (bitCount == 8 ? grayTableSize : 0);
    if (image.w() == 0 || image.w() > 0x7FFFFFFF || image.h() > 0x7FFFFFFF ||
        pixelBytes > 0xFFFFFFFF - offset)
        FN_THROW(FNEBadArg, "Fn::saveBMP: the image does not fit into a BMP file");
    std::vector<unsigned char> bytes{'B', 'M'};
    storeLittle(bytes, static_cast<std::uint32_t>(offset + pixelBytes), 4);
    storeLittle(bytes, 0, 4);
    storeLittle(bytes, static_cast<std::uint32_t>(offset), 4);
    storeLittle(bytes, 40, 4);
    storeLittle(bytes, image.w(), 4);
    storeLittle(bytes, 0u - image.h(), 4); // negative: top to bottom
    storeLittle(bytes, 1, 2);
    storeLittle(bytes, bitCount, 2);
    storeLittle(bytes, static_cast<std::uint32_t>(BitmapCoding::Rgb), 4);
    storeLittle(bytes, static_cast<std::uint32_t>(pixelBytes), 4);
    for (int i = 0; i < 4; ++i) storeLittle(bytes, 0, 4); // no resolution, all colours
    for (std::uint32_t gray = 0; bitCount == 8 && gray < 256; ++gray) storeLittle(bytes, gray * 0x010101, 4);
    return bytes;
}

void append(std::vector<unsigned char>& row, unsigned char p) {
    row.push_back(p);
}
void append(std::vector<unsigned char>& row, const Bgra32& p) {
    row.insert(row.end(), {p.b, p.g, p.r});
}

template <class Pixel>
void write(const FNImageReference& reference, const FNImage<Pixel>& image, std::ostream& stream) {
    constexpr unsigned bytesPerPixel = std::is_same_v<Pixel, Bgra32> ? 3 : 1;
    const std::uint64_t stride = (std::uint64_t{image.w()} * bytesPerPixel + 3) / 4 * 4;
    const auto start = head(reference, 8 * bytesPerPixel, stride * image.h());
    stream.write(reinterpret_cast<const char*>(start.data()), static_cast<std::streamsize>(start.size()));
    std::vector<unsigned char> row;
    for (FNConstImIter<Pixel> it(image, image.box()); !it.atEnd(); it.nextRow()) {
        row.clear();
        for (const Pixel& p : it.restOfRow()) append(row, p);
        row.resize(stride);
        stream.write(reinterpret_cast<const char*>(row.data()), static_cast<std::streamsize>(row.size()));
    }
    if (!stream.flush()) FN_THROW(FNEIOError, "Fn::saveBMP: error writing to stream");
}

} // namespace

void dumpBMP(const FNImageReference& image, std::ostream& stream) {
    image.isColor() ? write(image, image.toBgra32(), stream) : write(image, image.toMono8(), stream);
}

void saveBMP(const FNImageReference& image, const std::string& fileName) {
    writeWholeFile(fileName, [&](std::ostream& file) { dumpBMP(image, file); });
}

} // namespace Fn
