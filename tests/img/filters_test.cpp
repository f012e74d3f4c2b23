#include "img/contrast.h"
#include "img/fft/frequency_grid.h"
#include "img/local_filters.h"
#include "img/support_norm.h"
#include "img/whitening_filter.h"

#include "random_images.h"
#include "support/each_target.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <numbers>
#include <numeric>

namespace {

TEST(FrequencyGrid, NamesTheFrequencyOfEachIndex) {
    const ImgFSConv grid(8, 5);
    const struct { int x, y, sx, sy; } cases[] = {{0, 0, 0, 0}, {4, 2, 4, 2}, {5, 3, -3, -2}, {7, 4, -1, -1}};
    for (const auto& c : cases) {
        int sx, sy;
        double r, phi, p;
        grid.spatial(c.x, c.y, sx, sy);
        EXPECT_EQ(sx, c.sx);
        EXPECT_EQ(sy, c.sy);
        grid.frequency(c.x, c.y, r, phi);
        EXPECT_NEAR(r * std::cos(phi), c.sx / 8.0, 1e-12);
        EXPECT_NEAR(r * std::sin(phi), c.sy / 5.0, 1e-12);
        grid.period(c.x, c.y, p, phi);
        EXPECT_DOUBLE_EQ(p, 1 / r);
    }
}

/// One wave with sx by sy periods on a mean.
double wave(std::uint32_t x, std::uint32_t y, std::uint32_t w, std::uint32_t h, int sx, int sy) {
    return std::cos(2 * std::numbers::pi * (double(sx) * x / w + double(sy) * y / h));
}
double gain(double r, double cutoff) {
    return r * std::exp(-std::pow(r / cutoff, 4));
}

TEST(WhiteningFilter, WeighsWavesByTheirFrequency) {
    constexpr float cutoff = 0.3f;
    constexpr int w = 48, h = 40;
    const ImgWhiteningFilter filter(w, h, cutoff);
    for (const auto& [sx, sy] : {std::pair(0, 0), {1, 0}, {0, 7}, {5, -4}, {20, 3}}) {
        FNImage<float> image(w, h);
        for (FNImIter<float> it(image, image.box()); !it.atEnd(); ++it)
            *it = 0.5f + static_cast<float>(0.25 * wave(it.x(), it.y(), w, h, sx, sy));
        const FNImage<float> result = filter(image);
        const double amplitude = 0.25 * w * h * gain(std::hypot(sx / double(w), sy / double(h)), cutoff);
        for (std::uint32_t y = 0; y < h; ++y)
            for (std::uint32_t x = 0; x < w; ++x)
                ASSERT_NEAR(result(x, y), amplitude * wave(x, y, w, h, sx, sy), 2e-3) << sx << " " << sy;
    }
    RandomImages random(1);
    const FNImage<unsigned char> bytes = random.image<unsigned char>(w, h);
    FNImage<float> reals(w, h);
    for (std::uint64_t i = 0; i < bytes.size(); ++i)
        reals.getExclusive()[i] = (static_cast<float>(bytes.data()[i]) + 0.5f) / 256;
    EXPECT_EQ(filter(bytes), filter(reals));
    EXPECT_THROW(filter(FNImage<float>(h, w)), FNEBadArg);
}

TEST(WhiteningFilter, InIntegersDoesTheSame) {
    constexpr double cutoff = 0.390625, peak = cutoff / std::numbers::sqrt2 * 0.77880078307;
    for (const auto& [w, h] : {std::pair(16, 16), {64, 64}, {80, 64}, {80, 96}, {108, 108}, {160, 160}}) {
        SCOPED_TRACE(testing::Message() << w << "x" << h);
        const Img::IntWhiteningFilter filter(w, h);
        const ImgFFTInt fft(static_cast<unsigned>(w), static_cast<unsigned>(h));
        const int sx = w / 8, sy = -h / 5;
        const double weight =
            std::round(127 * gain(std::hypot(sx / double(w), sy / double(h)), cutoff) / peak);
        const double factor = 65536.0 / 64 * weight * fft.constantFactor();
        const double amplitude = std::min(15000.0, 30000 / factor);
        FNImage<short> image(static_cast<std::uint32_t>(w), static_cast<std::uint32_t>(h));
        for (FNImIter<short> it(image, image.box()); !it.atEnd(); ++it)
            *it = static_cast<short>(
                std::lround(3000 + amplitude * wave(it.x(), it.y(), image.w(), image.h(), sx, sy)));
        const FNImage<short> result = filter(image);
        // The rounding of the pixels is noise of a third of a unit, which the filter enlarges.
        const double tolerance = 1.5 * factor * 127 / weight / 3 + 4;
        for (std::uint32_t y = 0; y < image.h(); ++y)
            for (std::uint32_t x = 0; x < image.w(); ++x)
                ASSERT_NEAR(result(x, y), amplitude * factor * wave(x, y, image.w(), image.h(), sx, sy),
                            tolerance);
    }
    testing::internal::CaptureStderr();
    const Img::IntWhiteningFilter unknown(32, 32);
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              " WhiteningFilterClass wrong dimensions ! Please generate !\n");
    EXPECT_THROW(unknown(FNImage<short>(32, 32)), FNEBadArg);
}

