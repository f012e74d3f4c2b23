#include "eval/life.h"

#include "fn/imagefile/image_file.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <sstream>

namespace {

Eval::LifeTake take(const char* sequence, const char* person, bool live, int reach) {
    return {sequence, person, live, 3, 2, reach};
}

TEST(LifeReport, CountsTheTakesThatReachAThreshold) {
    Eval::LifeReport report;
    report.takes = {take("a", "1", true, 30), take("b", "1", false, 9), take("c", "2", true, 10),
                    take("d", "2", false, 0), take("e", "2", false, 31)};
    std::ostringstream text;
    Eval::printLife(report, {10, 31}, text);
    EXPECT_EQ(text.str().rfind("2 takes of living faces and 3 of photos, of 2 people\n", 0), 0u)
        << text.str();
    EXPECT_NE(text.str().find("\n       10   2/2    1/3 \n       31   0/2    1/3 \n"), std::string::npos)
        << text.str();
    EXPECT_NE(Eval::lifeJson(report).find("\"passes_up_to\": 30"), std::string::npos);
}

TEST(LifeReportWithModels, AStillPictureIsNeverAlive) {
    const ScratchFolder scratch;
    const FNImageReference bob = Fn::readImage(ORBEK_SOURCE_DIR "/examples/images/bob1.jpg");
    Fn::writeImage(FNImageReferenceFactory::create(bob.toMono8()), scratch.file("bob.pgm"),
                   FNImageCompressor::LOSSLESS);
    scratch.write("broken.pgm", "P5");
    const std::string header = "file\tperson\tlive\tsequence\tframe\n",
                      labels = scratch.write("labels.tsv",
                                             header + "broken.pgm\tbob\t1\tstill\t1\n" +
                                                 "bob.pgm\tbob\t1\tstill\t3\nbob.pgm\tbob\t1\tstill\t2\n");
    Labelled::Selection selection;
    selection.labels = {labels};
    const Eval::LifeReport report = Eval::measureLife(ORBEK_BINARY_DIR "/etc", selection, {}, {});
    ASSERT_EQ(report.takes.size(), 1u);
    EXPECT_EQ(report.takes[0].frames, 3u);
    EXPECT_EQ(report.takes[0].withEyes, 2u);
    EXPECT_EQ(report.takes[0].reach, 0);
    EXPECT_TRUE(report.takes[0].live);
    ASSERT_EQ(report.failures.size(), 1u);
    EXPECT_NE(report.failures[0].find("broken.pgm: "), std::string::npos);
    scratch.write("labels.tsv", header + "bob.pgm\tbob\t1\t\t3\n");
    EXPECT_NE(thrownBy([&] {
                  Eval::measureLife(ORBEK_BINARY_DIR "/etc", selection, {}, {});
              }).find("without a sequence"),
              std::string::npos);
}

} // namespace
