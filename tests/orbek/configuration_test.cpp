#include "orbek/configuration.h"

#include "fn/message/dialog.h"
#include "orbek/implementation/configuration_implementation.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>

namespace {

Orbek::Configuration fromText(const std::string& text) {
    std::istringstream stream(text);
    return Orbek::Configuration(stream);
}

TEST(Configuration, AnEmptyOneIsAllDefaults) {
    const Orbek::Configuration configuration = fromText("");
    EXPECT_EQ(configuration.version(), "8.6.0.0");
    for (const auto& [key, value] : {
             std::pair{"ComparisonAlgorithm.AlgorithmVersion", "B7"},
             std::pair{"ComparisonAlgorithm.NumberOfThreads", "1"},
             std::pair{"CaptureDevices", "Files"},
             std::pair{"CaptureDevices.Files", "ImageFiles"},
             std::pair{"CaptureDevices.Files.ImageFiles.FileLocation", "Files"},
             std::pair{"CaptureDevices.Files.ImageFiles.FileLocation.Files", "bob alice"},
             std::pair{"CaptureDevices.Files.ImageFiles.FileLocation.Files.alice",
                       "$INSTALLDIR/examples/images/alice1.jpg"},
             std::pair{"CaptureDevices.Files.ImageFiles.DeliveryFrameRate.Float", "25"},
             std::pair{"Substitutions", "INSTALLDIR FGLIBDIR"},
             std::pair{"Substitutions.INSTALLDIR", ""},
             std::pair{"Substitutions.FGLIBDIR", "lib/x86_64/"},
         })
        EXPECT_EQ(configuration.getValue(std::string("ORBEK.") + key), value) << key;
}

TEST(Configuration, ValuesAreStoredAsTheyAre) {
    Orbek::Configuration configuration = fromText("ORBEK.Substitutions.INSTALLDIR = /opt/orbek\n");
    const std::string key = "ORBEK.Substitutions.FGLIBDIR";
    configuration.setValue(key, "$INSTALLDIR/lib");
    EXPECT_EQ(configuration.getValue(key), "$INSTALLDIR/lib");
    Orbek::Configuration copy = configuration;
    copy.resetToDefault(key);
    EXPECT_EQ(configuration.getValue(key), "lib/x86_64/") << "a copy is the same configuration";
}

TEST(Configuration, WritesItsFileInTheBackground) {
    const ScratchFolder scratch;
    const std::string file = scratch.write("orbek.conf", "ORBEK.ComparisonAlgorithm.NumberOfThreads = 2\n");
    {
        Orbek::Configuration configuration(file);
        EXPECT_EQ(configuration.getValue("ORBEK.ComparisonAlgorithm.NumberOfThreads"), "2");
        configuration.resetToDefault("ORBEK.ComparisonAlgorithm.NumberOfThreads");
        Orbek::Configuration other(file);
        EXPECT_EQ(other.getValue("ORBEK.ComparisonAlgorithm.NumberOfThreads").size(), 1u);
    }
    EXPECT_EQ(scratch.read("orbek.conf"), "ORBEK.ComparisonAlgorithm.NumberOfThreads = 1\n")
        << "the default is stored as a value";
}

TEST(Configuration, RefusesUnknownKeysAndBadFiles) {
    Orbek::Configuration configuration = fromText("");
    EXPECT_EQ(thrownBy([&] { configuration.getValue("Other.Key"); }),
              "FNEBadArg: Could not generate Component with name 'Other.Key': Does not found matching root "
              "component.");
    EXPECT_EQ(thrownBy([&] { configuration.setValue("ORBEK.NoSuch", "1"); }),
              "FNEBadArg: subComponent(NoSuch): property not found in component ORBEK[ORBEKResources]");
    EXPECT_EQ(thrownBy([&] { configuration.getValue("ORBEK.CaptureDevices.a b"); }),
              "FNEBadArg: AppConfigDB[Unnamed,char: ,hex:20]: invalid char in key 'ORBEK.CaptureDevices.a "
              "b.default'");
    EXPECT_EQ(thrownBy([] { Orbek::Configuration("/no/such.conf"); }),
              "FNEIOError: Error opening config file [/no/such.conf] for reading");
    EXPECT_EQ(thrownBy([] { fromText("ORBEK\n"); }),
              "FNEIOError: AppConfigDB[Unnamed,line:1,column:5] syntax error, missing '='.");
}

TEST(Configuration, ListsEverySetting) {
    const auto settings = fromText("ORBEK.CaptureDevices = Files Door\n").settings();
    const auto find = [&](const std::string& key) {
        return std::find_if(settings.begin(), settings.end(),
                            [&](const Orbek::Configuration::Setting& setting) { return setting.key == key; });
    };
    ASSERT_NE(find("ORBEK.ComparisonAlgorithm.NumberOfThreads"), settings.end());
    EXPECT_EQ(find("ORBEK.ComparisonAlgorithm.NumberOfThreads")->type, "Int");
    EXPECT_EQ(find("ORBEK.ComparisonAlgorithm.NumberOfThreads")->defaultValue, "1");
    EXPECT_FALSE(find("ORBEK.ComparisonAlgorithm")->hasValue);
    EXPECT_NE(find("ORBEK.CaptureDevices.Door.ImageFiles.CaptureFrameRate"), settings.end());
    EXPECT_NE(find("ORBEK.CaptureDevices.Files.ImageFiles.FileLocation.Files.bob"), settings.end());
}

TEST(Resources, AnEngineIsMadeOnceAndAFailureLeavesItUnmade) {
    struct Engine {};
    const FNMutex mutex;
    const Orbek::MadeOnce<Engine> engine;
    EXPECT_EQ(thrownBy([&] {
                  engine.get(mutex, "Face finder", []() -> Engine* { FN_THROW(FNEIOError, "no model"); });
              }),
              "FNEGeneric: Face finder : no model");
    int made = 0;
    const auto make = [&] { return ++made, new Engine; };
    EXPECT_EQ(engine.get(mutex, "Face finder", make), engine.get(mutex, "Face finder", make));
    EXPECT_EQ(made, 1);
}

TEST(Resources, MissingModelsAreNamedWithTheirPath) {
    const Orbek::Configuration configuration = fromText("ORBEK.Substitutions.INSTALLDIR = /no/such\n");
    const auto implementation = Orbek::Configuration::Implementation::implementation(configuration);
    const std::string failure = thrownBy([&] { implementation->resources().faceFinder(); });
    EXPECT_EQ(failure.rfind("FNEGeneric: Face finder : ", 0), 0u) << failure;
    EXPECT_NE(failure.find("/no/such/etc/cara/"), std::string::npos) << failure;
    const std::string eyes = thrownBy([&] { implementation->resources().eyesFinder(); });
    EXPECT_EQ(eyes.rfind("FNEGeneric: Eyes finder : ", 0), 0u) << eyes;
    EXPECT_NE(eyes.find("/no/such/etc/ojo/eyedisc.dat"), std::string::npos) << eyes;
}

TEST(ResourcesWithModels, FindersAreMadeOnceFromTheInstallationFolder) {
    const Orbek::Configuration configuration =
        fromText(std::string("ORBEK.Substitutions.INSTALLDIR = ") + ORBEK_BINARY_DIR + "\n");
    const auto implementation = Orbek::Configuration::Implementation::implementation(configuration);
    EXPECT_EQ(implementation->resources().faceFinder().processingId(), "T8FF");
    EXPECT_NO_THROW(implementation->resources().eyesFinder());
}

TEST(PublicHandle, FollowsTheSameRulesAsTheInnerOne) {
    struct Counted {
        explicit Counted(int& deaths) : deaths_(deaths) {}
        ~Counted() { ++deaths_; }
        int& deaths_;
    };
    int deaths = 0;
    {
        Orbek::CountedPtr<Counted> a(new Counted(deaths)), b(a), null;
        Orbek::CountedPtr<Counted>& alias = a;
        a = alias;
        b = null;
        EXPECT_EQ(deaths, 0);
        EXPECT_EQ(null, Orbek::CountedPtr<Counted>());
    }
    EXPECT_EQ(deaths, 1);
    Orbek::deleteRefcount(nullptr);
}

} // namespace
