#include "cmp/portrait/age_cascade.h"
#include "cmp/portrait/analyzer.h"
#include "cmp/portrait/portrait_features.h"
#include "cmp/portrait/sphar_transformator.h"
#include "eye/discriminator/svm_fp_discriminator.h"
#include "fn/deployment/app_config_db.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <random>
#include <sstream>
#include <thread>

namespace {

using namespace Cmp::Portrait;

FNImageReference noisyImage(bool color, std::uint32_t w = 300, std::uint32_t h = 320) {
    std::mt19937 random(1);
    if (!color) {
        FNImage<unsigned char> image(w, h);
        for (std::size_t i = 0; i < image.size(); ++i)
            image.getExclusive()[i] = static_cast<unsigned char>(random());
        return FNImageReferenceFactory::create(image);
    }
    FNImage<Fn::Bgra32> image(w, h);
    for (std::size_t i = 0; i < image.size(); ++i) {
        const auto value = [&] { return static_cast<unsigned char>(random()); };
        image.getExclusive()[i] = Fn::Bgra32(value(), value(), value());
    }
    return FNImageReferenceFactory::create(image);
}

Cmp::Face noisyFace(bool color = true) {
    return {noisyImage(color), {{120, 140}, 60, 1}, {{180, 142}, 60, 1}};
}

/// A discriminator that scores the mean of the features times `slope`, less `bias`.
std::string discriminator(std::size_t dimension, float slope, float bias) {
    Eye::FullPolynomialSvm svm;
    svm.degree = 1;
    svm.bias = bias;
    svm.scale = static_cast<float>(dimension);
    svm.name = "test";
    svm.support.alphas = FNVector<float>(1, 1.0f);
    svm.support.vectors.push_back(FNVector<float>(dimension, slope));
    std::ostringstream stream;
    svm.write(stream);
    return stream.str();
}

/// One image and the light from the front.
SpharTransformator::Data lightData(std::size_t n) {
    SpharTransformator::Data data{FNVector<float>(n, 1.0f), Fn::Matrix<float>(n, 64 * 64),
                                  Fn::Matrix<float>(n, 9)};
    data.images.fill(0);
    data.coefficientRows.fill(0);
    return data;
}

/// A folder with model files for all measures, and an analyser on it.
struct Models : ScratchFolder {
    Models() {
        const PortraitFeatures features{FNMutex()};
        const FNImage<float> standard(108, 108), large(160, 160);
        const std::size_t head = features.head(standard).size(), age = features.genderOrAge(large).size();
        write("gldisc.dat", discriminator(features.glasses(standard).size(), 1, 0.25f));
        write("fpdisc.dat", discriminator(features.pose(standard).size(), 1, 0.25f));
        write("cmdisc.dat", discriminator(features.mouth(standard).size(), 1, 0.25f));
        for (const char* name : {"chinest.dat", "crownest.dat", "learest.dat", "rearest.dat"})
            write(name, discriminator(head, 0, -1.5f));
        write("gedisc.dat", discriminator(age, 1, 0));
        write("cedisc.dat", discriminator(ClosedEyeFeatureExtractor::featureSize, 1, 0));
        write("gadisc.dat", discriminator(GazeAwayFeatureExtractor::featureSize, 1, 0));
        for (const char* name : {"ethwdisc.dat", "ethbdisc.dat", "ethadisc.dat"})
            write(name, discriminator(64 * 64, 0, name[3] == 'w' ? 1 : name[3] == 'b' ? 2 : 3));
        write("ludisc.dat", discriminator(9, 1, -0.5f));
        std::ostringstream sphar;
        SpharTransformator::write(lightData(1), sphar);
        write("sphartr.dat", sphar.str());
        write("age-primary.dat", discriminator(age, 0, -34));
        for (const AgeStage& stage : laterAgeStages())
            for (const AgeEstimator& estimator : stage) write(estimator.file, discriminator(age, 0, -47));
    }
    Analyzer analyzer() const { return analyzerOn(path()); }
    static Analyzer analyzerOn(const std::filesystem::path& folder) {
        std::istringstream stream("X.DataDir = " + folder.string() + "\n");
        const Fn::Deployment::Type& type = Fn::Deployment::type<Analyzer>();
        return Analyzer(
            Fn::Deployment::Component(FNCountedPtr<AppConfigDB>(new AppVolatileConfigDB(stream)),
                                      Fn::Deployment::Property(type, "X", type.defaultValue(), "", false)));
    }
};

const Models& models() {
    static const Models& instance = *new Models;
    return instance;
}

std::size_t elementsOf(const Fn::Package& package) {
    return std::list<Fn::Package>(package).size();
}

TEST(PortraitAnalyzer, ValuesSurviveSerializationAndColourDecidesWhichThereAre) {
    const Analyzer analyzer = models().analyzer();
    const Characteristics color = analyzer.analyze(noisyFace()), gray = analyzer.analyze(noisyFace(false));
    EXPECT_TRUE(color.isColor());
    EXPECT_FALSE(gray.isColor());
    const Fn::Package package = color.serialize();
    EXPECT_EQ(elementsOf(package), 5u + 24 + 1);
    EXPECT_EQ(elementsOf(gray.serialize()), 5u + 24 + 1 - 3);
    EXPECT_EQ(elementsOf(analyzer.analyzeGrayScale(noisyFace()).serialize()), 5u + 24 + 1 - 3);
    const Characteristics grayInColor = analyzer.analyzeColor(noisyFace(false));
    EXPECT_TRUE(grayInColor.isColor());
    EXPECT_TRUE(analyzer.analyzeColor(noisyFace(false), {}).isColor());
    EXPECT_FALSE(analyzer.analyzeGrayScale(noisyFace(), {}).isColor());
    EXPECT_FALSE(analyzer.analyze(noisyFace(false), {}).isColor());
    EXPECT_EQ(grayInColor.eye0Tinted(), gray.eye0Tinted());

    const Characteristics read(package);
    EXPECT_EQ(read.serialize(), package);
    EXPECT_EQ(read.width(), 300u);
    EXPECT_EQ(read.eye1(), FNPos(180, 142));
    EXPECT_EQ(read.glasses(), color.glasses());
    EXPECT_EQ(read.grayScaleDensity(), color.grayScaleDensity());
    EXPECT_EQ(read.ethnicity(), (FNTriple<float, float, float>(-1, -2, -3)));
    EXPECT_FLOAT_EQ(read.deviationFromUniformLighting(), -0.5f);
    EXPECT_FLOAT_EQ(read.poseAngleRoll(), -2.0f / 60);

    EXPECT_EQ(thrownBy([&] { Characteristics(gray.serialize()).eye0Red(); }),
              "FNEBadArg: Characteristics::eye0Red() not applicable on gray scale image");
    EXPECT_EQ(thrownBy([&] { gray.eye1Red(); }),
              "FNEBadArg: Characteristics::eye1Red() not applicable on gray scale image");
    EXPECT_EQ(thrownBy([&] { gray.naturalSkinColour(); }),
              "FNEBadArg: Characteristics::naturalSkinColor() not applicable on gray scale image");
    EXPECT_EQ(thrownBy([] { Characteristics(Fn::Package(true)); }).substr(0, 9), "FNEBadArg");
}

TEST(PortraitAnalyzer, HeadExtentIsInEyeDistancesOrAsAnnotated) {
    const Characteristics estimated = models().analyzer().analyze(noisyFace());
    const float d = estimated.eyeDistance();
    EXPECT_FLOAT_EQ(d, std::hypot(60.0f, 2.0f));
    EXPECT_FLOAT_EQ(estimated.chin(), 1.5f * d);
    EXPECT_FLOAT_EQ(estimated.lengthOfHead(), 3 * d);
    EXPECT_FLOAT_EQ(estimated.ear0(), 2 * d);
    EXPECT_FLOAT_EQ(estimated.ear1(), d);

    const ScratchFolder empty;
    const Characteristics annotated =
        Models::analyzerOn(empty.path()).analyze(noisyFace(), {90, 80, 70, 60.5f});
    EXPECT_EQ(annotated.chin(), 90);
    EXPECT_EQ(earToEarChinCrownSurroundingBox(annotated), (FNBox{80, 61, 212, 232}));
}

TEST(PortraitAnalyzer, FailuresNameTheFile) {
    const ScratchFolder folder;
    folder.write("gldisc.dat", "nothing");
    folder.write("cmdisc.dat", discriminator(7, 1, 0));
    const Characteristics portrait = Models::analyzerOn(folder.path()).analyze(noisyFace());
    EXPECT_EQ(thrownBy([&] { portrait.isMale(); }),
              "FNEIOError: Could not open data file " + folder.file("gedisc.dat") + " for reading");
    EXPECT_EQ(thrownBy([&] { portrait.glasses(); }),
              "FNEGeneric: Error SVMFPDiscriminator: Data file format mismatch! when reading data file " +
                  folder.file("gldisc.dat"));
    const std::string thrown = thrownBy([&] { portrait.mouthClosed(); });
    EXPECT_NE(thrown.find(folder.file("cmdisc.dat")), std::string::npos) << thrown;
    EXPECT_GT(portrait.sharpness(), 0); // which needs no file
}

TEST(PortraitAnalyzer, AFaceNeedsEyesOrALocation) {
    FaceFinder::Location location;
    location.pos = {150, 141};
    location.width = 60;
    const Characteristics portrait = models().analyzer().analyze(Cmp::Face(noisyImage(true), location));
    EXPECT_EQ(portrait.eye0(), FNPos(120, 141));
    EXPECT_GT(portrait.sharpness(), 0);
    EXPECT_EQ(thrownBy([] { models().analyzer().analyze(Cmp::Face(noisyImage(true))).sharpness(); }),
              "FNEBadFunCall: Cannot reshape the face because there is no sufficient information about the "
              "location and size of this face!");
}

TEST(PortraitAnalyzer, OneEyeLooksLikeTheMirroredOther) {
    FNImage<float> portrait(108, 108), mirrored(108, 108);
    std::mt19937 random(2);
    for (std::uint32_t y = 0; y < 108; ++y)
        for (std::uint32_t x = 0; x < 108; ++x) {
            const float value = static_cast<float>(random() % 1000) / 1000;
            portrait.getExclusive()[y * 108 + x] = value;
            mirrored.getExclusive()[y * 108 + 107 - x] = value;
        }
    const PortraitFeatures features{FNMutex()};
    using Eye = PortraitFeatures::Eye;
    EXPECT_EQ(features.closedEye(portrait, Eye::eye0), features.closedEye(mirrored, Eye::eye1));
    EXPECT_EQ(features.gazeAway(portrait, Eye::eye1), features.gazeAway(mirrored, Eye::eye0));
    EXPECT_EQ(features.gazeAway(portrait, Eye::eye0).size(), 180u);
}

TEST(PortraitAnalyzer, AgeChoosesEstimatorsByTheLeastBoundaryAbove) {
    struct Case {
        float primary;
        const char* asked;
    };
    for (const auto& [primary, asked] :
         {Case{34, "Primary Secondary40 Tertiary35"}, Case{40, "Primary Secondary50 Tertiary45"},
          Case{80, "Primary SecondaryAbove Tertiary85"}, Case{85, "Primary SecondaryAbove TertiaryAbove"},
          Case{-3, "Primary Secondary10 Tertiary5"}}) {
        std::string keys;
        const float age = ageOfCascade([&, years = primary](const AgeEstimator& estimator) {
            keys += (keys.empty() ? "" : " ") + estimator.key;
            return years;
        });
        EXPECT_EQ(keys, asked);
        EXPECT_EQ(age, primary);
    }
    EXPECT_EQ(models().analyzer().analyze(noisyFace()).age(), 47);
}

TEST(PortraitAnalyzer, ThreadsShareOneObject) {
    const Analyzer analyzer = models().analyzer();
    const Characteristics portrait = analyzer.analyze(noisyFace());
    const Fn::Package expected = models().analyzer().analyze(noisyFace()).serialize();
    std::vector<std::jthread> threads;
    for (int i = 0; i < 4; ++i)
        threads.emplace_back([&, i] {
            const Characteristics own = i % 2 ? portrait : analyzer.analyze(noisyFace());
            EXPECT_EQ(own.serialize(), expected);
        });
}

/// An image of one bright pixel.
FNImage<float> spot(std::uint32_t x, std::uint32_t y, float value = 1) {
    FNImage<float> image(64, 64);
    image.fill(0);
    image.set({static_cast<std::int32_t>(x), static_cast<std::int32_t>(y)}, value);
    return image;
}

TEST(SpharTransformator, AveragesTheNearestTenthByItsDistance) {
    // Twenty images with one more pixel each, of which the first is (1, 2); the threshold is at number 2 of
    // the ascending distances, so two images count.
    auto data = lightData(20);
    for (std::size_t i = 0; i < 20; ++i) {
        data.images(i, 64 + 2) = 3;
        data.images(i, 1000 + i) = static_cast<float>(3 * i);
        data.coefficientRows(i, 0) = 1;
        data.coefficientRows(i, 8) = static_cast<float>(i);
    }
    std::stringstream stream;
    SpharTransformator::write(data, stream);
    const SpharTransformator transformator(stream);
    const FNVector<float> result = transformator(spot(1, 2, 0.3f));
    const double squared = 2 * (1 - 1 / std::sqrt(2.0)), weight = std::exp(-0.5 * squared);
    EXPECT_NEAR(result.get()[0], 1, 1e-6);
    EXPECT_NEAR(result.get()[8], weight / (1 + weight), 1e-5);

    data.sigmas.fill(0); // only equal images count
    EXPECT_NEAR(SpharTransformator(data)(spot(1, 2)).get()[8], 0, 1e-6);
    const FNVector<float> nothing = SpharTransformator(data)(spot(5, 5));
    EXPECT_EQ(nothing, FNVector<float>(9, 0.0f));
    EXPECT_EQ(SpharTransformator(lightData(0))(spot(1, 2)), FNVector<float>(9, 0.0f));
}

TEST(SpharTransformator, RefusesWhatDoesNotFit) {
    auto data = lightData(3);
    data.sigmas = FNVector<float>(2, 1.0f);
    EXPECT_EQ(thrownBy([&] { SpharTransformator{data}; }).substr(0, 9), "FNEBadArg");
    EXPECT_EQ(thrownBy([&] { SpharTransformator(lightData(1))(FNImage<float>(64, 63)); }).substr(0, 9),
              "FNEBadArg");
    std::istringstream empty;
    EXPECT_EQ(thrownBy([&] { SpharTransformator{empty}; }).substr(0, 10), "FNEIOError");
}

} // namespace
