// A gallery and a configuration file of a released version, used with the program as people have them.

#include "golden_facts.h"
#include "orbek/configuration.h"
#include "tools/orbek/program.h"

namespace {

/// A copy, since a gallery is opened to be changed.
std::string copied(const ScratchFolder& scratch, const std::string& name) {
    std::filesystem::copy_file(goldenFolder() / "formats" / name, scratch.file(name));
    return scratch.file(name);
}

TEST(GalleryGoldenWithModels, FindsPeopleInAGalleryOfThen) {
    GoldenFacts facts("gallery");
    const ScratchFolder scratch;
    const std::string gallery = copied(scratch, "people-b7.gallery");
    std::istringstream people(runOrbek({"gallery", "list", gallery}).output);
    std::string line;
    for (int i = 0; std::getline(people, line); ++i) facts.text("person" + std::to_string(i), line);
    for (const std::string person : {"open", "lit", "plain"}) {
        const std::string picture = (goldenFolder() / "pictures" / (person + ".jpg")).string();
        const ProgramRun run = runOrbekJson({"identify", gallery, picture, "--far", "0.3"});
        ASSERT_EQ(run.status, 0) << run.complaints;
        int i = 0;
        const nlohmann::json last = run.lines().back();
        for (const auto& match : last.at("matches")) {
            facts.text(person + "." + std::to_string(i), match.at("id"));
            facts.number(person + ".score" + std::to_string(i++), match.at("score"), 1e-3);
        }
        facts.number(person + ".matches", i);
    }
    EXPECT_EQ(runOrbek({"gallery", "remove", gallery, "lit"}).status, 0) << "and changes it";
    EXPECT_EQ(runOrbek({"gallery", "list", gallery}).output.find("lit"), std::string::npos);
}

TEST(ConfigurationGolden, ReadsAFileOfThen) {
    const ScratchFolder scratch;
    const Orbek::Configuration configuration(copied(scratch, "door.conf"));
    const std::pair<const char*, const char*> values[] = {
        {"ORBEK.Substitutions.INSTALLDIR", "/opt/orbek"},
        {"ORBEK.ComparisonAlgorithm.NumberOfThreads", "3"},
        {"ORBEK.SetEnroller.MinNumOfSamples", "2"},
        {"ORBEK.FaceTracker.ExhaustiveTracking", "false"},
        {"ORBEK.FaceTracker.MaxAllowedFaceSpeed", "1.5"},
        {"ORBEK.CaptureDevices", "Files Door"},
        {"ORBEK.CaptureDevices.Door", "ImageFiles"},
        {"ORBEK.CaptureDevices.Door.ImageFiles.FileLocation", "Directory"},
        {"ORBEK.CaptureDevices.Door.ImageFiles.FileLocation.Directory", "$INSTALLDIR/door frames"},
        {"ORBEK.CaptureDevices.Files.ImageFiles.CaptureFrameRate", "25"},
        {"ORBEK.ISOFullFrontalTest.MinSharpness", "0.1"}};
    for (const auto& [key, value] : values) EXPECT_EQ(configuration.getValue(key), value) << key;
}

} // namespace
