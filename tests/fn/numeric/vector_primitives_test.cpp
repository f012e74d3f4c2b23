#include "fn/numeric/vector_primitives.h"

#include "support/each_target.h"

#include <cmath>
#include <limits>
#include <numeric>
#include <random>
#include <vector>

namespace {

using namespace Fn;

// Below, at and above the width of every vector unit and of the partial sums, and an odd large one.
const std::vector<std::size_t> lengths{0, 1, 3, 7, 8, 15, 16, 17, 31, 32, 33, 63, 64, 65, 127, 1000, 20604};

template <class T> std::vector<T> randomVector(std::size_t n, unsigned seed) {
    std::mt19937 random(seed);
    std::vector<T> values(n);
    for (T& value : values) {
        if constexpr (std::is_floating_point_v<T>)
            value =
                std::ldexp(std::uniform_real_distribution<T>(-1, 1)(random), static_cast<int>(random() % 20));
        else
            value = static_cast<T>(random());
    }
    return values;
}

template <class T> void expectSameBitsAsPlainForm() {
    for (const std::size_t n : lengths) {
        SCOPED_TRACE(n);
        const auto a = randomVector<T>(n, 1), b = randomVector<T>(n, 2);
        std::vector<T> fast(n), plain(n);
        const auto expectSame = [&](const char* what) { EXPECT_EQ(fast, plain) << what; };
        Numeric::add(a.data(), b.data(), fast.data(), n);
        Numeric::Plain::add(a.data(), b.data(), plain.data(), n);
        expectSame("add");
        Numeric::subtract(a.data(), b.data(), fast.data(), n);
        Numeric::Plain::subtract(a.data(), b.data(), plain.data(), n);
        expectSame("subtract");
        Numeric::multiply(a.data(), b.data(), fast.data(), n);
        Numeric::Plain::multiply(a.data(), b.data(), plain.data(), n);
        expectSame("multiply");
        Numeric::scale(a.data(), T(0.1), fast.data(), n);
        Numeric::Plain::scale(a.data(), T(0.1), plain.data(), n);
        expectSame("scale");
        std::vector<T> squares(n);
        Numeric::Plain::multiply(a.data(), a.data(), squares.data(), n);
        Numeric::squareRoot(squares.data(), fast.data(), n);
        Numeric::Plain::squareRoot(squares.data(), plain.data(), n);
        expectSame("squareRoot");
        EXPECT_EQ(Numeric::dot(a.data(), b.data(), n), Numeric::Plain::dot(a.data(), b.data(), n));
        EXPECT_EQ(Numeric::sum(a.data(), n), Numeric::Plain::sum(a.data(), n));
    }
}

TEST(VectorPrimitives, GiveTheBitsOfThePlainFormOnEveryTarget) {
    forEachTarget([] {
        expectSameBitsAsPlainForm<float>();
        expectSameBitsAsPlainForm<double>();
    });
}

TEST(VectorPrimitives, PlainSumsAreSums) {
    const auto a = randomVector<float>(1000, 3), b = randomVector<float>(1000, 4);
    double dot = 0, sum = 0, magnitude = 0;
    for (std::size_t i = 0; i < a.size(); ++i) {
        dot += static_cast<double>(a[i]) * static_cast<double>(b[i]);
        sum += static_cast<double>(a[i]);
        magnitude += std::abs(static_cast<double>(a[i]) * static_cast<double>(b[i]));
    }
    EXPECT_NEAR(Numeric::Plain::dot(a.data(), b.data(), a.size()), dot, magnitude * 1e-6);
    EXPECT_DOUBLE_EQ(Numeric::Plain::sum(a.data(), a.size()), sum);
}

TEST(VectorPrimitives, WriteOverTheirInput) {
    forEachTarget([] {
        auto a = randomVector<float>(100, 5);
        const auto b = randomVector<float>(100, 6);
        std::vector<float> expected(100);
        Numeric::Plain::add(a.data(), b.data(), expected.data(), 100);
        Numeric::add(a.data(), b.data(), a.data(), 100);
        EXPECT_EQ(a, expected);
    });
}

TEST(VectorPrimitives, IntegerProductsAreExactOnEveryTarget) {
    forEachTarget([] {
        for (const std::size_t n : lengths) {
            SCOPED_TRACE(n);
            const auto a = randomVector<std::int16_t>(n, 7), b = randomVector<std::int16_t>(n, 8);
            const auto c = randomVector<std::int8_t>(n, 9);
            EXPECT_EQ(Numeric::dot(a.data(), b.data(), n), Numeric::Plain::dot(a.data(), b.data(), n));
            EXPECT_EQ(Numeric::dot(c.data(), b.data(), n), Numeric::Plain::dot(c.data(), b.data(), n));
        }
    });
}

TEST(VectorPrimitives, IntegerProductsOfTheExtremesDoNotWrap) {
    constexpr std::size_t n = 100003; // many times the run that fits a 32-bit lane
    constexpr std::int16_t extremes[] = {-32768, 32767};
    forEachTarget([&] {
        for (const std::int16_t x : extremes) {
            for (const std::int16_t y : extremes) {
                const std::vector<std::int16_t> a(n, x), b(n, y);
                EXPECT_EQ(Numeric::dot(a.data(), b.data(), n), std::int64_t{n} * x * y) << x << " " << y;
            }
            for (const std::int8_t y : {std::int8_t{-128}, std::int8_t{127}}) {
                const std::vector<std::int16_t> a(n, x);
                const std::vector<std::int8_t> b(n, y);
                EXPECT_EQ(Numeric::dot(b.data(), a.data(), n), std::int64_t{n} * x * y) << x << " " << +y;
            }
        }
    });
}

} // namespace
