#include "eye/boca/mouth_finder.h"
#include "eye/boca/mouth_scan.h"
#include "eye/discriminator/cascade_settings.h"
#include "eye/ojo/eyes_finder.h"
#include "eye/ojo/feature_scan.h"
#include "eye/raiz/bridge_finder.h"
#include "eye/raiz/bridge_scan.h"
#include "eye/random_svm.h"
#include "eye/window_signs.h"
#include "fn/deployment/app_config_db.h"
#include "fn/image_reference.h"
#include "fn/image_representation.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <fstream>
#include <map>
#include <numbers>
#include <random>

namespace {

using namespace Fn::Deployment;
using Eye::Implementation::CascadeSettings;
using Eye::Implementation::TrainedSvm;
using Eye::Ojo::T8::EyeScan;
using Eye::Ojo::T8::EyeSearchAreas;
using Eye::Ojo::T8::SearchArea;
using Image = FNImage<unsigned short>;

/// Smooth noise that looks different everywhere; the right half is the mirrored left one if wanted.
Image texture(std::uint32_t w, std::uint32_t h, unsigned seed, bool symmetric = false) {
    constexpr int waves = 60;
    std::mt19937 random(seed);
    std::uniform_real_distribution<float> frequency(-0.4f, 0.4f), phase(0, 2 * std::numbers::pi_v<float>);
    std::vector<float> sum(std::size_t{w} * h);
    for (int wave = 0; wave < waves; ++wave) {
        const float fx = frequency(random), fy = frequency(random), p = phase(random);
        for (std::uint32_t y = 0; y < h; ++y)
            for (std::uint32_t x = 0; x < w; ++x) {
                const std::uint32_t column = symmetric ? std::min(x, w - 1 - x) : x;
                sum[std::size_t{y} * w + x] +=
                    std::cos(fx * static_cast<float>(column) + fy * static_cast<float>(y) + p);
            }
    }
    Image image(w, h);
    unsigned short* const pixels = image.getExclusive();
    for (std::size_t i = 0; i < sum.size(); ++i)
        pixels[i] = static_cast<unsigned short>(std::clamp(32768 + 1500 * sum[i], 0.0f, 65535.0f));
    return image;
}

/// What a finder of `Scan` sees at a pixel of the first level of an area, and where that is.
template <class Scan> struct Pattern {
    Pattern(const Image& image, const SearchArea& area, FNGridPos at) {
        Image patch(Scan::patchWidth, Scan::patchHeight);
        const auto toImage = Img::Affine::transform(image, patch, area.origin, area.u, area.v, true, 0);
        signs = windowSigns(patch, at, Scan::columns, Scan::rows);
        centre = toImage(FNPos(at) + Scan::windowCentre);
    }
    Fn::SignValueVector<int> signs;
    FNPos centre;
};

/// A machine that gives `score` to the pattern itself and about one less to anything unlike it.
void writeMachine(const std::string& path, const Fn::SignValueVector<int>& pattern, float score) {
    TrainedSvm svm = randomSvm(TrainedSvm::Kernel::FullPolynomialDegree2, 300, pattern.size(), 1, 0,
                               static_cast<float>(pattern.size()));
    for (float& alpha : svm.alphas) alpha = 0;
    svm.supportVectors.front() = pattern;
    svm.alphas.front() = 1;
    svm.bias = 1 - score;
    std::ofstream stream(path, std::ios::binary);
    svm.write(stream);
}

using Values = std::map<std::string, std::string>;

template <class Finder> Component component(const ScratchFolder& folder, const Values& values = {}) {
    const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB);
    db->set("F.TemplatePath", folder.path().string());
    for (const auto& [key, value] : values) db->set("F." + key, value);
    return Component(db, Property(type<Finder>(), "F", "", "", false));
}

constexpr FacialFeatureLocation untouched{{-1, -2}, -3, -4};

struct FoundEyes {
    bool foundFirst = false, foundSecond = false;
    FacialFeatureLocation first = untouched, second = untouched;
};

void expectNear(const FacialFeatureLocation& location, FNPos pos, float tolerance, const char* what) {
    EXPECT_LT(length(location.pos - pos), tolerance)
        << what << ": (" << location.pos.x << ", " << location.pos.y << "), expected (" << pos.x << ", "
        << pos.y << ")";
}

/// A symmetric picture with a face on its middle line, and the machine for a place in the first eye's area.
class EyesFinderTest : public testing::Test {
protected:
    static constexpr FNGridPos place{3, 8};

