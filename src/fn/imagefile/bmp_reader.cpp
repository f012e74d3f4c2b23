#include "fn/imagefile/bmp.h"

#include "fn/imagefile/bmp_run_lengths.h"
#include "fn/imagefile/byte_stream.h"

#include <algorithm>
#include <ostream>

namespace Fn {

namespace {

using Mode = FNImageDataCompressionMode;

constexpr std::size_t fileHeaderSize = 14, infoSize = 40, maskBytes = 12;
/// Sizes of the later headers: with masks, with alpha, and versions 4 and 5.
constexpr std::array<std::size_t, 4> laterInfoSizes{52, 56, 108, 124};

std::uint32_t loadLittle(const unsigned char* bytes, int n) {
    std::uint32_t value = 0;
    while (n-- > 0) value = value << 8 | bytes[n];
    return value;
}

void readInto(std::istream& stream, unsigned char* to, std::uint64_t size, const char* what) {
    if (!stream.read(reinterpret_cast<char*>(to), static_cast<std::streamsize>(size)))
        FN_THROW(FNEIOError, std::string("BMP Error: reading ") + what);
}

void skip(std::istream& stream, std::uint64_t size, const char* what) {
    stream.ignore(static_cast<std::streamsize>(size));
    if (static_cast<std::uint64_t>(stream.gcount()) != size)
        FN_THROW(FNEIOError, std::string("BMP Error: reading ") + what);
}

/// Both headers as they are stored.
struct Headers {
    std::uint32_t pixelOffset; ///< from the start of the file
    std::size_t infoBytes;     ///< size of the second header
    BitmapInfo info;
    std::array<unsigned char, maskBytes> masks; ///< of a later header
    std::uint32_t alphaMask;

