#include "cmp/measured_portrait.h"
#include "drawn_image.h"
#include "orbek/face_finder.h"
#include "orbek/image_io.h"
#include "orbek/implementation/assessment.h"
#include "orbek/token_face.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

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
