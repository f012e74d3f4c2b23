#include "fn/imagefile/image_file.h"
#include "recognition_tool.h"

#include <gtest/gtest.h>

namespace {

TEST_F(RecognitionToolWithModels, EnrolsPicturesToOneRecord) {
    const ScratchFolder scratch;
    const std::string file = scratch.file("bob.fir"), broken = scratch.write("broken.jpg", "nothing");
    const ProgramRun both = run({"enrol", image("bob1.jpg"), broken, image("bob2.jpg"), "-o", file});
    EXPECT_EQ(both.status, 2);
    EXPECT_NE(both.complaints.find("orbek: " + broken + ": "), std::string::npos);
    const auto lines = both.lines();
    ASSERT_EQ(lines.size(), 3u);
    EXPECT_EQ(lines[0]["file"], image("bob1.jpg"));
    EXPECT_LT(lines[1]["eyes"]["left"][0], lines[1]["eyes"]["right"][0]);
    EXPECT_EQ(lines[2]["file"], file);
    EXPECT_EQ(lines[2]["bytes"], scratch.read("bob.fir").size());
    EXPECT_EQ(run({"show", file}).lines().at(0), lines[2]);

    // Gray pictures are read where they lie, and each is gone when the next one comes.
    std::vector<std::string> gray{"enrol", "-o", scratch.file("gray.fir")};
    for (const char* name : {"bob1", "bob2", "bob3"}) {
        gray.push_back(scratch.file(name + std::string(".pgm")));
        const FNImage<unsigned char> picture = Fn::readImage(image(name + std::string(".jpg"))).toMono8();
        Fn::writeImage(FNImageReferenceFactory::create(picture), gray.back(), FNImageCompressor::LOSSLESS);
    }
    EXPECT_EQ(run(gray).lines().at(3)["features"], 3);

    const std::string nobody = scratch.file("nobody.fir"),
                      empty = scratch.write("e.pgm", "P5\n4 4\n255\n" + std::string(16, 9));
    const ProgramRun none = run({"enrol", empty, "-o", nobody});
    EXPECT_EQ(none.status, 1);
    EXPECT_EQ(none.lines().at(0)["eyes"], nullptr);
    EXPECT_EQ(none.complaints, "orbek: " + nobody + ": not made, too few usable pictures\n");
    EXPECT_FALSE(std::filesystem::exists(nobody));
    EXPECT_EQ(run({"enrol", image("bob1.jpg"), "-o", "/no/such/x.fir"}).status, 1);
}

TEST_F(RecognitionToolWithModels, VerifiesByItsExitStatus) {
    const ScratchFolder scratch;
    const std::string bob = record(scratch, "bob1");
    const ProgramRun same = run({"verify", bob, image("bob1.jpg"), image("alice1.jpg"), "--far", "0.99"});
    EXPECT_EQ(same.status, 0);
    ASSERT_EQ(same.lines().size(), 2u) << "the second picture is not asked";
    EXPECT_EQ(same.lines()[1]["match"], true);
    const double score = same.lines()[0]["score"];
    const ProgramRun refused = run({"verify", bob, image("alice1.jpg"), "--score", std::to_string(score)});
    EXPECT_EQ(refused.status, 1);
    EXPECT_LT(refused.lines().at(0)["score"], score);
    EXPECT_EQ(refused.lines().at(1)["match"], false);
    const ProgramRun far = run({"verify", bob, image("bob1.jpg"), "--far", "0.25"});
    EXPECT_EQ(far.lines().back()["threshold"], 0.75);

    const std::string broken = scratch.write("broken.fir", "nothing");
    EXPECT_EQ(run({"verify", broken, image("bob1.jpg")}).status, 2);
    EXPECT_EQ(run({"verify", bob, "/no/such.jpg"}).status, 2);
    EXPECT_EQ(run({"verify", bob}).status, 2);
    EXPECT_EQ(run({"verify", bob, image("bob1.jpg"), "--far", "0.1", "--score", "0.5"}).status, 2);
    for (const std::string command : {"verify", "identify"})
        for (const std::string option : {"--far", "--score"})
            for (const std::string value : {"nan", "-nan", "-0.1", "1.01", "inf", "x"}) {
                if (command == "identify" && option == "--score") continue;
                const ProgramRun no = run({command, bob, image("alice1.jpg"), option, value});
                EXPECT_EQ(no.status, 2) << command << " " << option << " " << value;
                EXPECT_NE(no.complaints.find(option + ": \"" + value + "\" is not a number from 0 to 1"),
                          std::string::npos)
                    << no.complaints;
            }
    EXPECT_EQ(run({"verify", "--help"}).status, 0);
}

TEST_F(RecognitionToolWithModels, ComparesAndMergesRecords) {
    const ScratchFolder scratch;
    const std::string bob = record(scratch, "bob1"), alice = record(scratch, "alice1"),
                      both = scratch.file("both.fir");
    const auto compare = [&](const std::string& a, const std::string& b) {
        const ProgramRun compared = run({"compare", a, b});
        EXPECT_EQ(compared.status, 0);
        const auto line = compared.lines().at(0);
        const double score = line["score"];
        EXPECT_NEAR(line["far"], 1 - score, 1e-3);
        EXPECT_NEAR(line["frr"], score / 2, 1e-3);
        return score;
    };
    EXPECT_GT(compare(bob, bob), compare(bob, alice));
    const ProgramRun merged = run({"merge", bob, alice, "-o", both});
    EXPECT_EQ(merged.lines().at(0)["features"], 2);
    EXPECT_GT(compare(both, alice), compare(bob, alice));

    const std::string broken = scratch.write("broken.fir", "nothing");
    const ProgramRun shown = run({"show", bob, broken, alice});
    EXPECT_EQ(shown.status, 2);
    EXPECT_EQ(shown.lines().size(), 2u);
    EXPECT_EQ(shown.complaints.rfind("orbek: " + broken + ": ", 0), 0u);
    EXPECT_EQ(run({"compare", bob, broken}).status, 2);
    EXPECT_EQ(run({"merge", bob, "/no/such.fir", "-o", both}).complaints,
              "orbek: /no/such.fir: cannot be opened\n");
}

} // namespace
