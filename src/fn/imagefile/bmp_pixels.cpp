#include "fn/imagefile/bmp.h"

#include "fn/image_conversion.h"
#include "fn/imagefile/sample_scale.h"

#include <bit>

namespace Fn {

namespace {

/// The rows of a bitmap, top to bottom, each padded to 4 bytes.
class Rows {
public:
    explicit Rows(const Bitmap& bitmap)
        : bitmap_(bitmap), stride_((std::uint64_t{bitmap.w()} * bitmap.info.bitCount + 31) / 32 * 4) {
        const std::uint64_t lastRow = (std::uint64_t{bitmap.w()} * bitmap.info.bitCount + 7) / 8;
        if (bitmap.h() == 0 || bitmap.pixels.size() < stride_ * (bitmap.h() - 1) + lastRow)
            FN_THROW(FNEBadArg, "BMP Error: too few pixels");
    }
    const unsigned char* operator[](std::uint32_t y) const {
        const std::uint32_t stored = bitmap_.info.height < 0 ? y : bitmap_.h() - 1 - y;
        return bitmap_.pixels.data() + stored * stride_;
    }

private:
    const Bitmap& bitmap_;
    std::uint64_t stride_;
};

/// The pixels of one row that share bytes, first pixel in the high bits.
std::uint32_t packedIndex(const unsigned char* row, std::uint32_t x, unsigned bits) {
    const std::uint64_t bit = std::uint64_t{x} * bits;
    return row[bit / 8] >> (8 - bits - bit % 8) & ((1u << bits) - 1);
}

/// The colour of an index; black behind the end of the table.
Bgra32 tableColor(const Bitmap& bitmap, std::uint32_t index) {
    const std::size_t at = 4 * std::size_t{index};
    if (at + 4 > bitmap.colorTable.size()) return {0, 0, 0};
    const unsigned char* const entry = bitmap.colorTable.data() + at;
    return {entry[2], entry[1], entry[0]};
}

/// One channel of a pixel of 16 or 32 bits.
class MaskedChannel {
public:
    explicit MaskedChannel(std::uint32_t mask)
        : mask_(mask), shift_(mask ? std::countr_zero(mask) : 0), greatest_(mask >> shift_) {}
    unsigned char operator()(std::uint32_t pixel) const {
        if (mask_ == 0) return 0;
        return static_cast<unsigned char>(scaleSample((pixel & mask_) >> shift_, greatest_, 255));
    }

private:
    std::uint32_t mask_;
    int shift_;
    std::uint32_t greatest_;
};

/// Red, green and blue masks behind the colour table of a bitmap with BITFIELDS.
std::array<std::uint32_t, 3> storedMasks(const Bitmap& bitmap) {
    constexpr std::size_t bytes = 12;
    if (bitmap.colorTable.size() < bytes) FN_THROW(FNEBadArg, "BMP Error: no masks");
    const unsigned char* in = bitmap.colorTable.data(); // the masks lie before any colours
    std::array<std::uint32_t, 3> masks;
    for (std::uint32_t& mask : masks) {
        mask = in[0] | in[1] << 8 | in[2] << 16 | static_cast<std::uint32_t>(in[3]) << 24;
        in += 4;
    }
    return masks;
}

/// `bytesPerPixel` is 2 or 4.
template <unsigned bytesPerPixel>
FNImage<Bgra32> maskedColors(const Bitmap& bitmap, const std::array<std::uint32_t, 3>& masks) {
    const MaskedChannel red(masks[0]), green(masks[1]), blue(masks[2]), alpha(bitmap.alphaMask);
    const bool opaque = bitmap.alphaMask == 0;
    const Rows rows(bitmap);
    FNImage<Bgra32> image(bitmap.w(), bitmap.h());
    Bgra32* out = image.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y) {
        const unsigned char* in = rows[y];
        for (std::uint32_t x = 0; x < image.w(); ++x) {
            std::uint32_t pixel = 0;
            for (unsigned i = 0; i < bytesPerPixel; ++i) pixel |= std::uint32_t{*in++} << 8 * i;
            *out++ = Bgra32(red(pixel), green(pixel), blue(pixel), opaque ? 255 : alpha(pixel));
        }
    }
    return image;
}

FNImage<Bgra32> indexedColors(const Bitmap& bitmap) {
    const Rows rows(bitmap);
    FNImage<Bgra32> image(bitmap.w(), bitmap.h());
    Bgra32* out = image.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y)
        for (std::uint32_t x = 0; x < image.w(); ++x)
            *out++ = tableColor(bitmap, packedIndex(rows[y], x, bitmap.info.bitCount));
    return image;
}

