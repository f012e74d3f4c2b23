#include "program.h"

#include <gtest/gtest.h>

namespace {

namespace fs = std::filesystem;

const std::string people = ORBEK_SOURCE_DIR "/examples/images/";

TEST(OrbekToolWithModels, CutsPortraitsForDocuments) {
    const ScratchFolder scratch;
    const std::string folder = scratch.file("tokens"), alice = people + "alice1.jpg";
    const std::string nobody = scratch.write("nobody.pgm", "P5\n64 64\n255\n" + std::string(64 * 64, 'A'));
    const ProgramRun tokens =
        runOrbekJson({"token", "--minimal", alice, nobody, people + "bob1.jpg", "-o", folder});
    EXPECT_EQ(tokens.status, 2);
    EXPECT_EQ(tokens.complaints, "orbek: " + nobody + ": there are no eyes of a face\n");
    ASSERT_EQ(tokens.lines().size(), 2u);
    const auto line = tokens.lines()[0];
    EXPECT_NEAR(line["eyes"]["left"][0], 114.8, 6);
    EXPECT_EQ(line["picture"]["file"], folder + "/alice1.jpg");
    EXPECT_EQ(line["picture"]["height"], 320);
    EXPECT_EQ(line["picture"]["eyes"]["left"][0], 90.5);
    EXPECT_TRUE(fs::exists(folder + "/bob1.jpg"));
    EXPECT_FALSE(fs::exists(folder + "/nobody.jpg"));

    const std::string file = scratch.file("frontal.png");
    const ProgramRun frontal =
        runOrbek({"frontal", alice, "--width", "210", "--position", "0.6", "-o", file});
    EXPECT_EQ(frontal.status, 0);
    EXPECT_EQ(frontal.output, alice + ": " + file + ", 210 x 270\n");
    EXPECT_EQ(scratch.read("frontal.png").substr(1, 3), "PNG");
}

TEST(OrbekToolWithModels, SaysWhyAPortraitIsNotCut) {
    const ScratchFolder scratch;
    const std::string alice = people + "alice1.jpg", out = scratch.file("a.jpg");
    struct Case {
        std::vector<std::string> arguments;
        int status;
        std::string complaint;
    };
    const Case cases[] = {
        {{"token", alice}, 1, "--output is required"},
        {{"token", alice, alice, "-o", out}, 1, out + ": one file for 2 pictures; give a folder"},
        {{"token", alice, "-o", alice + "/x"}, 1, "Cannot make the folder"},
        {{"token", alice, "-o", "/no/such/a.jpg"}, 1, "/no/such/a.jpg: cannot be written"},
        {{"token", "/no/such.jpg", "-o", out}, 2, "/no/such.jpg: "},
        {{"frontal", alice, "--position", "0.8", "-o", out},
         2,
         "Configured target position of face is out of"},
        {{"frontal", alice, "--length-ratio", "0", "-o", out}, 1, "--length-ratio"},
    };
    for (const auto& [arguments, status, complaint] : cases) {
        const ProgramRun run = runOrbek(arguments);
        EXPECT_EQ(run.status, status) << complaint;
        EXPECT_NE(run.complaints.find(complaint), std::string::npos) << run.complaints;
    }
    EXPECT_FALSE(fs::exists(out));
}

} // namespace
