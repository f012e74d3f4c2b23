// The steps from a picture of a drawn person to its B7 vector, as they were when the models were trained.

#include "cmp/b7/preprocessor.h"
#include "cmp/b7/reshape_warp.h"
#include "cmp/b7/score_normalization.h"
#include "cmp/b7/value_histogram.h"
#include "fn/imagefile/image_file.h"
#include "golden/golden_facts.h"

namespace {

using namespace Cmp::B7;

/// Sums of parts, in which each value counts by its place.
void tellSums(GoldenFacts& facts, const std::string& name, const float* values, std::size_t n,
              std::size_t parts) {
    for (std::size_t p = 0; p < parts; ++p) {
        double sum = 0;
        const std::size_t begin = n * p / parts, end = n * (p + 1) / parts;
        for (std::size_t i = begin; i < end; ++i)
            sum += static_cast<double>(values[i]) * static_cast<double>(1 + i % 13);
        facts.number(name + std::to_string(p), sum / static_cast<double>(end - begin));
    }
}

TEST(B7Golden, TurnsAPictureIntoTheVectorThatModelsWereTrainedOn) {
    GoldenFacts facts("b7_vector");
    const FNImageReference picture = Fn::readImage((goldenFolder() / "pictures/open.jpg").string());
    float padding;
    // Of that person, and of nobody: aside and tilted, so that a part is outside.
    const FNPos faces[][4] = {{{164.3f, 229.1f}, {259.8f, 233.9f}, {205, 335}, {213, 231}},
                              {{40.5f, 120}, {150, 90.25f}, {120, 215}, {100, 108}}};
    for (const auto& [left, right, mouth, bridge] : faces) {
        const std::string face = left.x < 100 ? "aside." : "face.";
        const FNImage<float> warped = reshapeWarp(picture.toMonoFloat(), left, right, mouth, bridge, padding);
        facts.number(face + "padding", padding, 1e-6);
        tellSums(facts, face + "warped.", warped.data(), warped.size(), 16);
        const PreProcessor processor;
        const FNImage<float> normalized = processor.normalize(warped);
        tellSums(facts, face + "normalized.", normalized.data(), normalized.size(), 16);
        const FNVector<float> vector = processor(warped);
        ASSERT_EQ(vector.size(), 20604u);
        tellSums(facts, face + "vector.", vector.begin(), vector.size(), 200);
    }
    const std::vector<FNPos> points = PreProcessor::gridPoints();
    double x = 0, y = 0;
    for (std::size_t i = 0; i < points.size(); ++i) {
        x += static_cast<double>(points[i].x) * static_cast<double>(1 + i % 7);
        y += static_cast<double>(points[i].y) * static_cast<double>(1 + i % 7);
    }
    facts.number("points.x", x, 1e-9);
    facts.number("points.y", y, 1e-9);
}

TEST(B7Golden, ApproximatesDensitiesByChordsOfTheExponentialFunction) {
    // With a deviation that makes the density the exponential function itself.
    const auto density = [](double exponent) {
        constexpr float deviation = 0.39894228f;
        const auto x = static_cast<float>(std::sqrt(-2 * exponent)) * deviation;
        return static_cast<double>(EM::linearApproxOfGaussDensity(x, 0.0f, deviation));
    };
    const double ends[] = {-0.1, -0.5, -1, -2, -3, -4, -6, -8, -10, -12, -14, -16, -18, -20};
    EXPECT_NEAR(density(-0.04), 0.96, 1e-4) << "a tangent";
    for (std::size_t i = 0; i + 1 < std::size(ends); ++i) {
        const double middle = (ends[i] + ends[i + 1]) / 2, half = (ends[i] - ends[i + 1]) / 2;
        EXPECT_NEAR(density(middle) / std::exp(middle), std::cosh(half), 2e-3) << middle;
        for (const double end : {ends[i] - 0.001 * half, ends[i + 1] + 0.001 * half})
            EXPECT_NEAR(density(end) / std::exp(end), 1, 4e-3) << end;
    }
    EXPECT_NEAR(density(-21) / std::exp(-21), 1, 1e-3) << "exactly";
}

TEST(B7Golden, NormalizesTheScoresOfSearchesAsItDid) {
    GoldenFacts facts("b7_normalization");
    // Scores of others about a mean, and of the person that is looked for above them, if there are any.
    const auto tell = [&](const std::string& name, double mean, double deviation, double others, double own) {
        Cmp::ScoreHistogram histogram(rawScoreBins);
        for (unsigned int i = 0; i < rawScoreBins; ++i) {
            const double score = rawScoreMin + (i + 0.5) * static_cast<double>(rawScoreBinWidth);
            const double a = (score - mean) / deviation, b = (score - mean - 8 * deviation) / deviation;
            histogram.getExclusive()[i] =
                static_cast<unsigned int>(others * std::exp(-a * a / 2) + own * std::exp(-b * b / 2));
        }
        Cmp::RawMatches matches;
        for (const float score : {-100.0f, 0.0f, 40.0f, 250.0f})
            matches.emplace(score, std::to_string(score));
        for (const Cmp::RawMatch& match : normalizeRawScores(matches, histogram))
            facts.number(name + "." + match.id, 1000 * static_cast<double>(match.score), 1e-3);
    };
    tell("usual", 0, 5, 20000, 300);
    tell("few", 0, 5, 200, 1);
    tell("strangers", 3, 4, 20000, 0);
    tell("wide", -20, 20, 5000, 500);
    tell("high", 30, 6, 9000, 2000);
    tell("alike", 10, 1, 100000, 3);
    tell("nobody", 0, 5, 0, 0);
}

} // namespace