FNImage<Bgra32> directColors(const Bitmap& bitmap) {
    const Rows rows(bitmap);
    const unsigned bytes = bitmap.info.bitCount / 8;
    FNImage<Bgra32> image(bitmap.w(), bitmap.h());
    Bgra32* out = image.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y) {
        const unsigned char* in = rows[y];
        for (std::uint32_t x = 0; x < image.w(); ++x, in += bytes) *out++ = Bgra32(in[2], in[1], in[0]);
    }
    return image;
}

FNImage<Bgra32> rgbColors(const Bitmap& bitmap) {
    constexpr std::array<std::uint32_t, 3> fiveBits{0x7C00, 0x03E0, 0x001F};
    const bool masked = bitmap.coding() == BitmapCoding::BitFields;
    switch (bitmap.info.bitCount) {
    case 1:
    case 4:
    case 8:
        return indexedColors(bitmap);
    case 16:
        return maskedColors<2>(bitmap, masked ? storedMasks(bitmap) : fiveBits);
    case 24:
        return directColors(bitmap);
    case 32:
        if (masked) return maskedColors<4>(bitmap, storedMasks(bitmap));
        if (bitmap.coding() != BitmapCoding::Rgb)
            FN_THROW(FNESysError, "Wrong biCompression hint with biBitCount 32");
        return directColors(bitmap);
    default:
        FN_THROW(FNEBadArg,
                 "BMP Error: biBitCount " + std::to_string(bitmap.info.bitCount) + " not supported");
    }
}

Bgra32 fromYCbCr(int y, int cb, int cr) {
    using Factors = ColorConversions<float, 1>;
    const float luma = Factors::luma * static_cast<float>(y - 16);
    const float b = static_cast<float>(cb - 128), r = static_cast<float>(cr - 128);
    const auto sample = [](float v) {
        return static_cast<unsigned char>(std::clamp(static_cast<int>(v), 0, 255));
    };
    return {sample(luma + Factors::redCr * r), sample(luma + Factors::greenCb * b + Factors::greenCr * r),
            sample(luma + Factors::blueCb * b)};
}

/// Whether the pixels hold `size` bytes; what has no colour planes or rows of its own lies top to bottom,
/// unpadded.
void requireBytes(const Bitmap& bitmap, std::uint64_t size) {
    if (bitmap.pixels.size() < size) FN_THROW(FNEBadArg, "BMP Error: too few pixels");
}

/// Two pixels in four bytes: Y0, Cb, Y1, Cr.
FNImage<Bgra32> yuy2Colors(const Bitmap& bitmap) {
    const std::uint64_t stride = (std::uint64_t{bitmap.w()} + 1) / 2 * 4;
    requireBytes(bitmap, stride * bitmap.h());
    FNImage<Bgra32> image(bitmap.w(), bitmap.h());
    Bgra32* out = image.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y)
        for (std::uint32_t x = 0; x < image.w(); ++x) {
            const unsigned char* const pair = bitmap.pixels.data() + y * stride + x / 2 * 4;
            *out++ = fromYCbCr(pair[x % 2 * 2], pair[1], pair[3]);
        }
    return image;
}

