#include "eye/cara/sod_image.h"

#include "eye/discriminator/sod_conversion.h"

#include <gtest/gtest.h>

#include <random>

namespace {

using namespace Eye::Implementation;

FNImage<unsigned short> noise(std::uint32_t w, std::uint32_t h, unsigned levels, unsigned seed) {
    std::mt19937 random(seed);
    FNImage<unsigned short> image(w, h);
    unsigned short* const pixels = image.getExclusive();
    for (std::uint64_t i = 0; i < image.size(); ++i)
        pixels[i] = static_cast<unsigned short>(random() % levels);
    return image;
}

TEST(SodImage, BytesAreThoseOfTheDefinition) {
    for (const auto& [w, h, levels] :
         {std::array{40u, 33u, 65536u}, std::array{17u, 50u, 3u}, std::array{18u, 17u, 2u}}) {
        const FNImage<unsigned short> image = noise(w, h, levels, w);
        const SodImage sods(image);
        for (std::uint32_t y = 0; y + 1 < h; ++y)
            for (std::uint32_t x = 0; x + 1 < w; ++x)
                ASSERT_EQ(sods(x, y), Plain::sodByte(image, x, y))
                    << x << "," << y << " of " << w << "x" << h;
    }
}

TEST(SodImage, GridHoldsTheWindowsThatFit) {
    for (const auto& [w, h, gridW, gridH] :
         {std::array{17u, 17u, 1u, 1u}, std::array{16u, 40u, 0u, 0u}, std::array{40u, 16u, 0u, 0u},
          std::array{1u, 1u, 0u, 0u}, std::array{0u, 0u, 0u, 0u}, std::array{30u, 20u, 14u, 4u}}) {
        const SodImage sods(noise(w, h, 100, 1));
        EXPECT_EQ(sods.gridWidth(), gridW) << w << "x" << h;
        EXPECT_EQ(sods.gridHeight(), gridH) << w << "x" << h;
    }
}

/// The scan's window against a trained vector gives the product of the two trained vectors: the filler adds
/// nothing.
TEST(SodImage, WindowsMatchConvertedTrainedVectors) {
    const SodImage sods(noise(60, 50, 9, 4));
    Fn::SignValueVector<int> window(SodImage::windowBits);
    for (unsigned i = 0; i < 200; ++i) {
        const std::uint32_t x = i * 7 % sods.gridWidth(), y = i * 5 % sods.gridHeight();
        const Fn::SignValueVector<int> trained =
            sods.trainedWindow(i * 3 % sods.gridWidth(), i % sods.gridHeight());
        sods.getWindow(x, y, window.exclusiveBytes());
        const auto converted =
            SodConversion::sod2csod(trained, 16, 16, SodConversion::SodLayout::ColumnAligned, halfSetFiller);
        EXPECT_EQ(window * converted, sods.trainedWindow(x, y) * trained);
    }
}

} // namespace
