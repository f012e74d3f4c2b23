#include "kx/feature_test.h"

#include "cmp/measured_portrait.h"
#include "support/settings.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>

namespace {

using namespace Kx::Feature;
using Assessment = Kx::Feature::Test; // "Test" is something else inside of TEST

TEST(FeatureTest, ThresholdsBelongToWhatTheyBegin) {
    const Assessment test(settingsOf<Assessment>("X.IsMaleThreshold = 0.25\n"));
    EXPECT_EQ(test.boundaries().wearsGlassesThreshold(), -0.8f);
    MeasuredPortrait at, below;
    at["glasses"] = -0.8f, at["isMale"] = 0.25f, at["age"] = 41.5f;
    below["glasses"] = std::nextafter(-0.8f, -1.0f), below["isMale"] = std::nextafter(0.25f, 0.0f);
    EXPECT_TRUE(test.assess(at).wearsGlasses());
    EXPECT_EQ(test.assess(at).gender(), Male);
    EXPECT_EQ(test.assess(at).age(), 41.5f);
    EXPECT_FALSE(test.assess(below).wearsGlasses());
    EXPECT_EQ(test.assess(below).gender(), Female);
}

TEST(FeatureTest, TheFirstOfTheLargestEthnicitiesStands) {
    const Assessment test{settingsOf<Assessment>()};
    for (const auto& [scores, expected] :
         {std::pair{std::array{0.5f, 0.5f, 0.5f}, White}, std::pair{std::array{0.1f, 0.5f, 0.5f}, Black},
          std::pair{std::array{-2.0f, -3.0f, -1.0f}, Asian},
          std::pair{std::array{0.5f, 0.1f, 0.5f}, White}}) {
        MeasuredPortrait portrait;
        portrait.ethnicity = scores;
        EXPECT_EQ(test.assess(portrait).ethnicity(), expected);
    }
}

TEST(FeatureTest, ASetSurvivesPackingAndComesFromSettings) {
    MeasuredPortrait portrait;
    portrait["glasses"] = 1, portrait["isMale"] = -1, portrait["age"] = 7.25f;
    portrait.ethnicity = {0, 0, 1};
    const Fn::Package package = Assessment(settingsOf<Assessment>()).assess(portrait).serialize();
    const Set stored(
        settingsOf<Set>("X.WearsGlasses = true\nX.Gender = female\nX.Ethnicity = Asian\nX.Age = 7.25\n"));
    EXPECT_EQ(stored.serialize(), package);
    const Set read(package);
    EXPECT_TRUE(read.wearsGlasses());
    EXPECT_EQ(read.gender(), Female);
    EXPECT_EQ(read.ethnicity(), Asian);
    EXPECT_EQ(read.age(), 7.25f);

    const std::list<Fn::Package> elements(package);
    ASSERT_EQ(elements.size(), 4u);
    EXPECT_EQ(elements.front().cores().front().size(), 1u);
    std::list<Fn::Package> wrong = elements;
    wrong.push_back(Fn::Package(1.0f));
    EXPECT_EQ(thrownBy([&] { Set{Fn::Package(wrong)}; }).substr(0, 9), "FNEBadArg");
    wrong = elements;
    *std::next(wrong.begin(), 2) = Fn::Package(3);
    EXPECT_EQ(thrownBy([&] { Set{Fn::Package(wrong)}; }),
              "FNEBadArg: Kx::Feature::EthnicityConfig::valueToString: unknwon ethnicity 3");
    wrong = elements;
    *std::next(wrong.begin()) = Fn::Package(2);
    EXPECT_EQ(thrownBy([&] { Set{Fn::Package(wrong)}; }),
              "FNEBadArg: Kx::Feature::GenderEnumDef::toString: unknown gender 2");
}

TEST(FeatureTest, WordsAndValues) {
    EXPECT_EQ(GenderConfig::stringToValue("male"), Male);
    EXPECT_EQ(GenderConfig::valueToString(Female), "female");
    EXPECT_EQ(EthnicityConfig::stringToValue("Black"), Black);
    EXPECT_EQ(EthnicityConfig::valueToString(Asian), "Asian");
    EXPECT_EQ(thrownBy([] { GenderConfig::stringToValue("Male"); }),
              "FNEBadArg: Kx::Feature::GenderEnumDef::toGender: unknown gender Male");
    EXPECT_EQ(thrownBy([] { EthnicityConfig::stringToValue(""); }),
              "FNEBadArg: Kx::Feature::EthnicityConfig::stringToValue: unknown ethnicity ");
    EXPECT_EQ(thrownBy([] { EthnicityConfig::valueToString(static_cast<Ethnicity>(-1)); }),
              "FNEBadArg: Kx::Feature::EthnicityConfig::valueToString: unknwon ethnicity -1");
}

} // namespace