    FoundEyes find(const Image& picture, const FaceFinder::Location& where, const Values& values = {}) const {
        const Eye::Ojo::T8::EyesFinder finder(component<Eye::Ojo::T8::EyesFinder>(folder, values));
        FoundEyes eyes;
        finder.find(where, FNImageReferenceFactory::create(picture), eyes.foundFirst, eyes.first,
                    eyes.foundSecond, eyes.second);
        return eyes;
    }
    void teach(const Image& picture, const FaceFinder::Location& where, float score) {
        const Pattern<EyeScan> pattern(picture, EyeSearchAreas::of(where).first, place);
        eye = pattern.centre;
        writeMachine(folder.file("eyedisc.dat"), pattern.signs, score);
    }
    FNPos mirrored(FNPos pos) const { return {2 * face.pos.x - pos.x, pos.y}; }

    ScratchFolder folder;
    const Image image = texture(200, 160, 1, true);
    const FaceFinder::Location face{{100, 80}, 36, 0, 0};
    FNPos eye;
};

TEST_F(EyesFinderTest, FindsBothEyesAtMirroredPlaces) {
    teach(image, face, -0.3f); // only the place itself
    const FoundEyes eyes = find(image, face);
    ASSERT_TRUE(eyes.foundFirst && eyes.foundSecond);
    expectNear(eyes.first, eye, 0.5f, "first");
    expectNear(eyes.second, mirrored(eye), 0.5f, "second");
    EXPECT_LT(eyes.first.pos.x, face.pos.x - face.width / 2) << "left of its patch's middle";
    EXPECT_GT(eyes.second.pos.x, face.pos.x + face.width / 2);
    EXPECT_NEAR(eyes.first.confidence, -0.3f, 0.02f);
    for (const auto& found : {eyes.first, eyes.second})
        EXPECT_NEAR(found.size, face.width * 16 * 1.6f / 29, 1e-3);
}

TEST_F(EyesFinderTest, FindsThemFromAnInaccurateFaceAndAgainAroundKnownEyes) {
    teach(image, face, 0.4f); // a kernel value of 0.26 is enough
    const FaceFinder::Location inaccurate{{101.4f, 79}, 37, 0, 0.03f};
    const FoundEyes eyes = find(image, inaccurate);
    ASSERT_TRUE(eyes.foundFirst && eyes.foundSecond);
    expectNear(eyes.first, eye, 1, "first");
    expectNear(eyes.second, mirrored(eye), 1, "second");

    const Eye::Ojo::T8::EyesFinder finder(component<Eye::Ojo::T8::EyesFinder>(folder));
    FoundEyes again;
    const FacialFeatureLocation left{eye + FNPos{3, -2}, 36, 0}, right{mirrored(eye) + FNPos{-3, 2}, 36, 0};
    finder.find(left, right, FNImageReferenceFactory::create(image), again.foundFirst, again.first,
                again.foundSecond, again.second);
    ASSERT_TRUE(again.foundFirst && again.foundSecond);
    expectNear(again.first, eye, 1, "first again");
    expectNear(again.second, mirrored(eye), 1, "second again");
    EXPECT_EQ(finder.processingId(), "Ojo T8");
}

TEST_F(EyesFinderTest, LooksIntoAreasThatReachOutOfTheImage) {
    const FaceFinder::Location corner{{38, 16}, 36, 0, 0}; // 9 pixels left of and 13 above the image
    const FNPos origin = EyeSearchAreas::of(corner).first.origin;
    EXPECT_LT(std::max(origin.x, origin.y), -8);
    teach(image, corner, 0.2f);
    const FoundEyes eyes = find(image, corner);
    ASSERT_TRUE(eyes.foundFirst);
    expectNear(eyes.first, eye, 0.5f, "first");
    const FoundEyes outside = find(image, {{-500, -500}, 36, 0, 0});
    EXPECT_FALSE(outside.foundFirst || outside.foundSecond);
}

TEST_F(EyesFinderTest, ReportsOneEyeWithoutTheOther) {
    const Image asymmetric = texture(200, 160, 2);
    teach(asymmetric, face, 0.2f);
    const FoundEyes eyes = find(asymmetric, face);
    EXPECT_TRUE(eyes.foundFirst);
    EXPECT_FALSE(eyes.foundSecond);
    EXPECT_EQ(eyes.second.pos, untouched.pos);
    EXPECT_EQ(eyes.second.confidence, untouched.confidence);
}