    bool hasMasks() const { return infoBytes > infoSize; }
};

Headers readHeaders(std::istream& stream, bool laterOnes) {
    std::array<unsigned char, laterInfoSizes.back()> bytes{};
    readInto(stream, bytes.data(), fileHeaderSize, "bitmap file header");
    const std::uint32_t pixelOffset = loadLittle(bytes.data() + 10, 4);
    readInto(stream, bytes.data(), 4, "bitmap info header size");
    const std::size_t size = loadLittle(bytes.data(), 4);
    if (size != infoSize && !(laterOnes && std::ranges::count(laterInfoSizes, size)))
        FN_THROW(FNESysError, "BMP Error: Unknown BMP type or wrong header");
    readInto(stream, bytes.data() + 4, size - 4, "bitmap info");
    const auto word = [&](int offset) { return loadLittle(bytes.data() + offset, 4); };
    const auto half = [&](int offset) {
        return static_cast<std::uint16_t>(loadLittle(bytes.data() + offset, 2));
    };
    const auto number = [&](int offset) { return static_cast<std::int32_t>(word(offset)); };
    Headers headers{pixelOffset,
                    size,
                    {number(4), number(8), half(12), half(14), word(16), word(20), number(24), number(28),
                     word(32), word(36)},
                    {},
                    word(infoSize + maskBytes)};
    std::copy_n(bytes.begin() + infoSize, maskBytes, headers.masks.begin());
    return headers;
}

/// Of the codings that are known, the conversions take all but these.
void refuseOtherCodings(BitmapCoding coding, bool runLengths) {
    switch (coding) {
    case BitmapCoding::Rgb:
    case BitmapCoding::Rgb5:
    case BitmapCoding::BitFields:
    case BitmapCoding::Yuy2:
    case BitmapCoding::Yv12:
    case BitmapCoding::I420:
    case BitmapCoding::Iyuv:
    case BitmapCoding::Y800:
    case BitmapCoding::Y8:
        return;
    case BitmapCoding::Rle8:
    case BitmapCoding::Rle4:
        if (runLengths) return;
        break;
    default:
        break;
    }
    FN_THROW(FNEBadArg, "Unknown biCompression type");
}

/// What lies between the headers and the pixels; the masks of a later header come first.
std::vector<unsigned char> readColorTable(std::istream& stream, const Bitmap& bitmap,
                                          const Headers& headers) {
    constexpr std::uint32_t mostColors = 1u << 16;
    const BitmapInfo& info = bitmap.info;
    const std::uint32_t colors = info.colorsUsed != 0 ? info.colorsUsed
                                 : info.bitCount <= 8 ? 1u << info.bitCount
                                                      : 0;
    if (colors > mostColors) FN_THROW(FNEIOError, "BMP Error: reading BMP color map");
    const bool masked = bitmap.coding() == BitmapCoding::BitFields;
    std::vector<unsigned char> table(4 * colors + (masked ? maskBytes : 0));
    const std::size_t known = masked && headers.hasMasks() ? maskBytes : 0;
    std::copy_n(headers.masks.begin(), known, table.begin());
    readInto(stream, table.data() + known, table.size() - known, "BMP color map");
    const std::uint64_t behind = fileHeaderSize + headers.infoBytes + table.size() - known;
    if (headers.pixelOffset > behind) skip(stream, headers.pixelOffset - behind, "BMP pixels");
    return table;
}

/// Bytes that the pixels of this coding take at least: the padding of the last row may be missing.
std::uint64_t neededBytes(const Bitmap& bitmap) {
    const std::uint64_t w = bitmap.w(), h = bitmap.h(), halfW = (w + 1) / 2, halfH = (h + 1) / 2;
    switch (bitmap.coding()) {
    case BitmapCoding::Yuy2:
        return 4 * halfW * h;
    case BitmapCoding::Yv12:
    case BitmapCoding::I420:
    case BitmapCoding::Iyuv:
        return w * h + 2 * halfW * halfH;
    case BitmapCoding::Y800:
    case BitmapCoding::Y8:
        return w * h;
    default: {
        const std::uint64_t rowBits = w * bitmap.info.bitCount;
        return (rowBits + 31) / 32 * 4 * (h - 1) + (rowBits + 7) / 8;
    }
    }
}

/// Reads what the conversions need and passes the rest of what is announced.
std::vector<unsigned char> readPixels(std::istream& stream, const Bitmap& bitmap) {
    constexpr const char* what = "BMP pixels";
    const std::uint64_t announced = getBitmapSize(bitmap.info), needed = neededBytes(bitmap);
    std::vector<unsigned char> pixels(needed);
    readInto(stream, pixels.data(), needed, what);
    if (announced > needed) skip(stream, announced - needed, what);
    return pixels;
}

Mode modeOf(BitmapCoding coding) {
    switch (coding) {
    case BitmapCoding::Rgb:
    case BitmapCoding::Rgb5:
        return Mode::Rgb;
    case BitmapCoding::Rle8:
        return Mode::Rle8;
    case BitmapCoding::Rle4:
        return Mode::Rle4;
    case BitmapCoding::BitFields:
        return Mode::BitFields;
    case BitmapCoding::Yuy2:
        return Mode::Yuy2;
    case BitmapCoding::Yvyu:
        return Mode::Yvyu;
    case BitmapCoding::Uyvy:
        return Mode::Uyvy;
    case BitmapCoding::Yvu9:
        return Mode::Yvu9;
    case BitmapCoding::Yv12:
        return Mode::Yv12;
    case BitmapCoding::I420:
        return Mode::I420;
    case BitmapCoding::Iyuv:
        return Mode::Iyuv;
    case BitmapCoding::Y800:
        return Mode::Y800;
    case BitmapCoding::Y8:
        return Mode::Y8;
    }
    return Mode::Unknown;
}

bool isMono(const Bitmap& bitmap) {
    switch (bitmap.coding()) {
    case BitmapCoding::Rgb:
    case BitmapCoding::Rgb5:
        return bitmap.info.bitCount == 8 && bitmap.info.colorsUsed == 0;
    case BitmapCoding::Y800:
    case BitmapCoding::Y8:
        return true;
    default:
        return false;
    }
}

} // namespace

std::uint64_t getBitmapSize(const BitmapInfo& info) {
    const Bitmap sizes{info, {}, {}};
    const std::uint64_t size =
        info.sizeImage != 0 ? info.sizeImage : (std::uint64_t{info.bitCount} * sizes.w() + 7) / 8 * sizes.h();
    if (size == 0) FN_THROW(FNEIOError, "BMP Error: got image with size 0");
    return size;
}

FNImageReference readBMP(std::istream& stream, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    const Headers headers = readHeaders(stream, limits.rareVariants);
    Bitmap bitmap{headers.info, {}, {}};
    bitmap.alphaMask = headers.alphaMask;
    feedback.compressionMode(modeOf(bitmap.coding()));
    feedback.pixelDepth(bitmap.info.bitCount);
    if (bitmap.info.width <= 0 || bitmap.info.height == 0)
        FN_THROW(FNEIOError, "BMP Error: got image with size 0");
    // What is stored, at most 32 bits for each pixel, and the result.
    limits.check(bitmap.w(), bitmap.h(), 4 + sizeof(Bgra32), "Fn::readBMP");
    if (bitmap.info.bitCount > 32)
        FN_THROW(FNEBadArg,
                 "BMP Error: biBitCount " + std::to_string(bitmap.info.bitCount) + " not supported");
    refuseOtherCodings(bitmap.coding(), limits.rareVariants);
    bitmap.colorTable = readColorTable(stream, bitmap, headers);
    if (bitmap.coding() == BitmapCoding::Rle8 || bitmap.coding() == BitmapCoding::Rle4)
        expandRunLengths(stream, bitmap);
    else
        bitmap.pixels = readPixels(stream, bitmap);
    return isMono(bitmap) ? FNImageReferenceFactory::create(bmp2ByteImg(bitmap))
                          : FNImageReferenceFactory::create(bmp2ColorImg(bitmap));
}

FNImageReference loadBMP(const std::string& fileName, const ReadImagePropertiesFeedback& feedback,
                         const ImageLimits& limits) {
    std::ifstream file = openForReading(fileName, "Unable to open BMP file ");
    return readBMP(file, feedback, limits);
}

void dumpBMPInfo(const BitmapInfo& info, std::ostream& stream) {
    stream << "biWidth " << info.width << "\nbiHeight " << info.height << "\nbiPlanes " << info.planes
           << "\nbiBitCount " << info.bitCount << "\nbiCompression " << info.compression << "\nbiSizeImage "
           << info.sizeImage << "\nbiXPelsPerMeter " << info.xPixelsPerMeter << "\nbiYPelsPerMeter "
           << info.yPixelsPerMeter << "\nbiClrUsed " << info.colorsUsed << "\nbiClrImportant "
           << info.colorsImportant << '\n';
}

} // namespace Fn
