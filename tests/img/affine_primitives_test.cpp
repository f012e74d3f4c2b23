#include "img/affine/primitives.h"
#include "img/affine/rothstein.h"

#include "plain_affine.h"
#include "random_images.h"
#include "support/each_target.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <numeric>

namespace {

using namespace Img::Affine;
using namespace Img::Affine::Primitives;
using Words = FNImage<unsigned short>;

TEST(RothsteinCode, SpreadsUnitsEvenly) {
    EXPECT_EQ(imgRothsteinCode(7, 3), (std::vector<std::uint32_t>{2, 3, 2}));
    EXPECT_EQ(imgRothsteinCode(5, 5), (std::vector<std::uint32_t>{1, 1, 1, 1, 1}));
    RandomImages random(1);
    for (int round = 0; round < 50; ++round) {
        const auto q = static_cast<std::uint32_t>(random.number(1, 200));
        const auto p = static_cast<std::uint32_t>(random.number(static_cast<int>(q), 100000));
        std::uint64_t sum = 0, slots = 0;
        for (const std::uint32_t n : imgRothsteinCode(p, q)) {
            sum += n;
            ++slots;
            EXPECT_TRUE(n == p / q || n == p / q + 1);
            // As even as possible: no prefix strays from the straight line by more than one unit.
            EXPECT_LE(std::abs(static_cast<double>(sum) - static_cast<double>(p) * slots / q), 1);
        }
        EXPECT_EQ(sum, p);
    }
    EXPECT_EQ(thrownText<FNEBadArg>([] { imgRothsteinCode(2, 3); }),
              "imgRothsteinCode: Fatal Error: p < q: 2 3");
}

/// Random sources, boxes and factors; rows of 1 to 100 pixels end at all offsets from a vector's end.
template <class Fast, class Slow>
void compareOnRandomBoxes(float leastFactor, float greatestFactor, Fast fast, Slow slow) {
    RandomImages random(2);
    for (int round = 0; round < 60; ++round) {
        const auto size = [&](int box) {
            const float result = static_cast<float>(box) / random.real(leastFactor, greatestFactor);
            return std::clamp(static_cast<int>(result + 0.5f),
                              static_cast<int>(std::ceil(static_cast<float>(box) / greatestFactor)),
                              static_cast<int>(static_cast<float>(box) / leastFactor));
        };
        const int least = static_cast<int>(std::ceil(leastFactor));
        const Words src = random.image<unsigned short>(random.number(least, 100), random.number(least, 30));
        const FNBox box =
            random.boxInside(static_cast<int>(src.w()), static_cast<int>(src.h()), least, least);
        Words dst(static_cast<std::uint32_t>(size(static_cast<int>(box.width()))),
                  static_cast<std::uint32_t>(size(static_cast<int>(box.height()))));
        SCOPED_TRACE(testing::Message()
                     << box.width() << "x" << box.height() << " to " << dst.w() << "x" << dst.h());
        const Words expected = slow(src, box, dst.w(), dst.h());
        const Mapping mapping = fast(src, dst, box);
        EXPECT_EQ(dst, expected);
        EXPECT_EQ(mapping, Mapping::scaling(static_cast<float>(box.width()) / static_cast<float>(dst.w()),
                                            static_cast<float>(box.height()) / static_cast<float>(dst.h()),
                                            {static_cast<float>(box.x0), static_cast<float>(box.y0)}));
    }
}

using WordPrimitive = Mapping (*)(const Words&, Words&, const FNBox&);

TEST(AreaAverages, EqualTheirPlainForms) {
    const struct {
        const char* name;
        float least, greatest;
        WordPrimitive fast;
        Words (*slow)(const Words&, const FNBox&, std::uint32_t, std::uint32_t);
    } cases[] = {
        {"destination aligned", 1, 2, destinationAlignedFractionalAveraging, Plain::destinationAligned},
        {"destination aligned, far", 1, 16, destinationAlignedFractionalAveraging, Plain::destinationAligned},
        {"destination aligned, up", 0.3f, 1, destinationAlignedFractionalAveraging,
         Plain::destinationAligned},
        {"source aligned", 1, 2, sourceAlignedFractionalAveraging, Plain::sourceAligned},
        {"source aligned, far", 1, 30, sourceAlignedFractionalAveraging, Plain::sourceAligned},
        {"integer", 1, 12, integerAveraging, Plain::integerAverage},
        {"bilinear", 0.1f, 1, bilinearInterpolationFixedpoint, Plain::bilinearBox},
        {"bilinear, down", 0.1f, 4, bilinearInterpolationFixedpoint, Plain::bilinearBox},
    };
    for (const auto& c : cases)
        forEachTarget([&] {
            SCOPED_TRACE(c.name);
            compareOnRandomBoxes(c.least, c.greatest, c.fast, c.slow);
        });
}

TEST(AreaAverages, WideSourcesChooseTheirUnitsByTheHorizontalFactor) {
    RandomImages random(3);
    for (const std::uint32_t factor : {2u, 4u, 8u, 16u, 32u, 64u, 127u, 128u, 255u}) {
        const Words src = random.image<unsigned short>(static_cast<int>(2 * factor), 4);
        Words dst(2, 2);
        sourceAlignedFractionalAveraging(src, dst, src.box());
        EXPECT_EQ(dst, Plain::sourceAligned(src, src.box(), 2, 2)) << factor;
    }
    const Words tooWide(512, 4);
    Words dst(2, 2);
    EXPECT_EQ(thrownText<FNEBadArg>([&] { sourceAlignedFractionalAveraging(tooWide, dst, tooWide.box()); }),
              "Img::downScale<FNUInt16, FNUInt16>: could not find a valid scale factor for requested scaling "
              "[512x4]->[2x2], requested scale factor is 256 but maximal possible is 256!");
}

TEST(AreaAverages, KeepConstantImages) {
    for (const unsigned short value : {0, 1, 255, 40000, 65535}) {
        Words src(97, 61), dst(41, 29);
        src.fill(value);
        destinationAlignedFractionalAveraging(src, dst, src.box());
        EXPECT_EQ(*std::min_element(dst.data(), dst.data() + dst.size()), value);
        EXPECT_EQ(*std::max_element(dst.data(), dst.data() + dst.size()), value);
        sourceAlignedFractionalAveraging(src, dst, src.box());
        EXPECT_LE(*std::max_element(dst.data(), dst.data() + dst.size()), value);
        EXPECT_GE(*std::min_element(dst.data(), dst.data() + dst.size()) + 3, value)
            << "truncated reciprocal";
    }
}

TEST(AreaAverages, SumsBeyond32BitsAreMeansAllTheSame) {
    Words src(400, 400), dst(1, 1);
    src.fill(65535);
    integerAveraging(src, dst, src.box());
    EXPECT_EQ(dst(0, 0), 65535);
    Words high(10, 4000), low(5, 2); // 128 units along x make 256000 along y
    high.fill(50000);
    sourceAlignedFractionalAveraging(high, low, high.box());
    EXPECT_EQ(low(4, 1), 50000);
}

TEST(AreaAverages, RefuseBoxesOutsideAndLargeFactors) {
    const Words src(340, 340);
    const struct {
        WordPrimitive primitive;
        const char* name;
    } cases[] = {{destinationAlignedFractionalAveraging, "scaleImageFd"},
                 {sourceAlignedFractionalAveraging, "PreciseScaleFromImage"},
                 {integerAveraging, "IntegerAveraging"}};
    for (const auto& c : cases)
        for (const FNBox& box :
             {FNBox{-1, 0, 5, 5}, FNBox{0, -1, 5, 5}, FNBox{0, 0, 341, 5}, FNBox{0, 0, 5, 341}}) {
            Words dst(2, 2);
            EXPECT_EQ(thrownText<FNEBadArg>([&] { c.primitive(src, dst, box); }),
                      std::string(c.name) + ": the given source box does not lay inside the source image!");
        }
    Words dst(20, 20);
    EXPECT_NO_THROW(destinationAlignedFractionalAveraging(src, dst, {0, 0, 320, 320}));
    EXPECT_EQ(thrownText<FNEBadArg>([&] {
                  destinationAlignedFractionalAveraging(src, dst, {0, 0, 340, 20});
              }),
              "Img::scaleImageFd: the scale factors 17 and 1 for scaling from 340x20 to 20x20 are too large. "
              "maximal allowed factor is 16.");
}

TEST(AreaAverages, OfFloatsAreAreaMeans) {
    RandomImages random(4);
    forEachTarget([&] {
        for (const auto& [w, h] : {std::pair(40u, 15u), {17u, 20u}, {10u, 5u}}) {
            const FNImage<float> src = random.image<float>(83, 41);
            const FNBox box{3, 1, 80, 41};
            FNImage<float> fine(w, h), coarse(w, h);
            sourceAlignedFractionalAveraging(src, fine, box);
            const FNImage<double> expected = Plain::areaMean(src, box, w, h);
            // A border is off by up to 1/16 of a source pixel and half of that on average.
            const double tolerance = 4.0 / 16 / (static_cast<double>(box.width()) / w);
            for (std::uint64_t i = 0; i < fine.size(); ++i)
                ASSERT_NEAR(fine.data()[i], expected.data()[i], tolerance);
        }
        // Where the borders fall on pixels, the mean is exact.
        const FNImage<float> src = random.image<float>(64, 32);
        FNImage<float> fine(16, 16), whole(16, 16);
        sourceAlignedFractionalAveraging(src, fine, src.box());
        integerAveraging(src, whole, src.box());
        const FNImage<double> expected = Plain::areaMean(src, src.box(), 16, 16);
        for (std::uint64_t i = 0; i < fine.size(); ++i) {
            ASSERT_NEAR(fine.data()[i], expected.data()[i], 1e-6);
            ASSERT_NEAR(whole.data()[i], expected.data()[i], 1e-6);
        }
    });
}

TEST(AreaAverages, OfColoursAreThoseOfTheirChannels) {
    RandomImages random(5);
    const FNImage<Fn::Bgra32> src = random.image<Fn::Bgra32>(53, 37);
    const FNBox box{4, 2, 51, 36};
    using Color = FNImage<Fn::Bgra32>;
    const struct {
        Mapping (*color)(const Color&, Color&, const FNBox&);
        Words (*plain)(const Words&, const FNBox&, std::uint32_t, std::uint32_t);
        bool widens;
    } cases[] = {{sourceAlignedFractionalAveraging, Plain::sourceAligned, true},
                 {integerAveraging, Plain::integerAverage, true},
                 {bilinearInterpolationFixedpoint, Plain::bilinearBox, false}};
    forEachTarget([&] {
        for (const auto& c : cases) {
            Color dst(13, 11);
            c.color(src, dst, box);
            for (const auto channel : {&Fn::Bgra32::r, &Fn::Bgra32::g, &Fn::Bgra32::b}) {
                Words plane(src.w(), src.h());
                for (std::uint64_t i = 0; i < src.size(); ++i) {
                    const unsigned short v = src.data()[i].*channel;
                    plane.getExclusive()[i] = static_cast<unsigned short>(c.widens ? v << 8 | 128 : v);
                }
                const Words expected = c.plain(plane, box, 13, 11);
                for (std::uint64_t i = 0; i < dst.size(); ++i) {
                    ASSERT_EQ(dst.data()[i].*channel,
                              c.widens ? expected.data()[i] >> 8 : expected.data()[i]);
                    ASSERT_EQ(dst.data()[i].a, 255);
                }
            }
        }
    });
}

TEST(FourToThree, EqualsItsPlainForm) {
    RandomImages random(6);
    forEachTarget([&] {
        for (int w = 1; w < 40; w += w < 9 ? 1 : 5)
            for (int h = 1; h < 12; ++h) {
                const Words src = random.image<unsigned short>(w, h);
                Words dst = FourToThreeFractionalAveraging::createDst(src.w(), src.h());
                const Mapping mapping = FourToThreeFractionalAveraging::scale(src, dst);
                ASSERT_EQ(dst, Plain::fourToThree(src)) << w << "x" << h;
                ASSERT_EQ(mapping, Mapping::scaling(1.3333334f, 1.3333334f));
            }
    });
    Words constant(5, 4), dst = FourToThreeFractionalAveraging::createDst(5, 4);
    constant.fill(10000);
    FourToThreeFractionalAveraging::scale(constant, dst);
    EXPECT_EQ(dst.w(), 4u);
    EXPECT_EQ(dst.h(), 3u);
    EXPECT_EQ(dst(2, 1), 10000);
    EXPECT_EQ(dst(3, 1), 7500) << "completed with zeros";
    EXPECT_THROW(FourToThreeFractionalAveraging::scale(constant, constant), FNEBadArg);
}

TEST(Bilinear, FixedPointParallelogramsEqualTheirPlainForm) {
    RandomImages random(7);
    for (int round = 0; round < 200; ++round) {
        const Words src = random.image<unsigned short>(random.number(1, 20), random.number(1, 20));
        const auto vector = [&] { return FN2Vector<float>(random.real(-30, 30), random.real(-30, 30)); };
        const FNPos origin(random.real(-5, 25), random.real(-5, 25));
        FN2Vector<float> u = vector(), v = vector();
        if (round % 4 == 0) u.y = v.x = 0;
        Words dst(static_cast<std::uint32_t>(random.number(1, 40)),
                  static_cast<std::uint32_t>(random.number(1, 20)));
        bool outside = false;
        const Words expected = Plain::bilinear(src, dst.w(), dst.h(), origin, u, v, [&] {
            outside = true;
            return static_cast<unsigned short>(4711);
        });
        const Mapping mapping = bilinearInterpolationFixedpoint(src, dst, origin, u, v, true, 4711);
        ASSERT_EQ(dst, expected) << round;
        EXPECT_EQ(mapping(FNPos(0, 0)), origin);
        const auto strict = [&] { bilinearInterpolationFixedpoint(src, dst, origin, u, v, false, 4711); };
        EXPECT_EQ(thrownText<FNEBadArg>(strict),
                  outside ? "bilinearInterpolationFixedpoint: Invalid source pixels (but padding is "
                            "not allowed)!"
                          : "nothing thrown");
    }
}

TEST(Bilinear, ColorsAreSampledChannelByChannel) {
    forEachTarget([] {
        RandomImages random(8);
        for (int round = 0; round < 60; ++round) {
            const auto src = random.image<Fn::Bgra32>(random.number(1, 30), random.number(1, 30));
            const auto vector = [&] { return FN2Vector<float>(random.real(-30, 30), random.real(-30, 30)); };
            const FNPos origin(random.real(-5, 25), random.real(-5, 25));
            const FN2Vector<float> u = vector(), v = vector();
            FNImage<Fn::Bgra32> dst(static_cast<std::uint32_t>(random.number(1, 40)),
                                    static_cast<std::uint32_t>(random.number(1, 20)));
            bilinearInterpolationFixedpoint(src, dst, origin, u, v, true, {1, 2, 3});
            for (const auto channel : {&Fn::Bgra32::b, &Fn::Bgra32::g, &Fn::Bgra32::r}) {
                Words plane(src.w(), src.h());
                std::ranges::transform(src.span(), plane.getExclusive(),
                                       [&](const Fn::Bgra32& pixel) { return pixel.*channel; });
                const Words expected = Plain::bilinear(plane, dst.w(), dst.h(), origin, u, v, [&] {
                    return static_cast<unsigned short>(Fn::Bgra32(1, 2, 3).*channel);
                });
                for (std::uint64_t i = 0; i < dst.size(); ++i)
                    ASSERT_EQ(dst.data()[i].*channel, expected.data()[i]) << round << ", pixel " << i;
            }
            for (const Fn::Bgra32& pixel : dst.span()) ASSERT_EQ(pixel.a, 255);
        }
    });
}

/// One float sample by the rule for neighbours outside: a value inside along the same row or column, or the
/// only one.
float floatSample(const FNImage<float>& src, double x, double y, float background) {
    const double x0 = std::floor(x - 0.5), y0 = std::floor(y - 0.5), a = x - 0.5 - x0, b = y - 0.5 - y0;
    const auto inside = [&](double px, double py) {
        return px >= 0 && py >= 0 && px < src.w() && py < src.h();
    };
    double sum = 0;
    for (int j = 0; j < 2; ++j)
        for (int i = 0; i < 2; ++i) {
            FNPos p;
            bool found = false;
            for (const auto& [di, dj] : {std::pair(i, j), {1 - i, j}, {i, 1 - j}, {1 - i, 1 - j}})
                if (!found && inside(x0 + di, y0 + dj)) {
                    found = true;
                    p = FNPos(static_cast<float>(x0 + di), static_cast<float>(y0 + dj));
                }
            if (!found) return background;
            sum += (i ? a : 1 - a) * (j ? b : 1 - b) * static_cast<double>(src.get(FNGridPos(p)));
        }
    return static_cast<float>(sum);
}

TEST(Bilinear, FloatsFollowTheRuleForNeighboursOutside) {
    RandomImages random(8);
    forEachTarget([&] {
        for (int round = 0; round < 60; ++round) {
            const FNImage<float> src = random.image<float>(random.number(1, 30), random.number(1, 30));
            // Multiples of 2^-8, and sizes that are powers of two: positions are exact, so no sample is near
            // an edge.
            const auto exact = [&](float low, float high) {
                return std::round(random.real(low, high) * 256) / 256;
            };
            const FNPos origin(exact(-4, 20), exact(-4, 20));
            const FN2Vector<float> u(exact(-30, 30), exact(-9, 9)), v(exact(-9, 9), exact(-30, 30));
            FNImage<float> dst(32, 8);
            bilinearInterpolation(src, dst, origin, u, v, true, 7);
            for (std::uint32_t j = 0; j < dst.h(); ++j)
                for (std::uint32_t i = 0; i < dst.w(); ++i) {
                    const double x = origin.x + (i + 0.5) * u.x / 32 + (j + 0.5) * v.x / 8;
                    const double y = origin.y + (i + 0.5) * u.y / 32 + (j + 0.5) * v.y / 8;
                    ASSERT_NEAR(dst(i, j), floatSample(src, x, y, 7), 1e-5) << round << " " << i << " " << j;
                }
        }
    });
    const FNImage<float> src = random.image<float>(4, 4);
    FNImage<float> dst(4, 4);
    EXPECT_EQ(thrownText<FNEBadArg>([&] {
                  bilinearInterpolation(src, dst, {-3, 0}, {4, 0}, {0, 4}, false, 0);
              }),
              "DoBilinearInterpolation: Invalid source pixels (but padding is not allowed)!");
    bilinearInterpolation(src, dst, src.box());
    EXPECT_EQ(dst, src);
}

} // namespace
