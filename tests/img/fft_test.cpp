#include "img/fft/img_fft.h"

#include "random_images.h"
#include "support/each_target.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <complex>
#include <numbers>

namespace {

using Point = std::complex<double>;
template <class T> using Complex = FNImage<FNComplex<T>>;

template <class T> Point value(T pixel) {
    return static_cast<double>(pixel);
}
template <class T> Point value(FNComplex<T> pixel) {
    return {static_cast<double>(pixel.re), static_cast<double>(pixel.im)};
}

/// The transform by its definition, in double: rows, then columns, with n operations for each point.
template <class Image> std::vector<Point> direct(const Image& image, int sign) {
    const std::uint32_t w = image.w(), h = image.h();
    const auto roots = [&](std::uint32_t n) {
        std::vector<Point> powers(n);
        for (std::uint32_t k = 0; k < n; ++k)
            powers[k] = std::polar(1.0, sign * 2 * std::numbers::pi * k / n);
        return powers;
    };
    const std::vector<Point> along = roots(w), down = roots(h);
    std::vector<Point> rows(image.size()), result(image.size());
    for (std::uint32_t y = 0; y < h; ++y)
        for (std::uint32_t u = 0; u < w; ++u)
            for (std::uint32_t x = 0; x < w; ++x)
                rows[y * w + u] += value(image(x, y)) * along[std::uint64_t{u} * x % w];
    for (std::uint32_t v = 0; v < h; ++v)
        for (std::uint32_t u = 0; u < w; ++u)
            for (std::uint32_t y = 0; y < h; ++y)
                result[v * w + u] += rows[y * w + u] * down[std::uint64_t{v} * y % h];
    return result;
}

/// Largest deviation, as a fraction of the root mean square of what is expected.
template <class T>
double deviation(const Complex<T>& result, const std::vector<Point>& expected, double scale = 1) {
    double worst = 0, sum = 0;
    for (std::uint64_t i = 0; i < expected.size(); ++i) {
        worst = std::max(worst, std::abs(value(result.data()[i]) - scale * expected[i]));
        sum += std::norm(scale * expected[i]);
    }
    return worst / std::sqrt(sum / static_cast<double>(expected.size()));
}

Complex<float> randomComplex(RandomImages& random, int w, int h) {
    const FNImage<float> re = random.image<float>(w, h), im = random.image<float>(w, h);
    Complex<float> image(re.w(), re.h());
    for (std::uint64_t i = 0; i < re.size(); ++i)
        image.getExclusive()[i] = {re.data()[i] - 0.5f, im.data()[i] - 0.5f};
    return image;
}

TEST(FloatFft, OfAnySizeIsTheDirectTransform) {
    RandomImages random(1);
    // Powers of two, every radix and pairs of them, generic radices, convolutions, and edges of the vectors'
    // lanes.
    const std::pair<int, int> sizes[] = {{2, 2},  {64, 16},  {3, 5},   {160, 160}, {108, 80},
                                         {7, 49}, {12, 100}, {33, 35}, {13, 22},   {31, 17},
                                         {37, 6}, {82, 3},   {2, 101}, {1 << 9, 2}};
    forEachTarget([&] {
        for (const auto& [w, h] : sizes) {
            SCOPED_TRACE(testing::Message() << w << "x" << h);
            const ImgFFTFloat fft(static_cast<unsigned>(w), static_cast<unsigned>(h));
            const auto temporary = fft.create();
            FNImage<float> real = random.image<float>(w, h);
            for (FNImIter<float> it(real, real.box()); !it.atEnd(); ++it) *it -= 0.5f;
            const Complex<float> image = randomComplex(random, w, h);
            EXPECT_LT(deviation(fft.transformReal(real, temporary), direct(real, -1)), 2e-5);
            EXPECT_LT(deviation(fft.transformComplex(image, temporary), direct(image, -1)), 2e-5);
            EXPECT_LT(deviation(fft.inverse(image, temporary), direct(image, 1)), 2e-5);
            EXPECT_EQ(fft.constantFactor(), double(w) * h);
        }
    });
}

PixelBlockRanges randomRanges(RandomImages& random, std::uint32_t size) {
    const int n = static_cast<int>(size), end = random.number(0, n / 2);
    PixelBlockRanges ranges{static_cast<std::uint32_t>(random.number(0, end)),
                            static_cast<std::uint32_t>(end), 0, 0};
    if (random.number(0, 2)) {
        ranges.secondBegin = static_cast<std::uint32_t>(random.number(end, n));
        ranges.secondEnd = static_cast<std::uint32_t>(random.number(static_cast<int>(ranges.secondBegin), n));
    }
    return ranges;
}

TEST(FloatFft, OfSparseImagesEqualsThatOfTheFullOnes) {
    RandomImages random(2);
    forEachTarget([&] {
        for (int round = 0; round < 20; ++round) {
            const unsigned w = round % 2 ? 80 : 45, h = round % 4 < 2 ? 64 : 27;
            const ImgFFTFloat fft(w, h);
            const auto temporary = fft.create();
            const PixelBlockRanges pixels = randomRanges(random, w), lines = randomRanges(random, h);
            const SparseImage<float> real(random.image<float>(int(w), int(h)), pixels, lines);
            const SparseImage<FNComplex<float>> complex(randomComplex(random, int(w), int(h)), pixels, lines);
            const FNImage<float> fullReal(real);
            const Complex<float> full(complex);
            const auto expectNear = [&](const Complex<float>& a, const Complex<float>& b) {
                ASSERT_EQ(a.size(), b.size());
                for (std::uint64_t i = 0; i < a.size(); ++i)
                    ASSERT_LT(norm(a.data()[i] - b.data()[i]), 1e-5f) << round;
            };
            expectNear(fft.transformReal(real, temporary), fft.transformReal(fullReal, temporary));
            expectNear(fft.transformComplex(complex, temporary), fft.transformComplex(full, temporary));
            const Complex<float> inverse = fft.inverse(full, temporary);
            expectNear(fft.inverse(complex, temporary), inverse);

            std::vector<std::uint32_t> columns;
            for (std::uint32_t x = 0; x < w; ++x)
                if (random.number(0, 2)) columns.push_back(x);
            Complex<float> chosen(static_cast<std::uint32_t>(columns.size()), h);
            for (std::uint32_t y = 0; y < h; ++y)
                for (std::uint32_t i = 0; i < columns.size(); ++i)
                    chosen.getExclusive()[y * columns.size() + i] = inverse(columns[i], y);
            expectNear(fft.processColumnsSparse(complex, columns, temporary), chosen);
        }
    });
    const ImgFFTFloat fft(8, 8);
    const SparseImage<FNComplex<float>> nothing(Complex<float>(8, 8), {}, {});
    const std::uint32_t outside[] = {8};
    EXPECT_THROW(fft.processColumnsSparse(nothing, outside, fft.create()), FNEOutOfRange);
    EXPECT_EQ(norm(fft.inverse(nothing, fft.create())(3, 3)), 0);
}

TEST(FixedPointFft, IsTheDirectTransformScaledDown) {
    RandomImages random(3);
    forEachTarget([&] {
        for (const auto& [w, h] : {std::pair(16, 16), {64, 8}, {80, 96}, {108, 108}, {160, 80}, {11, 26}}) {
            SCOPED_TRACE(testing::Message() << w << "x" << h);
            const ImgFFTInt fft(static_cast<unsigned>(w), static_cast<unsigned>(h));
            const auto temporary = fft.create();
            FNImage<int> image = random.image<int>(w, h); // a quarter of the values at each end of the range
            const double scale = std::sqrt(fft.constantFactor() / (double(w) * h));
            EXPECT_LE(scale, 1.0 / (w * h));
            const Complex<int> spectrum = fft.transformReal(image, temporary);
            const std::vector<Point> expected = direct(image, -1);
            // Rounding leaves an error of few units at each stage; clamped extremes are off by 2^-15.
            EXPECT_LT(deviation(spectrum, expected, scale), 2e-4);

            Complex<int> complex(image.w(), image.h());
            for (std::uint64_t i = 0; i < image.size(); ++i)
                complex.getExclusive()[i] = {image.data()[i] / 2, image.data()[image.size() - 1 - i] / 2};
            EXPECT_LT(deviation(fft.inverse(complex, temporary), direct(complex, 1), scale), 2e-5);
            EXPECT_LT(deviation(fft.transformComplex(complex, temporary), direct(complex, -1), scale), 2e-5);
        }
    });
}

TEST(FixedPointFft, DoesNotOverflow) {
    forEachTarget([] {
        for (const int value : {std::numeric_limits<int>::min(), std::numeric_limits<int>::max()})
            for (const unsigned size : {16u, 160u, 108u}) {
                const ImgFFTInt fft(size, size);
                FNImage<int> image(size, size);
                image.fill(value);
                const Complex<int> spectrum = fft.transformReal(image, fft.create());
                const double scale = std::sqrt(fft.constantFactor()) * size;
                EXPECT_NEAR(spectrum(0, 0).re / scale, value, 1e5);
                for (std::uint64_t i = 1; i < spectrum.size(); ++i)
                    ASSERT_LE(std::abs(spectrum.data()[i].re), 8);

                // The longest spectrum whose inverse gathers in one pixel.
                Complex<int> corners(size, size);
                corners.fill({value, value});
                const FNComplex<int> first = fft.inverse(corners, fft.create())(0, 0);
                EXPECT_NEAR(first.re / scale, value / std::numbers::sqrt2, 1e5);
                EXPECT_NEAR(first.im / scale, value / std::numbers::sqrt2, 1e5);
            }
    });
}

TEST(Fft, RefusesWrongSizes) {
    const FNImage<float> real(5, 5);
    const Complex<float> complex(5, 5);
    const ImgFFTFloat radix2(8, 8), mixed(6, 8);
    const auto t = radix2.create();
    EXPECT_EQ(thrownText<FNEBadArg>([&] { radix2.transformReal(real, t); }),
              "imgFFT<float,IPP>::transformReal: invalid image sizes");
    EXPECT_EQ(thrownText<FNEBadArg>([&] { radix2.inverse(complex, t); }),
              "imgFFT::inverse: invalid image sizes");
    EXPECT_EQ(thrownText<FNEBadArg>([&] { mixed.transformReal(real, t); }),
              "ImgFFT<float,MKL>::transformReal: invalid image sizes");
    EXPECT_EQ(thrownText<FNEBadArg>([&] { mixed.transformComplex(complex, t); }),
              "ImgFFT<float,MKL>::transformComplex: invalid image sizes");
    EXPECT_EQ(thrownText<FNEBadArg>([&] { mixed.inverse(complex, t); }),
              "ImgFFT<float,MKL>::inverse: invalid image sizes");
    const ImgFFTInt fixed(16, 16);
    EXPECT_EQ(thrownText<FNEBadArg>([&] { fixed.transformReal(FNImage<int>(5, 5), fixed.create()); }),
              "imgFFT::transform: invalid image sizes");
    EXPECT_EQ(thrownText<FNEBadArg>([] { ImgFFTInt(7, 12); }), "imgFFT::constructor: invalid image sizes");
    EXPECT_EQ(thrownText<FNEBadArg>([] { ImgFFTInt(80, 74); }),
              "The generated FFT mixed radix rotation factors are not available for this configation!");
    for (const unsigned size : {0u, 1u})
        EXPECT_EQ(thrownText<FNEBadArg>([&] { ImgFFTFloat(8, size); }),
                  "FFT::FFT: At least 2 points must be given for transforms");
    EXPECT_EQ(thrownText<FNEBadArg>([] { ImgFFTImplementations::IPPRadix2<float>(8, 6); }),
              "ImgFFT<float, IPPRadix2>::ImgFFT(unsigned int,unsigned int): Image dimensions have to be "
              "exact powers "
              "of two !");
    EXPECT_TRUE(ImgFFTFloat::isPowerOfTwo(0));
    EXPECT_TRUE(ImgFFTFloat::isPowerOfTwo(1));
    EXPECT_FALSE(ImgFFTFloat::isPowerOfTwo(12));
}

} // namespace
