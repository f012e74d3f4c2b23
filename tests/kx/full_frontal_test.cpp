#include "kx/full_frontal_test.h"

#include "cmp/measured_portrait.h"
#include "cmp/portrait/analyzer.h"
#include "support/settings.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <functional>

namespace {

using namespace Kx::ISO_19794_5::FullFrontal;
using Assessment = Kx::ISO_19794_5::FullFrontal::Test; // "Test" is something else inside of TEST
using Portrait = MeasuredPortrait;

Assessment withSettings(const std::string& text = "") {
    return Assessment(settingsOf<Assessment>(text));
}

Compliance assessed(const Portrait& portrait) {
    return withSettings().assess(portrait);
}

/// One measure that a test looks at, and values at the edge of what passes.
struct Edge {
    const char* name;
    bool (Compliance::*test)() const;
    std::function<void(Portrait&, float)> set;
    float passes, fails;
    bool demanded, recommended; ///< by the summaries
};

std::function<void(Portrait&, float)> measure(const std::string& name) {
    return [name](Portrait& portrait, float value) { portrait[name] = value; };
}

std::vector<Edge> edges() {
    using C = Compliance;
    const Boundaries l = withSettings().boundaries();
    const auto above = [](float value) { return std::nextafter(value, 1e9f); };
    const auto below = [](float value) { return std::nextafter(value, -1e9f); };
    const auto eyeY = [](Portrait& p, float y) { p.eye0.y = p.eye1.y = y; };
    const auto centerX = [](Portrait& p, float x) { p.eye0.x = x - 60, p.eye1.x = x + 60; };
    const auto roll = [](Portrait& p, float tangent) { p.eye0.y = 340 + tangent * 120; };
    const auto earToEar = [](Portrait& p, float width) { p["ear0"] = p["ear1"] = width / 2; };
    const auto head = [](Portrait& p, float length) { p["crown"] = 300, p["chin"] = length - 300; };
    const auto height = [](Portrait& p, float h) { p.height = h > 0 ? static_cast<unsigned int>(h) : 0; };
    // Beyond the border on one side, with so little on the other that the ratio is good.
    const auto sides = [](const char* large, const char* little) {
        return [large, little](Portrait& p, float value) {
            p[large] = value;
            p[little] = large[0] == 'e' ? 130 : 200;
        };
    };
    const auto small = [](Portrait& p, float width) {
        p.width = 360, p.height = 480;
        p.eye0 = {144, 204}, p.eye1 = {216, 204};
        p["chin"] = 168, p["crown"] = 192, p["ear0"] = p["ear1"] = width / 2;
    };
    const float least = l.eyesOpenThreshold(), tan8 = l.poseMaxRotation();
    return {
        {"low", &C::goodVerticalFacePosition, eyeY, 400, 401, true, true},
        {"high", &C::goodVerticalFacePosition, eyeY, 241, 239, true, true},
        {"left", &C::horizontallyCenteredFace, centerX, 271, 269, true, true},
        {"right", &C::horizontallyCenteredFace, centerX, 329, 331, true, true},
        {"thin", &C::widthOfHead, earToEar, 300, 299, true, true},
        {"thick", &C::widthOfHead, earToEar, 450, 451, true, true},
        {"thick", &C::widthOfHeadBestPractice, earToEar, 428, 429, false, true},
        {"cut on the left", &C::widthOfHead, sides("ear0", "ear1"), 300, 300.5f, true, true},
        {"cut on the right", &C::widthOfHead, sides("ear1", "ear0"), 299, 299.5f, true, true},
        {"short", &C::lengthOfHead, head, 481, 480, true, true},
        {"long", &C::lengthOfHead, head, 719, 721, true, true},
        {"short", &C::lengthOfHeadBestPractice, head, 561, 560, false, true},
        {"long", &C::lengthOfHeadBestPractice, head, 640, 641, false, true},
        {"cut above", &C::lengthOfHead, sides("crown", "chin"), 340, 340.5f, true, true},
        {"cut below", &C::lengthOfHead, sides("chin", "crown"), 459, 459.5f, true, true},
        {"small", &C::resolution, small, 180, below(180), true, true},
        {"small", &C::resolutionBestPractice, small, 240, below(240), false, true},
        {"dark", &C::goodExposure, measure("exposure"), 63.75f, below(63.75f), true, true},
        {"bright", &C::goodExposure, measure("exposure"), 191.25f, above(191.25f), true, true},
        {"few", &C::goodGrayScaleProfile, measure("grayScaleDensity"), 128, 127, true, true},
        {"not", &C::isBackgroundUniformBestPractice, measure("backgroundUniformity"), 1, 0, false, true},
        {"left", &C::isFrontal, roll, tan8 - 1e-4f, tan8 + 1e-4f, true, true},
        {"right", &C::isFrontal, roll, -tan8 + 1e-4f, -tan8 - 1e-4f, true, true},
        {"left", &C::isFrontalBestPractice, roll, 0.0874f, 0.0876f, false, true},
        {"turned", &C::isFrontal, measure("deviationFromFrontalPose"), 0.42f, above(0.42f), true, true},
        {"turned", &C::isFrontalBestPractice, measure("deviationFromFrontalPose"), 0.42f, above(0.42f), true,
         true},
        {"not", &C::isLightingUniform, measure("deviationFromUniformLighting"), -0.75f, above(-0.75f), true,
         true},
        {"one", &C::eyesOpenBestPractice, measure("eye0Open"), above(least), least, false, true},
        {"other", &C::eyesOpenBestPractice, measure("eye1Open"), above(least), least, false, true},
        {"high", &C::imageWidthToHeightBestPractice, height, 804, 805, false, true},
        {"wide", &C::imageWidthToHeightBestPractice, height, 750, 749, false, true},
        {"not", &C::isSharp, measure("sharpness"), 0.26f, below(0.26f), true, true},
        {"open", &C::mouthClosedBestPractice, measure("mouthClosed"), 0.5f, below(0.5f), false, true},
        {"little", &C::hasNaturalSkinColour, measure("naturalSkinColour"), 0.7f, below(0.7f), true, true},
        {"one", &C::noHotSpots, measure("hotSpots"), below(0.5f), 0.5f, true, true},
        {"one", &C::eyesNotRedBestPractice, measure("eye0Red"), 0.18f, above(0.18f), false, true},
        {"other", &C::eyesNotRedBestPractice, measure("eye1Red"), 0.18f, above(0.18f), false, true},
        {"one", &C::eyesGazeFrontalBestPractice, measure("eye0GazeFrontal"), 0.5f, below(0.5f), false, true},
        {"other", &C::eyesGazeFrontalBestPractice, measure("eye1GazeFrontal"), 0.5f, below(0.5f), false,
         true},
    };
}

TEST(FullFrontalTest, EachTestHasItsEdge) {
    const Compliance perfect = assessed({});
    EXPECT_TRUE(perfect.isCompliant());
    EXPECT_TRUE(perfect.isBestPractice());
    for (const Edge& edge : edges()) {
        Portrait good, bad, none;
        edge.set(good, edge.passes);
        edge.set(bad, edge.fails);
        edge.set(none, std::numeric_limits<float>::quiet_NaN());
        EXPECT_TRUE((assessed(good).*edge.test)()) << edge.name << " " << edge.passes;
        EXPECT_FALSE((assessed(bad).*edge.test)()) << edge.name << " " << edge.fails;
        EXPECT_FALSE((assessed(none).*edge.test)()) << edge.name;
        EXPECT_EQ(assessed(bad).isCompliant(), !edge.demanded) << edge.name << " " << edge.fails;
        EXPECT_EQ(assessed(bad).isBestPractice(), !edge.recommended) << edge.name << " " << edge.fails;
    }
}

TEST(FullFrontalTest, TintOnlyMattersInGlasses) {
    Portrait dark;
    dark["eye1Tinted"] = 34;
    EXPECT_TRUE(assessed(dark).noTintedGlasses());
    dark["glasses"] = -0.79f;
    EXPECT_FALSE(assessed(dark).noTintedGlasses());
    EXPECT_FALSE(assessed(dark).isCompliant());
    dark["eye1Tinted"] = 33;
    EXPECT_TRUE(assessed(dark).noTintedGlasses());
    dark["eye0Tinted"] = 33;
    EXPECT_TRUE(assessed(dark).noTintedGlasses());
    dark["eye0Tinted"] = 34;
    EXPECT_FALSE(assessed(dark).noTintedGlasses());
    dark["glasses"] = -0.8f;
    EXPECT_TRUE(assessed(dark).noTintedGlasses());
}

TEST(FullFrontalTest, LimitsAreSettings) {
    Portrait child;
    child.eye0.y = child.eye1.y = 440;
    EXPECT_FALSE(assessed(child).goodVerticalFacePosition());
    const Assessment test =
        withSettings("X.UpperBoundForVerticalPosition = 0.6\nX.DeviationFromCenter = 0.125\n");
    EXPECT_TRUE(test.assess(child).goodVerticalFacePosition());
    EXPECT_EQ(test.boundaries().leftBoundCenteredFace(), 0.375f);
    EXPECT_EQ(test.boundaries().rightBoundCenteredFace(), 0.625f);
    EXPECT_EQ(withSettings().boundaries().poseMaxRotation(), 0.14054083f) << "all digits of the default";
    EXPECT_EQ(withSettings().boundaries().minWidthOfHeadRatio(), 1.3333f);
}

TEST(FullFrontalTest, AGrayPortraitIsNotAskedForColour) {
    Portrait gray;
    gray.isColor = false;
    const Compliance compliance = assessed(gray);
    EXPECT_TRUE(compliance.isBestPractice());
    for (const Compliance& c : {compliance, Compliance(compliance.serialize())}) {
        EXPECT_EQ(thrownBy([&] { c.hasNaturalSkinColour(); }),
                  "FNEBadArg: Compliance::hasNaturalSkinColour() not applicable on gray scale image");
        EXPECT_EQ(thrownBy([&] { c.eyesNotRedBestPractice(); }),
                  "FNEBadArg: Compliance::eyesNotRed() not applicable on gray scale image");
    }
}

TEST(FullFrontalTest, ResultsSurvivePacking) {
    // Failures all over the package.
    Portrait portrait;
    portrait.eye0.x -= 31, portrait.eye1.x -= 31; // horizontallyCenteredFace
    portrait["ear0"] = portrait["ear1"] = 110;    // the widths of the head, and the better resolution
    portrait["exposure"] = 1, portrait["deviationFromFrontalPose"] = 1, portrait["mouthClosed"] = 0;
    portrait["hotSpots"] = 3, portrait["glasses"] = 1, portrait["eye0Tinted"] = 200;
    const Compliance original = assessed(portrait);
    std::string results;
    for (const Fn::Package& element : std::list<Fn::Package>(original.serialize()))
        results += element.toBool() ? '1' : '0';
    EXPECT_EQ(results, "110010110011001111010110");
    portrait.isColor = false;
    std::string gray;
    for (const Fn::Package& element : std::list<Fn::Package>(assessed(portrait).serialize()))
        gray += element.toBool() ? '1' : '0';
    EXPECT_EQ(gray, "010010110011001111000010");

    const Compliance read(original.serialize());
    for (const Edge& edge : edges()) EXPECT_EQ((read.*edge.test)(), (original.*edge.test)()) << edge.name;
    EXPECT_FALSE(read.isCompliant());
    EXPECT_EQ(read.serialize(), original.serialize());
    EXPECT_EQ(thrownBy([] { Compliance(Fn::Package(true)); }).substr(0, 9), "FNEBadArg");
    for (const bool more : {false, true}) {
        std::list<Fn::Package> elements(original.serialize());
        more ? elements.push_back(Fn::Package(true)) : elements.pop_back();
        EXPECT_EQ(thrownBy([&] { Compliance{Fn::Package(elements)}; }).substr(0, 9), "FNEBadArg") << more;
    }
}

TEST(FullFrontalTest, SummariesStopAtTheFirstFailure) {
    using Cmp::Portrait::Analyzer;
    FNImage<unsigned char> image(600, 800);
    image.fill(90);
    const Cmp::Face face(FNImageReferenceFactory::create(image), {{240, 340}, 0, 0}, {{360, 340}, 0, 0});
    const Analyzer analyzer(settingsOf<Analyzer>("X.DataDir = /no/such\n"));
    const Assessment test = withSettings();
    // The flat gray picture has too few levels, which is found out before a model is needed.
    EXPECT_FALSE(test.assess(analyzer.analyze(face, {280, 320, 160, 160})).isCompliant());
    EXPECT_EQ(thrownBy([&] { test.assess(analyzer.analyze(face)).isCompliant(); }).substr(0, 10),
              "FNEIOError");
}

} // namespace
