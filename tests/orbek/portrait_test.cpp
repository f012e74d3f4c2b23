#include "cmp/measured_portrait.h"
#include "drawn_image.h"
#include "orbek/face_finder.h"
#include "orbek/image_io.h"
#include "orbek/implementation/assessment.h"
#include "orbek/token_face.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <filesystem>
#include <sstream>

using namespace Orbek;

namespace {

Configuration installed(const std::string& folder = ORBEK_BINARY_DIR, const std::string& settings = "") {
    std::istringstream text("ORBEK.Substitutions.INSTALLDIR = " + folder + "\n" + settings);
    return Configuration(text);
}

Portrait::Characteristics measured(const MeasuredPortrait& portrait, unsigned int numberOfFaces = 1) {
    return Portrait::Characteristics::Implementation::make(portrait, numberOfFaces);
}

TEST(PortraitClasses, SayWhatTheEnginesSay) {
    MeasuredPortrait portrait;
    portrait.eye0 = {239.25f, 340};
    portrait["ear0"] = 300.25f, portrait["crown"] = 340.75f, portrait["chin"] = 100.5f;
    portrait.ethnicity = {1, 2, 3};
    const Portrait::Characteristics publicly = measured(portrait, 4);
    EXPECT_EQ(publicly.numberOfFaces(), 4u);
    EXPECT_EQ(publicly.eye0(), (Position{239.25f, 340}));
    EXPECT_EQ(publicly.faceCenter(), (Position{299.625f, 340}));
    EXPECT_EQ(publicly.grayScaleDensity(), 200u);
    EXPECT_EQ(publicly.ethnicity(), (std::array{1.0f, 2.0f, 3.0f}));
    EXPECT_EQ(Portrait::earToEarChinCrownSurroundingBox(publicly), Box(0, 0, 460, 441))
        << "fractions are dropped, also of negative numbers";
    EXPECT_EQ(thrownBy([&] {
                  MeasuredPortrait gray;
                  gray.isColor = false;
                  measured(gray).eye0Red();
              }),
              "FNEBadArg: Characteristics::eye0Red() not applicable on gray scale image");
}

TEST(PortraitClasses, EachMeasureIsTheEnginesOfThatName) {
    using C = Portrait::Characteristics;
    const struct {
        const char* measure;
        float (C::*get)() const;
    } cases[] = {{"glasses", &C::glasses},
                 {"eye0Open", &C::eye0Open},
                 {"eye1Open", &C::eye1Open},
                 {"eye0GazeFrontal", &C::eye0GazeFrontal},
                 {"eye1GazeFrontal", &C::eye1GazeFrontal},
                 {"eye0Red", &C::eye0Red},
                 {"eye1Red", &C::eye1Red},
                 {"eye0Tinted", &C::eye0Tinted},
                 {"eye1Tinted", &C::eye1Tinted},
                 {"mouthClosed", &C::mouthClosed},
                 {"exposure", &C::exposure},
                 {"naturalSkinColour", &C::naturalSkinColour},
                 {"hotSpots", &C::hotSpots},
                 {"backgroundUniformity", &C::backgroundUniformity},
                 {"chin", &C::chin},
                 {"crown", &C::crown},
                 {"ear0", &C::ear0},
                 {"ear1", &C::ear1},
                 {"deviationFromFrontalPose", &C::deviationFromFrontalPose},
                 {"isMale", &C::isMale},
                 {"deviationFromUniformLighting", &C::deviationFromUniformLighting},
                 {"sharpness", &C::sharpness},
                 {"age", &C::age}};
    MeasuredPortrait portrait;
    float value = 1000;
    for (auto& [name, measure] : portrait.measures) measure = ++value;
    portrait.width = 501, portrait.height = 702;
    portrait.eye0 = {100, 205}, portrait.eye1 = {400, 209};
    portrait.ethnicity = {7, 8, 9};
    const C publicly = measured(portrait, 3);
    EXPECT_EQ(std::size(cases) + 1, portrait.measures.size()) << "and the one that is a whole number";
    for (const auto& [measure, get] : cases) EXPECT_EQ((publicly.*get)(), portrait[measure]) << measure;
    EXPECT_EQ(publicly.grayScaleDensity(), static_cast<unsigned int>(portrait["grayScaleDensity"]));
    EXPECT_TRUE(publicly.isColor());
    EXPECT_EQ(publicly.width(), 501u);
    EXPECT_EQ(publicly.height(), 702u);
    EXPECT_EQ(publicly.eye0(), (Position{100, 205}));
    EXPECT_EQ(publicly.eye1(), (Position{400, 209}));
    EXPECT_EQ(publicly.faceCenter(), (Position{250, 207}));
    EXPECT_FLOAT_EQ(publicly.eyeDistance(), std::hypot(300.0f, 4.0f));
    EXPECT_FLOAT_EQ(publicly.poseAngleRoll(), -4.0f / 300);
    EXPECT_EQ(publicly.widthOfHead(), portrait["ear0"] + portrait["ear1"]);
    EXPECT_EQ(publicly.lengthOfHead(), portrait["chin"] + portrait["crown"]);
    EXPECT_EQ(publicly.ethnicity(), (std::array{7.0f, 8.0f, 9.0f}));
}

/// Each test, with settings below ORBEK.ISOFullFrontalTest that a perfect portrait fails, and no other test
/// does. In the order of the summary of what is demanded, and then those that are recommended only.
struct Failing {
    bool (ISO_19794_5::FullFrontal::Compliance::*test)() const;
    const char* settings[2];
    bool demanded, recommended;
};
using Verdicts = ISO_19794_5::FullFrontal::Compliance;
constexpr Failing failing[] = {
    {&Verdicts::goodVerticalFacePosition, {"LowerBoundForVerticalPosition = 0.9"}, true, true},
    {&Verdicts::horizontallyCenteredFace, {"DeviationFromCenter = -1"}, true, true},
    {&Verdicts::widthOfHead, {"ImageMinWidthToHeadWidthRatio = 99"}, true, false},
    {&Verdicts::lengthOfHead, {"ImageMinHeightToHeadLengthRatio = 99"}, true, false},
    {&Verdicts::resolution, {"MinHeadWidth = 99999"}, true, false},
    {&Verdicts::goodExposure, {"LowExposureThreshold = 999"}, true, true},
    {&Verdicts::goodGrayScaleProfile, {"MinimalGrayScaleThreshold = 999"}, true, true},
    {&Verdicts::noHotSpots, {"HotSpotThreshold = -1"}, true, true},
    {&Verdicts::isFrontal, {"MaxFrontalPoseDeviation = -1e9"}, true, false},
    {&Verdicts::isLightingUniform, {"DeviationFromUniformLightingThreshold = -1e9"}, true, true},
    {&Verdicts::isSharp, {"MinSharpness = 9"}, true, true},
    {&Verdicts::noTintedGlasses,
     {"WearsGlassesThreshold = -1e9", "TintedGlassesThreshold = -1e9"},
     true,
     true},
    {&Verdicts::hasNaturalSkinColour, {"MinSkinColourRatio = 9"}, true, true},
    {&Verdicts::widthOfHeadBestPractice, {"ImageMinWidthToHeadWidthRatioBestPractice = 99"}, false, true},
    {&Verdicts::lengthOfHeadBestPractice, {"ImageMinHeightToHeadLengthRatioBestPractice = 99"}, false, true},
    {&Verdicts::resolutionBestPractice, {"MinHeadWidthBestPractice = 99999"}, false, true},
    {&Verdicts::imageWidthToHeightBestPractice, {"ImageMinWidthToHeightRatioBestPractice = 99"}, false, true},
    {&Verdicts::isFrontalBestPractice, {"MaxFrontalPoseDeviationBestPractice = -1e9"}, false, true},
    {&Verdicts::eyesOpenBestPractice, {"MinOpenEyeThresholdBestPractice = 1e9"}, false, true},
    {&Verdicts::eyesGazeFrontalBestPractice, {"EyesGazeFrontalThresholdBestPractice = 1e9"}, false, true},
    {&Verdicts::mouthClosedBestPractice, {"ClosedMouthThresholdBestPractice = 1e9"}, false, true},
    {&Verdicts::eyesNotRedBestPractice, {"MaxRedEyeThresholdBestPractice = -1"}, false, true},
};

std::string settingsOf(const Failing& one) {
    std::string text;
    for (const char* setting : one.settings)
        if (setting) text += std::string("ORBEK.ISOFullFrontalTest.") + setting + "\n";
    return text;
}

TEST(PortraitClasses, EachVerdictIsTheEnginesOfThatName) {
    const Portrait::Characteristics perfect = measured(MeasuredPortrait());
    for (const Failing& one : failing) {
        const ISO_19794_5::FullFrontal::Test test(installed("/no/such", settingsOf(one)));
        const Verdicts verdicts = test.assess(perfect);
        for (const Failing& other : failing)
            EXPECT_EQ((verdicts.*other.test)(), &other != &one) << one.settings[0];
        EXPECT_TRUE(verdicts.isBackgroundUniformBestPractice() && verdicts.onlyOneFaceVisible());
        EXPECT_EQ(verdicts.isCompliant(), !one.demanded) << one.settings[0];
        EXPECT_EQ(verdicts.isBestPractice(), !one.recommended) << one.settings[0];
    }
    MeasuredPortrait colourful;
    colourful["backgroundUniformity"] = 0;
    const Verdicts verdicts = ISO_19794_5::FullFrontal::Test(installed()).assess(measured(colourful));
    EXPECT_FALSE(verdicts.isBackgroundUniformBestPractice() || verdicts.isBestPractice());
    EXPECT_TRUE(verdicts.isCompliant());
}

TEST(PortraitClasses, EachBoundaryIsTheSettingOfThatName) {
    using B = ISO_19794_5::FullFrontal::Boundaries;
    const struct {
        float (B::*get)() const;
        const char* key;
    } cases[] = {
        {&B::upperBoundVerticalPosition, "UpperBoundForVerticalPosition"},
        {&B::lowerBoundVerticalPosition, "LowerBoundForVerticalPosition"},
        {&B::minWidthOfHeadRatio, "ImageMinWidthToHeadWidthRatio"},
        {&B::minLengthOfHeadRatio, "ImageMinHeightToHeadLengthRatio"},
        {&B::maxWidthOfHeadRatio, "ImageMaxWidthToHeadWidthRatio"},
        {&B::maxLengthOfHeadRatio, "ImageMaxHeightToHeadLengthRatio"},
        {&B::minHeadWidth, "MinHeadWidth"},
        {&B::minWidthOfHeadRatioBestPractice, "ImageMinWidthToHeadWidthRatioBestPractice"},
        {&B::minLengthOfHeadRatioBestPractice, "ImageMinHeightToHeadLengthRatioBestPractice"},
        {&B::maxWidthOfHeadRatioBestPractice, "ImageMaxWidthToHeadWidthRatioBestPractice"},
        {&B::maxLengthOfHeadRatioBestPractice, "ImageMaxHeightToHeadLengthRatioBestPractice"},
        {&B::minHeadWidthBestPractice, "MinHeadWidthBestPractice"},
        {&B::minWidthToHeightRatioBestPractice, "ImageMinWidthToHeightRatioBestPractice"},
        {&B::maxWidthToHeightRatioBestPractice, "ImageMaxWidthToHeightRatioBestPractice"},
        {&B::lowExposerThreshold, "LowExposureThreshold"},
        {&B::highExposerThreshold, "HighExposureThreshold"},
        {&B::minimalGrayScaleBounding, "MinimalGrayScaleThreshold"},
        {&B::minimalSkinColourRatio, "MinSkinColourRatio"},
        {&B::maxFrontalPoseDeviation, "MaxFrontalPoseDeviation"},
        {&B::poseMaxRotation, "PoseMaxRotation"},
        {&B::maxFrontalPoseDeviationBestPractice, "MaxFrontalPoseDeviationBestPractice"},
        {&B::poseMaxRotationBestPractice, "PoseMaxRotationBestPractice"},
        {&B::maxDeviationFromLighting, "DeviationFromUniformLightingThreshold"},
        {&B::eyesOpenThreshold, "MinOpenEyeThresholdBestPractice"},
        {&B::eyesGazeFrontalThreshold, "EyesGazeFrontalThresholdBestPractice"},
        {&B::eyesNotRedThreshold, "MaxRedEyeThresholdBestPractice"},
        {&B::minimalSharpness, "MinSharpness"},
        {&B::closedMouthThreshold, "ClosedMouthThresholdBestPractice"},
        {&B::hotSpotsThreshold, "HotSpotThreshold"},
        {&B::wearsGlassesThreshold, "WearsGlassesThreshold"},
        {&B::tintedGlassesThreshold, "TintedGlassesThreshold"},
    };
    std::string settings = "ORBEK.ISOFullFrontalTest.DeviationFromCenter = 0.125\n";
    int value = 100;
    for (const auto& each : cases)
        settings +=
            std::string("ORBEK.ISOFullFrontalTest.") + each.key + " = " + std::to_string(++value) + "\n";
    const B boundaries = ISO_19794_5::FullFrontal::Test(installed("", settings)).boundaries();
    value = 100;
    for (const auto& each : cases) EXPECT_EQ((boundaries.*each.get)(), ++value) << each.key;
    EXPECT_EQ(boundaries.leftBoundCenteredFace(), 0.375f);
    EXPECT_EQ(boundaries.rightBoundCenteredFace(), 0.625f);
}

TEST(PortraitClassesWithModels, SummariesStopAtTheFirstTestThatFails) {
    namespace fs = std::filesystem;
    // Limits that a drawn face passes, whatever it looks like.
    std::string lenient;
    for (const char* setting :
         {"DeviationFromCenter = 9", "LowerBoundForVerticalPosition = -9",
          "UpperBoundForVerticalPosition = 9", "ImageMinWidthToHeadWidthRatio = 0",
          "ImageMaxWidthToHeadWidthRatio = 99", "ImageMinHeightToHeadLengthRatio = 0",
          "ImageMaxHeightToHeadLengthRatio = 99", "MinHeadWidth = 0", "LowExposureThreshold = -9",
          "HighExposureThreshold = 999", "MinimalGrayScaleThreshold = 0", "HotSpotThreshold = 1e9",
          "MaxFrontalPoseDeviation = 1e9", "PoseMaxRotation = 9",
          "DeviationFromUniformLightingThreshold = 1e9", "MinSharpness = 0", "WearsGlassesThreshold = 1e9",
          "MinSkinColourRatio = 0"})
        lenient += std::string("ORBEK.ISOFullFrontalTest.") + setting + "\n";
    const Image alice = ImageIO::load(ORBEK_SOURCE_DIR "/examples/images/alice1.jpg");
    const std::pair portrait(alice, Eyes::Location{{114.82f, 187.86f}, {196.16f, 183.26f}, 0, 0});
    const fs::path models = fs::path(ORBEK_BINARY_DIR) / "etc" / "portrait";
    // The first test that asks each file, by its place among those that are demanded.
    for (const auto& [missing, place] : {std::pair{"learest.dat", 2u},
                                         {"chinest.dat", 3u},
                                         {"fpdisc.dat", 8u},
                                         {"ludisc.dat", 9u},
                                         {"gldisc.dat", 11u}}) {
        const ScratchFolder scratch;
        for (const auto& file : fs::directory_iterator(models))
            if (file.path().filename() != missing)
                fs::create_symlink(file.path(), scratch.path() / file.path().filename());
        const std::string folder = "ORBEK.PortraitAnalyzer.DataDir = " + scratch.path().string() + "\n";
        const auto measures = Portrait::Analyzer(installed(ORBEK_BINARY_DIR, folder)).analyze(portrait);
        for (std::size_t i = 0; i < std::size(failing) && failing[i].demanded; ++i) {
            // The first of a key counts.
            const ISO_19794_5::FullFrontal::Test test(installed("", settingsOf(failing[i]) + lenient));
            const Verdicts verdicts = test.assess(measures);
            const std::string thrown = thrownBy([&] { EXPECT_FALSE(verdicts.isCompliant()); });
            EXPECT_EQ(thrown.find(missing) != std::string::npos, i >= place)
                << missing << " " << failing[i].settings[0] << ": " << thrown;
        }
    }
}

TEST(PortraitClasses, TestsAreSetByTheConfiguration) {
    const Configuration configuration =
        installed("/no/such", "ORBEK.FeatureTest.IsMaleThreshold = 1.5\n"
                              "ORBEK.ISOFullFrontalTest.MinSharpness = 0.625\n");
    const ISO_19794_5::FullFrontal::Test test(configuration);
    EXPECT_EQ(test.boundaries().minimalSharpness(), 0.625f);
    EXPECT_EQ(test.boundaries().maxLengthOfHeadRatioBestPractice(), 1.428f);
    MeasuredPortrait portrait;
    const auto one = test.assess(measured(portrait));
    EXPECT_FALSE(one.isSharp());
    EXPECT_TRUE(one.goodExposure());
    const auto perfect = ISO_19794_5::FullFrontal::Test(installed()).assess(measured(portrait));
    EXPECT_TRUE(perfect.isCompliant() && perfect.isBestPractice() && perfect.onlyOneFaceVisible());
    for (const unsigned int faces : {0u, 2u}) {
        const auto other = ISO_19794_5::FullFrontal::Test(installed()).assess(measured(portrait, faces));
        EXPECT_FALSE(other.isCompliant() || other.isBestPractice() || other.onlyOneFaceVisible()) << faces;
    }

    using namespace Portrait::Feature;
    const Portrait::Feature::Test features(configuration);
    EXPECT_EQ(features.assess(measured(portrait)).gender(), Gender::Female) << "below the threshold";
    portrait["isMale"] = 1.5f;
    portrait.ethnicity = {0, 0, 1};
    const Set set = features.assess(measured(portrait));
    EXPECT_EQ(static_cast<int>(set.gender()), 0) << "male";
    EXPECT_EQ(set.ethnicity(), Ethnicity::Asian);
    EXPECT_FALSE(set.wearsGlasses());
    EXPECT_EQ(set.age(), 30);

    EXPECT_EQ(thrownBy([] {
                  Portrait::Feature::Test(installed("", "ORBEK.FeatureTest.IsMaleThreshold = much\n"));
              }),
              "FNEGeneric: Feature assessment : Converting from invalid string [much] to float");
    EXPECT_EQ(
        thrownBy([] {
            ISO_19794_5::FullFrontal::Test(installed("", "ORBEK.ISOFullFrontalTest.MinSharpness = much\n"));
        }),
        "FNEGeneric: ISO 19794-5 Full Frontal images assessment : Converting from invalid string [much] to "
        "float");
    const Portrait::Analyzer analyzer(configuration);
    EXPECT_EQ(thrownBy([&] {
                  analyzer.analyze({grayPattern(90, 90), {{30, 40}, {60, 40}}});
              }).substr(0, 25),
              "FNEGeneric: Face finder :");
}

/// Pictures side by side.
Image beside(const Image& left, const Image& right) {
    const unsigned int w = left->width() + right->width(), h = std::max(left->height(), right->height());
    std::vector<Rgb> pixels(std::size_t{w} * h);
    unsigned int offset = 0;
    for (const Image& part : {left, right}) {
        for (unsigned int y = 0; y < part->height(); ++y)
            std::copy_n(part->colorRepresentation() + std::size_t{y} * part->width(), part->width(),
                        pixels.begin() + std::size_t{y} * w + offset);
        offset += part->width();
    }
    return Image(new DrawnImage(w, h, pixels));
}

TEST(PortraitClassesWithModels, FacesAreCountedInTheWholeImage) {
    const Configuration configuration = installed();
    const Portrait::Analyzer analyzer(configuration);
    const ISO_19794_5::FullFrontal::Test test(configuration);
    const Image bob = ImageIO::load(ORBEK_SOURCE_DIR "/examples/images/bob1.jpg");
    const Image two = beside(bob, ImageIO::load(ORBEK_SOURCE_DIR "/examples/images/alice1.jpg"));
    const auto faces =
        Face::Finder(configuration)
            .find(bob, 0.05f, 0.45f, 0, 0, static_cast<int>(bob->width()), static_cast<int>(bob->height()));
    ASSERT_EQ(faces.size(), 1u);
    const Eyes::Location eyes = Eyes::Finder(configuration).find(bob, faces.front()).front();
    const auto alone = analyzer.analyze({bob, eyes}), accompanied = analyzer.analyze({two, eyes});
    EXPECT_TRUE(alone.isColor());
    EXPECT_EQ(alone.numberOfFaces(), 1u);
    EXPECT_EQ(accompanied.numberOfFaces(), 2u);
    EXPECT_EQ(accompanied.deviationFromFrontalPose(), alone.deviationFromFrontalPose());
    EXPECT_FALSE(test.assess(accompanied).onlyOneFaceVisible());
    EXPECT_NEAR(alone.age(), accompanied.age(), 5);

    const auto nobody = analyzer.analyze({grayPattern(200, 200), {{80, 90}, {120, 90}}});
    EXPECT_FALSE(nobody.isColor());
    EXPECT_EQ(nobody.numberOfFaces(), 0u);
    EXPECT_EQ(nobody.eyeDistance(), 40);
    EXPECT_GT(nobody.grayScaleDensity(), 100u) << "measured nevertheless";
    EXPECT_FALSE(test.assess(nobody).isCompliant());
}

TEST(TokenFaceRecord, KeepsPicturesAndWhereTheirEyesAre) {
    using namespace ISO_19794_5;
    std::stringstream stream;
    TokenFace::write(stream, {{colorPattern(240, 320), {{1, 2}, {3, 4}}}, {grayPattern(60, 80), {}}});
    const auto faces = TokenFace::read(stream);
    ASSERT_EQ(faces.size(), 2u);
    EXPECT_EQ(faces.front().first->name(), "");
    EXPECT_TRUE(faces.front().first->isColor());
    EXPECT_EQ(faces.front().first->height(), 320u);
    EXPECT_EQ(faces.front().second.first, (Position{89.5f, 144.5f})) << "where a token image has them";
    EXPECT_EQ(faces.front().second.second, (Position{149.5f, 144.5f}));
    EXPECT_FALSE(faces.back().first->isColor());
    std::istringstream broken("FAC");
    EXPECT_EQ(thrownBy([&] { TokenFace::read(broken); }), "FNEOutOfRange: CBEFFHeader with wrong size.");
}

} // namespace
