#include "eye/discriminator/sod_conversion.h"

#include "eye/random_svm.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

namespace {

using namespace Eye::Implementation;
using Signs = Fn::SignValueVector<int>;

/// Nibble number i has the value i modulo 16.
Signs countingNibbles(std::uint32_t nibbles) {
    Signs signs(4 * nibbles);
    for (std::uint32_t i = 0; i < nibbles; ++i)
        signs.exclusiveBytes()[i / 2] |= static_cast<unsigned char>(i % 16 << 4 * (i % 2));
    return signs;
}

std::vector<int> bytesOf(const Signs& signs) {
    return {signs.bytes(), signs.bytes() + signs.byteCount()};
}

TEST(SodConversion, PutsBothNibblesOfAPositionIntoOneByte) {
    // Three columns and two rows: first nibbles 0 1 2, 3 4 5, second ones 6 7 at (1, 1) and (2, 1).
    const Signs trained = countingNibbles(8);
    EXPECT_EQ(bytesOf(SodConversion::sod2csod(trained, 3, 2, SodConversion::SodLayout::ColumnAligned, 0xAA)),
              (std::vector<int>{0xA0, 0xA3, 0xAA, 0xAA, 0xA1, 0x64, 0xAA, 0xAA, 0xA2, 0x75, 0xAA, 0xAA}));
    EXPECT_EQ(bytesOf(SodConversion::sod2csod(trained, 3, 2, SodConversion::SodLayout::RowAligned, 0xAA)),
              (std::vector<int>{0xA0, 0xA1, 0xA2, 0xAA, 0xA3, 0x64, 0x75, 0xAA}));
    EXPECT_EQ(
        SodConversion::sod2csod(countingNibbles(481), 16, 16, SodConversion::SodLayout::ColumnAligned, 0xAA)
            .size(),
        2048u);
}

TEST(SodConversion, TakesASingleColumnAndRefusesNone) {
    const auto converted = [](std::uint32_t nibbles, std::uint32_t columns, std::uint32_t rows) {
        return SodConversion::sod2csod(countingNibbles(nibbles), columns, rows,
                                       SodConversion::SodLayout::ColumnAligned, 0xAA);
    };
    EXPECT_EQ(bytesOf(converted(3, 1, 3)), (std::vector<int>{0xA0, 0xA1, 0xA2, 0xAA}));
    EXPECT_NE(thrownBy([&] { converted(0, 0, 3); }), "");
    EXPECT_NE(thrownBy([&] { converted(0, 3, 0); }), "");
}

TEST(SodConversion, KeepsProductsWithWindows) {
    std::mt19937 random(1);
    for (int i = 0; i < 10; ++i) {
        const Signs a = randomSigns(1924, random), b = randomSigns(1924, random);
        const auto column = SodConversion::SodLayout::ColumnAligned;
        EXPECT_EQ(SodConversion::sod2csod(a, 16, 16, column, halfSetFiller) *
                      SodConversion::sod2csod(b, 16, 16, column, 0),
                  a * b);
        const Signs c = randomSigns(2400, random), d = randomSigns(2400, random);
        const auto byColumn = GSodConversion::GSodLayout::ColumnAligned;
        EXPECT_EQ(GSodConversion::sod2ssod(c, 8, 6, 6, byColumn, halfSetFiller) *
                      GSodConversion::sod2ssod(d, 8, 6, 6, byColumn, 0),
                  c * d);
    }
}

TEST(GSodConversion, GathersPairsAtTheirLowerRightPoint) {
    // Two by one points, one direction: the trained pairs are (p, right), (p, next) of the left point, then
    // (p, next).
    Signs trained(6);
    trained.exclusiveBytes()[0] = 0b01'10'11;
    EXPECT_EQ(
        bytesOf(GSodConversion::sod2ssod(trained, 2, 1, 1, GSodConversion::GSodLayout::ColumnAligned, 0)),
        (std::vector<int>{0, 0, 0, 0, 0, 0, 0b10, 0, 0b11, 0, 0, 0, 0, 0, 0b01, 0}));
}

TEST(SodConversion, NamesSizesThatDoNotFit) {
    EXPECT_EQ(thrownText<FNEBadArg>([] {
                  SodConversion::sod2csod(Signs(10), 16, 16, SodConversion::SodLayout::ColumnAligned, 0);
              }),
              "Eye::Implementation::sod2csod:  the given input vector of size 10 does not match to the "
              "provided dimension "
              " columns [16] and rows [16] which yields to an size of 1924");
    EXPECT_EQ(thrownText<FNEBadArg>([] {
                  GSodConversion::sod2ssod(Signs(10), 7, 7, 6, GSodConversion::GSodLayout::ColumnAligned, 0);
              }),
              "Eye::Implementation::sod2ssod:  the given input vector of size 10 does not match to the "
              "provided dimension "
              " columns [7] and rows [7] which yields to an size of 2460");
    EXPECT_THROW(SodConversion::sod2csod(Signs(0), 0, 0, SodConversion::SodLayout::RowAligned, 0), FNEBadArg);
    EXPECT_THROW(GSodConversion::sod2ssod(Signs(2460), 7, 7, 7, GSodConversion::GSodLayout::RowAligned, 0),
                 FNEBadArg);
}

} // namespace