TEST_F(EyesFinderTest, TolerantAcceptsLowerScoresAndScoresAlike) {
    for (const auto& [score, strict, tolerant] :
         {std::tuple{-0.3f, true, true}, std::tuple{-0.7f, false, true}, std::tuple{-1.05f, false, false}}) {
        teach(image, face, score);
        const FoundEyes byDefault = find(image, face),
                        eyes = find(image, face, {{"DiscSettings", "Tolerant"}});
        EXPECT_EQ(byDefault.foundFirst, strict) << score;
        EXPECT_EQ(eyes.foundFirst, tolerant) << score;
        if (tolerant) {
            EXPECT_NEAR(eyes.first.confidence, score, 0.02f);
        }
        if (strict) {
            EXPECT_EQ(eyes.first.confidence, byDefault.first.confidence);
        }
    }
}

TEST_F(EyesFinderTest, NamesWhatItCannotUse) {
    using Finder = Eye::Ojo::T8::EyesFinder;
    const auto construct = [&](const Values& values) {
        return thrownBy([&] { Finder(component<Finder>(folder, values)); });
    };
    EXPECT_NE(construct({}).find(folder.file("eyedisc.dat")), std::string::npos) << construct({});
    EXPECT_EQ(construct({{"DiscSettings", "Lax"}}).substr(0, 9), "FNEBadArg");
    teach(image, face, 0);
    EXPECT_EQ(construct({}), "nothing thrown");
    EXPECT_EQ(construct({{"DiscSettings.Strict.Cascade", "301"}}).substr(0, 13), "FNEOutOfRange");
}

TEST(EyeSearchAreas, FollowTheRotationOfTheFace) {
    const float angle = 0.4f;
    const FNPos across{std::cos(angle), std::sin(angle)}, down{-across.y, across.x};
    const auto fromFace = EyeSearchAreas::of(FaceFinder::Location{{50, 60}, 20, 0, angle});
    const FNPos eye1 = FNPos{50, 60} - across * 10.0f, eye2 = FNPos{50, 60} + across * 10.0f;
    const auto fromEyes = EyeSearchAreas::of({eye1, 20, 0}, {eye2, 10, 0});
    const auto expectSquare = [&](const SearchArea& area, FNPos centre, float side, float direction) {
        EXPECT_LT(length(area.origin + area.u / 2.0f + area.v / 2.0f - centre), 1e-4f);
        EXPECT_LT(length(area.u - across * (direction * side)), 1e-4f);
        EXPECT_LT(length(area.v - down * side), 1e-4f);
    };
    expectSquare(fromFace.first, eye1, 32, 1);
    expectSquare(fromFace.second, eye2, 32, -1);
    expectSquare(fromEyes.first, eye1, 32, 1);
    expectSquare(fromEyes.second, eye2, 16, -1);
}

TEST(EyeScan, LooksAtThreeScales) {
    std::map<float, std::vector<FNPos>> centres;
    Eye::Ojo::T8::forEachWindow<EyeScan>(
        texture(60, 60, 3), {{58, 0}, {-58, 0}, {0, 58}},
        [&](const auto&, FNPos centre, float size) { centres[size].push_back(centre); });
    ASSERT_EQ(centres.size(), 3u);
    auto level = centres.begin();
    for (const auto& [pixels, windows] : {std::pair{29, 144u}, std::pair{26, 81u}, std::pair{22, 25u}}) {
        const float pixel = 58.0f / static_cast<float>(pixels);
        EXPECT_NEAR(level->first, 16 * pixel, 1e-3);
        EXPECT_EQ(level->second.size(), windows);
        EXPECT_LT(length(level->second[0] - FNPos{58 - 8.5f * pixel, 8.5f * pixel}), 1e-3f);
        EXPECT_LT(length(level->second[1] - FNPos{58 - 10.5f * pixel, 8.5f * pixel}), 1e-3f);
        ++level;
    }
}

