#include "eye/cara/sod_image.h"

#include "eye/discriminator/sod_conversion.h"

#include <algorithm>
#include <array>
#include <cstring>

namespace Eye::Implementation {
namespace {

/// Columns lie one after another, since a window is read by columns; so the pixels are first brought into
/// that order.
std::vector<unsigned short> transposed(const FNImage<unsigned short>& image) {
    constexpr std::uint32_t tile = 16;
    const std::uint32_t w = image.w(), h = image.h();
    std::vector<unsigned short> columns(image.size());
    for (std::uint32_t y0 = 0; y0 < h; y0 += tile)
        for (std::uint32_t x0 = 0; x0 < w; x0 += tile)
            for (std::uint32_t x = x0; x < std::min(w, x0 + tile); ++x)
                for (std::uint32_t y = y0; y < std::min(h, y0 + tile); ++y)
                    columns[std::size_t{x} * h + y] = image.row(y)[x];
    return columns;
}

/// Low nibbles of one column, from it and the one to the right.
void lowNibbles(const unsigned short* column, const unsigned short* right, unsigned char* codes,
                std::size_t n) {
    for (std::size_t y = 0; y < n; ++y) {
        const unsigned short p = column[y], r = right[y], d = column[y + 1], e = right[y + 1];
        codes[y] = static_cast<unsigned char>((r >= p) | (e >= p) << 1 | (d >= p) << 2 | (d >= r) << 3);
    }
}

/// Bytes of one column, from its low nibbles and those of the column to the left.
void withHighNibbles(const unsigned char* left, const unsigned char* codes, unsigned char* bytes,
                     std::size_t n) {
    bytes[0] = codes[0];
    for (std::size_t y = 1; y < n; ++y) {
        const unsigned upperLeft = left[y - 1], upper = codes[y - 1];
        const unsigned differ = ((upperLeft ^ upper) & 1) | ((upperLeft ^ codes[y]) & 2) |
                                ((upperLeft ^ left[y]) & 4) | ((left[y] ^ upper) & 8);
        bytes[y] = static_cast<unsigned char>(codes[y] | (~differ & 15) << 4);
    }
}

constexpr std::uint32_t gridSize(std::uint32_t pixels) {
    return pixels > SodImage::windowSize ? pixels - SodImage::windowSize : 0;
}

/// What of a window's column is kept: its first byte loses the high nibble.
constexpr std::uint64_t firstByteLow = 0xFFFFFFFFFFFFFF0F;
constexpr std::uint64_t allLow = 0x0F0F0F0F0F0F0F0F;

} // namespace

SodImage::SodImage(const FNImage<unsigned short>& image)
    : gridWidth_(gridSize(image.h() > windowSize ? image.w() : 0)),
      gridHeight_(gridSize(image.w() > windowSize ? image.h() : 0)),
      stride_(image.h() > 1 ? image.h() - 1 : 0),
      bytes_(image.w() > 1 ? stride_ * (image.w() - 1) + readableBehind : readableBehind) {
    if (image.w() < 2 || image.h() < 2) return;
    const std::vector<unsigned short> columns = transposed(image);
    std::vector<unsigned char> left(stride_), codes(stride_);
    for (std::uint32_t x = 0; x + 1 < image.w(); ++x) {
        const unsigned short* const column = columns.data() + std::size_t{x} * image.h();
        lowNibbles(column, column + image.h(), codes.data(), stride_);
        unsigned char* const bytes = bytes_.data() + x * stride_;
        if (x == 0)
            std::copy(codes.begin(), codes.end(), bytes);
        else
            withHighNibbles(left.data(), codes.data(), bytes, stride_);
        left.swap(codes);
    }
}

void SodImage::getWindow(std::uint32_t x, std::uint32_t y, unsigned char* window) const noexcept {
    const unsigned char* column = this->column(x) + y;
    std::uint64_t upperMask = allLow, lowerMask = allLow; // of the first column
    for (std::uint32_t c = 0; c < windowSize; ++c, column += stride_, window += windowSize) {
        std::uint64_t halves[2];
        std::memcpy(halves, column, sizeof halves);
        halves[0] &= upperMask;
        halves[1] &= lowerMask;
        std::memcpy(window, halves, sizeof halves);
        upperMask = firstByteLow;
        lowerMask = ~std::uint64_t{0};
    }
}

Fn::SignValueVector<int> SodImage::trainedWindow(std::uint32_t x, std::uint32_t y) const {
    Fn::SVVectorSequentialBuilder<int> builder(
        static_cast<std::uint32_t>(SodConversion::trainedSize(windowSize, windowSize)));
    const auto addNibble = [&](unsigned nibble) {
        for (int bit = 0; bit < 4; ++bit) builder.setNextSign(nibble >> bit & 1);
    };
    for (std::uint32_t row = 0; row < windowSize; ++row)
        for (std::uint32_t column = 0; column < windowSize; ++column)
            addNibble((*this)(x + column, y + row) & 15u);
    for (std::uint32_t row = 1; row < windowSize; ++row)
        for (std::uint32_t column = 1; column < windowSize; ++column)
            addNibble((*this)(x + column, y + row) >> 4);
    return builder.vector();
}

namespace Plain {
namespace {

unsigned code(const FNImage<unsigned short>& image, std::uint32_t x, std::uint32_t y) {
    const unsigned p = image(x, y), r = image(x + 1, y), d = image(x, y + 1), e = image(x + 1, y + 1);
    return (r >= p ? 1u : 0u) + (e >= p ? 2u : 0u) + (d >= p ? 4u : 0u) + (d >= r ? 8u : 0u);
}

} // namespace

unsigned char sodByte(const FNImage<unsigned short>& image, std::uint32_t x, std::uint32_t y) {
    unsigned byte = code(image, x, y);
    if (x == 0 || y == 0) return static_cast<unsigned char>(byte);
    const unsigned upperLeft = code(image, x - 1, y - 1), upper = code(image, x, y - 1),
                   left = code(image, x - 1, y);
    const auto equalBit = [](unsigned a, unsigned b, int bit) { return (a >> bit & 1) == (b >> bit & 1); };
    if (equalBit(upperLeft, upper, 0)) byte += 16;
    if (equalBit(upperLeft, byte, 1)) byte += 32;
    if (equalBit(upperLeft, left, 2)) byte += 64;
    if (equalBit(left, upper, 3)) byte += 128;
    return static_cast<unsigned char>(byte);
}

} // namespace Plain

} // namespace Eye::Implementation
