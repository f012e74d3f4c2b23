#pragma once

#include "fn/sign_value_vector.h"

/// Conversion of trained sign vectors to the bit order in which the scan reads its windows.
///
/// SOD: signs of differences of neighbouring pixels, a nibble for each position, and a second nibble on how
/// those of neighbours agree for each position with x >= 1 and y >= 1. GSOD: comparisons of neighbouring
/// Gabor responses.
///
/// What a window does not hold is clear there; the trained vectors hold a filler at that place whose bits are
/// half set, so that it adds nothing to the scalar product.

namespace Eye::Implementation {

/// Filler of the discriminators.
inline constexpr unsigned char halfSetFiller = 0xAA;

namespace SodConversion {

/// Order of the positions; along the inner one each line is padded with the filler to a multiple of 4 bytes.
enum class SodLayout { RowAligned = 1, ColumnAligned = 2 };

/// Number of values of a trained vector.
constexpr std::uint64_t trainedSize(std::uint64_t columns, std::uint64_t rows) {
    return 4 * (columns * rows + (columns - 1) * (rows - 1));
}

/// One byte for each position: its first nibble in the low half, its second in the high half.
/// @param sv the first nibbles of all positions row after row, then the second ones
/// @throws FNEBadArg if `sv` has not the size for `columns` by `rows`, each at least 1
Fn::SignValueVector<int> sod2csod(const Fn::SignValueVector<int>& sv, std::uint32_t columns,
                                  std::uint32_t rows, SodLayout layout, unsigned char filler);

} // namespace SodConversion

namespace GSodConversion {

enum class GSodLayout { RowAligned = 0, ColumnAligned = 1 };

/// Bytes of one grid point: one for each direction, up to 6, with its comparisons to the points left, above
/// and upper left, and two with those of neighbouring directions.
inline constexpr std::uint32_t bytesPerPoint = 8;
inline constexpr std::uint32_t mostDirections = 6;

/// Number of values of a trained vector: two for each pair.
constexpr std::uint64_t trainedSize(std::uint64_t columns, std::uint64_t rows, std::uint64_t directions) {
    return 2 * directions *
           ((columns - 1) * rows + columns * (rows - 1) + 2 * (columns - 1) * (rows - 1) + columns * rows);
}

/// From the order of a single window's vector to that of windows of a patch, see
/// Eye::Ojo::T8::RowOrientedGaborSods.
/// @throws FNEBadArg if `sv` has not the size for `columns` by `rows`, each at least 1, and `dirs`
/// directions, 1 to 6
Fn::SignValueVector<int> sod2ssod(const Fn::SignValueVector<int>& sv, std::uint32_t columns,
                                  std::uint32_t rows, std::uint32_t dirs, GSodLayout layout,
                                  unsigned char filler);

} // namespace GSodConversion

} // namespace Eye::Implementation
