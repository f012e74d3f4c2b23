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
          {{"set", key, "nan"}, "orbek: " + key + ": \"nan\" is not of the type Float"},
          {{"set", "ORBEK.ComparisonAlgorithm.AlgorithmVersion", "B8"},
           "orbek: ORBEK.ComparisonAlgorithm.AlgorithmVersion: \"B8\" is none of B7, B6, A14, B6L5"},
          {{"set", "ORBEK.Substitutions", "A A"}, "orbek: ORBEK.Substitutions: names \"A\" twice"},
          {{"set", key, "fast"}, "orbek: " + key + ": \"fast\" is not of the type Float"}}) {
        const ProgramRun refused = run(arguments);
        EXPECT_EQ(refused.status, 1) << complaint;
        EXPECT_EQ(refused.complaints.rfind(complaint, 0), 0u) << refused.complaints;
    }
    EXPECT_EQ(run({"get", key}).output, "12.5\n");
}

TEST(OrbekSettings, FaultyLinesAreErrors) {
    const ScratchFolder scratch;
    const std::string first = "ORBEK.Substitutions.INSTALLDIR = /opt\n",
                      good = scratch.write("good.conf", first),
                      bad = scratch.write("bad.conf", first + "ORBEK.StreamVerifier.UseLifecheck = true\n" +
                                                          "ORBEK.FaceTracker.FrameRate = fast\n" + first),
                      text = scratch.write("text.conf", "nothing\n");
    const std::string key = "ORBEK.StreamVerifier.UseLifecheck",
                      reason =
                          "is no key of the configuration; did you mean ORBEK.StreamVerifier.UseLifeCheck?";
    for (const auto& arguments :
         {std::vector<std::string>{"config", "check", bad}, {"config", "check", "--config", bad}}) {
        const ProgramRun checked = runOrbekJson(arguments);
        EXPECT_EQ(checked.status, 1);
        EXPECT_EQ(checked.complaints, "");
        ASSERT_EQ(checked.lines().size(), 3u);
        EXPECT_EQ(checked.lines()[0],
                  nlohmann::json({{"file", bad}, {"line", 2}, {"key", key}, {"reason", reason}}));
        EXPECT_EQ(checked.lines()[1]["line"], 3);
        EXPECT_EQ(checked.lines()[2]["line"], 4);
    }
    EXPECT_EQ(runOrbek({"config", "check", bad}).output.substr(0, bad.size() + 9), bad + ": line 2:");
    const ProgramRun fine = runOrbek({"config", "check", good});
    EXPECT_EQ(fine.status, 0);
    EXPECT_EQ(fine.output + fine.complaints, "");
    EXPECT_EQ(runOrbek({"config", "check", text}).status, 1);
    EXPECT_EQ(runOrbek({"config", "check", scratch.file("none.conf")}).status, 1);

    for (const auto& arguments :
         {std::vector<std::string>{"config", "list"}, {"find", "x.jpg"}, {"models", "list"}}) {
        std::vector<std::string> all = arguments;
        all.insert(all.end(), {"--config", bad});
        const ProgramRun refused = runOrbek(all);
        EXPECT_NE(refused.status, 0);
        EXPECT_EQ(refused.complaints, "orbek: " + bad + ": line 2: " + key + ": " + reason +
                                          "; 'orbek config check' tells 2 more\n")
            << arguments[0];
    }

    // What is wrong with a key does not keep it from being set.
    const std::string one = scratch.write("one.conf", "ORBEK.FaceTracker.FrameRate = fast\n");
    EXPECT_EQ(runOrbek({"config", "set", "ORBEK.FaceTracker.FrameRate", "5", "--config", one}).status, 0);
    EXPECT_EQ(scratch.read("one.conf"), "ORBEK.FaceTracker.FrameRate = 5\n");
    std::filesystem::create_directories(good + ".bak/x");
    const ProgramRun blocked =
        runOrbek({"config", "set", "ORBEK.FaceTracker.FrameRate", "5", "--config", good});
    EXPECT_EQ(blocked.status, 1);
    EXPECT_NE(blocked.complaints.find("orbek: Error removing backup config file [" + good + ".bak]"),
              std::string::npos)
        << blocked.complaints;
    EXPECT_EQ(scratch.read("good.conf"), first);
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
