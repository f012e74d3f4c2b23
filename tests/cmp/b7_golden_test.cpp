// The steps from a picture of a drawn person to its B7 vector, as they were when the models were trained.

#include "cmp/b7/preprocessor.h"
#include "cmp/b7/reshape_warp.h"
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

} // namespace
