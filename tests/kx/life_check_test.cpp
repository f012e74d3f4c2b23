#include "fn/deployment/app_config_db.h"
#include "kx/life_checker.h"
#include "moving_face.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <sstream>

namespace Kx {
namespace {

using namespace MovingFace;

FNCountedPtr<Cmp::LifeChecker> checker(const std::string& settings = {}) {
    std::istringstream text(settings);
    return Implementation::createLifeChecker(AppVolatileConfigDB(text));
}

/// The eyes at some distance around a middle.
std::pair<FacialFeatureLocation, FacialFeatureLocation> eyes(FNPos middle, float distance) {
    return {{middle - FNPos(distance / 2, 0)}, {middle + FNPos(distance / 2, 0)}};
}

bool alive(const FNImage<unsigned char>& image, const FNImage<unsigned char>& reference, FNPos move = {},
           float distance = 24) {
    const auto [left, right] = eyes(FNPos(36, 28) + move, distance);
    return checker()->test(image, left, right, reference, FacialFeatureLocation{leftEye},
                           FacialFeatureLocation{rightEye});
}

TEST(LifeChecker, AFlatPictureIsNotAlive) {
    EXPECT_FALSE(alive(seen(0), seen(0)));
    EXPECT_FALSE(alive(seen(0, 0, 0.7), seen(0))) << "in other light";
    for (const float x : {-1.5f, 0.0f, 1.5f})
        for (const float y : {-1.5f, 0.0f, 1.5f})
            EXPECT_FALSE(alive(seen(0), seen(0), {x, y}))
                << "with eyes that were found elsewhere " << x << " " << y;
    EXPECT_FALSE(alive(seen(0, 0.004), seen(0))) << "that is leant back";
    EXPECT_FALSE(alive(seen(0), seen(0, 0.004)));
}

TEST(LifeChecker, AFaceThatMovesInDepthIsAlive) {
    EXPECT_TRUE(alive(seen(5), seen(0)));
    EXPECT_TRUE(alive(seen(0), seen(5)));
    EXPECT_TRUE(alive(seen(-5), seen(0)));
}

TEST(LifeChecker, AFaceThatMovedOrGrewTooMuchTellsNothing) {
    EXPECT_TRUE(alive(seen(5), seen(0), {10, 0})) << "the same, less";
    EXPECT_FALSE(alive(seen(5), seen(0), {20, 0}));
    EXPECT_FALSE(alive(seen(5), seen(0), {}, 24 * 1.3f));
    EXPECT_FALSE(alive(seen(5), seen(0), {}, 24 / 1.3f));
    EXPECT_FALSE(alive(seen(5), seen(0), {}, 0));
    EXPECT_FALSE(alive(seen(5), seen(0), {std::nanf(""), 0}));
}

TEST(LifeChecker, TakesItsSettingsFromTheDatabase) {
    const auto test = [](const Cmp::LifeChecker& c) {
        return c.test(seen(5), FacialFeatureLocation{leftEye}, FacialFeatureLocation{rightEye}, seen(0),
                      FacialFeatureLocation{leftEye}, FacialFeatureLocation{rightEye});
    };
    EXPECT_FALSE(test(*checker("KxRecognitionLifeCheckThreshold = 1000")));
    EXPECT_FALSE(test(*checker("KxRecognitionLifeCheckLossThreshold = 8")));
    EXPECT_TRUE(test(*checker("KxRecognitionLifeCheckWidth = 16\nKxRecognitionLifeCheckRelEyeDist = 1.05")));
    EXPECT_EQ(thrownBy([] { checker("KxRecognitionLifeCheckTemplateHeight = 15"); }),
              "FNEBadArg: CensusDisparity: standard face dim(s) smaller than template dim(s)");
}

TEST(LifeCheck, AsksForOneFaceThatDiffersFromTheFirst) {
    const auto face = [](double turn) {
        return Cmp::Face(picture(turn), FacialFeatureLocation{leftEye}, FacialFeatureLocation{rightEye});
    };
    Implementation::LifeChecker life(checker()), unchecked({});
    for (const double turn : {0.0, 0.0, 0.5}) {
        life.addFace(face(turn));
        EXPECT_FALSE(life.isAlive());
    }
    life.addFace(face(5));
    life.addFace(face(0));
    EXPECT_TRUE(life.isAlive());
    EXPECT_TRUE(life.isAlive()) << "once more";
    unchecked.addFace(face(0));
    unchecked.addFace(face(5));
    EXPECT_FALSE(unchecked.isAlive());
    Implementation::LifeChecker blind(checker());
    blind.addFace(face(0));
    blind.addFace(Cmp::Face(picture(0), FaceFinder::Location{}));
    EXPECT_EQ(thrownBy([&] { blind.isAlive(); }),
              "FNEBadFunCall: There is no left eye EyeFinder information for this face!");
}

TEST(LifeChecker, CountsTheBitsThatDiffer) {
    EXPECT_EQ(FNHammingDistance(0x00, 0xff), 8);
    EXPECT_EQ(FNHammingDistance(0x81, 0x80), 1);
}

} // namespace
} // namespace Kx