/// A plane of Y, then Cb and Cr planes of half the size in each direction; YV12 has them the other way round.
FNImage<Bgra32> planarColors(const Bitmap& bitmap) {
    const std::uint64_t halfW = (std::uint64_t{bitmap.w()} + 1) / 2,
                        halfH = (std::uint64_t{bitmap.h()} + 1) / 2;
    FNImage<Bgra32> image(bitmap.w(), bitmap.h());
    requireBytes(bitmap, image.size() + 2 * halfW * halfH);
    const unsigned char* const luma = bitmap.pixels.data();
    const unsigned char* cb = luma + image.size();
    const unsigned char* cr = cb + halfW * halfH;
    if (bitmap.coding() == BitmapCoding::Yv12) std::swap(cb, cr);
    Bgra32* out = image.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y)
        for (std::uint32_t x = 0; x < image.w(); ++x) {
            const std::uint64_t half = y / 2 * halfW + x / 2;
            *out++ = fromYCbCr(luma[std::uint64_t{y} * image.w() + x], cb[half], cr[half]);
        }
    return image;
}

/// The plane of Y, or all there is.
FNImage<unsigned char> lumaPlane(const Bitmap& bitmap) {
    FNImage<unsigned char> image(bitmap.w(), bitmap.h());
    requireBytes(bitmap, image.size());
    std::copy_n(bitmap.pixels.data(), image.size(), image.getExclusive());
    return image;
}

/// 8 bits through the colour table. Gray entries keep their value, which their luminance would not be.
FNImage<unsigned char> indexedGrays(const Bitmap& bitmap) {
    std::array<unsigned char, 256> grays;
    for (std::uint32_t i = 0; i < grays.size(); ++i) {
        const Bgra32 color = tableColor(bitmap, i);
        grays[i] = color.r == color.g && color.g == color.b ? color.g : luminance<unsigned char>(color);
    }
    const Rows rows(bitmap);
    FNImage<unsigned char> image(bitmap.w(), bitmap.h());
    unsigned char* out = image.getExclusive();
    for (std::uint32_t y = 0; y < image.h(); ++y)
        out = std::transform(rows[y], rows[y] + image.w(), out,
                             [&](unsigned char index) { return grays[index]; });
    return image;
}

} // namespace

FNImage<unsigned char> bmp2ByteImg(const Bitmap& bitmap) {
    switch (bitmap.coding()) {
    case BitmapCoding::Rgb:
    case BitmapCoding::Rgb5:
    case BitmapCoding::BitFields:
        if (bitmap.info.bitCount == 8) return indexedGrays(bitmap);
        return convertImage<unsigned char>(rgbColors(bitmap));
    case BitmapCoding::Y800:
    case BitmapCoding::Y8:
    case BitmapCoding::Yv12:
    case BitmapCoding::I420:
    case BitmapCoding::Iyuv:
        return lumaPlane(bitmap);
    default:
        break;
    }
    const std::uint32_t word = bitmap.info.compression;
    std::string characters;
    for (int shift = 0; shift < 32; shift += 8) characters += static_cast<char>(word >> shift & 0x7F);
    FN_THROW(FNEBadArg,
             "biCompression type " + std::to_string(word) + "(FourCC: " + characters + ") not supported");
}

FNImage<Bgra32> bmp2ColorImg(const Bitmap& bitmap) {
    switch (bitmap.coding()) {
    case BitmapCoding::Rgb:
    case BitmapCoding::Rgb5:
    case BitmapCoding::BitFields:
        return rgbColors(bitmap);
    case BitmapCoding::Yuy2:
        return yuy2Colors(bitmap);
    case BitmapCoding::Yv12:
    case BitmapCoding::I420:
    case BitmapCoding::Iyuv:
        return planarColors(bitmap);
    case BitmapCoding::Y800:
    case BitmapCoding::Y8:
        return convertImage<Bgra32>(lumaPlane(bitmap));
    default:
        FN_THROW(FNEBadArg, "Unknown biCompression type");
    }
}

} // namespace Fn
