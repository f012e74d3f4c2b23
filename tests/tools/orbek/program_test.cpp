#include "program.h"

#include "fn/imagefile/image_file.h"
#include "fn/imagefile/jpeg.h"
#include "support/labelled_photos.h"

#include <gtest/gtest.h>

#include <cmath>

namespace {

namespace fs = std::filesystem;
using Lines = std::vector<std::string>;

/// A gray picture without a face.
std::string writeRamp(const ScratchFolder& scratch, const std::string& name, std::uint32_t w,
                      std::uint32_t h) {
    FNImage<unsigned char> image(w, h);
    for (FNImIter<unsigned char> pixel(image, image.box()); !pixel.atEnd(); ++pixel)
        *pixel = static_cast<unsigned char>(pixel.x() + 2 * pixel.y());
    Fn::writeImage(FNImageReferenceFactory::create(image), scratch.file(name), FNImageCompressor::LOSSLESS);
    return scratch.file(name);
}

TEST(OrbekToolWithModels, FindGoesOnBehindFilesThatCannotBeRead) {
    const ScratchFolder scratch;
    const std::string a = writeRamp(scratch, "a.pgm", 120, 90), b = writeRamp(scratch, "b.pgm", 1, 1),
                      broken = scratch.write("broken.jpg", "\xFF\xD8\xFFnothing");
    for (const char* jobs : {"1", "3"}) {
        const ProgramRun run = runOrbekJson({"find", a, broken, b, "/no/such.png", a, "--jobs", jobs});
        EXPECT_EQ(run.status, 2);
        const auto lines = run.lines();
        ASSERT_EQ(lines.size(), 3u);
        EXPECT_EQ(run.output.substr(0, run.output.find('\n')),
                  R"({"file":")" + a + R"(","width":120,"height":90,"faces":[]})");
        EXPECT_EQ(lines[1]["file"], b) << "in the order of the arguments";
        EXPECT_EQ(lines[2]["file"], a);
        EXPECT_NE(run.complaints.find("orbek: " + broken + ": "), std::string::npos);
        EXPECT_NE(run.complaints.find("orbek: /no/such.png: "), std::string::npos);
        EXPECT_EQ(std::count(run.complaints.begin(), run.complaints.end(), '\n'), 2) << "no progress bar";
    }
    const ProgramRun forPeople = runOrbek({"find", a, b});
    EXPECT_EQ(forPeople.status, 0);
    EXPECT_EQ(forPeople.output,
              a + ": width 120, height 90, 0 faces\n" + b + ": width 1, height 1, 0 faces\n");
}

TEST(OrbekToolWithModels, ReadsPicturesFromPipes) {
    const ScratchFolder scratch;
    const std::string a = writeRamp(scratch, "a.pgm", 120, 90);
    const std::string orbek = "'" ORBEK_BINARY_DIR "/bin/orbek'";
    for (const std::string name : {"-", "/dev/stdin"}) {
        // Twice: what comes out of a pipe is kept.
        const std::string command =
            "cat '" + a + "' | " + orbek + " find " + name + " " + name + " >'" + scratch.file("out") + "'";
        EXPECT_EQ(std::system(command.c_str()), 0);
        const std::string line = name + ": width 120, height 90, 0 faces\n";
        EXPECT_EQ(scratch.read("out"), line + line);
    }
}

TEST(OrbekToolWithModels, NeverWritesOverItsInputs) {
    const ScratchFolder scratch;
    std::ostringstream jpeg;
    FNImage<unsigned char> black(64, 64);
    black.fill(0);
    Fn::writeJpeg(FNImageReferenceFactory::create(black), jpeg, 50);
    const std::string photo = scratch.write("a.jpg", jpeg.str()), folder = scratch.path().string();
    for (const Lines& arguments : std::vector<Lines>{{"find", folder, "--draw", folder},
                                                     {"track", folder, "--draw", folder},
                                                     {"token", folder, "-o", folder},
                                                     {"frontal", photo, "-o", photo},
                                                     {"record", "write", photo, "--uncut", "-o", photo},
                                                     {"portrait", photo, "--report", photo},
                                                     {"enrol", photo, "-o", photo}}) {
        const ProgramRun run = runOrbek(arguments);
        EXPECT_EQ(run.status, arguments[0] == "portrait" ? 2 : 1) << arguments[0];
        EXPECT_EQ(run.complaints, "orbek: " + photo + ": is an input too, and is not written over\n");
        EXPECT_EQ(scratch.read("a.jpg"), jpeg.str()) << arguments[0];
    }
    // Nor is what was there lost if a result cannot be written.
    fs::create_directory(scratch.file("out"));
    scratch.write("out/a.jpg", "old");
    const std::string command = "ulimit -f 1; trap '' XFSZ; '" ORBEK_BINARY_DIR "/bin/orbek' find '" + photo +
                                "' --draw '" + scratch.file("out") + "' 2>'" + scratch.file("err") + "'";
    scratch.write("a.jpg", "P6 200 200 255\n" + std::string(120000, 'x'));
    EXPECT_NE(std::system(command.c_str()), 0);
    EXPECT_NE(scratch.read("err").find(scratch.file("out/a.jpg") + ": cannot be written"), std::string::npos)
        << scratch.read("err");
    EXPECT_EQ(scratch.read("out/a.jpg"), "old");
    EXPECT_EQ(std::distance(fs::directory_iterator(scratch.file("out")), fs::directory_iterator()), 1);
}

TEST(OrbekToolWithModels, TheLimitsOfPicturesCanBeRaised) {
    const ScratchFolder scratch;
    const std::string file = scratch.write("a.pgm", "P5 70000 1 255\n" + std::string(70000, 'x'));
    const ProgramRun refused = runOrbek({"find", file});
    EXPECT_EQ(refused.status, 2);
    EXPECT_NE(refused.complaints.find("exceeds the limit of 65535 columns"), std::string::npos);
    EXPECT_EQ(runOrbek({"find", file, "--max-side", "70000"}).status, 0);
    EXPECT_EQ(runOrbek({"find", file, "--max-side", "70000", "--max-pixels", "69999"}).status, 2);
    EXPECT_EQ(runOrbek({"find", file, "--max-side", "0"}).status, 1);
}

TEST(OrbekToolWithModels, SaysWhatStopsIt) {
    const ScratchFolder scratch;
    const std::string a = writeRamp(scratch, "a.pgm", 20, 20),
                      noModels = scratch.write("none.conf", "ORBEK.Substitutions.INSTALLDIR = /no/such\n"),
                      damaged = scratch.write("damaged.conf", "nonsense\n");
    struct Case {
        Lines arguments;
        std::string complaint;
    };
    const Case cases[] = {
        {{}, "subcommand is required"},
        {{"compute"}, "orbek: there is no command \"compute\"; see orbek --help"},
        {{"gallery", "bake", a}, "there is no command \"bake\""},
        {{"find"}, "images is required"},
        {{"find", a, "--box", "1", "2", "3"}, "--box"},
        {{"find", a, "--config", "/no/such.conf"}, "orbek: /no/such.conf: "},
        {{"find", a, "--config", damaged}, "orbek: " + damaged + ": "},
        {{"find", a, "--config", noModels}, "/no/such/etc/cara/"},
        {{"find", a, "--draw", a + "/x"}, "orbek: Cannot make the folder " + a + "/x"},
        {{"track", a, "--fps", "0"}, "frame rate out of range"},
        {{"track", scratch.path().string(), "--config", noModels}, "/no/such/etc/cara/"},
    };
    for (const auto& [arguments, complaint] : cases) {
        const ProgramRun run = runOrbek(arguments);
        EXPECT_EQ(run.status, 1) << complaint;
        EXPECT_EQ(run.output, "");
        EXPECT_NE(run.complaints.find(complaint), std::string::npos) << run.complaints;
    }
    EXPECT_EQ(scratch.read("none.conf"), "ORBEK.Substitutions.INSTALLDIR = /no/such\n");
}

TEST(OrbekToolWithModels, ResultsForPeopleCountInTheirLanguage) {
    const ScratchFolder scratch;
    const std::string gray = writeRamp(scratch, "a.pgm", 50, 40),
                      bob = ORBEK_SOURCE_DIR "/examples/images/bob1.jpg";
    const ProgramRun found = runOrbek({"find", gray, bob});
    EXPECT_NE(found.output.find("width 50, height 40, 0 faces\n"), std::string::npos) << found.output;
    EXPECT_NE(found.output.find(", 1 face\n  x "), std::string::npos) << found.output;
}

TEST(OrbekToolWithModels, PicturesOfOneNameAreDrawnIntoFilesOfTheirOwn) {
    const ScratchFolder scratch;
    fs::create_directory(scratch.path() / "sub");
    const std::string a = writeRamp(scratch, "a.pgm", 50, 40), b = writeRamp(scratch, "sub/a.pgm", 30, 20);
    ASSERT_EQ(runOrbek({"find", a, b, "--draw", scratch.file("drawn")}).status, 0);
    EXPECT_EQ(Fn::readImage(scratch.file("drawn/a.jpg")).w(), 50u);
    EXPECT_EQ(Fn::readImage(scratch.file("drawn/a-2.jpg")).w(), 30u);
}

double distance(const nlohmann::json& place, double x, double y) {
    return std::hypot(place[0].get<double>() - x, place[1].get<double>() - y);
}

TEST(OrbekToolOnPhotos, FindPrintsWhereTheFeaturesAre) {
    if (labelledPhotos().empty()) GTEST_SKIP() << "the labelled photos are not there";
    const ScratchFolder scratch;
    const std::string photo = (labelledPhotos() / "scenes/faces/celeba_001719.jpg").string();
    const ProgramRun run = runOrbekJson({"find", photo, "--draw", scratch.path().string()});
    ASSERT_EQ(run.status, 0) << run.complaints;
    const nlohmann::json found = run.lines().front();
    ASSERT_EQ(found["faces"].size(), 1u);
    const nlohmann::json face = found["faces"][0];
    EXPECT_NEAR(face["eye_distance"], 50, 10);
    EXPECT_NEAR(face["rotation"], 0.25, 0.2);
    EXPECT_LT(std::hypot(face["x"].get<double>() - 196, face["y"].get<double>() - 105), 15);
    EXPECT_LT(distance(face["eyes"]["left"], 171.8, 98.6), 5);
    EXPECT_LT(distance(face["eyes"]["right"], 220.1, 111.2), 5);
    EXPECT_LT(distance(face["mouth"], 182.8, 154), 8);
    EXPECT_LT(distance(face["bridge"], 199.3, 105.3), 6);
    const FNImage<Fn::Bgra32> drawn = Fn::readImage(scratch.file("celeba_001719.jpg")).toBgra32();
    EXPECT_GT(drawn(172, 98).g, 150) << "a green dot on the eye";

    EXPECT_TRUE(runOrbekJson({"find", photo, "--box", "0", "200", "300", "343"}).lines()[0]["faces"].empty());
    EXPECT_TRUE(runOrbekJson({"find", photo, "--min-eye", "0.3"}).lines()[0]["faces"].empty());
    EXPECT_TRUE(runOrbekJson({"find", photo, "--max-eye", "0.06"}).lines()[0]["faces"].empty());
}

TEST(OrbekToolOnPhotos, TrackGivesAFaceOneIdThroughTheFrames) {
    if (labelledPhotos().empty()) GTEST_SKIP() << "the labelled photos are not there";
    const ScratchFolder scratch;
    const fs::path photo = labelledPhotos() / "scenes/faces/celeba_001719.jpg";
    for (const char* name : {"f9.jpg", "f10.jpg", "f11.jpg"}) fs::copy_file(photo, scratch.path() / name);
    const std::string config =
        scratch.write("c.conf", "ORBEK.Substitutions.INSTALLDIR = " ORBEK_BINARY_DIR "\n"
                                "ORBEK.FaceTracker.ReturnFacesWithNoEyesThreshold = -10\n");
    const ProgramRun run = runOrbekJson({"track", scratch.path().string(), "--config", config, "--fps", "8",
                                         "--draw", scratch.file("drawn")});
    ASSERT_EQ(run.status, 0) << run.complaints;
    const auto lines = run.lines();
    ASSERT_EQ(lines.size(), 3u);
    for (std::size_t i = 0; i < lines.size(); ++i) {
        EXPECT_EQ(lines[i]["frame"], i);
        EXPECT_EQ(lines[i]["time"], i * 125);
        ASSERT_EQ(lines[i]["faces"].size(), 1u);
        EXPECT_EQ(lines[i]["faces"][0]["id"], lines[0]["faces"][0]["id"]);
        EXPECT_EQ(lines[i]["faces"][0]["track"], 1);
    }
    EXPECT_EQ(fs::path(lines[0]["file"].get<std::string>()).filename(), "f9.jpg");
    EXPECT_TRUE(fs::exists(scratch.file("drawn/f11.jpg")));
    EXPECT_EQ(scratch.read("c.conf").find("FrameRate"), std::string::npos) << "the file is left as it is";
}

} // namespace
