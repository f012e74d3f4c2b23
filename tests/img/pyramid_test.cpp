#include "img/pyramid.h"
#include "img/scaling_table.h"

#include "random_images.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <cmath>

namespace {

using Table = std::list<float>;

TEST(ScalingTable, CoversTheSizesEvenly) {
    constexpr double factor = 1.154700538379;
    EXPECT_EQ(Img::createScalingTable(7.0, factor, 14, 14, 0, true), Table{2.0f});

    // Sizes 14 to 70 take log(5) / log(4/3) = 5.59 steps of 4/3: 7 levels, whose surplus is split between
    // both ends.
    const Table table = Img::createScalingTable(7.0, factor, 14, 70, 0, true);
    ASSERT_EQ(table.size(), 7u);
    EXPECT_NEAR(table.front() * table.back(), 2.0 * 10.0, 1e-4);
    for (auto it = table.begin(); std::next(it) != table.end(); ++it)
        EXPECT_NEAR(*std::next(it) / *it, 4.0 / 3, 1e-5);
    // With an overlap of 1/2, steps are half as long.
    const Table overlapping = Img::createScalingTable(7.0, factor, 14, 70, 0.5, true);
    EXPECT_NEAR(*std::next(overlapping.begin()) / overlapping.front(), std::sqrt(4.0 / 3), 1e-5);
}

TEST(ScalingTable, NeverEnlarges) {
    constexpr double factor = 1.154700538379; // from 3.5, the series is 0.5 times powers of about 4/3
    const Table clamped = Img::createScalingTable(7.0, factor, 3.5, 28, 0, true);
    EXPECT_EQ(clamped.front(), 1.0f);
    EXPECT_NEAR(*std::next(clamped.begin()), 4.0 / 3, 1e-5);
    const Table plain = Img::createScalingTable(7.0, factor, 3.5, 28, 0, false);
    EXPECT_EQ(plain.size() + 1, clamped.size());
    EXPECT_GE(plain.front(), 1.0f);
    EXPECT_TRUE(Img::createScalingTable(7.0, factor, 1, 2, 0, true).empty()) << "does not reach 1";
}

TEST(ScalingTable, RefusesWrongParameters) {
    const double nan = std::nan("");
    const double cases[][5] = {{0, 1.2, 1, 2, 0},   {7, 1, 1, 2, 0},         {7, 1.2, 0, 2, 0},
                               {7, 1.2, 3, 2, 0},   {7, 1.2, 1, 2, 1},       {7, 1.2, 1, 2, -0.1},
                               {7, 1.2, 1, nan, 0}, {7, 1 + 1e-12, 1, 2, 0}, {7, 1.2, 1, 2, 1 - 1e-17}};
    for (const auto& c : cases)
        EXPECT_THROW(Img::createScalingTable(c[0], c[1], c[2], c[3], c[4], true), FNEBadArg)
            << c[1] << " " << c[4];
    EXPECT_EQ(thrownText<FNEBadArg>([&] { Img::createScalingTable(7, 0.5, 1, 2, 0.25, true); }),
              "Img::createScalingTable parameter error: 7, 0.5, 0.25, 1, 2");
}

TEST(Pyramid, MakesEachLevelFromTheSource) {
    RandomImages random(1);
    const FNImage<unsigned short> source = random.image<unsigned short>(29, 29);
    using Pyramid = Img::SuccessiveScaledPyramid<Img::PyramidScaling<unsigned short>, 0>;
    const Pyramid pyramid(source, {1.0f, 1.125f, 2.6f, 100.0f});
    ASSERT_EQ(pyramid.size(), 4u);
    EXPECT_EQ(pyramid[0].image.data(), source.data());
    EXPECT_EQ(pyramid[1].image.w(), 26u);
    EXPECT_EQ(pyramid[2].image.h(), 11u);
    EXPECT_TRUE(pyramid[3].image.empty());
    FNImage<unsigned short> expected(11, 11);
    EXPECT_EQ(pyramid[2].mapping, Img::Affine::transform(source, expected));
    EXPECT_EQ(pyramid[2].image, expected);
    EXPECT_THROW(Pyramid(source, {0.0f}), FNEBadArg);
    EXPECT_THROW(Pyramid(source, {1e-9f}), FNEBadArg);
}

} // namespace
