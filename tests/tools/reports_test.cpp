#include "eval/detect.h"
#include "eval/landmarks.h"
#include "eval/plot.h"
#include "fn/image_reference.h"
#include "support/scratch_folder.h"

#include <gtest/gtest.h>

namespace {

/// Reports the same faces on every picture.
class FixedFinder : public FaceFinder::Body {
public:
    explicit FixedFinder(const std::list<FaceFinder::Location>& faces) : faces_(faces) {}
    bool find(const FNImageReference&, std::list<FaceFinder::Location>& locations, double, double,
              const FNBox&) const override {
        locations = faces_;
        return true;
    }
    std::string processingId() const override { return "fixed"; }

private:
    std::list<FaceFinder::Location> faces_;
};

/// Sees each eye a little to the right of where the face's width says it is.
class OffEyes : public EyesFinder::Body {
public:
    void find(const FaceFinder::Location& face, const FNImageReference&, bool& foundFirst,
              FacialFeatureLocation& first, bool& foundSecond, FacialFeatureLocation& second) const override {
        foundFirst = foundSecond = face.width < 30;
        first = {face.pos + FNPos{-face.width / 2 + 1, 0}, face.width, 0};
        second = {face.pos + FNPos{face.width / 2 + 2, 0}, face.width, 0};
    }
    void find(const FacialFeatureLocation&, const FacialFeatureLocation&, const FNImageReference&, bool&,
              FacialFeatureLocation&, bool&, FacialFeatureLocation&) const override {}
    std::string processingId() const override { return "off"; }
};

template <class Handle> class BetweenTheEyes : public Handle::Body {
public:
    bool find(const FacialFeatureLocation& eye1, const FacialFeatureLocation& eye2, const FNImageReference&,
              FacialFeatureLocation& result) const override {
        result.pos = (eye1.pos + eye2.pos) / 2.0f;
        return true;
    }
    std::string processingId() const override { return "between"; }
};

FaceFinder finderOf(const std::list<FaceFinder::Location>& faces) {
    return FaceFinder(FNCountedPtr<FaceFinder::Body>(new FixedFinder(faces)));
}

/// One picture with three faces, of which the third is turned and labelled by an annotator, and one that
/// cannot be read.
class Reports : public testing::Test {
protected:
    void SetUp() override {
        scratch_.write("a.pgm", "P5\n2 2\n255\nabcd");
        selection_.labels = {scratch_.write(
            "labels.tsv", "file\teye_left_x\teye_left_y\teye_right_x\teye_right_y\tmouth_x\tmouth_y\t"
                          "source_labels\tgender\n"
                          "a.pgm\t10\t50\t30\t50\t20\t50\thand\tf\n"
                          "a.pgm\t100\t50\t140\t50\t\t\thand\tm\n"
                          "a.pgm\t200\t50\t220\t65\t\t\tteacher\tm\n"
                          "missing.pgm\t1\t1\t9\t1\t\t\thand\tf\n")};
        selection_.groupColumn = "gender";
        selection_.jobs = 2;
    }

    // The faces as they are, the last one missed, and one more.
    const std::list<FaceFinder::Location> reports_ = {
        {{20, 52}, 22, 0.9f, 0}, {{120, 50}, 40, 0.5f, 0}, {{400, 50}, 20, 0.1f, 0}};
    ScratchFolder scratch_;
    Labelled::Selection selection_;
};

TEST_F(Reports, DetectionCountsTheFacesThatAreAskedFor) {
    const auto judged = [&] {
        const auto pictures = Eval::detect(finderOf(reports_), selection_, {});
        EXPECT_EQ(pictures.size(), 2u);
        EXPECT_NE(pictures[1].failure.find("missing.pgm"), std::string::npos) << pictures[1].failure;
        return pictures[0];
    };
    const Eval::DetectedPicture all = judged();
    ASSERT_EQ(all.faces.size(), 3u);
    EXPECT_EQ(all.faces[0].confidence, 0.9f);
    EXPECT_EQ(all.faces[0].group, "f");
    EXPECT_FALSE(all.faces[2].confidence);
    EXPECT_EQ(all.falseAlarms, std::vector<float>{0.1f});

    // What does not count is neither missed nor a false alarm.
    selection_.mostRotation = 20;
    selection_.mostEyeDistance = 30;
    const Eval::DetectedPicture some = judged();
    ASSERT_EQ(some.faces.size(), 1u);
    EXPECT_EQ(some.faces[0].confidence, 0.9f);
    EXPECT_EQ(some.falseAlarms, std::vector<float>{0.1f});

    selection_ = {selection_.labels, {}, true, 0, 1e9, 180, "", 1};
    EXPECT_EQ(judged().faces.size(), 2u);
}

TEST_F(Reports, LandmarkErrorsAreThoseOfTheWorseEyeInEyeDistances) {
    const Eval::LandmarkFinders finders{
        finderOf(reports_), EyesFinder(FNCountedPtr<EyesFinder::Body>(new OffEyes)),
        MouthFinder(FNCountedPtr<MouthFinder::Body>(new BetweenTheEyes<MouthFinder>)),
        BridgeFinder(FNCountedPtr<BridgeFinder::Body>(new BetweenTheEyes<BridgeFinder>))};
    const Eval::LandmarkReport report = Eval::measureLandmarks(finders, selection_, {});
    EXPECT_EQ(report.faces, 3u);
    EXPECT_EQ(report.facesFound, 2u);
    EXPECT_EQ(report.eyes.looked, 2u) << "the eyes of the wide face are not seen";
    ASSERT_EQ(report.eyes.errors.size(), 1u);
    // Face at (20, 52) of width 22: the right eye at (33, 52), its label at (30, 50).
    EXPECT_FLOAT_EQ(report.eyes.errors[0], std::sqrt(13.0f) / 20);
    EXPECT_FLOAT_EQ(report.rightOffset.x, 0.15f);
    EXPECT_NEAR(report.eyesCentred.errors.at(0), 0, 1e-6) << "a single face is its own mean";
    EXPECT_EQ(report.eyes.within(0.1f), 0);
    EXPECT_EQ(report.eyes.within(0.2f), 1);
    ASSERT_EQ(report.mouth.errors.size(), 1u);
    EXPECT_FLOAT_EQ(report.mouth.errors[0], std::sqrt(1.5f * 1.5f + 4) / 20);
    EXPECT_EQ(report.bridge.looked, 0u) << "no label";
    ASSERT_EQ(report.eyesByGroup.size(), 2u);
    ASSERT_EQ(report.failures.size(), 1u);
    EXPECT_NE(report.failures[0].find("missing.pgm"), std::string::npos);
}

TEST(Plot, CurvesLieWithinTheirAxes) {
    const std::string svg = Eval::plotSvg("<a & b>", {"x", 0.001, 10, true}, {"y", 0, 1},
                                          {{"one", {{0, 0}, {10, 1}}}, {"two", {{0.1, 0.5}}}});
    EXPECT_NE(svg.find("&lt;a &amp; b>"), std::string::npos);
    EXPECT_NE(svg.find("points=\"70.0,380.0 620.0,40.0 \""), std::string::npos) << svg;
    EXPECT_NE(svg.find("points=\"345.0,210.0 \""), std::string::npos) << svg;
    EXPECT_NE(svg.find(">two</text>"), std::string::npos);
}

} // namespace
