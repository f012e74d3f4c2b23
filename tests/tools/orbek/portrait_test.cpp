#include "fn/imagefile/image_file.h"
#include "program.h"
#include "support/scratch_folder.h"

#include <gtest/gtest.h>

#include <set>

namespace {

using nlohmann::json;

std::string picture(const std::string& name) {
    return ORBEK_SOURCE_DIR "/examples/images/" + name + ".jpg";
}

/// A small gray picture of nobody.
std::string nobody(const ScratchFolder& scratch) {
    return scratch.write("nobody.pgm", "P5\n40 40\n255\n" + std::string(1600, 9));
}

TEST(PortraitToolWithModels, TellsEveryValueWithItsLimits) {
    const ProgramRun run = runOrbek({"portrait", "--json", picture("alice1")});
    const json portrait = run.lines().at(0);
    EXPECT_EQ(run.status, portrait["compliant"] == true ? 0 : 1);
    EXPECT_EQ(portrait["faces"], 1);
    EXPECT_LT(portrait["head"][0], portrait["eyes"]["left"][0]);
    EXPECT_GT(portrait["head"][3], portrait["eyes"]["right"][1]);
    EXPECT_EQ(portrait["features"]["gender"], "female");
    ASSERT_EQ(portrait["tests"].size(), 24u);
    bool all = true;
    for (const json& test : portrait["tests"]) {
        all = all && (test["required"] == false || test["passed"] == true);
        // A test without alternatives passes if and only if its values are within their limits.
        bool within = true;
        for (const json& v : test["values"]) {
            const double value = v["value"];
            EXPECT_GT(v.size(), 1u) << test;
            within = within && value >= v.value("min", value) && value <= v.value("max", value) &&
                     (!v.contains("above") || value > v["above"]) &&
                     (!v.contains("below") || value < v["below"]);
        }
        EXPECT_TRUE(test["passed"] == within || test["test"] == "noTintedGlasses") << test;
    }
    EXPECT_EQ(portrait["compliant"], all);
}

TEST(PortraitToolWithModels, TellsOfTheSamplePeopleWhatIsDrawn) {
    const std::pair<const char*, const char*> people[] = {
        {"alice", "female white"}, {"bob", "male white"},    {"carl", "male black"},
        {"david", "male asian"},   {"erik", "male white"},   {"fiona", "female white"},
        {"grace", "female black"}, {"hanna", "female white"}};
    for (const auto& [person, drawn] : people)
        for (const char number : {'1', '2', '3', '4'}) {
            const std::string name = std::string(person) + number;
            const json portrait = runOrbek({"portrait", "--json", picture(name)}).lines().at(0);
            const json& features = portrait["features"];
            EXPECT_EQ(portrait["faces"], 1) << name;
            EXPECT_EQ(features["gender"].get<std::string>() + " " + features["ethnicity"].get<std::string>(),
                      drawn)
                << name;
            EXPECT_EQ(features["glasses"], false) << name;
            EXPECT_GT(features["age"], 14) << name;
            EXPECT_LT(features["age"], 60) << name;
        }
}

TEST(PortraitToolWithModels, ItsStatusIsThatOfAllPictures) {
    const ScratchFolder scratch;
    // Limits that everything passes, and the tests that have none.
    std::string lenient = "ORBEK.Substitutions.INSTALLDIR = " ORBEK_BINARY_DIR "\n";
    for (const char* setting :
         {"MinHeadWidth = 1", "MinSharpness = 0", "HotSpotThreshold = 1e9",
          "DeviationFromUniformLightingThreshold = 1e9", "MaxFrontalPoseDeviation = 1e9"})
        lenient += std::string("ORBEK.ISOFullFrontalTest.") + setting + "\n";
    const std::string config = scratch.write("lenient.conf", lenient);
    const ProgramRun good = runOrbek({"portrait", "--config", config, picture("alice1"), picture("bob1")});
    EXPECT_EQ(good.status, 0) << good.output;
    EXPECT_EQ(good.output.rfind(picture("alice1") + ": compliant, ", 0), 0u);
    EXPECT_NE(good.output.find("\n  pass  required     Exposure of the face"), std::string::npos);

    const std::string none = nobody(scratch), broken = scratch.write("broken.jpg", "nothing");
    const ProgramRun empty = runOrbek({"portrait", "--config", config, "--json", picture("alice1"), none});
    EXPECT_EQ(empty.status, 1);
    EXPECT_EQ(empty.lines().at(1),
              (json{{"file", none}, {"eyes", nullptr}, {"compliant", false}, {"best_practice", false}}));
    EXPECT_EQ(runOrbek({"portrait", "--config", config, none}).output,
              none + ": no eyes, not compliant, not best practice\n");
    const ProgramRun unreadable = runOrbek({"portrait", "--config", config, broken, picture("alice1")});
    EXPECT_EQ(unreadable.status, 2);
    EXPECT_EQ(unreadable.complaints.rfind("orbek: " + broken + ": ", 0), 0u);
    EXPECT_NE(unreadable.output.find(": compliant"), std::string::npos) << "the other picture is done";
    EXPECT_EQ(runOrbek({"portrait", picture("alice1"), "--report", "/no/such/page.html"}).status, 2);
    EXPECT_EQ(runOrbek({"portrait"}).status, 2);
}

TEST(RecordToolWithModels, WritesPicturesAndReadsThemBack) {
    const ScratchFolder scratch;
    const std::string file = scratch.file("faces.rec"), none = nobody(scratch),
                      folder = scratch.file("images");
    const ProgramRun written = runOrbek(
        {"record", "write", "--json", "--minimal", "-o", file, picture("bob1"), none, picture("alice1")});
    EXPECT_EQ(written.status, 2);
    EXPECT_EQ(written.complaints, "orbek: " + none + ": there are no eyes of a face\n");
    ASSERT_EQ(written.lines().size(), 3u);
    EXPECT_EQ(written.lines()[0]["height"], 320);
    EXPECT_EQ(written.lines()[2]["bytes"], scratch.read("faces.rec").size());
    const ProgramRun read = runOrbek({"record", "read", "--json", "-o", folder, file});
    EXPECT_EQ(read.status, 0);
    ASSERT_EQ(read.lines().size(), 3u);
    for (const unsigned int i : {0u, 1u}) {
        const json image = read.lines()[i];
        EXPECT_EQ(image["eyes"]["left"], (json{89.5, 144.5, 0.0}));
        EXPECT_EQ(Fn::readImage(image["file"].get<std::string>()).w(), 240u);
    }
    EXPECT_EQ(read.lines()[2]["images"], 2);

    // A token image is taken as it is, with no regard to what it shows.
    EXPECT_EQ(runOrbek({"record", "write", "--uncut", "-o", file, none}).status, 0);
    EXPECT_EQ(runOrbek({"record", "read", "--json", file}).lines().at(0)["width"], 40);
    const ProgramRun empty = runOrbek({"record", "write", "-o", scratch.file("none.rec"), none});
    EXPECT_EQ(empty.status, 1);
    EXPECT_FALSE(std::filesystem::exists(scratch.file("none.rec")));
    EXPECT_EQ(runOrbek({"record", "read", none}).status, 2);
    EXPECT_EQ(runOrbek({"record", "read", "/no/such.rec"}).complaints,
              "orbek: /no/such.rec: cannot be opened\n");
    EXPECT_EQ(runOrbek({"record"}).status, 1);
}

// ---- the page, as a browser shows it

/// Of a headless browser; empty if there is none.
std::string browser() {
    for (const char* name : {"chromium", "chromium-browser", "google-chrome"})
        if (std::system((std::string("command -v ") + name + " >/dev/null 2>&1").c_str()) == 0) return name;
    return "";
}

/// Measures each row of the page: all that it says is to lie inside the window, uncovered and apart.
constexpr const char* measureRows = R"js(<script>
const problems = row => {
  row.scrollIntoView({block: "center"});
  const bad = [], texts = [...row.querySelectorAll("th, .value span, .limits, .verdict")], boxes = [];
  for (const e of [...texts, ...row.querySelectorAll(".scale, .scale u")]) {
    const r = e.getBoundingClientRect(), label = e.className + ":" + e.textContent;
    if (!e.textContent && e.localName == "span") bad.push("empty " + label);
    if (r.width < 2 || r.height < 2) bad.push("no size " + label);
    if (r.left < 0 || r.right > innerWidth || r.top < 0 || r.bottom > innerHeight) bad.push("outside " + label);
    const hit = document.elementFromPoint((r.left + r.right) / 2, (r.top + r.bottom) / 2);
    if (!hit || !row.contains(hit)) bad.push("covered " + label);
    const range = document.createRange();
    range.selectNodeContents(e);
    if (texts.includes(e)) boxes.push([label, range.getBoundingClientRect()]);
  }
  for (const [a, p] of boxes) for (const [b, q] of boxes)
    if (a < b && p.left < q.right - 1 && q.left < p.right - 1 && p.top < q.bottom - 1 && q.top < p.bottom - 1)
      bad.push("overlap " + a + " and " + b);
  return bad;
};
addEventListener("load", () => {
  const rows = [...document.querySelectorAll("tr[data-test]")].map(r => ({test: r.dataset.test, bad: problems(r)}));
  const images = [...document.querySelectorAll("figure svg, figure img")].map(e => e.getBoundingClientRect());
  const out = document.createElement("pre");
  out.id = "layout";
  out.textContent = JSON.stringify({width: innerWidth, page: document.documentElement.scrollWidth, rows,
    images: images.filter(r => r.width > 100 && r.right <= innerWidth && r.height > 100).length});
  parent.document.body.append(out);
});
</script>)js";

