#include "eye/discriminator/sod_conversion.h"
#include "eye/gabor/window_convolver.h"
#include "eye/gabor/windowing_iterator.h"
#include "eye/window_signs.h"
#include "support/each_target.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <cmath>
#include <complex>
#include <numbers>
#include <random>
#include <set>

namespace {

using namespace Eye;
using Cara::Impl::SpatialGaborConvolverSettings_T8;
using Cara::Impl::SpatialGaborConvolverSettings_T8_FinalDecider;
using Image = FNImage<unsigned short>;
template <class S> using WindowConvolver = Cara::Impl::FastSpatialGaborConvolver<unsigned short, int, S>;
template <class S> using PatchConvolver = Ojo::T8::FastSpatialGaborConvolver<unsigned short, int, S>;

/// Noise that is smooth enough for responses of every kind, or of extreme contrast.
Image randomImage(std::uint32_t w, std::uint32_t h, unsigned seed, bool extreme = false) {
    std::mt19937 random(seed);
    Image image(w, h);
    unsigned short* p = image.getExclusive();
    for (std::size_t i = 0; i < image.size(); ++i)
        p[i] = static_cast<unsigned short>(extreme ? (random() & 1) * 65535 : random() % 65536);
    return image;
}

TEST(GaborKernels, AreTheRoundedTaps) {
    const auto& k = Gabor::kernelRep<6>();
    using Taps = Gabor::KernelTable::Taps;
    // exp(g * i^2) with g = -k^2 / (2 sigma^2) is 0.49938, 0.06219; the amplitude is trunc(26754.96
    // / 2.12314).
    EXPECT_EQ(k.gauss, (Taps{784, 6293, 12602, 6293, 784}));
    EXPECT_EQ(k.dc[2], -static_cast<std::int32_t>(
                           std::lround(12602 * std::exp(-0.5 * std::pow(0.6 * std::numbers::pi, 2)))));
    for (unsigned m = 0; m <= 3; ++m)
        for (unsigned t = 0; t < 2; ++t) {
            EXPECT_EQ(k.cosX[m][t], k.cosX[m][4 - t]);
            EXPECT_EQ(k.sinX[m][t], -k.sinX[m][4 - t]);
        }
    EXPECT_EQ(k.sinY[0], (Taps{0, 0, 0, 0, 0}));
    EXPECT_LT(k.sinX[0][3], 0); // minus the sine of a positive phase
}

/// What a response is in real numbers: the mask correlated with the complex kernel.
std::complex<double> response(const Image& image, std::uint32_t x0, std::uint32_t y0, unsigned d,
                              unsigned directions) {
    const double sigma = 0.6 * std::numbers::pi, k = std::numbers::pi / std::numbers::sqrt2;
    const double angle = d * std::numbers::pi / directions, g = -k * k / (2 * sigma * sigma);
    std::complex<double> sum = 0;
    for (int b = -2; b <= 2; ++b)
        for (int a = -2; a <= 2; ++a) {
            const double gauss = 12602.0 * 12602.0 * std::exp(g * (a * a + b * b));
            const double phase = k * (std::cos(angle) * a + std::sin(angle) * b);
            sum += gauss * image(x0 + a + 2, y0 + b + 2) *
                   std::complex(std::cos(phase) - std::exp(-sigma * sigma / 2), -std::sin(phase));
        }
    return sum / 65536.0 / 65536.0;
}

TEST(GaborResponses, FollowTheComplexKernels) {
    const Image image = randomImage(23, 23, 1);
    WindowConvolver<SpatialGaborConvolverSettings_T8_FinalDecider>::ConvolutionData data;
    WindowConvolver<SpatialGaborConvolverSettings_T8_FinalDecider>().convolve(image, {0, 0}, data);
    for (unsigned d = 0; d < 8; ++d)
        for (std::uint32_t y = 0; y < 10; ++y)
            for (std::uint32_t x = 0; x < 10; ++x) {
                const std::size_t i = data.row(d, y) + x;
                const auto expected = response(image, 2 * x, 2 * y, d, 8);
                EXPECT_NEAR(data.re()[i], expected.real(), 4);
                EXPECT_NEAR(data.im()[i], expected.imag(), 4);
                EXPECT_EQ(data.mag()[i], data.re()[i] * data.re()[i] + data.im()[i] * data.im()[i]);
            }
}

TEST(GaborResponses, OfAConstantImageAreNearlyZero) {
    Image image(17, 17);
    image.fill(65535);
    WindowConvolver<SpatialGaborConvolverSettings_T8>::ConvolutionData data;
    WindowConvolver<SpatialGaborConvolverSettings_T8>().convolve(image, {0, 0}, data);
    for (unsigned d = 0; d < 6; ++d)
        for (std::uint32_t x = 0; x < 7; ++x) {
            EXPECT_LT(std::abs(data.re()[data.row(d, 3) + x]),
                      0.04 * 10922); // five taps leave a little of the mean
            EXPECT_LE(std::abs(data.im()[data.row(d, 3) + x]), 1);
        }
}

void expectPlainFormOnEveryTarget(const Image& image, std::uint32_t step, std::uint32_t columns,
                                  std::uint32_t rows, unsigned directions) {
    const auto& kernels = directions == 6 ? Gabor::kernelRep<6>() : Gabor::kernelRep<8>();
    Gabor::Responses plain(directions, columns, rows);
    Gabor::Plain::computeResponses(kernels, image.data(), image.w(), step, plain);
    forEachTarget([&] {
        Gabor::Responses fast(directions, columns, rows);
        Gabor::computeResponses(kernels, image.data(), image.w(), step, fast);
        const std::size_t width = (columns + 15) / 16 * 16;
        for (std::uint32_t y = 0; y < rows; ++y) {
            for (unsigned d = 0; d < directions; ++d) {
                for (std::size_t i = plain.row(d, y); i < plain.row(d, y) + columns; ++i) {
                    ASSERT_EQ(fast.re()[i], plain.re()[i]);
                    ASSERT_EQ(fast.im()[i], plain.im()[i]);
                    ASSERT_EQ(fast.mag()[i], plain.mag()[i]);
                }
                std::vector<std::int32_t> codes(width), plainCodes(width);
                Gabor::compareInWindow(fast, d, y, codes.data());
                Gabor::Plain::compareInWindow(plain, d, y, plainCodes.data());
                for (std::uint32_t x = 0; x < columns; ++x) {
                    std::int32_t defined = 0x300;
                    if (x + 1 < columns) defined |= 0x003;
                    if (y + 1 < rows) defined |= 0x0C0;
                    if (x + 1 < columns && y + 1 < rows) defined |= 0x03C;
                    ASSERT_EQ(codes[x] & defined, plainCodes[x]) << d << " " << y << " " << x;
                }
            }
            if (directions != 6) continue;
            std::vector<std::vector<unsigned char>> bytes(16, std::vector<unsigned char>(width));
            std::array<unsigned char*, 16> rowsOfBytes;
            for (unsigned i = 0; i < 16; ++i) rowsOfBytes[i] = bytes[i].data();
            Gabor::compareInPatch(fast, y, rowsOfBytes.data());
            Gabor::Plain::compareInPatch(plain, y, rowsOfBytes.data() + 8);
            for (unsigned i = 0; i < 8; ++i)
                for (std::uint32_t x = 0; x < columns; ++x)
                    ASSERT_EQ(bytes[i][x], bytes[i + 8][x]) << i << " " << y << " " << x;
        }
    });
}

TEST(GaborResponses, AndTheirComparisonsHaveTheBitsOfThePlainFormOnEveryTarget) {
    for (const bool extreme : {false, true}) {
        expectPlainFormOnEveryTarget(randomImage(17, 17, 2, extreme), 2, 7, 7, 6);
        expectPlainFormOnEveryTarget(randomImage(23, 23, 3, extreme), 2, 10, 10, 8);
        expectPlainFormOnEveryTarget(randomImage(29, 29, 4, extreme), 1, 25, 25, 6);
        expectPlainFormOnEveryTarget(randomImage(37, 40, 5, extreme), 1, 33, 36, 6);
    }
    Image constant(29, 29); // ties everywhere
    constant.fill(1000);
    expectPlainFormOnEveryTarget(constant, 1, 25, 25, 6);
}

TEST(GaborSods, OfTiesAreAllSet) {
    Image black(23, 23);
    black.fill(0);
    const auto sods =
        WindowConvolver<SpatialGaborConvolverSettings_T8_FinalDecider>().getGaborSODs(black, {0, 0});
    ASSERT_EQ(sods.size(), 7072u);
    for (std::uint32_t i = 0; i < sods.size(); ++i) ASSERT_EQ(sods[i], 1);
}

/// The order of the vector, written out.
template <class Settings> Fn::SignValueVector<int> sodsByDefinition(const Image& image, FNGridPos pos) {
    typename WindowConvolver<Settings>::ConvolutionData r;
    WindowConvolver<Settings>().convolve(image, pos, r);
    constexpr std::uint32_t n = Settings::gridPoints;
    Fn::SVVectorSequentialBuilder<int> builder(WindowConvolver<Settings>::size);
    const auto pair = [&](std::size_t a, std::size_t b) {
        builder.setNextSign(r.mag()[a] >= r.mag()[b]);
        builder.setNextSign(r.re()[b] * r.im()[a] - r.im()[b] * r.re()[a] >= 0);
    };
    for (std::uint32_t x = 0; x < n; ++x)
        for (std::uint32_t y = 0; y < n; ++y)
            for (unsigned o = 0; o < Settings::directions; ++o) {
                const std::size_t p = r.row(o, y) + x;
                if (x < n - 1) pair(p, p + 1);
                if (x < n - 1 && y < n - 1) {
                    pair(p + 1, r.row(o, y + 1) + x);
                    pair(p, r.row(o, y + 1) + x + 1);
                }
                if (y < n - 1) pair(p, r.row(o, y + 1) + x);
                pair(p, r.row((o + 1) % Settings::directions, y) + x);
            }
    EXPECT_EQ(builder.position(), builder.vector().size());
    return builder.vector();
}

TEST(GaborSods, RunOverColumnsRowsAndDirections) {
    const Image image = randomImage(40, 30, 6);
    EXPECT_EQ(WindowConvolver<SpatialGaborConvolverSettings_T8>().getGaborSODs(image, {11, 5}),
              sodsByDefinition<SpatialGaborConvolverSettings_T8>(image, {11, 5}));
    EXPECT_EQ(WindowConvolver<SpatialGaborConvolverSettings_T8_FinalDecider>().getGaborSODs(image, {17, 7}),
              sodsByDefinition<SpatialGaborConvolverSettings_T8_FinalDecider>(image, {17, 7}));
    EXPECT_EQ(WindowConvolver<SpatialGaborConvolverSettings_T8>::size, 2460u);
}

TEST(GaborSods, RefuseWindowsThatLeaveTheImage) {
    const Image image = randomImage(23, 23, 7);
    const WindowConvolver<SpatialGaborConvolverSettings_T8_FinalDecider> convolver;
    EXPECT_NO_THROW(convolver.getGaborSODs(image, {0, 0}));
    EXPECT_EQ(thrownText<FNEBadArg>([&] {
                  convolver.getGaborSODs(image, {1, 0});
              }),
              "Eye::Cara::Impl::FastSpatialGaborConvolver<unsigned short, int, "
              "Eye::Cara::Impl::SpatialGaborConvolverSettings_T8_FinalDecider>: convolution failed: src: "
              "23x23, mask: 23x23, "
              "pos: (1, 0)");
    for (const FNGridPos pos :
         {FNGridPos(0, 1), FNGridPos(-1, 0), FNGridPos(0, -1), FNGridPos(2147483647, 2147483647)})
        EXPECT_THROW(convolver.getGaborSODs(image, pos), FNEBadArg);
    EXPECT_THROW(convolver.getGaborSODs(Image(), {0, 0}), FNEBadArg);
}

template <class Settings> class PatchOf : public testing::Test {};
using AllSettings =
    testing::Types<Ojo::T8::ConvolverSettings<18, 18>, Ojo::T8::ConvolverSettings<22, 22>,
                   Ojo::T8::ConvolverSettings<25, 25>, Boca::MConvolverSettings, Raiz::MConvolverSettings>;
TYPED_TEST_SUITE(PatchOf, AllSettings);

TYPED_TEST(PatchOf, WindowsHaveTheBitsOfTheSingleWindowAtTheirPlace) {
    constexpr std::uint32_t C = TypeParam::windowColumns, R = TypeParam::windowRows;
    const Image patch = randomImage(TypeParam::getPatchWidth(), TypeParam::getPatchHeight(), 8);
    const PatchConvolver<TypeParam> convolver;
    typename PatchConvolver<TypeParam>::ConvolutionData data;
    convolver.calculateResponses(patch, data);
    const auto phases = convolver.getAllGaborSODs(data);

    std::set<std::pair<int, int>> seen;
    for (Ojo::T8::GSodWindowingIterator<C, R, 6> window(phases); !window.atEnd(); ++window) {
        const FNGridPos pos = window.position();
        const auto single = windowSigns(patch, pos, C, R);
        if constexpr (C == 7 && R == 7) {
            ASSERT_EQ(single, WindowConvolver<SpatialGaborConvolverSettings_T8>().getGaborSODs(patch, pos));
        }
        namespace Conversion = Implementation::GSodConversion;
        ASSERT_EQ(*window, Conversion::sod2ssod(single, C, R, 6, Conversion::GSodLayout::ColumnAligned, 0))
            << pos.x << " " << pos.y;
        seen.emplace(pos.x, pos.y);
    }
    // In each phase of n columns the windows start at 0 to n - C, if n is above C.
    std::size_t expected = 0;
    for (const auto& phase : phases)
        if (phase.columns > C && phase.rows > R) expected += (phase.columns - C + 1) * (phase.rows - R + 1);
    EXPECT_EQ(seen.size(), expected);
    EXPECT_GT(expected, 0u);
}

TEST(GaborPatch, PhasesHalveTheGrid) {
    const PatchConvolver<Boca::MConvolverSettings> convolver;
    PatchConvolver<Boca::MConvolverSettings>::ConvolutionData data;
    EXPECT_EQ(thrownText<FNEBadFunCall>([&] { convolver.getAllGaborSODs(data); }),
              "Convolution must be done previous to getAllGaborSODs() call");
    EXPECT_THROW(convolver.calculateResponses(randomImage(40, 37, 9), data), FNEBadArg);
    convolver.calculateResponses(randomImage(37, 40, 9), data);
    const auto phases = convolver.getAllGaborSODs(data);
    ASSERT_EQ(phases.size(), 4u);
    for (std::uint32_t i = 0; i < 4; ++i) {
        EXPECT_EQ(phases[i].px + 2 * phases[i].py, i);
        EXPECT_EQ(phases[i].columns, 16u); // 33 and 32 halved
        EXPECT_EQ(phases[i].rows, i < 2 ? 18u : 17u);
    }
    EXPECT_EQ(Boca::MConvolverSettings::getFeatureVectorSize(), 864u);
}

TEST(GaborPatch, PhaseOfJustOneWindowHasNone) {
    std::vector<Ojo::T8::RowOrientedGaborSods> phases{{0, 0, 9, 7, std::vector<unsigned char>(9 * 7 * 8)},
                                                      {1, 0, 7, 9, std::vector<unsigned char>(9 * 7 * 8)}};
    EXPECT_TRUE((Ojo::T8::GSodWindowingIterator<7, 7, 6>(phases).atEnd()));
    phases.push_back({0, 1, 8, 8, std::vector<unsigned char>(8 * 8 * 8)});
    std::size_t windows = 0;
    for (Ojo::T8::GSodWindowingIterator<7, 7, 6> it(phases); !it.atEnd(); ++it) ++windows;
    EXPECT_EQ(windows, 4u);
}

} // namespace
