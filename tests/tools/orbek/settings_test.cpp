#include "program.h"

#include <gtest/gtest.h>

#include <regex>

namespace {

namespace fs = std::filesystem;

TEST(OrbekSettingsWithModels, AreToldAndChanged) {
    const ScratchFolder scratch;
    const std::string text = "# a comment\nORBEK.Substitutions.INSTALLDIR = " ORBEK_BINARY_DIR "\n",
                      config = scratch.write("c.conf", text), key = "ORBEK.FaceTracker.FrameRate";
    const auto run = [&](std::vector<std::string> arguments) {
        arguments.insert(arguments.begin(), "config");
        arguments.insert(arguments.end(), {"--config", config});
        return runOrbek(arguments);
    };
    const ProgramRun before = run({"get", key});
    EXPECT_EQ(before.status, 0);
    EXPECT_EQ(scratch.read("c.conf"), text) << "looking changes nothing";
    EXPECT_EQ(run({"set", key, "12.5"}).status, 0);
    EXPECT_EQ(run({"get", key}).output, "12.5\n");
    EXPECT_EQ(scratch.read("c.conf.bak"), text);
    EXPECT_EQ(run({"list", key}).output, key + " = 12.5\n");
    const auto line = nlohmann::json::parse(run({"explain", key, "--json"}).output);
    EXPECT_EQ(line["value"], "12.5");
    EXPECT_EQ(line["default"].get<std::string>() + "\n", before.output);
    EXPECT_EQ(line["type"], "Float");

    const ProgramRun all = run({"list"});
    EXPECT_GT(std::ranges::count(all.output, '\n'), 50);
    EXPECT_EQ(run({"list", "ORBEK.FaceTracker"}).output.find("ORBEK.FaceFinder."), std::string::npos);
    for (const auto& [arguments, complaint] :
         {std::pair{std::vector<std::string>{"get", "ORBEK.FaceTracke"},
                    std::string("orbek: ORBEK.FaceTracke: is no key")},
          {{"list", "ORBEK.FaceTracke"}, "orbek: ORBEK.FaceTracke: is no key"},
          {{"set", "ORBEK.FaceTracker", "1"}, "orbek: ORBEK.FaceTracker: is a group"},
          {{"set", key, "fast"}, "orbek: " + key + ": \"fast\" is not of the type Float"}}) {
        const ProgramRun refused = run(arguments);
        EXPECT_EQ(refused.status, 1) << complaint;
        EXPECT_EQ(refused.complaints.rfind(complaint, 0), 0u) << refused.complaints;
    }
    EXPECT_EQ(run({"get", key}).output, "12.5\n");
}

TEST(OrbekModelsWithModels, AreComparedWithTheirSums) {
    const ProgramRun installed = runOrbekJson({"models", "check"});
    EXPECT_EQ(installed.status, 0) << installed.complaints;
    EXPECT_EQ(installed.lines().at(0)["bad"], 0);
    EXPECT_EQ(runOrbekJson({"models", "list"}).lines().size(), installed.lines()[0]["good"]);

    const ScratchFolder scratch;
    const std::string config =
        scratch.write("c.conf", "ORBEK.Substitutions.INSTALLDIR = " + scratch.path().string() + "\n");
    EXPECT_EQ(runOrbek({"models", "check", "--config", config}).status, 2) << "there is no list";
    fs::create_directory(scratch.path() / "etc");
    const std::string good = scratch.write("etc/good.dat", ""),
                      changed = scratch.write("etc/changed.dat", "x");
    const std::string empty = "e3b0c44298fc1c149afbf4c8996fb92427ae41e4649b934ca495991b7852b855";
    scratch.write("etc/SHA256SUMS",
                  empty + "  good.dat\n" + empty + "  changed.dat\n" + empty + "  none.dat\n");
    const ProgramRun bad = runOrbekJson({"models", "check", "--config", config});
    EXPECT_EQ(bad.status, 2);
    EXPECT_EQ(bad.lines().at(0), nlohmann::json({{"good", 1}, {"bad", 2}}));
    EXPECT_NE(bad.complaints.find("orbek: " + changed + ": is not as it was installed"), std::string::npos);
    EXPECT_NE(bad.complaints.find("orbek: " + scratch.file("etc/none.dat") + ": "), std::string::npos);
    const ProgramRun listed = runOrbekJson({"models", "list", "--config", config});
    EXPECT_EQ(listed.status, 2);
    EXPECT_EQ(listed.lines().size(), 2u);
}

TEST(OrbekManualPages, TellTheOptionsOfEachCommand) {
    std::size_t pages = 0;
    for (const auto& entry : fs::directory_iterator(ORBEK_BINARY_DIR "/man1")) {
        std::ifstream file(entry.path());
        const std::string page(std::istreambuf_iterator<char>(file), {});
        std::vector<std::string> arguments;
        std::istringstream names(entry.path().stem().string());
        for (std::string name; std::getline(names, name, '-');)
            if (name != "orbek") arguments.push_back(name);
        arguments.emplace_back("--help");
        const ProgramRun help = runOrbek(arguments);
        EXPECT_EQ(help.status, 0) << entry.path();
        const std::regex option("--[a-z]+");
        for (std::sregex_iterator found(help.output.begin(), help.output.end(), option), end; found != end;
             ++found) {
            const std::string shown = "\\-\\-" + found->str().substr(2);
            EXPECT_NE(page.find(shown), std::string::npos) << entry.path() << ": " << found->str();
        }
        ++pages;
    }
    EXPECT_GE(pages, 20u);
}

} // namespace