struct Shown {
    json layout;
    FNImageReference screenshot;
};

std::string replaced(std::string text, const std::string& what, const std::string& by) {
    for (std::size_t at = 0; (at = text.find(what, at)) != std::string::npos; at += by.size())
        text.replace(at, what.size(), by);
    return text;
}

Shown show(const ScratchFolder& scratch, const std::string& page, int width, int height) {
    const std::string size = std::to_string(width) + "," + std::to_string(height);
    const auto run = [&](const std::string& options) {
        return std::system(("timeout 120 " + browser() +
                            " --headless --no-sandbox --disable-gpu --hide-scrollbars --user-data-dir='" +
                            scratch.file("profile") + "' --window-size=" + size + " " + options +
                            " 2>/dev/null")
                               .c_str());
    };
    // A window is never as narrow as a phone: the page is measured in a frame.
    const std::string inner =
        replaced(replaced(scratch.read(page) + measureRows, "&", "&amp;"), "\"", "&quot;");
    scratch.write("frame.html", "<!DOCTYPE html><meta charset=utf-8><body><iframe style='border:0;width:" +
                                    std::to_string(width) + "px;height:" + std::to_string(height) +
                                    "px' srcdoc=\"" + inner + "\"></iframe>");
    EXPECT_EQ(run("--dump-dom 'file://" + scratch.file("frame.html") + "' >'" + scratch.file("dom") + "'"),
              0);
    const std::string image = scratch.file("shot.png");
    EXPECT_EQ(run("--screenshot='" + image + "' 'file://" + scratch.file(page) + "' >/dev/null"), 0);
    const std::string dom = scratch.read("dom"), begin = "<pre id=\"layout\">";
    const std::size_t at = dom.rfind(begin);
    if (at == std::string::npos) return {};
    const std::size_t text = at + begin.size();
    return {json::parse(replaced(dom.substr(text, dom.find("</pre>", text) - text), "&amp;", "&")),
            Fn::readImage(image)};
}

