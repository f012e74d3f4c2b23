#include "cmp/b7/preprocessor.h"
#include "cmp/b7/reshape_warp.h"
#include "cmp/b7/transformation.h"

#include "support/each_target.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <random>

namespace {

using namespace Cmp::B7;

struct Landmarks {
    FNPos leftEye, rightEye, mouth, bridge;
};

FNImage<float> warp(const FNImage<float>& image, const Landmarks& at, float& padding) {
    return reshapeWarp(image, at.leftEye, at.rightEye, at.mouth, at.bridge, padding);
}

/// Each pixel is its position along an axis.
FNImage<float> ramp(std::uint32_t w, std::uint32_t h, bool vertical) {
    FNImage<float> image(w, h);
    float* out = image.getExclusive();
    for (std::uint32_t y = 0; y < h; ++y)
        for (std::uint32_t x = 0; x < w; ++x) *out++ = static_cast<float>(vertical ? y : x) + 0.5f;
    return image;
}

TEST(ReshapeWarp, PutsEyesAndMouthWhereTheyBelong) {
    const Landmarks faces[] = {
        {{268, 250}, {332, 250}, {300, 311}, {300, 250}},  // straight, at the scale of the result
        {{250, 240}, {330, 262}, {275, 330}, {295, 255}},  // tilted
        {{268, 250}, {332, 250}, {285, 330}, {270, 252}},  // turned to one side
        {{268, 250}, {332, 250}, {302, 330}, {303, 200}}}; // the bridge far up
    for (const Landmarks& face : faces)
        for (const bool vertical : {false, true}) {
            float padding;
            const FNImage<float> warped = warp(ramp(600, 600, vertical), face, padding);
            // Between two pixels of the result, of two rows around a fractional one.
            const auto at = [&](std::uint32_t x, float y) {
                const auto row = static_cast<std::uint32_t>(y - 0.5f);
                const float t = y - 0.5f - static_cast<float>(row);
                const auto border = [&](std::uint32_t r) { return (warped(x - 1, r) + warped(x, r)) / 2; };
                return (1 - t) * border(row) + t * border(row + 1);
            };
            const auto along = [&](FNPos p) { return vertical ? p.y : p.x; };
            EXPECT_NEAR(at(48, 58.667f), along(face.leftEye), 0.6);
            EXPECT_NEAR(at(112, 58.667f), along(face.rightEye), 0.6);
            EXPECT_NEAR(at(80, 120), along(face.mouth), 0.6);
        }
}

TEST(ReshapeWarp, AveragesTheImageAlongTheArcsOfAHalfEllipse) {
    // A smooth picture, of which each value can be computed anywhere.
    const auto picture = [](double x, double y) {
        return 0.5 + 0.2 * std::sin(x / 9) + 0.2 * std::cos((y - 0.3 * x) / 11);
    };
    FNImage<float> image(640, 520);
    for (std::uint32_t y = 0; y < image.h(); ++y)
        for (std::uint32_t x = 0; x < image.w(); ++x)
            image.getExclusive()[y * image.w() + x] = static_cast<float>(picture(x + 0.5, y + 0.5));
    const Landmarks faces[] = {{{268, 250}, {332, 250}, {300, 311}, {300, 250}},
                               {{270, 230}, {352, 256}, {300, 340}, {306, 247}},
                               {{280, 260}, {330, 244}, {320, 300}, {312, 250}}};
    for (const Landmarks& face : faces) {
        float padding;
        const FNImage<float> warped = warp(image, face, padding);
        // The strip in which both axes are those of the face: (0, 0) is its corner, (1, 0) is a column on.
        const double dx = face.rightEye.x - face.leftEye.x, dy = face.rightEye.y - face.leftEye.y;
        const double D = std::hypot(dx, dy), columns = std::max(800.0, std::trunc(12.5 * D + 0.5));
        const double h = ((face.mouth.y - face.leftEye.y) * dx - (face.mouth.x - face.leftEye.x) * dy) / D;
        const double ux = 12.5 * dx / columns, uy = 12.5 * dy / columns;
        const double k = h / D / 0.38333374 / 160, vx = -k * dy, vy = k * dx;
        const double ox = (face.leftEye.x + face.rightEye.x) / 2 - 0.5 * columns * ux - 0.36666626 * 160 * vx;
        const double oy = (face.leftEye.y + face.rightEye.y) / 2 - 0.5 * columns * uy - 0.36666626 * 160 * vy;
        const auto inStrip = [&](FNPos p) {
            const double x = p.x - ox, y = p.y - oy, det = ux * vy - uy * vx;
            return FN2Vector<double>((x * vy - y * vx) / det, (ux * y - uy * x) / det);
        };
        constexpr double eyeRow = 58.666603;
        const double x1 = inStrip(face.leftEye).x, x2 = inStrip(face.rightEye).x, middle = (x1 + x2) / 2;
        const auto mouth = inStrip(face.mouth), bridge = inStrip(face.bridge);
        const double bx = middle + 0.3 * (bridge.x - middle), by = eyeRow + 0.3 * (bridge.y - eyeRow);
        const double c = bx + (eyeRow - by) * (mouth.x - bx) / (mouth.y - by);
        const double p = (x1 + x2 - 2 * c) / 2 / -0.083484888, q = (x2 - x1) / 0.8;
        double difference = 0;
        for (std::uint32_t y = 0; y < 160; ++y) {
            const double t = (y - eyeRow) / (mouth.y - eyeRow), row = (1 - t) * c + t * mouth.x - p;
            const auto f = [&](double u) { return std::sqrt(1 - u * u) * p + u * q + row; };
            for (std::uint32_t x = 0; x < 160; ++x) {
                const double a = f((x - 80.0) / 80), b = f((x - 79.0) / 80);
                double expected = 0;
                constexpr int samples = 8;
                for (int i = 0; b >= a && i < samples; ++i) {
                    const double s = a + (b - a) * (i + 0.5) / samples, r = y + 0.5;
                    expected += picture(ox + s * ux + r * vx, oy + s * uy + r * vy) / samples;
                }
                // Narrow intervals take one whole pixel of the strip.
                ASSERT_NEAR(warped(x, y), expected, 0.06) << x << " " << y;
                difference += std::abs(double{warped(x, y)} - expected);
            }
        }
        EXPECT_LT(difference / 25600, 0.008);
    }
}

TEST(ReshapeWarp, CountsWhatLiesOutsideOfTheImageAsPadding) {
    FNImage<float> white(600, 600);
    white.fill(1);
    const FNPos down(0, 61.3333f), right(64, 0);
    const auto faceAt = [&](FNPos eye) {
        return Landmarks{eye, eye + right, eye + right * 0.5f + down, eye + right * 0.5f};
    };
    float padding;
    for (const FNPos eye : {FNPos{268, 250}, {30, 250}, {268, 20}, {560, 580}, {-5000, 5000}}) {
        const FNImage<float> warped = warp(white, faceAt(eye), padding);
        double covered = 0; // the resampling may fill one more line along a border
        for (std::uint32_t i = 0; i < warped.size(); ++i) covered += double{warped.data()[i]};
        EXPECT_NEAR(padding, 1 - covered / 25600, 1.01 / 160) << eye.x << " " << eye.y;
        EXPECT_EQ(padding > 0.01, eye.x != 268 || eye.y != 250);
    }
}

TEST(ReshapeWarp, KeepsTheCentreLineBetweenTheEyes) {
    float padding;
    const FNImage<float> image = ramp(600, 600, false);
    for (const float bridge : {-1e6f, 0.0f, 900.0f, 1e6f}) {
        const FNImage<float> warped =
            warp(image, {{268, 250}, {332, 250}, {300, 311}, {bridge, 250}}, padding);
        // The arc turns back on the far side, where nothing of the face can be seen.
        const bool left = bridge < 300;
        EXPECT_NEAR(warped(left ? 112 : 47, 58), left ? 332 : 268, 6) << bridge;
        EXPECT_EQ(warped(left ? 0 : 159, 58), 0) << bridge;
    }
}

TEST(ReshapeWarp, RefusesWhatIsNoFace) {
    FNImage<float> image(100, 100);
    image.fill(0);
    float padding;
    const auto thrown = [&](const Landmarks& face) { return thrownBy([&] { warp(image, face, padding); }); };
    const std::string mouth = "FNEBadArg: Vertically, the mouth center must be below the eyes!";
    EXPECT_EQ(thrown({{60, 40}, {30, 40}, {45, 70}, {45, 40}}), mouth) << "eyes swapped";
    EXPECT_EQ(thrown({{30, 40}, {60, 40}, {45, 40}, {45, 40}}), mouth);
    const std::string noFace = "FNEBadArg: The positions of eyes and mouth are not those of a face";
    EXPECT_EQ(thrown({{30, 40}, {30, 40}, {45, 70}, {45, 40}}), noFace);
    EXPECT_EQ(thrown({{30, 40}, {1e9f, 40}, {45, 1e9f}, {45, 40}}), noFace);
    EXPECT_EQ(thrown({{30, 40}, {60, 40}, {NAN, 70}, {45, 40}}), noFace);
}

/// Noise, or one value, or a dark and a bright half.
FNImage<float> testFace(const std::string& kind) {
    std::mt19937 random(7);
    FNImage<float> image(warpedSize, warpedSize);
    float* const pixels = image.getExclusive();
    for (std::uint32_t i = 0; i < image.size(); ++i)
        pixels[i] = kind == "noise"    ? static_cast<float>(random() % 256) / 255
                    : kind == "halves" ? static_cast<float>(i % warpedSize < 77)
                                       : 0.25f;
    return image;
}

class B7PreProcessor : public testing::Test {
protected:
    static const PreProcessor& processor() {
        static const PreProcessor instance;
        return instance;
    }
};

TEST_F(B7PreProcessor, RanksTheSameOnAllVectorUnits) {
    ASSERT_EQ(PreProcessor::computeFeatureVectorSize(), 20604u);
    for (const std::string kind : {"noise", "flat", "halves"}) {
        const auto responses = processor().bank().respond(processor().normalize(testFace(kind)));
        const FNVector<float> plain = processor().extractPlain(responses);
        forEachTarget([&] { EXPECT_EQ(processor().extract(responses), plain) << kind; });
    }
}

TEST_F(B7PreProcessor, FiltersAsFullTransformsDo) {
    const FNImage<float> face = processor().normalize(testFace("noise"));
    const auto fast = processor().bank().respond(face), plain = processor().bank().respondPlain(face);
    for (std::size_t s = 0; s < PreProcessor::NUM_SHAPED_GRIDS; ++s)
        for (std::size_t o = 0; o < PreProcessor::orientations; ++o) {
            const FNImage<float>&a = fast.filter(s, o), &b = plain.filter(s, o);
            ASSERT_EQ(a.size(), b.size());
            const float greatest = *std::max_element(b.data(), b.data() + b.size());
            for (std::size_t i = 0; i < a.size(); ++i)
                ASSERT_NEAR(a.data()[i], b.data()[i], 1e-5f * greatest) << s << " " << o;
        }
}

TEST_F(B7PreProcessor, GivesRanksThatDoNotDependOnBrightnessAndContrast) {
    const FNImage<float> face = testFace("noise");
    FNImage<float> dim(face.w(), face.h());
    for (std::size_t i = 0; i < face.size(); ++i) dim.getExclusive()[i] = face.data()[i] * 0.5f;
    const FNVector<float> a = processor()(face), b = processor()(dim);
    // Differences near the additive noise are lost in the dim image.
    EXPECT_GT(a * b / std::sqrt((a * a) * (b * b)), 0.97f);
    for (const float rank : a) {
        ASSERT_LE(rank, PreProcessor::rankTable[0]);
        ASSERT_GE(rank, 0);
    }
    // Without any difference, no neighbour is greater: the first rank, or one between it and the next.
    for (const float rank : processor()(testFace("flat"))) ASSERT_GT(rank, PreProcessor::rankTable[5]);
    EXPECT_EQ(thrownBy([&] { processor()(FNImage<float>(80, 80)); }),
              "FNEBadArg: ImgFFT<float,MKL>::transformReal: invalid image sizes");
}

using Weights = Fn::Matrix<signed char>;

template <class Next> Weights weights(std::size_t rows, std::size_t cols, Next next) {
    Weights m(rows, cols);
    std::generate_n(m.getExclusive(), m.size(), next);
    return m;
}

TEST(MultiplyDigitized, SumsExactlyOnAllVectorUnits) {
    std::mt19937 random(3);
    const auto noise = [&] { return static_cast<signed char>(random()); };
    struct Case {
        std::size_t rows;
        std::function<signed char()> weight;
        std::function<short()> digit;
    };
    // Sums beyond 32 bits keep the lower ones.
    const Case cases[] = {
        {1, noise, [&] { return static_cast<short>(random()); }},
        {77, noise, [&] { return static_cast<short>(random()); }},
        {20604, noise, [&] { return static_cast<short>(random()); }},
        {20608, [] { return static_cast<signed char>(-128); }, [] { return short{-32768}; }},
        {20608, [] { return static_cast<signed char>(127); }, [] { return short{-32767}; }}};
    for (const Case& c : cases) {
        const Weights m = weights(c.rows, 7, c.weight);
        FNVector<short> v(c.rows);
        std::generate_n(v.getExclusive(), v.size(), c.digit);
        const Cmp::FPMatVecMultiplier multiplier;
        FNVector<int> sums(7);
        for (std::size_t col = 0; col < 7; ++col) {
            std::int64_t sum = 0;
            for (std::size_t row = 0; row < c.rows; ++row) sum += int{m(row, col)} * int{v[row]};
            sums[col] = static_cast<int>(sum);
        }
        forEachTarget([&] {
            EXPECT_EQ(multiplier.leftMultiply(v, m), sums) << c.rows;
            EXPECT_EQ(multiplier.leftMultiplyPlain(v, m), sums) << c.rows;
        });
    }
}

TEST(MultiplyDigitized, DigitizesBetweenTheLeastAndTheGreatestElement) {
    const Cmp::DigitizedVector d(FNVector<float>(std::vector{-32766.0f, 1.5f, 0.5f, 1.25f, 32768.0f}), 6);
    EXPECT_EQ(std::vector<short>(d.digits.begin(), d.digits.end()),
              (std::vector<short>{-32767, 1, -1, 0, 32767, 0}));
    EXPECT_EQ(d.offset, 1);

    const Weights m = weights(4, 1, [i = 0]() mutable { return static_cast<signed char>(10 * ++i); });
    const FNVector<float> base(1, 6 * 0.5f); // of the first three weights 10, 20, 30 with factor 0.05
    const auto product = [&](std::vector<float> v) {
        return Cmp::multiplyDigitized(FNVector<float>(v), m, 0.05f, base)[0];
    };
    EXPECT_NEAR(product({1, -2, 0.5f}), 0.05f * (10 - 40 + 15), 1e-3);
    EXPECT_NEAR(product({7, 7, 7}), 7 * 3, 1e-6) << "a constant vector";
    EXPECT_EQ(thrownBy([&] { product({1, 2, 3, 4, 5}); }), "FNEBadArg: Invalid Size for digitized vector");
}

/// Of 21 raw components and 5 of a feature.
Transformation smallTransformation(unsigned int seed) {
    std::mt19937 random(seed);
    const auto vector = [&](std::size_t n) {
        FNVector<float> v(n);
        std::generate_n(v.getExclusive(), n, [&] { return static_cast<float>(random() % 100) / 50 - 1; });
        return v;
    };
    const auto matrix = weights(21, 5, [&] { return static_cast<signed char>(random()); });
    const FNVector<float> average = vector(21), translation = vector(5), base = vector(5);
    return {0.25f, matrix, average, translation, base};
}

TEST(B7Transformation, StaysWhenItsFileChanges) {
    const ScratchFolder folder;
    const std::string path = folder.file("trans"), other = folder.file("other");
    smallTransformation(3).write(path);
    smallTransformation(4).write(other);
    const std::string content = folder.read("trans");
    const FNVector<float> raw(21, 0.5f);
    const FNVector<float> expected = smallTransformation(3)(raw);
    ASSERT_NE(smallTransformation(4)(raw), expected);

    const auto overwrite = [&] { // as cp does
        std::filesystem::copy_file(other, path, std::filesystem::copy_options::overwrite_existing);
    };
    const std::pair<const char*, std::function<void()>> changes[] = {
        {"overwritten", overwrite},
        {"cut", [&] { std::filesystem::resize_file(path, 0); }},
        {"cut in the middle", [&] { std::filesystem::resize_file(path, 100); }},
        {"zeroed", [&] { folder.write("trans", std::string(content.size(), '\0')); }},
        {"removed", [&] { std::filesystem::remove(path); }},
    };
    for (const auto& [name, change] : changes) {
        folder.write("trans", content);
        const Transformation read = Transformation::read(path, 21, 5);
        change();
        EXPECT_EQ(read(raw), expected) << name;
    }
    folder.write("trans", content + std::string(1 << 20, 'x'));
    EXPECT_EQ(Transformation::read(path, 21, 5)(raw), expected) << "what follows it does not matter";
}

TEST(B7Transformation, ComesBackFromItsFile) {
    const ScratchFolder folder;
    const std::string path = folder.file("trans");
    smallTransformation(3).write(path);
    const Transformation read = Transformation::read(path, 21, 5);
    EXPECT_EQ(read(read.average), read.translation) << "nothing is left of the average";
    const std::string content = folder.read("trans");
    read.write(path);
    EXPECT_EQ(folder.read("trans"), content) << "over the file that holds the matrix";
    EXPECT_EQ(read(read.average), read.translation);

    const auto thrown = [&](const std::string& file, std::size_t rows, std::size_t cols) {
        return thrownBy([&] { Transformation::read(file, rows, cols); });
    };
    const std::string invalid = "FNEIOError: CmpAlgorithm: invalid ";
    EXPECT_EQ(thrown(folder.file("none"), 21, 5), "FNEIOError: CmpAlgorithm: File '" + folder.file("none") +
                                                      "' could not be opened for reading.");
    std::filesystem::create_directory(folder.file("taken"));
    EXPECT_EQ(thrownBy([&] { read.write(folder.file("taken")); }),
              "FNEIOError: Cannot write the transformation '" + folder.file("taken") + "'");
    EXPECT_FALSE(std::filesystem::exists(folder.file("taken.part")));
    EXPECT_EQ(thrown("/dev/zero", 21, 5),
              "FNEIOError: CmpAlgorithm: File '/dev/zero' could not be opened for reading.");
    EXPECT_EQ(thrown(path, 22, 5), invalid + "matrix package reading file '" + path + "'");
    EXPECT_EQ(thrown(path, 21, 6), "FNEIOError: PCLD: incompatible number of vector components.  Matrix cols "
                                   "= 5 EncodedFeature components = 6\n");
    const struct {
        std::size_t size;
        const char* text;
    } cuts[] = {{0, "float factor package reading file '"},
                {40, "matrix package reading file '"},
                {content.size() - 150, "average vector package "},
                {content.size() - 50, "translation vector package "},
                {content.size() - 1, "transformed gabor base vector package "}};
    for (const auto& cut : cuts) {
        const std::string file = folder.write("cut", content.substr(0, cut.size));
        EXPECT_THAT(thrown(file, 21, 5), testing::StartsWith(invalid + cut.text + file));
    }
}

} // namespace
