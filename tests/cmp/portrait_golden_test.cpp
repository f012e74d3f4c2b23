// Steps of the portrait measures on many small scenes that are drawn by chance: each gives the answer that it
// gave.

#include "cmp/portrait/background_uniformity.h"
#include "cmp/portrait/pixel_measures.h"
#include "cmp/portrait/sharpness.h"
#include "golden/golden_facts.h"

#include <random>

namespace {

using namespace Cmp::Portrait;
using Fn::Bgra32;
using Steps = BackgroundUniformity;

/// Rectangles before a ground, one of them masked as a head would be.
struct Scene {
    static constexpr std::int32_t width = 48, height = 40;

    FNImage<Bgra32> image{width, height};
    Steps::Labels labels{height, width};
    int regions = 1;

    explicit Scene(unsigned int seed) : random_(seed) {
        const int level = upTo(120) + 60, slopeX = upTo(5) - 2, slopeY = upTo(3) - 1;
        const int noise = upTo(30), stripes = upTo(3) == 0 ? 2 + upTo(9) : 0, tint = upTo(60);
        std::fill_n(labels.getExclusive(), labels.size(), 0);
        draw({0, 0, width, height}, 0, [&](int x, int y) {
            const int stripe = stripes && x / stripes % 2 ? 10 : 0;
            const int gray = level + slopeX * x / 2 + slopeY * y + stripe + (noise ? upTo(noise) : 0);
            return colour(gray + (upTo(2) ? tint : 0), gray, gray - tint / 2);
        });
        for (int n = upTo(7); n > 0; --n) {
            const int x = upTo(width - 1), y = upTo(height - 1), w = 1 + upTo(9), h = 1 + upTo(9);
            const int gray = level + upTo(80) - 40, label = regions++;
            draw({x, y, x + w, y + h}, label, [&](int, int) { return colour(gray, gray, gray + upTo(4)); });
        }
        const int left = 14 + upTo(6), top = 10 + upTo(8);
        draw({left, top, left + 12 + upTo(8), height - upTo(2)}, Steps::masked,
             [&](int, int) { return colour(200, 150, 120); });
    }

    /// The pixels of each label.
    std::vector<Steps::Region> regionsOf() const {
        std::vector<Steps::Region> result(static_cast<std::size_t>(regions));
        for (FNGridPos pos; pos.y < height; ++pos.y)
            for (pos.x = 0; pos.x < width; ++pos.x)
                if (const int label = labelAt(pos); label != Steps::masked)
                    result[static_cast<std::size_t>(label)].push_back(pos);
        return result;
    }
    int labelAt(FNGridPos pos) const {
        return labels(static_cast<std::size_t>(pos.y), static_cast<std::size_t>(pos.x));
    }

private:
    int upTo(int n) { return static_cast<int>(random_() % static_cast<unsigned int>(n)); }

    static Bgra32 colour(int r, int g, int b) {
        const auto byte = [](int v) { return static_cast<unsigned char>(std::clamp(v, 0, 255)); };
        return {byte(r), byte(g), byte(b)};
    }
    template <class Colour> void draw(FNBox box, int label, Colour colourOf) {
        Bgra32* const pixels = image.getExclusive();
        int* const out = labels.getExclusive();
        for (std::int32_t y = box.y0; y < std::min(box.y1, height); ++y)
            for (std::int32_t x = box.x0; x < std::min(box.x1, width); ++x) {
                pixels[y * width + x] = colourOf(x, y);
                labels.access(out, static_cast<std::size_t>(y), static_cast<std::size_t>(x)) = label;
            }
    }

    std::mt19937 random_;
};

constexpr unsigned int scenes = 600;

/// The answers of all scenes in lines of 100.
template <class Answer> void tellAnswers(GoldenFacts& facts, const std::string& name, Answer answer) {
    std::string line;
    for (unsigned int seed = 0; seed < scenes; ++seed) {
        line += answer(Scene(seed)) ? '1' : '0';
        if (line.size() < 100) continue;
        facts.text(name + "." + std::to_string(seed / 100), line);
        line.clear();
    }
}

TEST(PortraitGolden, JudgesBackgroundsAsItDid) {
    GoldenFacts facts("backgrounds");
    tellAnswers(facts, "even", [](const Scene& scene) {
        return Steps::newRegionGradient(scene.image, scene.regionsOf().front(), scene.labels);
    });
    tellAnswers(facts, "islands", [](const Scene& scene) {
        return Steps::thereAreIsolatedRegionsInsideBackground(scene.labels, 0);
    });
    tellAnswers(facts, "shoulders", [](const Scene& scene) {
        return Steps::thereAreObjectsTouchingShoulders(scene.labels, scene.regionsOf(), 0, Steps::masked);
    });
    tellAnswers(facts, "shoulders of a head that shows", [](const Scene& scene) {
        return Steps::thereAreObjectsTouchingShoulders(scene.labels, scene.regionsOf(), 0, scene.regions - 1);
    });
    tellAnswers(facts, "connected", [](const Scene& scene) {
        return Steps::regionsAreConnected(scene.labels, scene.regionsOf(), 0, scene.regions / 2,
                                          scene.regions - 1);
    });
    tellAnswers(facts, "all", [](const Scene& scene) {
        return backgroundUniformity(scene.image, {19, 16}, {29, 17}) != 0;
    });
    std::string merged;
    for (unsigned int seed = 0; seed < scenes; ++seed) {
        const Scene scene(seed);
        Steps::Labels labels = scene.labels;
        std::size_t pixels = 0;
        for (const auto& region : Steps::mergeRegionsToBackground(scene.image, labels, 0))
            pixels = 7 * pixels + region.size();
        merged += std::to_string(pixels % 10);
    }
    facts.text("merged", merged);
}

TEST(PortraitGolden, SegmentsScenesAsItDid) {
    GoldenFacts facts("segments");
    for (unsigned int seed = 0; seed < 40; ++seed) {
        const Scene scene(seed);
        FNImage<unsigned char> mask(Scene::width, Scene::height);
        for (std::uint32_t i = 0; i < mask.size(); ++i)
            mask.getExclusive()[i] =
                scene.labelAt({static_cast<std::int32_t>(i) % Scene::width,
                               static_cast<std::int32_t>(i) / Scene::width}) == Steps::masked;
        const Steps::Labels labels = Steps::segment(scene.image, mask, 7);
        double sum = 0, greatest = 0;
        for (std::size_t y = 0; y < labels.rows(); ++y)
            for (std::size_t x = 0; x < labels.cols(); ++x) {
                const double label = labels(y, x);
                sum += label * static_cast<double>(1 + (x + 5 * y) % 11);
                greatest = std::max(greatest, label);
            }
        facts.number(std::to_string(seed), sum, 1e-9);
        facts.number(std::to_string(seed) + ".regions", greatest, 1e-9);
    }
}

TEST(PortraitGolden, RanksSharpnessByATableThatAscends) {
    GoldenFacts facts("sharpness");
    float before = 0;
    for (int i = 0; i < 120; ++i) {
        double sum = 0;
        for (int j = 0; j < 100; ++j) {
            const float share = SharpnessMeter::shareBelow(static_cast<float>(i * 100 + j) * 2e-7f);
            EXPECT_GE(share, before);
            before = share;
            sum += static_cast<double>(share);
        }
        facts.number(std::to_string(i), sum, 1e-6);
    }
}

} // namespace