TEST(Contrast, NormalizesToLength1) {
    FNImage<float> image(2, 1);
    image.set({0, 0}, 3);
    image.set({1, 0}, -4);
    EXPECT_FLOAT_EQ(Img::normalizeContrast(image)(0, 0), 0.6f);
    EXPECT_FLOAT_EQ(Img::normalizeContrast(image)(1, 0), -0.8f);
    image.fill(0);
    EXPECT_EQ(Img::normalizeContrast(image), image);
    FNImage<FNComplex<float>> complex(1, 1);
    complex.fill({2, 3});
    EXPECT_EQ(Img::realPart(complex)(0, 0), 2);
}

/// Applies `of` to the 9 values around each inner pixel of the box.
template <class R, class T, class Of> FNImage<R> around(const FNImage<T>& image, const FNBox& box, Of of) {
    const FNBox part = box & FNBox{1, 1, image.box().x1 - 1, image.box().y1 - 1};
    FNImage<R> result(part.width(), part.height());
    for (std::int32_t y = part.y0; y < part.y1; ++y)
        for (std::int32_t x = part.x0; x < part.x1; ++x) {
            std::vector<T> values;
            for (int j = -1; j <= 1; ++j)
                for (int i = -1; i <= 1; ++i) values.push_back(image.get({x + i, y + j}));
            result.set({x - part.x0, y - part.y0}, of(values));
        }
    return result;
}

template <class T> void checkNeighbourhoods() {
    RandomImages random(2);
    const FNImage<T> image = random.image<T>(17, 13);
    for (const FNBox& box : {image.box(), FNBox{3, 2, 9, 40}, FNBox{-5, 0, 2, 2}, FNBox{20, 0, 30, 5}}) {
        EXPECT_EQ(imgMedian3x3(image, box), around<T>(image, box, [](std::vector<T> values) {
                      std::sort(values.begin(), values.end());
                      return values[4];
                  }));
        if constexpr (std::is_same_v<T, short> || std::is_same_v<T, int>)
            continue;
        else
            EXPECT_EQ(imgCensusTransform3x3(image, box),
                      around<unsigned char>(image, box, [](const std::vector<T>& values) {
                          int code = 0;
                          for (int bit = 7; const int i : {0, 1, 2, 3, 5, 6, 7, 8})
                              code += (values[4] > values[static_cast<std::size_t>(i)]) << bit--;
                          return static_cast<unsigned char>(code);
                      }));
    }
    EXPECT_TRUE(imgMedian3x3(random.image<T>(2, 5), {0, 0, 2, 5}).empty());
}

TEST(LocalFilters, MedianAndCensusLookAtTheNeighbours) {
    checkNeighbourhoods<float>();
    checkNeighbourhoods<unsigned char>();
    checkNeighbourhoods<unsigned short>();
    checkNeighbourhoods<short>();
    checkNeighbourhoods<int>();
}