struct Mouth {
    using Finder = Eye::Boca::MouthFinder;
    using Scan = Eye::Boca::MouthScan;
    static constexpr const char *file = "mouthdisc.dat", *key = "MouthD", *id = "Boca T8";
    static constexpr float threshold = -1.3f;
    static constexpr FNPos middle{18.5f, 20}, belowEyes{0, 1.2f};
};
struct Bridge {
    using Finder = Eye::Raiz::BridgeFinder;
    using Scan = Eye::Raiz::BridgeScan;
    static constexpr const char *file = "bridgedisc.dat", *key = "BridgeD", *id = "Raiz T8";
    static constexpr float threshold = -0.87f;
    static constexpr FNPos middle{18, 18}, belowEyes{0, 0.1f};
};

template <class Feature> class FeatureFinderTest : public testing::Test {
protected:
    using Finder = typename Feature::Finder;

    FacialFeatureLocation find(FNPos left, FNPos right, bool expected) const {
        const Finder finder(component<Finder>(folder));
        EXPECT_EQ(finder.processingId(), Feature::id);
        FacialFeatureLocation result = untouched;
        EXPECT_EQ(finder.find({left, 0, 0}, {right, 0, 0}, FNImageReferenceFactory::create(image), result),
                  expected);
        return result;
    }

    ScratchFolder folder;
    const Image image = texture(200, 160, 4);
    const FNPos eye1{70, 60}, eye2{108, 70};
    static constexpr FNGridPos place{6, 9};
};
using Features = testing::Types<Mouth, Bridge>;
TYPED_TEST_SUITE(FeatureFinderTest, Features);

TYPED_TEST(FeatureFinderTest, FindsThePatternBelowTheEyes) {
    const Pattern<typename TypeParam::Scan> pattern(
        this->image, TypeParam::Scan::placement.area(this->eye1, this->eye2), this->place);
    writeMachine(this->folder.file(TypeParam::file), pattern.signs, TypeParam::threshold + 0.75f);

    // The same place from the eyes: a pixel is a sixteenth of their distance.
    const FNPos line = this->eye2 - this->eye1, down{-line.y, line.x};
    const FNPos offset = FNPos(this->place) + TypeParam::Scan::windowCentre - TypeParam::middle;
    const FNPos expected = (this->eye1 + this->eye2) / 2.0f + down * TypeParam::belowEyes.y +
                           (line * offset.x + down * offset.y) / 16.0f;

    const FacialFeatureLocation exact = this->find(this->eye1, this->eye2, true);
    expectNear(exact, expected, 0.5f, "from the same eyes");
    EXPECT_NEAR(exact.size, length(line), 0.01f);
    EXPECT_NEAR(exact.confidence, TypeParam::threshold + 0.75f, 0.02f);
    expectNear(this->find(this->eye1 + FNPos{1.2f, 0.4f}, this->eye2 + FNPos{0.3f, -0.9f}, true), expected,
               1.2f, "from other eyes");
    EXPECT_EQ(this->find({60, 60}, {60, 60}, false).pos, untouched.pos) << "no distance between the eyes";
    EXPECT_EQ(this->find({-960, 60}, {-930, 60}, false).pos, untouched.pos) << "outside of the image";
}

TYPED_TEST(FeatureFinderTest, HasItsThresholdAndNamesItsFile) {
    EXPECT_NE(thrownBy([&] {
                  typename TypeParam::Finder(component<typename TypeParam::Finder>(this->folder));
              }).find(this->folder.file(TypeParam::file)),
              std::string::npos);
    const auto settings = CascadeSettings::read(
        component<typename TypeParam::Finder>(this->folder).subComponent(TypeParam::key));
    ASSERT_EQ(settings.cascade.size(), 1u);
    EXPECT_EQ(settings.cascade[0].steps, "300");
    EXPECT_EQ(settings.cascade[0].threshold, TypeParam::threshold);
}

TEST(FacialFeatureLocation, PacksAsAListOfThree) {
    const FacialFeatureLocation location{{1.5f, -2.25f}, 30, 0.75f};
    const Fn::Package package = Fn::serialize(location);
    Fn::PackageReader reader(package);
    EXPECT_EQ((reader.next<FNPair<float, float>>()), (FNPair<float, float>(1.5f, -2.25f)));
    EXPECT_EQ(reader.next<float>(), 30);
    EXPECT_EQ(reader.next<float>(), 0.75f);
    EXPECT_TRUE(reader.atEnd());
    EXPECT_EQ(Fn::deSerialize<FacialFeatureLocation>(package).pos, location.pos);
    EXPECT_NE(thrownBy([] { Fn::deSerialize<FacialFeatureLocation>(Fn::Package(std::list<Fn::Package>{})); }),
              "nothing thrown");
}

} // namespace
