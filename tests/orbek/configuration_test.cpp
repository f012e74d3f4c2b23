#include "orbek/configuration.h"

#include "fn/message/dialog.h"
#include "orbek/implementation/configuration_implementation.h"
#include "orbek/implementation/own_place.h"
#include "support/recorded_dialog.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>

#include <unistd.h>

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

TEST(Configuration, TellsWhichLinesAreWrong) {
    const std::string device = "ORBEK.CaptureDevices.Door.ImageFiles.",
                      life = "KxRecognitionLifeCheckThreshold";
    const struct {
        std::string line;
        std::string reason; ///< empty: nothing is wrong
    } cases[] = {
        {"ORBEK.FaceTracker.FrameRate = 12.5", ""},
        {"ORBEK.Substitutions.INSTALLDIR = /opt/x", ""},
        {"ORBEK.Substitutions = INSTALLDIR FGLIBDIR RATE", ""},
        {"ORBEK.Substitutions.RATE = 5", ""},
        {"ORBEK.FaceTracker.MaxAllowedFaceSpeed = $RATE", ""},
        {device + "CaptureFrameRate = 5", ""},
        {device + "FileLocation = Directory", ""},
        {device + "FileLocation.Files = a b", ""},
        {device + "FileLocation.Files.a = x.jpg", ""},
        {device + "DeliveryFrameRate.Float = 5", ""}, // beside the choice
        {"FNAppConfigLogAccess = no", ""},
        {life + " = 3", ""},
        {"ORBEK.StreamIdentifier.UseLifeCheck.default = true", ""},
        {"*.StreamVerifier.UseLifeCheck.default = true", ""},
        {"ORBEK.CaptureDevices.*.ImageFiles.CaptureFrameRate.default = 5", ""},
        {"ORBEK.StreamVerifier.UseLifecheck = true",
         "is no key of the configuration; did you mean ORBEK.StreamVerifier.UseLifeCheck?"},
        {"ORBEKK.FaceTracker.FrameRate = 1", "is no key of the configuration; did you mean ORBEK?"},
        {"Other = 1", "is no key of the configuration"},
        {life + "s = 3", "is no key of the configuration; did you mean " + life + "?"},
        {"ORBEK..FaceTracker = 1", "is no key of the configuration"},
        {"ORBEK.FaceTracker.FrameRate.X = 1", "is no key of the configuration"},
        {"*.StreamVerifier.UseLifeCheck = true", "is no key of the configuration"},
        {"ORBEK.FaceTracker.FrameRates.default = 1",
         "is no key of the configuration; did you mean ORBEK.FaceTracker.FrameRate?"},
        {"ORBEK.FaceTracker = 1", "is a group of keys and has no value"},
        {"ORBEK.StreamIdentifier.UseLifeCheck = yes", "\"yes\" is none of true, false"},
        {"ORBEK.SetVerifier.EyeDistanceRange.MinEyeDistance.default = wide",
         "\"wide\" is not of the type Float"},
        {"ORBEK.SetVerifier.EyeDistanceRange.MinEyeDistance = $FGLIBDIR",
         "\"lib/x86_64/\" is not of the type Float"},
        {"ORBEK.ComparisonAlgorithm.AlgorithmVersion = B8", "\"B8\" is none of B7, B6, A14, B6L5"},
        {"ORBEK.Substitutions.MODELS = /opt",
         "has no effect, since ORBEK.Substitutions does not list MODELS"},
        {device + "FileLocation.Files.c = x.jpg",
         "has no effect, since " + device + "FileLocation.Files does not list c"},
        {"ORBEK.FgDllCache.DllPaths = Prosilica Webcam", ""},
        {"ORBEK.FgDllCache.DllPaths.Prosilica = p.so", ""},
        {"ORBEK.FgDllCache.DllPaths.Webcam = p.so",
         "has no effect, since Webcam is no kind of device that a plug-in drives"},
        {"ORBEK.ComparisonAlgorithm.AlgorithmVersion.B6 = x", "is a group of keys and has no value"},
        {"ORBEK.FgDllCache.DllPaths.WMF = p.so",
         "has no effect, since ORBEK.FgDllCache.DllPaths does not list WMF"},
        {"ORBEK.FaceTracker.FrameRate = 25", "has no effect, since it stands in line 2 already"},
    };
    std::string text = "# comment\n";
    std::vector<std::string> expected, warnings;
    int number = 1;
    for (const auto& [line, reason] : cases) {
        text += line + "\n";
        ++number;
        if (reason.empty()) continue;
        const std::string key = line.substr(0, line.find(' '));
        expected.push_back(std::to_string(number) + " " + key + " " + reason);
        warnings.push_back("warn: AppConfigDB[Unnamed,line:" + std::to_string(number) + "]: " + key + ": " +
                           reason);
    }
    const RecordedDialog dialog;
    const Orbek::Configuration configuration = fromText(text);
    std::vector<std::string> told;
    for (const auto& [line, key, reason] : configuration.faults())
        told.push_back(std::to_string(line) + " " + key + " " + reason);
    EXPECT_EQ(told, expected);
    EXPECT_EQ(dialog.messages(), warnings);
}

