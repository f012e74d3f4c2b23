#include "eye/cara/first_test.h"
#include "eye/cara/sod_image.h"
#include "eye/discriminator/sod_conversion.h"
#include "eye/random_svm.h"
#include "support/each_target.h"

#include <gtest/gtest.h>

#include <algorithm>

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

TEST(FirstTest, AcceptsTheWindowsThatTheDiscriminatorAccepts) {
    using namespace Eye::Cara;
    using Eye::Implementation::TrainedSvm;
    const auto dimension =
        static_cast<std::uint32_t>(Eye::Implementation::SodConversion::trainedSize(16, 16));
    // Machines of one to three vectors, of which about half of the windows pass.
    struct {
        std::size_t vectors;
        const char* steps[2];
        std::uint32_t w, h;
    } const cases[] = {{1, {"1", "1"}, 90, 33},
                       {2, {"1", "2"}, 60, 100},
                       {3, {"2", "3"}, 40, 150},
                       {2, {"1", "2"}, 17, 17},
                       {2, {"1", "2"}, 16, 40}};
    for (const auto& [vectors, steps, w, h] : cases) {
        SCOPED_TRACE(std::to_string(vectors) + " vectors, " + std::to_string(w) + "x" + std::to_string(h));
        TrainedSvm svm = randomSvm(TrainedSvm::Kernel::Dot, vectors, dimension, w);
        svm.bias = 0;
        const T8::SodDotDiscriminator discriminator(svm, {"", {{steps[0], -40.0f}, {steps[1], -10.0f}}});
        const SodImage sods(noise(w, h, 30, w));
        const std::vector<unsigned char> expected = T8::Plain::acceptedWindows(discriminator, sods);
        EXPECT_EQ(expected.size(), std::size_t{sods.gridWidth()} * sods.gridHeight());
        if (expected.size() > 100) {
            EXPECT_GT(std::count(expected.begin(), expected.end(), 1), 9);
            EXPECT_GT(std::count(expected.begin(), expected.end(), 0), 9);
        }
        forEachTarget([&] { EXPECT_EQ(T8::acceptedWindows(discriminator, sods), expected); });
    }
}

} // namespace
