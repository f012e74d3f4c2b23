#pragma once

#include "fn/image.h"
#include "fn/sign_value_vector.h"

#include <vector>

namespace Eye::Implementation {

/// Signs of differences of neighbouring pixels, and windows of 16 by 16 of them: the features of the face
/// finder's first stages. They do not depend on brightness and contrast.
///
/// There is a byte for each position but those of the last row and column. Let p be the pixel, r the one to
/// the right, d the one below and e the one below to the right. The low nibble holds, from bit 0 on, r >= p,
/// e >= p, d >= p and d >= r. The high nibble, 0 in the first row and column, tells where those signs agree:
/// bit 0 that of the upper left and the upper position, bit 1 of the upper left and this one, bit 2 of the
/// upper left and the left one, bit 3 of the left and the upper one.
class SodImage {
public:
    /// Positions of a window along each side; it covers one pixel more.
    static constexpr std::uint32_t windowSize = 16;
    static constexpr std::uint32_t windowPixels = windowSize + 1;
    /// Bits of a window as evaluated, and as trained.
    static constexpr std::uint32_t windowBits = windowSize * windowSize * 8;

    explicit SodImage(const FNImage<unsigned short>& image);

    /// Number of windows along each side, 0 if the image is too small.
    std::uint32_t gridWidth() const noexcept { return gridWidth_; }
    std::uint32_t gridHeight() const noexcept { return gridHeight_; }

    unsigned char operator()(std::uint32_t x, std::uint32_t y) const { return bytes_[x * stride_ + y]; }

    /// The window at (x, y), below gridWidth() and gridHeight(), to `window`, which has windowBits values: 16
    /// columns of 16 bytes, with the high nibbles of its first row and column cleared.
    void getWindow(std::uint32_t x, std::uint32_t y, unsigned char* window) const noexcept;

    /// The bytes of a column, as operator() gives them, and how far it is to the next column. Behind the last
    /// column, so many bytes more may be read.
    static constexpr std::size_t readableBehind = 256;
    const unsigned char* column(std::uint32_t x) const noexcept { return bytes_.data() + x * stride_; }
    std::size_t stride() const noexcept { return stride_; }

    /// The same window in the order in which discriminators are trained: the low nibbles of all positions row
    /// by row, then the high nibbles of those outside the first row and column.
    Fn::SignValueVector<int> trainedWindow(std::uint32_t x, std::uint32_t y) const;

private:
    std::uint32_t gridWidth_, gridHeight_;
    std::size_t stride_; // bytes from one column to the next
    std::vector<unsigned char> bytes_;
};

namespace Plain {

/// The byte of one position, straight from its definition.
unsigned char sodByte(const FNImage<unsigned short>& image, std::uint32_t x, std::uint32_t y);

} // namespace Plain

} // namespace Eye::Implementation