TEST(Configuration, ChecksValuesOnlyWhenAsked) {
    Orbek::Configuration configuration = fromText("");
    const std::string key = "ORBEK.StreamVerifier.UseLifeCheck";
    EXPECT_NO_THROW(configuration.checkValue(key, "true"));
    EXPECT_EQ(thrownBy([&] { configuration.checkValue(key, "yes"); }),
              "FNEBadArg: " + key + ": \"yes\" is none of true, false");
    EXPECT_NO_THROW(configuration.setValue(key, "yes")) << "any text is stored";
    EXPECT_NE(thrownBy([&] { configuration.checkValue("ORBEK.No", "1"); }), "nothing thrown");
}

TEST(Configuration, AFileThatCannotBeWrittenShows) {
    const ScratchFolder scratch;
    const std::string file = scratch.write("orbek.conf", ""),
                      key = "ORBEK.ComparisonAlgorithm.NumberOfThreads";
    const RecordedDialog dialog;
    {
        Orbek::Configuration configuration(file);
        configuration.setValue(key, "2");
        configuration.flush();
        EXPECT_EQ(scratch.read("orbek.conf"), key + " = 2\n");
        std::filesystem::remove(file + ".bak");
        std::filesystem::create_directories(file + ".bak/x");
        configuration.setValue(key, "3"); // returns before it is tried
        EXPECT_EQ(thrownBy([&] { configuration.flush(); }).rfind("FNEIOError: Error removing backup", 0), 0u);
        EXPECT_NE(thrownBy([&] { configuration.setValue(key, "4"); }), "nothing thrown");
    }
    EXPECT_EQ(dialog.messages().size(), 1u);
    EXPECT_EQ(scratch.read("orbek.conf"), key + " = 2\n");
    EXPECT_FALSE(std::filesystem::exists(file + "-" + std::to_string(getpid()) + ".tmp"));
}

TEST(Configuration, TheNumbersOfTheLifeCheckAreSettings) {
    Orbek::Configuration configuration = fromText("KxRecognitionLifeCheckWidth = 20\n");
    const std::string prefix = "KxRecognitionLifeCheck";
    const std::pair<const char*, const char*> defaults[] = {
        {"Width", "14"},          {"Height", "14"},        {"RelEyeDist", "1.2"},
        {"RelUp", "0.1"},         {"TemplateWidth", "12"}, {"TemplateHeight", "12"},
        {"Threshold", "50"},      {"LossThreshold", "2"},  {"TranslationThreshold", "0.8"},
        {"ScaleThreshold", "1.2"}};
    const auto settings = configuration.settings();
    for (const auto& [name, value] : defaults) {
        const auto setting = std::ranges::find(settings, prefix + name, &Orbek::Configuration::Setting::key);
        ASSERT_NE(setting, settings.end()) << name;
        EXPECT_EQ(setting->defaultValue, value) << name;
        EXPECT_FALSE(setting->description.empty());
        configuration.setValue(prefix + name, "9");
        EXPECT_EQ(configuration.getValue(prefix + name), "9");
    }
    const auto threshold =
        std::ranges::find(settings, prefix + "Threshold", &Orbek::Configuration::Setting::key);
    EXPECT_EQ(threshold->type, "Int");
    EXPECT_EQ(threshold->description,
              "Threshold (integer value) to be used for the life check discriminator (default: 50).");
    configuration.resetToDefault(prefix + "Threshold");
    EXPECT_EQ(configuration.getValue(prefix + "Threshold"), "50");
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
    const Orbek::Resources& resources = implementation->resources();
    EXPECT_EQ(resources.faceFinder().processingId(), "T8FF");
    EXPECT_NO_THROW(resources.eyesFinder());
    // They are not made again, which could not be done.
    Orbek::Configuration same = configuration;
    for (const std::string finder : {"FaceFinder", "EyesFinder"})
        same.setValue("ORBEK." + finder + ".TemplatePath", "/no/such");
    EXPECT_NO_THROW(resources.faceFinder());
    EXPECT_NO_THROW(resources.eyesFinder());
    EXPECT_EQ(resources.cmpStrategy().algorithm(), resources.cmpStrategy().algorithm());
    EXPECT_EQ(resources.cmpStrategy().scoreMapping(), resources.cmpStrategy().scoreMapping());
}

