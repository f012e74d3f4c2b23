#include "fn/image_conversion.h"
#include "support/each_target.h"

#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <vector>

namespace {

using Fn::Bgra32;
using Fn::convertPixel;
using Fn::Rgb48;
using Byte = unsigned char;
using Word = unsigned short;

TEST(Conversion, FollowsTheTable) {
    EXPECT_EQ(convertPixel<Word>(Byte{0}), 128);
    EXPECT_EQ(convertPixel<Word>(Byte{255}), 65408);
    EXPECT_EQ(convertPixel<float>(Byte{0}), 0.001953125f);
    EXPECT_EQ(convertPixel<float>(Byte{255}), 0.998046875f);
    EXPECT_EQ(convertPixel<Bgra32>(Byte{7}), Bgra32(7, 7, 7, 255));
    EXPECT_EQ(convertPixel<Rgb48>(Byte{1}), Rgb48(384, 384, 384));

    EXPECT_EQ(convertPixel<Byte>(Word{0x12FF}), 0x12);
    EXPECT_EQ(convertPixel<float>(Word{65535}), 65535 / 65536.0f + 1 / 131072.0f);
    EXPECT_EQ(convertPixel<Bgra32>(Word{0xFE80}), Bgra32(0xFE, 0xFE, 0xFE, 255));
    EXPECT_EQ(convertPixel<Rgb48>(Word{0xFE80}), Rgb48(0xFE80, 0xFE80, 0xFE80));

    EXPECT_EQ(convertPixel<Byte>(1.0f), 255);
    EXPECT_EQ(convertPixel<Byte>(0.5f), 128) << "127.5 + 0.5";
    EXPECT_EQ(convertPixel<Byte>(0.49f), 125) << "124.95 + 0.5";
    EXPECT_EQ(convertPixel<Word>(1.0f), 65535);
    EXPECT_EQ(convertPixel<Word>(0.25f), 16384) << "16383.75 + 0.5";
    EXPECT_EQ(convertPixel<Bgra32>(1.0f), Bgra32(255, 255, 255, 255));
    EXPECT_EQ(convertPixel<Rgb48>(0.0f), Rgb48(0, 0, 0));

    EXPECT_EQ(convertPixel<Byte>(Bgra32(255, 255, 255)), 254) << "the weights sum to 255";
    EXPECT_EQ(convertPixel<Byte>(Bgra32(10, 20, 30)), (760 + 3000 + 870) >> 8);
    EXPECT_EQ(convertPixel<Word>(Bgra32(10, 20, 30)), 760 + 3000 + 870 + 128);
    EXPECT_EQ(convertPixel<float>(Bgra32(10, 0, 0)), 10 * (0.299f / 256) + 1 / 512.0f);
    EXPECT_EQ(convertPixel<float>(Bgra32(0, 10, 0)), 10 * (0.587f / 256) + 1 / 512.0f);
    EXPECT_EQ(convertPixel<float>(Bgra32(0, 0, 10)), 10 * (0.114f / 256) + 1 / 512.0f);
    EXPECT_EQ(convertPixel<Rgb48>(Bgra32(1, 2, 3, 4)), Rgb48(384, 640, 896));
    EXPECT_EQ(convertPixel<Bgra32>(Bgra32(1, 2, 3, 4)), Bgra32(1, 2, 3, 4));

    EXPECT_EQ(convertPixel<Byte>(Rgb48(65535, 65535, 65535)), 65535 * 255 >> 16);
    EXPECT_EQ(convertPixel<Byte>(Rgb48(1000, 2000, 3000)), (76000 + 300000 + 87000) >> 16);
    EXPECT_EQ(convertPixel<Word>(Rgb48(1000, 2000, 3000)), (76000 + 300000 + 87000) >> 8);
    EXPECT_EQ(convertPixel<float>(Rgb48(0, 1000, 0)), 1000 * (0.587f / 65536) + 1 / 131072.0f);
    EXPECT_EQ(convertPixel<Bgra32>(Rgb48(0x1234, 0x5678, 0x9ABC)), Bgra32(0x12, 0x56, 0x9A, 255));
}

TEST(Conversion, WiderFormsReturnTheSameSample) {
    for (int v = 0; v < 256; ++v) {
        const auto byte = static_cast<Byte>(v);
        EXPECT_EQ(convertPixel<Byte>(convertPixel<Word>(byte)), byte);
        EXPECT_EQ(convertPixel<Byte>(convertPixel<float>(byte)), byte);
    }
    for (int v = 0; v < 65536; ++v) {
        const auto word = static_cast<Word>(v);
        ASSERT_EQ(convertPixel<Word>(convertPixel<float>(word)), word);
    }
}

TEST(Conversion, RealsOutsideOfTheRangeAreClipped) {
    const float infinity = std::numeric_limits<float>::infinity();
    const struct {
        float real;
        int byte, word;
    } cases[] = {{-0.1f, 0, 0},         {1.5f, 255, 65535}, {infinity, 255, 65535}, {-infinity, 0, 0},
                 {std::nanf(""), 0, 0}, {-0.0f, 0, 0},      {1e20f, 255, 65535}};
    for (const auto& c : cases) {
        EXPECT_EQ(convertPixel<Byte>(c.real), c.byte) << c.real;
        EXPECT_EQ(convertPixel<Word>(c.real), c.word) << c.real;
    }
}

/// Samples of all kinds: the ends of the range, and reals outside of it.
template <class T> T randomPixel(std::mt19937& random) {
    if constexpr (std::is_same_v<T, float>) {
        const float special[] = {
            0, 1, -1, 1.5f, std::nanf(""), 1e30f, -1e30f, std::numeric_limits<float>::infinity()};
        const unsigned n = random();
        return n % 8 == 0 ? special[n / 8 % 8] : static_cast<float>(random()) * 0x1p-32f;
    } else if constexpr (Fn::isColorPixel<T>) {
        using Sample = typename Fn::SampleOf<T>::Type;
        T p(randomPixel<Sample>(random), randomPixel<Sample>(random), randomPixel<Sample>(random));
        if constexpr (std::is_same_v<T, Bgra32>) p.a = randomPixel<Byte>(random);
        return p;
    } else {
        return random() % 4 ? static_cast<T>(random()) : random() % 2 ? std::numeric_limits<T>::max() : T{0};
    }
}

/// Whole rows against one pixel after the other, at every length up to a few vectors and from odd places.
template <class From, class To> void expectRowLikePixels() {
    std::mt19937 random(7);
    const std::size_t lengths[] = {0, 1, 2, 3, 5, 7, 8, 15, 16, 17, 31, 33, 63, 64, 65, 100, 127, 129, 1001};
    for (const std::size_t n : lengths) {
        std::vector<From> from(n + 1);
        for (From& p : from) p = randomPixel<From>(random);
        std::vector<To> to(n + 2, convertPixel<To>(Byte{77})), expected = to;
        Fn::convertPixels(from.data() + 1, to.data() + 1, n);
        for (std::size_t i = 0; i < n; ++i) expected[i + 1] = convertPixel<To>(from[i + 1]);
        EXPECT_EQ(to, expected) << n;
    }
}

template <class From, class... To> void expectRowsLikePixels() {
    (expectRowLikePixels<From, To>(), ...);
}

TEST(Conversion, RowsAreConvertedLikeSinglePixelsOnEveryInstructionSet) {
    forEachTarget([] {
        expectRowsLikePixels<Byte, Word, float, Bgra32, Rgb48>();
        expectRowsLikePixels<Word, Byte, float, Bgra32, Rgb48>();
        expectRowsLikePixels<float, Byte, Word, Bgra32, Rgb48>();
        expectRowsLikePixels<Bgra32, Byte, Word, float, Rgb48>();
        expectRowsLikePixels<Rgb48, Byte, Word, float, Bgra32>();
    });
}

} // namespace
