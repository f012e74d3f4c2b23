#include "img/histogram_equalizer.h"
#include "img/local_equalization.h"

#include "random_images.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <array>
#include <cmath>

namespace {

template <class T> FNImage<T> rowOf(std::initializer_list<T> pixels) {
    FNImage<T> image(static_cast<std::uint32_t>(pixels.size()), 1);
    std::copy(pixels.begin(), pixels.end(), image.getExclusive());
    return image;
}

TEST(HistogramEqualizer, MapsValuesToTheirRank) {
    const FNImage<float> image = rowOf<float>({4, 1, 2, 2, 8});
    const HistogramEqualizer<float> equalizer(image, image.box(), 10, 18); // 2 for each rank
    const std::pair<float, float> cases[] = {{1, 10},       {2, 13},    {4, 16},
                                             {8, 18},                                // ranks 0, 1.5, 3, 4
                                             {0.5f, 10},    {9, 18},                 // beyond both ends
                                             {1.5f, 11.5f}, {3, 14.5f}, {7, 17.5f}}; // between two
    for (const auto& [value, mapped] : cases) EXPECT_FLOAT_EQ(equalizer(value), mapped) << value;

    const HistogramEqualizer<float> ofTwo(image, {0, 0, 2, 1}, 0, 1), ofNone(image, {9, 0, 12, 1}, 0, 1);
    EXPECT_FLOAT_EQ(ofTwo(2), 1.0f / 3);
    EXPECT_EQ(ofNone(0.7f), 0.7f);
    EXPECT_EQ(HistogramEqualizer<float>(image, {0, 0, 1, 1}, 0, 1)(4), 0) << "a single pixel has rank 0";
    EXPECT_EQ(thrownText<FNEBadArg>([&] { HistogramEqualizer<float>(image, image.box(), 2, 2); }),
              "HistogramEqualizer:  max has to be larger than min: ( min: 2, max: 2)");
}

TEST(HistogramEqualizer, MapsAConstantImageToTheMiddle) {
    FNImage<float> image(7, 3);
    image.fill(0.3f);
    const HistogramEqualizer<float> equalizer(image, image.box(), -1, 1);
    ASSERT_EQ(equalizer.items().size(), 1u);
    EXPECT_EQ(equalizer.items()[0].rank, 10);
    const FNImage<float> result = imgEqualizeHistogram(image, -1, 1);
    EXPECT_EQ(std::count(result.data(), result.data() + 21, 0.0f), 21);
}

TEST(EqualizeHistogram, MapsEveryPixelAsTheEqualizerDoes) {
    RandomImages random(1);
    for (int round = 0; round < 4; ++round) {
        FNImage<float> image = random.image<float>(61, 47);
        for (FNImIter<float> it(image, image.box()); !it.atEnd(); ++it) {
            *it = *it - 0.5f;
            if (round > 0) *it = std::round(*it * 100) / 100; // many equal values, 0 and -0 among them
            if (round == 3 && it.x() == 5) *it = std::numeric_limits<float>::quiet_NaN();
        }
        const HistogramEqualizer<float> whole(image, image.box(), -2, 5), part(image, {3, 10, 40, 30}, -2, 5);
        const FNImage<float> ofWhole = imgEqualizeHistogram(image, -2, 5);
        const FNImage<float> ofPart = imgEqualizeHistogram(image, -2, 5, true, 40, 10, 3, 30);
        for (std::uint64_t i = 0; i < image.size(); ++i) {
            ASSERT_EQ(ofWhole.data()[i], whole(image.data()[i]));
            ASSERT_EQ(ofPart.data()[i], part(image.data()[i]));
        }
    }
    EXPECT_THROW(imgEqualizeHistogram(FNImage<float>(3, 3), 1, 0), FNEBadArg);
}

TEST(HistogramEqualizer, InIntegersShiftsRanks) {
    // Ranks 0, 1 (of 1 and 2), 3 (of 3 to 5), 6, 7 of 8.
    const FNImage<short> image = rowOf<short>({-100, 10, 10, 20, 20, 20, 400, 30});
    const HistogramEqualizer<short> equalizer(image, image.box(), 1000, 1801);
    std::vector<std::pair<int, unsigned>> items;
    for (const auto& item : equalizer.items()) items.emplace_back(item.value, item.rank);
    EXPECT_EQ(items, (std::vector<std::pair<int, unsigned>>{{-100, 0}, {10, 1}, {20, 4}, {30, 6}, {400, 7}}));
    const auto at = [](int rank) { return 1000 + (801 * rank >> 3); };
    const std::pair<short, int> cases[] = {
        {-100, at(0)},
        {10, at(1)},
        {20, at(4)},
        {400, at(7)},
        {-101, 1000},
        {401, 1801},
        {13, at(1) + 3 * ((801 * 3 >> 3) / 10)}, // slope 300 / 10
        {-50, at(0) + 50 * ((801 >> 3) / 110)},  // slope 100 / 110 truncates to 0
    };
    for (const auto& [value, mapped] : cases) EXPECT_EQ(equalizer(value), mapped) << value;
    const HistogramEqualizer<short> full(image, image.box(), -32768, 32767);
    EXPECT_EQ(full(400), -32768 + (65535 * 7 >> 3));
    EXPECT_EQ(full(401), 32767);
}

TEST(EqualizeHistogram, InIntegersUsesTheCumulativeHistogram) {
    RandomImages random(2);
    const FNImage<short> image = random.image<short>(50, 40);
    const FNImage<short> result = imgEqualizeHistogram(image, -32768, 32767);
    for (std::uint64_t i = 0; i < image.size(); i += 7) {
        double below = 0, upTo = 0;
        for (std::uint64_t j = 0; j < image.size(); ++j) {
            below += image.data()[j] < image.data()[i];
            upTo += image.data()[j] <= image.data()[i];
        }
        ASSERT_NEAR(result.data()[i], -32768 + 65535 * (below + upTo) / (2 * 2000), 1);
    }
}

TEST(NearlyRegularGrid, EndsWithTheImage) {
    const FNImage<float> image(50, 16);
    const NearlyRegularGrid<float> grid(image, 8, 8, 16, 16);
    EXPECT_EQ(grid.nx(), 6); // 0, 8, .. 32 and 34
    EXPECT_EQ(grid.ny(), 1);
    EXPECT_EQ(grid.corner(4, 0), FNGridPos(32, 0));
    EXPECT_EQ(grid.box(5, 0), (FNBox{34, 0, 50, 16}));
    EXPECT_EQ(NearlyRegularGrid<float>(image, 17, 1, 16, 16).nx(), 3) << "the last one is regular";
    for (const auto& c : {std::array{0, 16, 16}, {8, 0, 16}, {8, 51, 16}, {8, 16, 17}, {8, 16, -1}})
        EXPECT_EQ(thrownText<FNEBadArg>([&] { NearlyRegularGrid<float>(image, c[0], 8, c[1], c[2]); }),
                  "NearlyRegularGrid: invalid parameters");
}

/// Tile and weight of the second tile along one axis, from the definition.
std::pair<int, double> place(int x, int size, int tile, int step) {
    const int half = tile / 2, tiles = (size - tile + step - 1) / step + 1;
    if (x < half) return {0, 0};
    if (x >= size - half) return {tiles - 1, 0};
    const int i = (x - half) / step, low = i * step, high = std::min(low + step, size - tile);
    return {i, (x - low - tile / 2.0) / (high - low)};
}

template <class T> void checkLocally(const FNImage<T>& image, T min, T max, double tolerance) {
    constexpr int dx = 6, dy = 5, tile = 8;
    const FNImage<T> result = imgLocalAdaptiveHistogramEqualization(image, dx, dy, tile, tile, min, max);
    const int w = image.box().x1, h = image.box().y1;
    for (int y = 0; y < h; ++y)
        for (int x = 0; x < w; ++x) {
            const auto [i, a] = place(x, w, tile, dx);
            const auto [j, b] = place(y, h, tile, dy);
            double sum = 0;
            for (int v = 0; v < 2; ++v)
                for (int u = 0; u < 2; ++u) {
                    const double weight = (u ? a : 1 - a) * (v ? b : 1 - b);
                    if (weight == 0) continue;
                    const int x0 = std::min((i + u) * dx, w - tile), y0 = std::min((j + v) * dy, h - tile);
                    const HistogramEqualizer<T> equalizer(image, {x0, y0, x0 + tile, y0 + tile}, min, max);
                    sum += weight * static_cast<double>(equalizer(image.get({x, y})));
                }
            ASSERT_NEAR(static_cast<double>(result.get({x, y})), sum, tolerance) << x << " " << y;
        }
}

TEST(LocalEqualization, MixesTheMappingsOfTheTilesAround) {
    RandomImages random(3);
    checkLocally<float>(random.image<float>(35, 23), -1, 1, 1e-5);
    checkLocally<short>(random.image<short>(35, 23), -32768, 32767, 0.51);
    checkLocally<float>(random.image<float>(8, 23), -1, 1, 1e-5); // one column of tiles
    checkLocally<float>(random.image<float>(20, 8), -1, 1, 1e-5);
    const FNImage<float> odd =
        imgLocalAdaptiveHistogramEqualization(random.image<float>(3, 3), 1, 1, 3, 3, 0.f, 1.f);
    EXPECT_EQ(odd.size(), 9u) << "one tile of an odd size";
}

} // namespace
