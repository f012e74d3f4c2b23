#include "program.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <map>

namespace {

namespace fs = std::filesystem;
using nlohmann::json;

class DemoWithModels : public testing::Test {
protected:
    static void add(const ScratchFolder& scratch, const std::string& sample, const std::string& name) {
        const fs::path file = scratch.path() / name;
        fs::create_directories(file.parent_path());
        fs::copy_file(ORBEK_SOURCE_DIR "/examples/images/" + sample + ".jpg", file);
    }
    static ProgramRun demonstrate(const ScratchFolder& scratch) {
        return runOrbekJson({"demo", scratch.file("photos"), "-o", scratch.file("demo")});
    }
    static std::size_t count(const std::string& text, const std::string& part) {
        std::size_t n = 0;
        for (std::size_t at = text.find(part); at != std::string::npos; at = text.find(part, at + 1)) ++n;
        return n;
    }
};

TEST_F(DemoWithModels, PeopleAreFoundAgainByPicturesThatWereKeptBack) {
    const ScratchFolder scratch;
    for (const std::string name : {"alice", "bob", "erik"})
        for (const std::string number : {"1", "2", "3"})
            add(scratch, name + number, "photos/" + name + "-" + number + ".jpg");
    fs::copy_file(ORBEK_SOURCE_DIR "/examples/images/about.txt", scratch.file("photos/about.txt"));
    const ProgramRun run = demonstrate(scratch);
    ASSERT_EQ(run.status, 0) << run.complaints;
    std::map<std::string, std::string> identified;
    for (const json& line : run.lines())
        if (line.contains("claimed")) {
            EXPECT_TRUE(line["match"]) << line;
            identified[line["claimed"]] = line["identified"];
        } else if (line.contains("id")) {
            EXPECT_EQ(line["pictures"], 2) << line;
        }
    const std::map<std::string, std::string> own = {{"alice", "alice"}, {"bob", "bob"}, {"erik", "erik"}};
    EXPECT_EQ(identified, own);
    EXPECT_EQ(runOrbekJson({"gallery", "list", scratch.file("demo/people.gallery")}).lines().size(), 3u);
    const std::string page = scratch.read("demo/index.html");
    EXPECT_EQ(count(page, "data:image/jpeg"), 9u);
    EXPECT_EQ(count(page, "Who is it?"), 3u);
    EXPECT_NE(page.find("3 of 3"), std::string::npos);
    EXPECT_NE(page.find("<b>The people of these pictures do not exist: they are drawn by a program"),
              std::string::npos);
}

TEST_F(DemoWithModels, FoldersArePeopleAndUselessPicturesAreShownAsSuch) {
    const ScratchFolder scratch;
    for (const std::string name : {"alice", "bob", "carl", "<b>", "zoe"})
        add(scratch, "david1", "photos/" + name + "/1.jpg");
    add(scratch, "bob2", "photos/bob/2.jpg");
    // A page of one colour.
    std::ofstream(scratch.file("photos/carl/1.jpg"), std::ios::trunc) << "P5 40 40 255\n"
                                                                      << std::string(1600, 'x');
    scratch.write("photos/alice/2.jpg", "no picture");
    const ProgramRun run = demonstrate(scratch);
    EXPECT_EQ(run.status, 2);
    EXPECT_NE(run.complaints.find("carl: not enrolled, too few usable pictures\n"), std::string::npos);
    EXPECT_NE(run.complaints.find("alice/2.jpg"), std::string::npos);
    const std::string page = scratch.read("demo/index.html");
    EXPECT_EQ(count(page, "no eyes found"), 2u);
    EXPECT_EQ(count(page, "cannot be read"), 1u);
    EXPECT_NE(page.find("&lt;b&gt;"), std::string::npos);
    EXPECT_NE(page.find("a stranger"), std::string::npos); // the last of enough people
}

TEST_F(DemoWithModels, NobodyToEnrolIsAnError) {
    const ScratchFolder scratch;
    fs::create_directories(scratch.file("photos/a"));
    scratch.write("photos/a/1.jpg", "");
    const ProgramRun run = demonstrate(scratch);
    EXPECT_EQ(run.status, 2);
    EXPECT_NE(run.complaints.find("1.jpg"), std::string::npos) << run.complaints;
    EXPECT_FALSE(fs::exists(scratch.file("demo/index.html")));
}

} // namespace
