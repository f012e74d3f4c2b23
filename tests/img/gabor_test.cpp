#include "img/gabor/components_extractor.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <complex>
#include <random>

namespace {

using Img::Gabor::GaborFourierTransformation;
using Img::Gabor::TransformationParameters;
using ClosedEye = TransformationParameters<16, 16, 0, 2, 6>;
using GazeAway = TransformationParameters<16, 16, 1, 3, 3>;
constexpr double pi = std::numbers::pi;

/// A grating of that wave vector, of mean 0.5.
FNImage<float> grating(double kx, double ky) {
    FNImage<float> image(16, 16);
    for (int y = 0; y < 16; ++y)
        for (int x = 0; x < 16; ++x)
            image.set({x, y}, static_cast<float>(0.5 + 0.4 * std::cos(kx * x + ky * y)));
    return image;
}

TEST(GaborInFourier, PeaksAtItsWaveVectorAndIsBlindToTheMean) {
    FNImage<FNComplex<float>> filter(160, 160);
    const double sigma = 2 * pi;
    Img::gaborInFourier(sigma, {0, pi / 8}, filter, 1e-6); // 10 periods on 160 pixels, along y
    const FNComplex<float>* const peak =
        std::max_element(filter.data(), filter.data() + filter.size(),
                         [](FNComplex<float> a, FNComplex<float> b) { return a.re < b.re; });
    EXPECT_EQ(peak - filter.data(), 160 * 10);
    EXPECT_NEAR(peak->re, 2 * pi, 1e-4);
    EXPECT_NEAR(filter(0, 0).re, 0, 1e-6);
    // Two cycles off the peak, by the Gaussian: C = 2 pi^2 sigma^2 / k^2.
    const double C = 2 * pi * pi * sigma * sigma / (pi / 8 * pi / 8);
    EXPECT_NEAR(filter(2, 10).re, 2 * pi * std::exp(-C * 4 / 160 / 160), 1e-5);
    EXPECT_EQ(filter(80, 80).re, 0); // below the floor
    EXPECT_EQ(filter(2, 10).im, 0);
}

TEST(GaborInFourier, SumsTheGaussiansOfAllAliases) {
    const struct {
        double sigma;
        FN2Vector<double> k;
    } filters[] = {{2 * pi, {0.3, -0.5}}, {0.8 * pi, {pi, 0}}, {0.6, {1.2, 2.5}}, {2 * pi, {0.1, 0.05}}};
    for (const auto& [sigma, k] : filters) {
        FNImage<FNComplex<float>> filter(40, 24);
        Img::gaborInFourier(sigma, k, filter, 1e-6);
        const double C = 2 * pi * pi * sigma * sigma / dot(k, k), least = std::log(1e-6 / (40 * 24));
        const auto term = [&](double e) { return e > least ? std::exp(e) : 0; };
        for (std::uint32_t Y = 0; Y < 24; ++Y)
            for (std::uint32_t X = 0; X < 40; ++X) {
                double sum = 0;
                for (int n = -3; n <= 3; ++n)
                    for (int m = -3; m <= 3; ++m) {
                        const double x = X / 40.0 + n, y = Y / 24.0 + m;
                        const double dx = x - k.x / (2 * pi), dy = y - k.y / (2 * pi);
                        sum +=
                            term(-C * (dx * dx + dy * dy)) - term(-sigma * sigma / 2 - C * (x * x + y * y));
                    }
                ASSERT_NEAR(filter(X, Y).re, 2 * pi * sum, 1e-6) << sigma << " " << X << " " << Y;
            }
    }
}

TEST(GaborTransformation, AnswersMostToTheGratingOfItsOwnWaveVector) {
    const GaborFourierTransformation<float, GazeAway> gabor;
    for (unsigned s = 0; s < 2; ++s)
        for (unsigned d = 0; d < 3; ++d) {
            const double k = pi * std::pow(2, -(s + 1.0) / 2), angle = d * pi / 3;
            // Of a whole number of periods, or the edges would answer too.
            const auto periodic = [](double x) { return std::round(x * 8 / pi) * pi / 8; };
            const auto responses =
                gabor.transform(grating(periodic(k * std::cos(angle)), periodic(k * std::sin(angle))));
            ASSERT_EQ(responses.size(), 6u);
            std::vector<float> magnitudes;
            for (const auto& response : responses) magnitudes.push_back(norm(response(8, 8)));
            EXPECT_EQ(std::max_element(magnitudes.begin(), magnitudes.end()) - magnitudes.begin(), 3 * s + d);
        }
}

TEST(GaborTransformation, IsTheProductOfTheSpectra) {
    std::mt19937 random(1);
    FNImage<float> image(16, 16);
    std::generate_n(image.getExclusive(), 256,
                    [&] { return std::uniform_real_distribution<float>(0, 1)(random); });
    const auto response =
        GaborFourierTransformation<float, ClosedEye>().transform(image)[7]; // scale 1, direction 1
    FNImage<FNComplex<float>> filter(16, 16);
    const double k = pi / std::numbers::sqrt2;
    Img::gaborInFourier(0.8 * pi, {k * std::cos(pi / 6), k * std::sin(pi / 6)}, filter, 1e-6);

    std::complex<double> expected = 0; // at pixel (5, 11), by the definition of the transforms
    for (int v = 0; v < 16; ++v)
        for (int u = 0; u < 16; ++u) {
            std::complex<double> spectrum = 0;
            for (int y = 0; y < 16; ++y)
                for (int x = 0; x < 16; ++x)
                    spectrum +=
                        static_cast<double>(image(x, y)) * std::polar(1.0, -2 * pi * (u * x + v * y) / 16);
            expected += spectrum * static_cast<double>(filter(u, v).re) *
                        std::polar(1.0, 2 * pi * (u * 5 + v * 11) / 16);
        }
    EXPECT_NEAR(response(5, 11).re, expected.real(), std::abs(expected) * 1e-4);
    EXPECT_NEAR(response(5, 11).im, expected.imag(), std::abs(expected) * 1e-4);
}

TEST(MRIComponentsExtractor, TakesBlocksOfUnitEnergyAtTheGridPoints) {
    Img::Gabor::ResponseImages responses(2, FNImage<FNComplex<float>>(16, 16));
    for (auto& response : responses) response.fill({0, 0});
    responses[0].set({4, 7}, {3, 4});
    responses[1].set({4, 7}, {0, 12}); // together 169
    using Sparse = Img::MaskGridParameters<16, 16, 3, 6, 2>;
    const auto features = Img::Gabor::MRIComponentsExtractor::extract<Sparse>(responses).values();
    ASSERT_EQ(features.size(), 10u * 6); // x 4 to 12 and y 7, 9, by two
    const std::vector<float> first(features.begin(), features.begin() + 6);
    const std::vector<float> expected{5 / 13.0f, 12 / 13.0f, 3 / 13.0f, 0, 4 / 13.0f, 12 / 13.0f};
    for (std::size_t i = 0; i < 6; ++i) EXPECT_FLOAT_EQ(first[i], expected[i]);
    for (std::size_t i = 6; i < features.size(); ++i)
        EXPECT_EQ(features.get()[i], 0); // nothing there, not NaN

    const GaborFourierTransformation<float, ClosedEye> gabor;
    EXPECT_EQ((Img::Gabor::MRIComponentsExtractor::extract<Img::MaskGridParameters<16, 16, 3, 6, 1>>(
                   gabor.transform(grating(1, 1))))
                  .size(),
              1440u);
    responses[1] = FNImage<FNComplex<float>>(15, 16);
    EXPECT_THROW(Img::Gabor::MRIComponentsExtractor::extract<Sparse>(responses), FNEBadArg);
}

} // namespace