template <class T> void checkMeans() {
    RandomImages random(3);
    const FNImage<T> image = random.image<T>(15, 11);
    for (const FNBox& box : {image.box(), FNBox{4, 3, 12, 30}})
        for (const auto& [w, h] : {std::pair(1, 1), {2, 3}, {5, 4}, {100, 100}}) {
            const FNImage<T> means = imgMean(image, w, h, box);
            const FNBox part = box & image.box();
            for (std::int32_t y = part.y0; y < part.y1; ++y)
                for (std::int32_t x = part.x0; x < part.x1; ++x) {
                    const FNBox window = part & FNBox{x - w / 2, y - h / 2, x - w / 2 + w, y - h / 2 + h};
                    double sum = 0, n = 0;
                    for (FNConstImIter<T> it(image, window); !it.atEnd(); ++it, ++n)
                        sum += static_cast<double>(*it);
                    const double mean = sum / n,
                                 result = static_cast<double>(means.get({x - part.x0, y - part.y0}));
                    if constexpr (std::is_integral_v<T>)
                        ASSERT_EQ(result, std::floor(mean));
                    else
                        ASSERT_NEAR(result, mean, 1e-6);
                }
        }
    EXPECT_THROW(imgMean(image, 0, 3, image.box()), FNEBadArg);
}

TEST(LocalFilters, MeanIsCutAtTheBox) {
    checkMeans<float>();
    checkMeans<unsigned char>();
    checkMeans<unsigned short>();
}

TEST(LocalFilters, GrayHistogramCountsValues) {
    RandomImages random(4);
    const FNImage<unsigned char> image = random.image<unsigned char>(31, 9);
    const auto all = imgGrayHistogram(image),
               left = imgGrayHistogram(image, [](FNGridPos p) { return p.x < 10; });
    EXPECT_EQ(std::count(image.data(), image.data() + image.size(), 255), all[255]);
    EXPECT_EQ(std::accumulate(all.begin(), all.end(), 0), 31 * 9);
    EXPECT_EQ(std::accumulate(left.begin(), left.end(), 0), 10 * 9);
}

TEST(SupportNorm, GivesTheSameBitsOnAllVectorUnits) {
    RandomImages random(5);
    const Img::SupportNorm norm(4.0f, 6, 0.007f, 1.007f);
    for (const FNGridPos size : {FNGridPos{1, 1}, {5, 3}, {13, 40}, {33, 14}, {160, 20}}) {
        FNImage<float> image = random.image<float>(size.x, size.y);
        float* const pixels = image.getExclusive();
        for (std::size_t i = 0; i < image.size(); i += 7)
            pixels[i] = std::array{0.0f, -3.0f, 1e30f, INFINITY, NAN, 0.5f}[i % 6];
        const FNImage<float> plain = norm.plain(image);
        forEachTarget([&] {
            const FNImage<float> fast = norm(image);
            for (std::size_t i = 0; i < image.size(); ++i)
                ASSERT_EQ(fast.data()[i], plain.data()[i]) << size.x << " by " << size.y << " at " << i;
        });
    }
}

TEST(SupportNorm, WeighsDarkerAgainstBrighterNeighboursBeyondTheNoise) {
    const Img::SupportNorm norm(2.0f, 1, 0.01f, 1.1f);
    FNImage<float> image(3, 3);
    image.fill(0.5f);
    EXPECT_EQ(norm(image)(1, 1), 0);
    float* const pixels = image.getExclusive();
    const float side = std::exp(-1 / 4.0f), corner = std::exp(-2 / 4.0f), sum = 4 * side + 4 * corner;
    pixels[0] = 0.4f;  // darker: below 0.5 / 1.1 - 0.01
    pixels[1] = 0.57f; // brighter: above 0.5 * 1.1 + 0.01
    pixels[2] = 0.55f; // neither
    EXPECT_NEAR(norm(image)(1, 1), (corner - side) / sum, 1e-6);
    EXPECT_NEAR(norm(image)(0, 0), -1, 1e-6) << "the window is cut to the image";
    EXPECT_EQ(thrownBy([] { Img::SupportNorm(1, 1, 0, 0.99f); }),
              "FNEGeneric: Multiplicative noise threshold parameter must be >=1!");
    EXPECT_EQ(thrownBy([] { Img::SupportNorm(0, 1, 0, 1); }), "FNEGeneric: Sigma must be positive!");
}

} // namespace