TEST(PortraitReportWithModels, EveryRowIsSeenOnDesktopAndPhone) {
    if (browser().empty()) GTEST_SKIP() << "no browser is installed that could show the page";
    const ScratchFolder scratch;
    const std::string gray = scratch.file("bob<&\">.pgm");
    Fn::writeImage(FNImageReferenceFactory::create(Fn::readImage(picture("bob1")).toMono8()), gray,
                   FNImageCompressor::LOSSLESS);
    const ProgramRun told = runOrbek({"portrait", "--json", "--report", scratch.file("page.html"),
                                      picture("alice1"), gray, nobody(scratch)});
    std::vector<std::string> expected;
    for (const json& line : told.lines())
        for (const json& test : line.value("tests", json::array())) expected.push_back(test["test"]);
    ASSERT_EQ(expected.size(), 48u);
    EXPECT_EQ(scratch.read("page.html").find("://"), std::string::npos) << "nothing from elsewhere";

    for (const auto& [width, height] : {std::pair{1280, 2600}, std::pair{390, 3000}}) {
        const auto [layout, screenshot] = show(scratch, "page.html", width, height);
        ASSERT_FALSE(layout.is_null()) << "the browser has not shown the page";
        EXPECT_EQ(layout["width"], width);
        EXPECT_LE(layout["page"], width) << "the page is not to be moved sideways";
        EXPECT_EQ(layout["images"], 4) << "two pictures and their token images";
        std::vector<std::string> rows;
        for (const json& row : layout["rows"]) {
            rows.push_back(row["test"]);
            EXPECT_TRUE(row["bad"].empty()) << width << " " << row;
        }
        EXPECT_EQ(rows, expected);
        EXPECT_EQ(screenshot.w(), static_cast<unsigned int>(width));
        const FNImage<unsigned char> pixels = screenshot.toMono8();
        EXPECT_GT(std::set<unsigned char>(pixels.data(), pixels.data() + pixels.size()).size(), 100u);
        if (const char* folder = std::getenv("ORBEK_SCREENSHOTS")) // to look at
            std::filesystem::copy_file(scratch.file("shot.png"),
                                       std::string(folder) + "/" + std::to_string(width) + ".png",
                                       std::filesystem::copy_options::overwrite_existing);
    }
}

} // namespace
