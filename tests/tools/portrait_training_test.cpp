#include "eval/portrait.h"
#include "eye/discriminator/svm_fp_discriminator.h"
#include "labelled/portrait_truth.h"
#include "train/quadratic_training.h"

#include <gtest/gtest.h>

#include <cmath>
#include <random>

namespace {

Labelled::Row rowWithPoints(const std::array<FNPos, 68>& points) {
    std::string text;
    for (const FNPos p : points) text += std::to_string(p.x) + " " + std::to_string(p.y) + " ";
    return {"a.jpg", {{"points68", text}}};
}

TEST(PortraitTruth, IsTheGeometryOfPoints) {
    // Eyes 40 apart at (80, 100) and (120, 100), each 16 wide; the left one is open by 4, the other by 1.
    std::array<FNPos, 68> points{};
    const auto eye = [&](std::size_t first, float x, float opening) {
        const float top = 100 - opening / 2, bottom = 100 + opening / 2;
        const FNPos around[] = {{x - 8, 100}, {x - 3, top},    {x + 3, top},
                                {x + 8, 100}, {x + 3, bottom}, {x - 3, bottom}};
        std::copy(std::begin(around), std::end(around), points.begin() + static_cast<std::ptrdiff_t>(first));
    };
    eye(36, 80, 4);
    eye(42, 120, 1);
    for (std::size_t i = 0; i <= 16; ++i) points[i] = {60 + 5 * static_cast<float>(i), 120};
    points[8] = {100, 172};
    points[30] = {100, 120};
    for (const std::size_t i : {61u, 62u, 63u}) points[i] = {100, 150};
    for (const std::size_t i : {65u, 66u, 67u}) points[i] = {100, 158};
    const auto truth = *Labelled::Points68::of(rowWithPoints(points));
    EXPECT_FLOAT_EQ(truth.lipGap(), 0.2f);
    EXPECT_FLOAT_EQ(truth.eyeOpening(Labelled::Side::left), 0.25f);
    EXPECT_FLOAT_EQ(truth.eyeOpening(Labelled::Side::right), 0.0625f);
    EXPECT_NEAR(truth.yaw(), 0, 1e-4);
    const auto extent = truth.extent({80, 100}, {120, 100});
    EXPECT_FLOAT_EQ(extent.chin, 1.8f);
    EXPECT_FLOAT_EQ(extent.left, 1);
    EXPECT_FLOAT_EQ(extent.right, 1);
    points[30].x = 110; // the nose points to the right of the picture
    EXPECT_GT(Labelled::Points68::of(rowWithPoints(points))->yaw(), 10);
    EXPECT_FALSE(Labelled::Points68::of(Labelled::Row("a.jpg", {{"points68", "1 2 3"}})));

    FNImage<float> image(200, 200);
    image.fill(0.9f);
    for (std::int32_t y = 96; y < 104; ++y)
        for (std::int32_t x = 80; x < 86; ++x) image.set({x, y}, 0.1f); // around 83
    EXPECT_NEAR(*truth.irisOffset(image, Labelled::Side::left), 3.0f / 16, 0.05f);
    EXPECT_FALSE(truth.irisOffset(image, Labelled::Side::right));
}

TEST(PortraitTruth, ReadsRangesAndWordsOfTheSets) {
    const auto row = [](const char* column, const char* value) {
        return Labelled::Row("a.jpg", {{column, value}});
    };
    EXPECT_EQ(Labelled::ageOf(row("age", "34")), 34.0);
    EXPECT_EQ(Labelled::ageOf(row("age", "20-29")), 25.0);
    EXPECT_EQ(Labelled::ageOf(row("age", "more than 70")), 76.0);
    EXPECT_FALSE(Labelled::ageOf(row("age", "")));
    EXPECT_EQ(Labelled::ethnicityOf(row("ethnicity", "Southeast Asian")), Labelled::Ethnicity::asian);
    EXPECT_EQ(Labelled::ethnicityOf(row("ethnicity", "Indian")), Labelled::Ethnicity::other);
    const auto light = [](const char* azimuth, const char* elevation) {
        return Labelled::frontalLight(
            Labelled::Row("a.jpg", {{"light_azimuth", azimuth}, {"light_elevation", elevation}}));
    };
    EXPECT_EQ(light("-25", "0"), true);
    EXPECT_EQ(light("-50", "0"), false);
    EXPECT_FALSE(light("35", "40"));
    EXPECT_FALSE(light("0", "90"));
}

TEST(QuadraticTraining, LearnsAProductAndWritesItAsAMachine) {
    constexpr std::size_t n = 600, d = 5;
    std::mt19937 random(1);
    std::normal_distribution<float> normal;
    std::vector<std::vector<float>> x(n, std::vector<float>(d));
    Train::FloatSamples samples;
    std::vector<std::size_t> chosen;
    for (std::size_t i = 0; i < n; ++i) {
        for (float& v : x[i]) v = 5 + 2 * normal(random);
        samples.add(x[i], (x[i][0] - 5) * (x[i][1] - 5) + x[i][2]);
        if (i < 500) chosen.push_back(i);
    }
    const Train::QuadraticRegression regression(samples.features);
    const std::vector<float> targets(samples.targets.begin(), samples.targets.begin() + 500);
    const std::vector<float> solution = regression.solve(chosen, targets, std::vector<float>(500, 1), 1e-3);
    const auto function = regression.reduced(chosen, solution, 2); // a product has two directions
    const Eye::SVMFPDiscriminator machine(Train::machineOf(function, 2, 1, "test"), -1e30);
    for (std::size_t i = 500; i < n; ++i) {
        EXPECT_NEAR(regression.predict(chosen, solution, i), samples.targets[i], 0.5);
        EXPECT_NEAR(function(x[i]), samples.targets[i], 1.5); // its directions are rounded
        double score;
        machine(Img::FeatureVector<float>(FNVector<float>(x[i])), score);
        EXPECT_NEAR(score, 2 * function(x[i]) + 1, 0.1);
    }
}

TEST(PortraitReport, CountsAnswersOfBothKinds) {
    Eval::Question question{"q", 0.5f};
    for (const float score : {0.4f, 0.6f, 0.7f, 0.8f}) question.answers.push_back({score, true});
    for (const float score : {0.2f, 0.3f}) question.answers.push_back({score, false});
    EXPECT_EQ(question.right(true), 0.75);
    EXPECT_EQ(question.right(false), 1);
    EXPECT_EQ(question.balanced(), 0.875);
    EXPECT_EQ(question.bestBalanced(), 1);
    const Eval::Quantity quantity{"age", {-1, 3}};
    EXPECT_EQ(quantity.meanError(), 2);
    EXPECT_EQ(quantity.bias(), 1);
}

} // namespace
