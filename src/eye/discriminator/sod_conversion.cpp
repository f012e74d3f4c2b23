#include "eye/discriminator/sod_conversion.h"

#include <algorithm>
#include <string>

namespace Eye::Implementation {
namespace {

using Signs = Fn::SignValueVector<int>;

void requireSize(const char* function, const Signs& sv, std::uint32_t columns, std::uint32_t rows,
                 bool possible, std::uint64_t expected) {
    if (possible && sv.size() == expected) return;
    FN_THROW(FNEBadArg, std::string("Eye::Implementation::") + function +
                            ":  the given input vector of size " + std::to_string(sv.size()) +
                            " does not match to the provided dimension  columns [" + std::to_string(columns) +
                            "] and rows [" + std::to_string(rows) + "] which yields to an size of " +
                            std::to_string(expected));
}

/// Reads bits from the lowest up.
class BitReader {
public:
    explicit BitReader(const Signs& signs) : bytes_(signs.bytes()) {}
    unsigned char next(unsigned count) {
        unsigned value = 0;
        for (unsigned i = 0; i < count; ++i, ++position_)
            value |= (bytes_[position_ / 8] >> position_ % 8 & 1u) << i;
        return static_cast<unsigned char>(value);
    }

private:
    const unsigned char* bytes_;
    std::uint32_t position_ = 0;
};

constexpr std::uint32_t roundedUpTo4(std::uint32_t n) {
    return (n + 3) & ~3u;
}

} // namespace

namespace SodConversion {

Signs sod2csod(const Signs& sv, std::uint32_t columns, std::uint32_t rows, SodLayout layout,
               unsigned char filler) {
    const bool possible = columns != 0 && rows != 0;
    requireSize("sod2csod", sv, columns, rows, possible, possible ? trainedSize(columns, rows) : 0);
    const bool byColumn = layout == SodLayout::ColumnAligned;
    const std::uint32_t outputColumns = byColumn ? columns : roundedUpTo4(columns);
    const std::uint32_t outputRows = byColumn ? roundedUpTo4(rows) : rows;

    FNRMem<unsigned char> bytes(std::uint64_t{outputColumns} * outputRows);
    unsigned char* const out = bytes.getExclusive();
    std::fill_n(out, bytes.size(), filler);
    const auto at = [&](std::uint32_t x, std::uint32_t y) -> unsigned char& {
        return out[byColumn ? x * outputRows + y : y * outputColumns + x];
    };
    BitReader reader(sv);
    for (std::uint32_t y = 0; y < rows; ++y)
        for (std::uint32_t x = 0; x < columns; ++x)
            at(x, y) = static_cast<unsigned char>((at(x, y) & 0xF0) | reader.next(4));
    for (std::uint32_t y = 1; y < rows; ++y)
        for (std::uint32_t x = 1; x < columns; ++x)
            at(x, y) = static_cast<unsigned char>((at(x, y) & 0x0F) | reader.next(4) << 4);
    return Signs(static_cast<std::uint32_t>(8 * bytes.size()), bytes);
}

} // namespace SodConversion

namespace GSodConversion {

Signs sod2ssod(const Signs& sv, std::uint32_t columns, std::uint32_t rows, std::uint32_t dirs,
               GSodLayout layout, unsigned char filler) {
    const bool possible = columns != 0 && rows != 0 && dirs != 0 && dirs <= mostDirections;
    requireSize("sod2ssod", sv, columns, rows, possible, possible ? trainedSize(columns, rows, dirs) : 0);

    FNRMem<unsigned char> bytes(std::uint64_t{columns} * rows * bytesPerPoint);
    unsigned char* const out = bytes.getExclusive();
    std::fill_n(out, bytes.size(), filler);
    BitReader reader(sv);
    /// Moves the next pair of bits to pair number `slot` of a byte of a point.
    const auto movePair = [&](std::uint32_t x, std::uint32_t y, std::uint32_t byte, std::uint32_t slot) {
        const std::uint32_t point = layout == GSodLayout::ColumnAligned ? x * rows + y : y * columns + x;
        unsigned char& target = out[point * bytesPerPoint + byte];
        target = static_cast<unsigned char>((target & ~(3u << 2 * slot)) | reader.next(2) << 2 * slot);
    };
    for (std::uint32_t x = 0; x < columns; ++x)
        for (std::uint32_t y = 0; y < rows; ++y)
            for (std::uint32_t o = 0; o < dirs; ++o) {
                const bool right = x + 1 < columns, down = y + 1 < rows;
                if (right) movePair(x + 1, y, o, 0);             // this point is left of it
                if (right && down) movePair(x + 1, y + 1, o, 1); // its upper and its left neighbour
                if (right && down) movePair(x + 1, y + 1, o, 2); // this point is its upper left neighbour
                if (down) movePair(x, y + 1, o, 3);              // this point is above it
                const std::uint32_t next = (o + 1) % dirs;
                movePair(x, y, mostDirections + next / 4, next % 4);
            }
    return Signs(static_cast<std::uint32_t>(8 * bytes.size()), bytes);
}

} // namespace GSodConversion

} // namespace Eye::Implementation
