#include "cmp/portrait/background_uniformity.h"
#include "cmp/portrait/egg.h"
#include "cmp/portrait/pixel_measures.h"
#include "cmp/portrait/sharpness.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <random>

namespace {

using namespace Cmp::Portrait;
using Fn::Bgra32;

/// An image of what `pixel(x, y)` gives.
template <class T, class Pixel> FNImage<T> painted(std::uint32_t w, std::uint32_t h, Pixel pixel) {
    FNImage<T> image(w, h);
    T* out = image.getExclusive();
    for (std::uint32_t y = 0; y < h; ++y)
        for (std::uint32_t x = 0; x < w; ++x) *out++ = pixel(x, y);
    return image;
}

FNImage<Bgra32> plain(std::uint32_t w, std::uint32_t h, Bgra32 colour) {
    return painted<Bgra32>(w, h, [&](auto, auto) { return colour; });
}

TEST(PortraitPixels, AnEggIsLongerBelowThanAboveAndHoldsNothingWithoutAxes) {
    const Egg egg = Egg::ofEyes({40, 50}, {60, 50}, 1, 2, 1.5f);
    EXPECT_TRUE(egg.contains({70, 50}));
    EXPECT_FALSE(egg.contains({70.1f, 50}));
    EXPECT_TRUE(egg.contains({50, 90}));
    EXPECT_FALSE(egg.contains({50, 90.1f}));
    EXPECT_TRUE(egg.contains({50, 20}));
    EXPECT_FALSE(egg.contains({50, 19.9f}));
    EXPECT_FALSE(Egg::ofEyes({40, 50}, {40, 50}, 1, 2, 1.5f).contains({40, 50}));
    const Egg turned = Egg::ofEyes({50, 40}, {50, 60}, 1, 2, 1.5f); // the chin lies to the left
    EXPECT_TRUE(turned.contains({10.1f, 50}));
    EXPECT_FALSE(turned.contains({89, 50}));
}

TEST(PortraitPixels, ExposureIsTheMeanLevel) {
    EXPECT_FLOAT_EQ(exposure(painted<float>(64, 64, [](auto x, auto) { return x < 32 ? 0.25f : 0.75f; })),
                    127.5f);
}

TEST(PortraitPixels, HotSpotsAreFarBrighterThanTheFaceOrNearlyWhite) {
    // Half of the pixels 0.4, the others 0.5, so that the fence is at 0.65.
    const auto face = [](float spot) {
        return painted<float>(108, 108, [=](auto x, auto y) {
            if (x >= 50 && x < 55 && y == 40) return spot; // in the egg
            if (y == 60) return 1.0f;                      // below the part that counts
            return x % 2 ? 0.4f : 0.5f;
        });
    };
    EXPECT_EQ(hotSpots(face(0.64f)), 0);
    EXPECT_EQ(hotSpots(face(0.66f)), 5);
    EXPECT_EQ(hotSpots(painted<float>(108, 108, [](auto, auto) { return 0.5f; })), 0);
    const float whole = hotSpots(painted<float>(108, 108, [](auto, auto) { return 0.97f; }));
    EXPECT_GT(whole, 2000); // all pixels, about the area of the egg down to its limit
    EXPECT_LT(whole, 3600);
}

TEST(PortraitPixels, GrayScaleDensityCountsLevelsOfTheFaceOnly) {
    const auto image =
        painted<unsigned char>(200, 200, [](auto x, auto) { return static_cast<unsigned char>(x); });
    EXPECT_EQ(grayScaleDensity(image, {80, 100}, {120, 100}), 80u);
    EXPECT_EQ(grayScaleDensity(image, {0, 100}, {40, 100}), 60u);
    EXPECT_EQ(grayScaleDensity(image, {80, 100}, {80, 100}), 0u);
}

TEST(PortraitPixels, SkinHasReddishColours) {
    using Cmp::Implementation::hasNaturalSkinColour;
    struct Case {
        Bgra32 colour;
        bool skin;
    };
    for (const auto& [c, skin] : {Case{{200, 150, 120}, true}, Case{{200, 0, 0}, false},
                                  Case{{200, 150, 71}, true}, Case{{200, 150, 70}, false}, // G - B
                                  Case{{150, 151, 120}, false}, Case{{150, 100, 140}, false},
                                  Case{{250, 50, 40}, false}, // neither blue nor green enough
                                  Case{{109, 105, 100}, false}, Case{{110, 105, 100}, true}})
        EXPECT_EQ(hasNaturalSkinColour(c), skin) << int{c.r} << ' ' << int{c.g} << ' ' << int{c.b};

    // The patch lies between x 20 and 60 and y 15 and 47.
    const auto image = painted<Bgra32>(
        100, 100, [](auto x, auto) { return x < 50 ? Bgra32(200, 150, 120) : Bgra32(0, 0, 255); });
    EXPECT_FLOAT_EQ(naturalSkinColour(image, {20, 11}, {60, 11}), 0.75f);
    EXPECT_EQ(naturalSkinColour(image, {20, 110}, {60, 110}), 0);
}

TEST(PortraitPixels, RedEyesAreRedInTheMiddleOnly) {
    const FNPos eye0(50, 50), eye1(150, 50); // sigma is 3.4, the centre lies 3.5 above the eye
    const auto pupil = [](Bgra32 colour) {
        return painted<Bgra32>(
            200, 100, [=](auto x, auto y) { return x == 50 && y == 46 ? colour : Bgra32(60, 0, 0); });
    };
    EXPECT_EQ(redEye(pupil({60, 0, 0}), eye0, eye0, eye1), 0);
    const float weight = std::exp(-0.25f / (2 * 3.4f * 3.4f));
    EXPECT_NEAR(redEye(pupil({200, 9, 7}), eye0, eye0, eye1), weight * 40000 / 131 / (21 * 20), 1e-4f);
    EXPECT_EQ(redEye(pupil({200, 9, 7}), eye1, eye0, eye1), 0);
    EXPECT_EQ(redEye(pupil({200, 9, 7}), {-500, 50}, eye0, eye1), 0);
}

TEST(PortraitPixels, TintIsHowMuchDarkerItIsBelowTheEyeThanOnTheCheek) {
    const auto image = painted<Bgra32>(
        200, 150, [](auto, auto y) { return y < 90 ? Bgra32(100, 80, 60) : Bgra32(120, 110, 70); });
    EXPECT_FLOAT_EQ(glassTint(image, {50, 50}, {50, 50}, {150, 50}), 30);
    EXPECT_EQ(glassTint(image, {50, 140}, {50, 140}, {150, 140}), 0); // no cheek
}

TEST(PortraitPixels, SharpnessIsAPercentileAndFallsWithBlur) {
    EXPECT_FLOAT_EQ(SharpnessMeter::shareBelow(0), 0.01f);
    EXPECT_FLOAT_EQ(SharpnessMeter::shareBelow(0.000495757f), 0.02f);
    EXPECT_FLOAT_EQ(SharpnessMeter::shareBelow(0.00193986f), 0.99f);
    EXPECT_FLOAT_EQ(SharpnessMeter::shareBelow(1), 1);
    std::mt19937 random(1);
    const auto noise =
        painted<float>(80, 80, [&](auto, auto) { return static_cast<float>(random() % 1000) / 1000; });
    const auto smooth = painted<float>(80, 80, [](auto x, auto y) {
        return std::sin(static_cast<float>(x) / 12) * std::cos(static_cast<float>(y) / 9);
    });
    const SharpnessMeter meter;
    EXPECT_FLOAT_EQ(meter(noise), 1);
    EXPECT_LT(meter(smooth), 0.1f);
    EXPECT_FLOAT_EQ(meter(painted<float>(80, 80, [](auto, auto) { return 0.5f; })), 0.01f);
}

/// A head in front of `ground(x, y)`, eyes 32 pixels apart, with a few rows more than are looked at.
template <class Ground> float uniformity(Ground ground, std::uint32_t height = 140) {
    const FNPos eye0(64, 80), eye1(96, 80);
    const auto image = painted<Bgra32>(160, height, [&](auto x, auto y) {
        const FNPos offset = FNPos(static_cast<float>(x), static_cast<float>(y)) - FNPos(80, 80);
        const bool head = dot(offset, offset)<40 * 40, body = y> 80 && x > 50 && x < 110;
        return head || body ? Bgra32(200, 150, 120) : ground(x, y);
    });
    return backgroundUniformity(image, eye0, eye1);
}

Bgra32 gray(std::uint32_t level) {
    const auto byte = static_cast<unsigned char>(level);
    return {byte, byte, byte};
}

TEST(BackgroundUniformity, AcceptsPlainAndSlowlyChangingBackgrounds) {
    EXPECT_EQ(uniformity([](auto, auto) { return Bgra32(90, 120, 200); }), 1);
    EXPECT_EQ(uniformity([](auto x, auto) { return gray(80 + x / 2); }), 1);
    EXPECT_EQ(uniformity([](auto, auto) { return gray(200); }, 128), 0) << "ends above the shoulders";
    EXPECT_EQ(uniformity([](auto, auto) { return gray(200); }, 129), 1);
}

TEST(BackgroundUniformity, RejectsNoiseTwoColoursAndObjects) {
    std::mt19937 random(1);
    EXPECT_EQ(uniformity([&](auto, auto) { return gray(80 + random() % 80); }), 0);
    EXPECT_EQ(uniformity([](auto x, auto) { return x < 80 ? gray(220) : Bgra32(30, 30, 90); }), 0);
    const auto island = [](std::uint32_t width) {
        return uniformity(
            [=](auto x, auto y) { return y == 20 && x >= 20 && x < 20 + width ? gray(0) : gray(200); });
    };
    EXPECT_EQ(island(14), 1);
    EXPECT_EQ(island(15), 0);
    const auto atShoulder = [](std::uint32_t rows) { // in the last row of interest, number 128
        return uniformity([=](auto x, auto y) {
            return x >= 10 && x < 12 && y <= 128 && y > 128 - rows ? gray(0) : gray(200);
        });
    };
    EXPECT_EQ(atShoulder(4), 1);
    EXPECT_EQ(atShoulder(5), 0);
    const auto besideBody = [](std::uint32_t left) { // which is taken to go from 40 to 120
        return uniformity([=](auto x, auto y) {
            return x >= left && x < left + 2 && y <= 128 && y > 119 ? gray(0) : gray(200);
        });
    };
    for (const auto& [left, uniform] : {std::pair{37u, 0.0f}, {40u, 1.0f}, {118u, 1.0f}, {121u, 0.0f}})
        EXPECT_EQ(besideBody(left), uniform) << left;
}

TEST(BackgroundUniformity, DoesNotEnlargeWithoutBounds) {
    const auto image = plain(2000, 2000, {1, 2, 3});
    EXPECT_EQ(backgroundUniformity(image, {50, 50}, {50.001f, 50}), 0);
    EXPECT_EQ(backgroundUniformity(image, {50, 50}, {50, 50}), 0);
    EXPECT_EQ(backgroundUniformity(image, {std::nanf(""), 50}, {60, 50}), 0);
}

TEST(BackgroundUniformity, SegmentsByNeighbouringColours) {
    // A ramp is one region, a step of the tolerance ends it; a U is one region although its arms meet last.
    const auto image = painted<Bgra32>(7, 3, [](auto x, auto y) {
        if (x < 4) return gray(10 + 6 * x); // 10 16 22 28
        if (x == 5 && y < 2) return gray(200);
        return gray(100);
    });
    FNImage<unsigned char> mask = painted<unsigned char>(7, 3, [](auto, auto) { return 0; });
    mask.set({0, 2}, 1);
    const auto labels = BackgroundUniformity::segment(image, mask, 7);
    const auto row = [&](std::size_t y) {
        std::vector<int> values;
        for (std::size_t x = 0; x < 7; ++x) values.push_back(labels(y, x));
        return values;
    };
    EXPECT_EQ(row(0), (std::vector<int>{0, 0, 0, 0, 1, 2, 1}));
    EXPECT_EQ(row(2), (std::vector<int>{-1, 0, 0, 0, 1, 1, 1}));
    EXPECT_EQ(BackgroundUniformity::segment(image, mask, 6)(0, 1), 1);
}

} // namespace
