#include "eval/detect.h"
#include "labelled/labels.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"
#include "train/discriminator_training.h"
#include "train/position_tuning.h"
#include "train/working_point.h"

#include <gtest/gtest.h>

namespace {

using Eye::Implementation::TrainedSvm;

TEST(Labels, RowsCarryTheirFields) {
    const ScratchFolder scratch;
    const std::string file = scratch.write("labels.tsv", "file\tperson\teye_left_x\teye_left_y\tage\n"
                                                         "a.jpg\tAnn\t1.5\t2\t\r\n"
                                                         "helen_12_1.jpg\t\t\t\t3-9\n");
    const std::vector<Labelled::Row> rows = Labelled::readLabels(file);
    ASSERT_EQ(rows.size(), 2u);
    EXPECT_EQ(rows[0].image(), scratch.path() / "a.jpg");
    EXPECT_EQ(*rows[0].position("eye_left"), (FNPos{1.5f, 2}));
    EXPECT_FALSE(rows[0].number("age"));
    EXPECT_EQ(rows[0].splitKey(), "Ann");
    EXPECT_FALSE(rows[1].position("eye_left"));
    EXPECT_FALSE(rows[1].number("age")) << "a range is no number";
    EXPECT_EQ(rows[1].splitKey(), "helen_12") << "files cut from one photo stay together";
    EXPECT_EQ(Labelled::Row("net_7876_12_1_0.jpg", {}).splitKey(), "net_7876_12");
    EXPECT_EQ(Labelled::Row("net_7876__-20_1006_2.jpg", {}).splitKey(), "net_7876__-20_1006");
    EXPECT_EQ(Labelled::Row("helen_12.jpg", {}).splitKey(), "helen_12");
    EXPECT_EQ(Labelled::Row("26_1_1_20170116161105745.jpg", {}).splitKey(), "26_1_1_20170116161105745")
        << "an age and a gender are no photo";

    scratch.write("short.tsv", "file\tage\na.jpg\n");
    EXPECT_EQ(thrownBy([&] { Labelled::readLabels(scratch.file("short.tsv")); }),
              "FNEIOError: " + scratch.file("short.tsv") + ", line 2: 1 fields, expected 2");
    EXPECT_EQ(thrownBy([&] { Labelled::readLabels(scratch.file("none.tsv")); }),
              "FNEIOError: Cannot read labels from " + scratch.file("none.tsv"));
}

TEST(Labels, SplitsHaveTheirSharesAndStay) {
    std::map<Labelled::Split, int> counts;
    for (int i = 0; i < 20000; ++i) ++counts[Labelled::splitOf("Person_" + std::to_string(i))];
    EXPECT_NEAR(counts[Labelled::Split::train], 14000, 400);
    EXPECT_NEAR(counts[Labelled::Split::dev], 3000, 400);
    EXPECT_NEAR(counts[Labelled::Split::test], 3000, 400);
    // A change of the hash would mix people that trained files have seen into the test part.
    EXPECT_EQ(Labelled::splitOf("helen_100032540"), Labelled::Split::dev);
    EXPECT_EQ(Labelled::splitOf("celeba_001719"), Labelled::Split::train);
    EXPECT_EQ(Labelled::splitOf("10001"), Labelled::Split::train);
    EXPECT_EQ(Labelled::splitOf("net_7876_8"), Labelled::Split::test);
}

TEST(OperatingCurve, CountsFacesAndFalseAlarmsFromTheTop) {
    Eval::DetectedPicture first, second;
    first.faces = {{20, 0.5f}, {30, {}}};
    first.falseAlarms = {0.1f};
    second.faces = {{25, 0.2f}};
    const std::vector<Eval::OperatingPoint> curve = Eval::operatingCurve({first, second});
    ASSERT_EQ(curve.size(), 3u);
    EXPECT_EQ(curve[0].confidence, 0.5f);
    EXPECT_NEAR(curve[1].recall, 2.0 / 3, 1e-9);
    EXPECT_EQ(curve[1].falseAlarmsPerImage, 0);
    EXPECT_EQ(curve[2].falseAlarmsPerImage, 0.5);
}

/// Two classes of sign vectors: noisy copies of a pattern or of its negative (a machine of degree 2 has to
/// tell a pattern from its negative by the linear part of its kernel), against noise.
Train::SignSet noisyPatterns(std::size_t n, unsigned seed) {
    constexpr std::uint32_t d = 256;
    Train::Random random(seed);
    std::mt19937 patternRandom(5);
    std::vector<float> pattern(d);
    for (float& value : pattern) value = patternRandom() % 2 ? 1.0f : -1.0f;
    Train::SignSet set;
    for (std::size_t i = 0; i < n; ++i) {
        const bool isFace = i % 2 == 0;
        std::vector<float> values(d);
        for (std::uint32_t k = 0; k < d; ++k)
            values[k] = isFace && random() % 10 < 4 ? pattern[k] : (random() % 2 ? 1.0f : -1.0f);
        set.add(Train::signsOf(values.data(), d), isFace);
    }
    return set;
}

double accuracy(const TrainedSvm& svm, const Train::SignSet& set) {
    double right = 0;
    for (std::size_t i = 0; i < set.size(); ++i)
        right += (svm.evaluate(set.vectors[i]) >= 0) == (set.labels[i] > 0.5f);
    return right / static_cast<double>(set.size());
}

std::vector<Train::Signs> facesOf(const Train::SignSet& set) {
    std::vector<Train::Signs> faces;
    for (std::size_t i = 0; i < set.size(); ++i)
        if (set.labels[i] > 0.5f) faces.push_back(set.vectors[i]);
    return faces;
}

/// The share of `windows` whose score reaches the threshold of each step.
std::vector<double> shares(const TrainedSvm& svm, const std::vector<Train::Signs>& windows,
                           const std::vector<Train::WorkingStep>& steps) {
    std::vector<double> result;
    for (const Train::WorkingStep& step : steps) {
        TrainedSvm prefix = svm;
        prefix.alphas.resize(step.vectors);
        prefix.supportVectors.resize(step.vectors);
        double kept = 0;
        for (const Train::Signs& window : windows) kept += prefix.evaluate(window) >= step.threshold;
        result.push_back(kept / static_cast<double>(windows.size()));
    }
    return result;
}

TEST(Training, MachinesTellUnseenVectorsApart) {
    const Train::SignSet train = noisyPatterns(2000, 1), test = noisyPatterns(2000, 2);
    Train::Random random(3);
    TrainedSvm dot = Train::trainDot(train, 2, random);
    Train::setWorkingPoint(dot, facesOf(train), {{1, -1.0, 0.99}, {2, 0.0, 0.98}});
    EXPECT_EQ(dot.supportVectors.size(), 2u);
    EXPECT_GT(accuracy(dot, test), 0.95);

    TrainedSvm polynomial = Train::growPolynomial(train, {{3, 8}, 0.1f, 500}, random);
    Train::setWorkingPoint(polynomial, facesOf(train), {{3, -0.5, 0.99}, {8, 0.0, 0.98}});
    EXPECT_EQ(polynomial.supportVectors.size(), 8u);
    EXPECT_GT(accuracy(polynomial, test), 0.95);
}

TEST(Training, WorkingPointsKeepTheWantedShares) {
    const Train::SignSet set = noisyPatterns(4000, 4);
    const std::vector<Train::Signs> faces = facesOf(set);
    Train::Random random(6);
    TrainedSvm svm = Train::trainDot(set, 6, random);
    const std::vector<Train::WorkingStep> steps = {{1, -2.0, 0.999}, {2, -0.5, 0.99}, {6, 0.2, 0.97}};
    Train::setWorkingPoint(svm, faces, steps);
    const std::vector<double> kept = shares(svm, faces, steps);
    for (std::size_t i = 0; i < steps.size(); ++i) EXPECT_GE(kept[i], steps[i].keep - 0.002) << i;
    EXPECT_LE(kept.back(), steps.back().keep + 0.002);
}

TEST(Training, EarlierStepsOfAPolynomialMachineAreMetExactly) {
    const Train::SignSet set = noisyPatterns(4000, 8);
    Train::Random random(9);
    TrainedSvm svm = Train::growPolynomial(set, {{4, 12, 40}, 0.1f, 500}, random);
    const std::vector<Train::WorkingStep> steps = {{4, -0.8, 0.99}, {12, -0.5, 0.98}, {40, 0.3, 0.97}};
    Train::setWorkingPoints(svm, facesOf(set), steps, set.vectors);
    const std::vector<double> kept = shares(svm, facesOf(set), steps);
    for (std::size_t i = 0; i < steps.size(); ++i) EXPECT_NEAR(kept[i], steps[i].keep, 0.003) << i;
    EXPECT_GT(accuracy(svm, set), 0.95) << "still a discriminator";
}

TEST(PositionTuning, MovesThePlaceOfTheBestWindowsToTheLabel) {
    // Of each search, the windows left of the place look like the pattern, those right of it only half as
    // much.
    const Train::SignSet set = noisyPatterns(3000, 10);
    Train::Random random(11);
    TrainedSvm svm = Train::growPolynomial(set, {{20}, 0.1f, 500}, random);
    for (float& alpha : svm.alphas) alpha *= 0.1f; // so that no window decides alone
    const std::vector<Train::Signs> faces = facesOf(set);
    const auto error = [&](const TrainedSvm& machine) {
        double sum = 0;
        for (std::size_t i = 0; i + 1 < faces.size(); i += 2)
            sum += machine.evaluate(faces[i]) > machine.evaluate(set.vectors[2 * i + 1]) ? 0 : 1;
        return sum;
    };
    Train::PositionTuning tuning(svm, 24, 0.1f);
    for (std::size_t i = 0; i + 1 < faces.size(); i += 2)
        tuning.add({{faces[i], {0.3f, 0}, 0}, {set.vectors[2 * i + 1], {0, 0}, 0}}, 1);
    const TrainedSvm tuned = tuning.tuned(faces, {{24, -0.5, 0.95}}, random);
    EXPECT_LT(error(svm), 0.1 * static_cast<double>(faces.size()) / 2) << "the pattern wins";
    EXPECT_GT(error(tuned), 0.8 * static_cast<double>(faces.size()) / 2) << "the windows at the place win";
    EXPECT_NEAR(shares(tuned, faces, {{24, -0.5, 0.95}})[0], 0.95, 0.003);
}

} // namespace
