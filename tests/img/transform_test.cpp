#include "img/affine/primitives.h"
#include "img/affine/transform.h"

#include "random_images.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <cmath>

namespace {

using namespace Img::Affine;
using Words = FNImage<unsigned short>;
using Color = FNImage<Fn::Bgra32>;

TEST(Mapping, ComposesAndInverts) {
    const Mapping a{1, 2, -0.5f, 4, 10, -3}, b{0.5f, -1, 3, 2, 7, 1};
    const FNPos p(3, -8), q = b(a(p)), r = a.compose(b)(p), s = a.inverse()(a(p));
    EXPECT_NEAR(q.x, r.x, 1e-4);
    EXPECT_NEAR(q.y, r.y, 1e-4);
    EXPECT_NEAR(s.x, p.x, 1e-5);
    EXPECT_NEAR(s.y, p.y, 1e-5);
    EXPECT_THROW(Mapping::scaling(0, 1).inverse(), FNEBadArg);
}

TEST(ScaleTransform, OfAnImageAtItsOwnSizeSharesThePixels) {
    const auto check = [](const auto& src) {
        auto dst = std::remove_cvref_t<decltype(src)>(src.w(), src.h());
        EXPECT_EQ(transform(src, dst), Mapping());
        EXPECT_EQ(dst.data(), src.data());
    };
    RandomImages random(1);
    check(random.image<unsigned char>(7, 5));
    check(random.image<unsigned short>(7, 5));
    check(random.image<float>(7, 5));
    check(random.image<Fn::Bgra32>(7, 5));
}

/// The result of transform for a box equals that of a primitive.
template <class T, class Primitive>
void expectMethod(int boxSize, std::uint32_t dstSize, Primitive primitive) {
    RandomImages random(2);
    const FNImage<T> src = random.image<T>(200, 199);
    const FNBox box{3, 2, 3 + boxSize, 2 + boxSize};
    FNImage<T> dst(dstSize, dstSize), expected(dstSize, dstSize);
    EXPECT_EQ(transform(src, dst, box), primitive(src, expected, box));
    EXPECT_EQ(dst, expected) << boxSize << " to " << dstSize;
}

TEST(ScaleTransform, ChoosesTheMethodByTheFactor) {
    using namespace Primitives;
    const auto finely = [](auto&... args) { return destinationAlignedFractionalAveraging(args...); };
    const auto coarsely = [](auto&... args) { return sourceAlignedFractionalAveraging(args...); };
    const auto integers = [](auto&... args) { return integerAveraging(args...); };
    const auto fixed = [](auto&... args) { return bilinearInterpolationFixedpoint(args...); };
    const auto floating = [](auto&... args) { return bilinearInterpolation(args...); };
    expectMethod<unsigned short>(60, 61, fixed);
    expectMethod<unsigned short>(60, 60, finely);
    expectMethod<unsigned short>(60, 40, finely);
    expectMethod<unsigned short>(60, 30, coarsely);
    expectMethod<unsigned short>(60, 20, coarsely);
    expectMethod<unsigned short>(180, 23, coarsely);
    expectMethod<unsigned short>(180, 22, integers);
    expectMethod<unsigned short>(180, 20, integers);
    expectMethod<float>(60, 61, floating);
    expectMethod<float>(60, 40, coarsely);
    expectMethod<float>(180, 20, integers);
    expectMethod<Fn::Bgra32>(60, 61, fixed);
    expectMethod<Fn::Bgra32>(60, 40, coarsely);
    expectMethod<Fn::Bgra32>(180, 20, integers);
}

TEST(ScaleTransform, TreatsBytesAsTheHighBytesOfWords) {
    RandomImages random(3);
    const FNImage<unsigned char> src = random.image<unsigned char>(50, 40);
    Words words(50, 40);
    for (std::uint64_t i = 0; i < src.size(); ++i)
        words.getExclusive()[i] = static_cast<unsigned short>(src.data()[i] << 8 | 128);
    for (const std::uint32_t size : {60u, 30u, 10u, 4u}) {
        FNImage<unsigned char> dst(size, size);
        Words expected(size, size);
        EXPECT_EQ(transform(src, dst), transform(words, expected));
        for (std::uint64_t i = 0; i < dst.size(); ++i) ASSERT_EQ(dst.data()[i], expected.data()[i] >> 8);
        transform(src, dst, {-4, 2}, {30, 20}, {-5, 30}, true, 77);
        transform(words, expected, {-4, 2}, {30, 20}, {-5, 30}, true, 77 << 8 | 128);
        for (std::uint64_t i = 0; i < dst.size(); ++i) ASSERT_EQ(dst.data()[i], expected.data()[i] >> 8);
    }
}

TEST(ScaleTransform, LeavesEmptyResultsEmpty) {
    Words src(4, 4), dst;
    src.fill(1);
    EXPECT_NO_THROW(transform(src, dst));
    EXPECT_NO_THROW(transform(src, dst, {0, 0}, {4, 0}, {0, 4}, false, 0));
    EXPECT_TRUE(dst.empty());
    Words two(2, 2);
    EXPECT_THROW(transform(Words(), two), FNEBadArg);
}

// Of an image whose brightness is a plane, every cut-out is known: the plane at the middle of each result
// pixel.
constexpr float slopeX = 0.0015f, slopeY = 0.0007f;
float plane(FNPos p) {
    return 0.1f + slopeX * p.x + slopeY * p.y;
}
template <class T> T pixelOf(float v) {
    if constexpr (std::is_same_v<T, float>)
        return v;
    else if constexpr (std::is_same_v<T, unsigned short>)
        return static_cast<T>(v * 65536);
    else {
        const auto byte = static_cast<unsigned char>(v * 256);
        return {byte, byte, byte};
    }
}
template <class T> float valueOf(T pixel) {
    if constexpr (std::is_same_v<T, float>)
        return pixel;
    else if constexpr (std::is_same_v<T, unsigned short>)
        return (static_cast<float>(pixel) + 0.5f) / 65536;
    else
        return (static_cast<float>(pixel.g) + 0.5f) / 256;
}

struct CutOutCase {
    const char* name;
    FNPos origin;
    FN2Vector<float> u, v;
    std::uint32_t w, h;
};
const CutOutCase cutOuts[] = {
    {"enlarged", {40, 50}, {20, 7}, {-6, 19}, 64, 60},
    {"about 1:1", {40, 50}, {60, 7}, {-6, 59}, 58, 60},
    {"halved", {60, 30}, {100, 40}, {-40, 100}, 50, 50},
    {"a third across, two thirds down", {60, 30}, {150, 10}, {-5, 75}, 50, 50},
    {"a seventh", {90, 10}, {160, 70}, {-70, 160}, 25, 25},
    {"a twelfth, upside down", {280, 250}, {-240, -20}, {20, -220}, 20, 19},
    {"mirrored", {290, 20}, {-250, 10}, {10, 250}, 40, 40},
};

template <class T> void checkCutOuts(float tolerance) {
    FNImage<T> src(300, 280);
    for (FNImIter<T> it(src, src.box()); !it.atEnd(); ++it)
        *it = pixelOf<T>(plane(FNPos(static_cast<float>(it.x()) + 0.5f, static_cast<float>(it.y()) + 0.5f)));
    for (const CutOutCase& c : cutOuts) {
        SCOPED_TRACE(c.name);
        FNImage<T> dst(c.w, c.h);
        const Mapping mapping = transform(src, dst, c.origin, c.u, c.v, false, T{});
        const auto w = static_cast<float>(c.w), h = static_cast<float>(c.h);
        for (const auto& [p, expected] :
             {std::pair(FNPos(0, 0), c.origin), std::pair(FNPos(w, 0), c.origin + c.u),
              std::pair(FNPos(0, h), c.origin + c.v)}) {
            EXPECT_NEAR(mapping(p).x, expected.x, 2e-3);
            EXPECT_NEAR(mapping(p).y, expected.y, 2e-3);
        }
        for (std::uint32_t y = 0; y < c.h; ++y)
            for (std::uint32_t x = 0; x < c.w; ++x) {
                const FNPos p = mapping({static_cast<float>(x) + 0.5f, static_cast<float>(y) + 0.5f});
                ASSERT_NEAR(valueOf(dst(x, y)), plane(p), tolerance) << x << " " << y;
            }
    }
}

TEST(CutOut, ShowsWhatLiesThere) {
    checkCutOuts<float>(3e-4f);
    checkCutOuts<unsigned short>(4e-4f);
    checkCutOuts<Fn::Bgra32>(2.5f / 256); // each of up to four steps drops a fraction
}

TEST(CutOut, ReducesFirstOnlyIfBothFactorsAreAbove2) {
    RandomImages random(4);
    const Words src = random.image<unsigned short>(120, 90);
    const FNPos origin(10, 12);
    const FN2Vector<float> u(60, 4), v(-3, 30);
    Words dst(20, 20), samples(61, 31), expected(20, 20); // factors of 3 and 1.5
    const Mapping mapping = transform(src, dst, origin, u, v, true, 5);
    const Mapping toSource = Primitives::bilinearInterpolationFixedpoint(src, samples, origin, u, v, true, 5);
    EXPECT_EQ(mapping, transform(samples, expected).compose(toSource));
    EXPECT_EQ(dst, expected);
}

TEST(CutOut, FillsWhatLiesOutside) {
    Words src(40, 40);
    src.fill(60000);
    const Mapping mapping = [&] {
        Words dst(8, 8);
        const Mapping m = transform(src, dst, {100, 100}, {80, 0}, {0, 80}, true, 1234);
        EXPECT_EQ(std::count(dst.data(), dst.data() + 64, 1234), 64);
        return m;
    }();
    EXPECT_EQ(mapping, Mapping::scaling(10, 10, {100, 100}));

    for (const float side : {4.0f, 16.0f, 80.0f}) {
        Words dst(8, 8);
        // The image's left edge runs through the middle of the result.
        transform(src, dst, {-side / 2, 4}, {side, 0}, {0, side / 3}, true, 100);
        for (std::uint32_t y = 0; y < 8; ++y) {
            EXPECT_NEAR(dst(0, y), 100, 3) << side;
            EXPECT_GE(dst(7, y), 59990) << side;
        }
        EXPECT_THROW(transform(src, dst, {-side / 2, 4}, {side, 0}, {0, side / 3}, false, 100), FNEBadArg);
    }
    Words dst(8, 8);
    EXPECT_EQ(thrownText<FNEBadArg>([&] {
                  transform(src, dst, {100, 100}, {80, 0}, {0, 80}, false, 0);
              }),
              "transform: padding required for this transformation but not allowed!");
}

TEST(CutOut, OfColoursIsOpaque) {
    RandomImages random(5);
    const Color src = random.image<Fn::Bgra32>(40, 40); // of any alpha
    for (const float side : {6.0f, 12.0f, 80.0f})
        for (const float x : {-4.0f, 100.0f}) { // partly and wholly outside
            Color dst(8, 8);
            transform(src, dst, {x, 5}, {side, 1}, {-1, side}, true, Fn::Bgra32(1, 2, 3, 4));
            for (std::uint64_t i = 0; i < dst.size(); ++i)
                ASSERT_EQ(dst.data()[i].a, 255) << side << " " << x;
        }
}

TEST(CutOut, RefusesWhatCannotBeSampled) {
    Words src(10, 10), dst(4, 4);
    src.fill(0);
    const float inf = std::numeric_limits<float>::infinity(), nan = std::numeric_limits<float>::quiet_NaN();
    EXPECT_THROW(transform(src, dst, {nan, 0}, {4, 0}, {0, 4}, true, 0), FNEBadArg);
    EXPECT_THROW(transform(src, dst, {0, 0}, {inf, 0}, {0, 4}, true, 0), FNEBadArg);
    EXPECT_THROW(transform(src, dst, {0, 0}, {1e9f, 0}, {0, 4}, true, 0), FNEBadArg)
        << "would take 4e9 samples";
    EXPECT_NO_THROW(transform(src, dst, {-1e9f, -1e9f}, {2e9f, 0}, {0, 2e9f}, true, 0)) << "reduced first";
    EXPECT_NO_THROW(transform(src, dst, {0, 0}, {9, 0}, {0, 0}, true, 0)) << "without area";
}

} // namespace
