#include "drawn_image.h"
#include "orbek/image_operations.h"
#include "orbek/implementation/lense_distortion.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <sstream>

using namespace Orbek;

namespace {

Configuration anyConfiguration() {
    std::istringstream nothing;
    return Configuration(nothing);
}

const Rgb& pixel(const Image& image, unsigned int x, unsigned int y) {
    return image->colorRepresentation()[std::size_t{y} * image->width() + x];
}

LenseDistortionCorrector corrector(float parameter, int offsetX = 0, int offsetY = 0) {
    return LenseDistortionCorrector(anyConfiguration(), parameter, 101, 80, offsetX, offsetY);
}

TEST(LenseDistortion, SolvesTheRadialModel) {
    for (const double k : {1e-9, 1e-6, 1e-3, -1e-6, -1e-4})
        for (const FN2Vector<double> bent : {FN2Vector<double>{3, 0}, {30, -40}, {0.1, 25}}) {
            const double r = std::hypot(bent.x, bent.y);
            if (3 * k * r * r < -1) continue; // beyond the turning point the model is ambiguous
            const FN2Vector<double> solved = distortedPoint(bent * (1 + k * r * r), k);
            EXPECT_NEAR(solved.x, bent.x, 1e-5) << k;
            EXPECT_NEAR(solved.y, bent.y, 1e-5) << k;
        }
    EXPECT_EQ(distortedPoint({0, 0}, 1e-3), (FN2Vector<double>{0, 0}));
}

TEST(LenseDistortion, ZeroLeavesThePictureInColour) {
    const Image image = grayPattern(101, 80), straight = corrector(0).undistort(image);
    EXPECT_TRUE(straight->isColor());
    EXPECT_EQ(straight->name(), "");
    for (unsigned int i = 0; i < 101 * 80; ++i) {
        const unsigned char gray = image->grayScaleRepresentation()[i];
        ASSERT_EQ(straight->colorRepresentation()[i], (Rgb{gray, gray, gray, 255})) << i;
    }
}

TEST(LenseDistortion, MovesPixelsByTheModelInBothDirections) {
    const Image image = colorPattern(101, 80);
    const int centerX = 50 + 4, centerY = 40 - 3;
    for (const float parameter : {1.0f, -1.0f}) {
        const Image straight = corrector(parameter, 4, -3).undistort(image);
        const double k = 1e-5, g = 1 + k * (55 * 55 + 44 * 44);
        int moved = 0, black = 0;
        for (int y = 0; y < 80; ++y)
            for (int x = 0; x < 101; ++x) {
                // By bisection: r (1 + k r^2) = g times the distance.
                const double dx = x - centerX, dy = y - centerY, distance = std::hypot(dx, dy) * g;
                double low = 0, high = distance;
                for (int i = 0; i < 100; ++i) {
                    const double r = (low + high) / 2;
                    (r * (1 + k * r * r) < distance ? low : high) = r;
                }
                const double ratio = distance > 0 ? low * g / distance : 1;
                const int sign = parameter > 0 ? 1 : -1;
                const int fromX = x + sign * static_cast<int>(dx * ratio - dx + std::copysign(1e-9, dx)),
                          fromY = y + sign * static_cast<int>(dy * ratio - dy + std::copysign(1e-9, dy));
                const bool inside = fromX >= 0 && fromX < 101 && fromY >= 0 && fromY < 80;
                const Rgb expected =
                    inside ? pixel(image, static_cast<unsigned>(fromX), static_cast<unsigned>(fromY))
                           : Rgb{0, 0, 0, 255};
                ASSERT_EQ(pixel(straight, static_cast<unsigned>(x), static_cast<unsigned>(y)), expected)
                    << x << ", " << y;
                moved += fromX != x || fromY != y;
                black += !inside;
            }
        EXPECT_GT(moved, 500);
    }
}

TEST(LenseDistortion, ARegionIsCutFromTheWhole) {
    const Image image = colorPattern(101, 80);
    const LenseDistortionCorrector lens = corrector(1);
    const Image whole = lens.undistort(image), part = lens.undistort(image, {10.9f, 20}, {50, 70.5f});
    ASSERT_EQ(part->width(), 40u);
    ASSERT_EQ(part->height(), 50u);
    EXPECT_EQ(pixel(part, 0, 0), pixel(whole, 10, 20));
    EXPECT_EQ(pixel(part, 39, 49), pixel(whole, 49, 69));
    for (const auto& [lower, upper] :
         {std::pair{Position{5, 5}, Position{5, 9}}, std::pair{Position{0, 0}, Position{102, 80}},
          std::pair{Position{-1, 0}, Position{10, 10}}})
        EXPECT_EQ(thrownBy([&] { lens.undistort(image, lower, upper); }),
                  "FNEBadArg: Invalid image subregion specified");
    EXPECT_EQ(thrownBy([&] { lens.undistort(grayPattern(80, 101)); }),
              "FNEBadArg: Size of image passed to undistort() does not match corrector's image size");
}

TEST(LenseDistortion, RefusesParametersOutOfRange) {
    EXPECT_EQ(thrownBy([] { corrector(1.5f); }), "FNEBadArg: Distortion parameter out of range");
    EXPECT_EQ(thrownBy([] { corrector(-1.5f); }), "FNEBadArg: Distortion parameter out of range");
    EXPECT_EQ(thrownBy([] { corrector(NAN); }), "FNEBadArg: Distortion parameter out of range");
    EXPECT_EQ(thrownBy([] {
                  LenseDistortionCorrector(anyConfiguration(), 1, 3000, 10, 0, 0);
              }).rfind("FNEBadArg: Wrong size of displacement (", 0),
              0u);
    EXPECT_NE(thrownBy([] { corrector(0, 2000000000, 2000000000); }), "nothing thrown");
}

constexpr Rgb blue{200, 0, 0, 7};

TEST(Vignetting, WithoutBorderAndCornersNothingChanges) {
    const Image image = colorPattern(9, 6), result = vignetting(image, blue, 0, 0, SmoothingFunction::Hard);
    for (unsigned int i = 0; i < 54; ++i)
        EXPECT_EQ(result->colorRepresentation()[i], image->colorRepresentation()[i]);
}

TEST(Vignetting, FadesFromTheBorderInward) {
    const Image white(new DrawnImage(20, 12, std::vector<unsigned char>(240, 255)));
    const auto fadeOf = [&](SmoothingFunction smoothing) {
        return vignetting(white, Rgb{55, 155, 255, 9}, 4, 0, smoothing);
    };
    const Image hard = fadeOf(SmoothingFunction::Hard), linear = fadeOf(SmoothingFunction::Linear),
                bell = fadeOf(SmoothingFunction::Bell);
    for (const auto& [x, y, distance] :
         {std::array{0u, 6u, 0u}, std::array{1u, 6u, 1u}, std::array{3u, 5u, 3u}, std::array{18u, 6u, 1u},
          std::array{9u, 10u, 1u}, std::array{2u, 1u, 1u}, std::array{19u, 11u, 0u}}) {
        const double t = distance / 4.0, share = std::exp(-3 * (t - 1) * (t - 1));
        EXPECT_EQ(pixel(hard, x, y), (Rgb{55, 155, 255, 9})) << x << ", " << y;
        EXPECT_EQ(pixel(linear, x, y), (Rgb{static_cast<unsigned char>(55 + 200 * t + 0.5),
                                            static_cast<unsigned char>(155 + 100 * t + 0.5), 255, 255}));
        EXPECT_EQ(pixel(bell, x, y), (Rgb{static_cast<unsigned char>(55 + 200 * share + 0.5),
                                          static_cast<unsigned char>(155 + 100 * share + 0.5), 255, 255}));
    }
    EXPECT_EQ(pixel(hard, 4, 4), (Rgb{255, 255, 255, 255}));
}

TEST(Vignetting, RoundsTheCorners) {
    const Image image = colorPattern(40, 40),
                result = vignetting(image, blue, 0, 10, SmoothingFunction::Bell);
    int changed = 0;
    for (unsigned int y = 0; y < 40; ++y)
        for (unsigned int x = 0; x < 40; ++x) {
            const bool outside = pixel(result, x, y) == blue;
            changed += outside;
            ASSERT_EQ(outside, pixel(result, 39 - x, y) == blue) << "symmetric";
            ASSERT_EQ(outside, pixel(result, x, 39 - y) == blue) << "symmetric";
            if (!outside) {
                ASSERT_EQ(pixel(result, x, y), pixel(image, x, y));
            }
        }
    EXPECT_EQ(changed, 4 * (1 + 1 + 2 + 3 + 4 + 6 + 10))
        << "by half chords of the rows 4 to 10 of the circle";
    EXPECT_EQ(pixel(result, 9, 0), blue);
    EXPECT_NE(pixel(result, 10, 0), blue);
    // A fade around round corners, and sizes beyond the image, leave nothing undefined.
    for (const auto& [border, radius] : {std::pair{6, 10}, std::pair{100, 0}, std::pair{3, 100},
                                         std::pair{2000000000, 2000000000}, std::pair{-5, -5}})
        for (const Image& any : {image, grayPattern(1, 1), grayPattern(1, 9)})
            EXPECT_EQ(vignetting(any, blue, border, radius, SmoothingFunction::Linear)->width(),
                      any->width());
}

} // namespace