TEST(ResourcesWithModels, SettingsReachTheEnginesThatAreMadeLater) {
    Orbek::Configuration configuration =
        fromText(std::string("ORBEK.Substitutions.INSTALLDIR = ") + ORBEK_BINARY_DIR + "\n");
    const auto resources = [](const Orbek::Configuration& c) -> const Orbek::Resources& {
        return Orbek::Configuration::Implementation::implementation(c)->resources();
    };
    const std::string threads = "ORBEK.ComparisonAlgorithm.NumberOfThreads",
                      sharp = "ORBEK.ISOFullFrontalTest.MinSharpness",
                      male = "ORBEK.FeatureTest.IsMaleThreshold";
    for (const auto& [key, value] : {std::pair{threads, "3"}, {sharp, "0.5"}, {male, "7"}})
        configuration.setValue(key, value);
    EXPECT_EQ(resources(configuration).cmpStrategy().numberOfThreads(), 3u);
    EXPECT_EQ(resources(configuration).fullFrontalTest().boundaries().minimalSharpness(), 0.5f);
    EXPECT_EQ(resources(configuration).featureTest().boundaries().isMaleThreshold(), 7);
    for (const std::string& key : {threads, sharp, male}) configuration.setValue(key, "1");
    EXPECT_EQ(resources(configuration).cmpStrategy().numberOfThreads(), 3u);
    EXPECT_EQ(resources(configuration).fullFrontalTest().boundaries().minimalSharpness(), 0.5f);
    EXPECT_EQ(resources(configuration).featureTest().boundaries().isMaleThreshold(), 7);
    for (const auto& [value, count] : {std::pair{"0", 1u}, {"-4", 1u}, {"2", 2u}}) {
        const Orbek::Configuration other = fromText(
            std::string("ORBEK.Substitutions.INSTALLDIR = " ORBEK_BINARY_DIR "\n") + threads + " = " + value);
        EXPECT_EQ(resources(other).cmpStrategy().numberOfThreads(), count);
        EXPECT_NE(resources(other).cmpStrategy().algorithm(),
                  resources(configuration).cmpStrategy().algorithm());
    }
}

TEST(Resources, DataAreFoundBesideTheLibraryWhereverItIs) {
    const ScratchFolder scratch;
    const auto place = [&](const std::string& file) {
        return Orbek::dataFolderBeside(scratch.path() / file);
    };
    EXPECT_EQ(place("usr/lib/x86_64/liborbek.so"), std::nullopt);
    std::filesystem::create_directories(scratch.path() / "usr/share/orbek/etc");
    EXPECT_EQ(place("usr/lib/liborbek.so"), std::nullopt) << "a folder of that name is not enough";
    scratch.write("usr/share/orbek/etc/SHA256SUMS", "");
    for (const std::string file : {"usr/lib/x86_64/liborbek.so.8", "usr/lib/liborbek.so", "usr/bin/orbek"})
        EXPECT_EQ(place(file), scratch.path() / "usr/share/orbek") << file;
    std::filesystem::create_directories(scratch.path() / "build/etc");
    scratch.write("build/etc/SHA256SUMS", "");
    EXPECT_EQ(place("build/src/liborbek.so"), scratch.path() / "build");
    EXPECT_EQ(place("build/a/b/c/d/liborbek.so"), std::nullopt) << "not from anywhere above";
    EXPECT_EQ(Orbek::ownDataFolder(), std::filesystem::path(ORBEK_BINARY_DIR));

    const Orbek::Configuration configuration = fromText("ORBEK.Substitutions.INSTALLDIR = $ORBEKDIR/x\n");
    EXPECT_EQ(configuration.getValue("ORBEK.Substitutions.INSTALLDIR"), "$ORBEKDIR/x");
    const auto implementation = Orbek::Configuration::Implementation::implementation(configuration);
    EXPECT_EQ(implementation->resources()
                  .rootComponent()
                  .subComponent("FaceFinder")
                  .subComponent("TemplatePath")
                  .read(true),
              ORBEK_BINARY_DIR "/x/etc/cara");
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
