#include "cmp/b7/reshape_warp.h"

#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>

namespace {

using namespace Cmp::B7;

struct Landmarks {
    FNPos leftEye, rightEye, mouth, bridge;
};

FNImage<float> warp(const FNImage<float>& image, const Landmarks& at, float& padding) {
    return reshapeWarp(image, at.leftEye, at.rightEye, at.mouth, at.bridge, padding);
}

/// Each pixel is its position along an axis.
FNImage<float> ramp(std::uint32_t w, std::uint32_t h, bool vertical) {
    FNImage<float> image(w, h);
    float* out = image.getExclusive();
    for (std::uint32_t y = 0; y < h; ++y)
        for (std::uint32_t x = 0; x < w; ++x) *out++ = static_cast<float>(vertical ? y : x) + 0.5f;
    return image;
}

TEST(ReshapeWarp, PutsEyesAndMouthWhereTheyBelong) {
    const Landmarks faces[] = {
        {{268, 250}, {332, 250}, {300, 311}, {300, 250}},  // straight, at the scale of the result
        {{250, 240}, {330, 262}, {275, 330}, {295, 255}},  // tilted
        {{268, 250}, {332, 250}, {285, 330}, {270, 252}},  // turned to one side
        {{268, 250}, {332, 250}, {302, 330}, {303, 200}}}; // the bridge far up
    for (const Landmarks& face : faces)
        for (const bool vertical : {false, true}) {
            float padding;
            const FNImage<float> warped = warp(ramp(600, 600, vertical), face, padding);
            // Between two pixels of the result, of two rows around a fractional one.
            const auto at = [&](std::uint32_t x, float y) {
                const auto row = static_cast<std::uint32_t>(y - 0.5f);
                const float t = y - 0.5f - static_cast<float>(row);
                const auto border = [&](std::uint32_t r) { return (warped(x - 1, r) + warped(x, r)) / 2; };
                return (1 - t) * border(row) + t * border(row + 1);
            };
            const auto along = [&](FNPos p) { return vertical ? p.y : p.x; };
            EXPECT_NEAR(at(48, 58.667f), along(face.leftEye), 0.6);
            EXPECT_NEAR(at(112, 58.667f), along(face.rightEye), 0.6);
            EXPECT_NEAR(at(80, 120), along(face.mouth), 0.6);
        }
}

TEST(ReshapeWarp, CountsWhatLiesOutsideOfTheImageAsPadding) {
    FNImage<float> white(600, 600);
    white.fill(1);
    const FNPos down(0, 61.3333f), right(64, 0);
    const auto faceAt = [&](FNPos eye) {
        return Landmarks{eye, eye + right, eye + right * 0.5f + down, eye + right * 0.5f};
    };
    float padding;
    for (const FNPos eye : {FNPos{268, 250}, {30, 250}, {268, 20}, {560, 580}, {-5000, 5000}}) {
        const FNImage<float> warped = warp(white, faceAt(eye), padding);
        double covered = 0; // the resampling may fill one more line along a border
        for (std::uint32_t i = 0; i < warped.size(); ++i) covered += double{warped.data()[i]};
        EXPECT_NEAR(padding, 1 - covered / 25600, 1.01 / 160) << eye.x << " " << eye.y;
        EXPECT_EQ(padding > 0.01, eye.x != 268 || eye.y != 250);
    }
}

TEST(ReshapeWarp, KeepsTheCentreLineBetweenTheEyes) {
    float padding;
    const FNImage<float> image = ramp(600, 600, false);
    for (const float bridge : {-1e6f, 0.0f, 900.0f, 1e6f}) {
        const FNImage<float> warped =
            warp(image, {{268, 250}, {332, 250}, {300, 311}, {bridge, 250}}, padding);
        // The arc turns back on the far side, where nothing of the face can be seen.
        const bool left = bridge < 300;
        EXPECT_NEAR(warped(left ? 112 : 47, 58), left ? 332 : 268, 6) << bridge;
        EXPECT_EQ(warped(left ? 0 : 159, 58), 0) << bridge;
    }
}

TEST(ReshapeWarp, RefusesWhatIsNoFace) {
    FNImage<float> image(100, 100);
    image.fill(0);
    float padding;
    const auto thrown = [&](const Landmarks& face) { return thrownBy([&] { warp(image, face, padding); }); };
    const std::string mouth = "FNEBadArg: Vertically, the mouth center must be below the eyes!";
    EXPECT_EQ(thrown({{60, 40}, {30, 40}, {45, 70}, {45, 40}}), mouth) << "eyes swapped";
    EXPECT_EQ(thrown({{30, 40}, {60, 40}, {45, 40}, {45, 40}}), mouth);
    const std::string noFace = "FNEBadArg: The positions of eyes and mouth are not those of a face";
    EXPECT_EQ(thrown({{30, 40}, {30, 40}, {45, 70}, {45, 40}}), noFace);
    EXPECT_EQ(thrown({{30, 40}, {1e9f, 40}, {45, 1e9f}, {45, 40}}), noFace);
    EXPECT_EQ(thrown({{30, 40}, {60, 40}, {NAN, 70}, {45, 40}}), noFace);
}

} // namespace
