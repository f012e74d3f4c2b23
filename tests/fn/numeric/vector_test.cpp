#include "fn/vector.h"

#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

namespace {

template <class T> FNVector<T> vectorOf(const std::vector<T>& values) {
    return FNVector<T>(values);
}

template <class V> class VectorOfAnyElement : public testing::Test {};
using Elements = testing::Types<short, int, unsigned int, unsigned long, float, double, FNComplex<float>,
                                FNComplex<double>, FNGridPos>;
TYPED_TEST_SUITE(VectorOfAnyElement, Elements);

template <class T> FNVector<T> counting(std::size_t n) {
    FNVector<T> result(n);
    for (std::size_t i = 0; i < n; ++i) {
        if constexpr (requires(T t) { t.re; })
            result[i] = T{static_cast<decltype(T::re)>(i), static_cast<decltype(T::re)>(1)};
        else if constexpr (std::is_same_v<T, FNGridPos>)
            result[i] = FNGridPos(static_cast<int>(i), -1);
        else
            result[i] = static_cast<T>(i);
    }
    return result;
}

TYPED_TEST(VectorOfAnyElement, AddsAndSubtracts) {
    const auto a = counting<TypeParam>(70);
    EXPECT_EQ(a + a - a, a);
    auto b = a;
    b += a;
    EXPECT_EQ(b, a + a);
    EXPECT_EQ(b[69], a[69] + a[69]);
    b -= a;
    EXPECT_EQ(b, a);
}

TYPED_TEST(VectorOfAnyElement, SurvivesItsPackage) {
    const auto a = counting<TypeParam>(5);
    const Fn::Package package(a);
    ASSERT_EQ(package.cores().size(), 2u);
    EXPECT_EQ(FNVector<TypeParam>(package), a);
    EXPECT_TRUE(FNVector<TypeParam>(Fn::Package(FNVector<TypeParam>(0))).empty());
}

TYPED_TEST(VectorOfAnyElement, RefusesOtherPackages) {
    using V = FNVector<TypeParam>;
    const auto cores = Fn::Package(counting<TypeParam>(5)).cores();
    const std::string invalid = "converting to Vector<T> from an invalid package";
    EXPECT_EQ(thrownText<FNEBadArg>([] { V(Fn::Package()); }), invalid);
    EXPECT_EQ(thrownText<FNEBadArg>([] { V(Fn::Package(3)); }), invalid);
    const std::string contradiction = "T-vector dimensions contradicts packages dimension";
    const auto withData = [&](std::size_t bytes) {
        return Fn::Package(std::list<Fn::Package::Core>{cores.front(), Fn::Package::Core(bytes)});
    };
    EXPECT_EQ(thrownText<FNEBadArg>([&] { V(withData(cores.back().size() + 1)); }), contradiction);
    EXPECT_EQ(thrownText<FNEBadArg>([&] { V(withData(0)); }), contradiction);
}

TEST(Vector, CopyChangedAfterwardsLeavesTheFirstUnchanged) {
    const auto a = vectorOf<float>({1, 2, 3});
    auto b = a;
    EXPECT_EQ(a.get(), b.get());
    b[0] = 7;
    EXPECT_EQ(a[0], 1);
    EXPECT_EQ(b[0], 7);
}

TEST(Vector, StoresSixteenBitsMostSignificantFirst) {
    const auto cores = Fn::Package(vectorOf<short>({1, -2})).cores();
    const unsigned char count[] = {0, 0, 0, 2}, elements[] = {0, 1, 0xFF, 0xFE};
    EXPECT_TRUE(std::equal(cores.front().begin(), cores.front().end(), count));
    EXPECT_TRUE(std::equal(cores.back().begin(), cores.back().end(), elements));
}

TEST(Vector, ScalarProductsHaveTheWidthOfTheirType) {
    // 2^16 times 2^16 wraps to 0 in 32 bits; the sum of two products of 2^30 needs more than 32.
    EXPECT_EQ(vectorOf<int>({65536, 1 << 15, 1 << 15}) * vectorOf<int>({65536, 1 << 15, 1 << 15}), 1LL << 31);
    EXPECT_EQ(vectorOf<short>({-32768, -32768, -32768}) * vectorOf<short>({-32768, -32768, -32768}),
              3LL << 30);
    using C = FNComplex<float>;
    EXPECT_EQ(vectorOf<C>({{1, 2}, {0, 1}}) * vectorOf<C>({{3, 4}, {0, 1}}),
              (C{12, -2})); // first one conjugated
}

TEST(Vector, SumsChunksInDouble) {
    // In float alone, 1 added to 2^24 is lost; here the last two elements are a chunk of their own.
    FNVector<float> a(0x100000 + 2, 0.0f);
    a[0] = 16777216.0f;
    a[0x100000] = 1;
    a[0x100001] = 1;
    EXPECT_EQ(a.sum(), 16777218.0f);
    EXPECT_EQ(a * FNVector<float>(a.size(), 1.0f), 16777218.0f);
}

TEST(Vector, ScalesAndCombines) {
    auto a = vectorOf<double>({1, 2, 4});
    EXPECT_EQ(a * 2.0 / 4.0, vectorOf<double>({0.5, 1, 2}));
    a.linear_add(0.5, vectorOf<double>({2, 2, 2}));
    EXPECT_EQ(a, vectorOf<double>({2, 3, 5}));
    EXPECT_EQ(FNVector<double>::componentMult(a, a), a.componentSqr());
    EXPECT_EQ(a.componentSqr().componentSqrt(), a);
    EXPECT_NEAR(a.componentTanh()[0], 0.9640275800758169, 1e-15);
    FNVector<double>::componentMultI(a, a);
    EXPECT_EQ(a, vectorOf<double>({4, 9, 25}));
    using C = FNComplex<double>;
    EXPECT_EQ(vectorOf<C>({{0, 2}}) / C(0, 1), vectorOf<C>({{2, 0}}));
    EXPECT_EQ(vectorOf<int>({7, std::numeric_limits<int>::min()}) / -1,
              vectorOf<int>({-7, std::numeric_limits<int>::min()}));
}

TEST(Vector, StandardDeviationIsThatOfASample) {
    double mean = 0;
    EXPECT_NEAR(vectorOf<float>({2, 4, 4, 4, 5, 5, 7, 9}).stdDeviation(mean), std::sqrt(32.0 / 7), 1e-12);
    EXPECT_DOUBLE_EQ(mean, 5);
    EXPECT_EQ(vectorOf<float>({0.1f, 0.1f}).stdDeviation(mean), 0);
    EXPECT_EQ(thrownText<FNEBadArg>([&] { vectorOf<float>({1}).stdDeviation(mean); }),
              "Vector<>: stdDeviation: Size < 2");
}

TEST(Vector, NamesWhatDoesNotFit) {
    const FNVector<float> f3(3, 1.0f), f2(2, 1.0f);
    auto own = f3;
    const auto text = [](auto call) { return thrownText<FNEBadArg>(call); };
    EXPECT_EQ(text([&] { own += f2; }), "Vector<>: Assigning Vector<T>: Wrong dimensions");
    EXPECT_EQ(text([&] { own -= f2; }), "Vector<>: Assigning Vector<T>: Wrong dimensions");
    EXPECT_EQ(text([&] { f3 + f2; }), "Vector<>: Vector<T> +: Wrong dimensions");
    EXPECT_EQ(text([&] { f3 - f2; }), "Vector<>: Vector<T> -: Wrong dimensions");
    EXPECT_EQ(text([&] { own.linear_add(1, f2); }),
              "Vector<>: Linear Adding Vector<float>: Wrong dimensions");
    EXPECT_EQ(text([&] { FNVector<float>::componentMult(f3, f2); }),
              "Vector<>: componentMult: Wrong dimensions");
    EXPECT_EQ(text([&] { FNVector<float>::componentMultI(own, f2); }),
              "Vector<>: componentMultI: Wrong dimensions");
    EXPECT_EQ(text([&] { own /= 0; }), "Vector<>: Vector<T>::operator/=(): Dividing by 0");
    EXPECT_EQ(text([&] { f3* f2; }), "Vector<float>: Scalar product: Wrong dimensions ");
    EXPECT_EQ(text([&] { FNVector<double>(3) * FNVector<double>(2); }),
              "Vector<double>: Scalar product: Wrong dimensions ");
    EXPECT_EQ(text([&] { FNVector<short>(3) * FNVector<short>(2); }),
              "Vector<FNInt16>: Scalar product: Wrong dimensions ");
    EXPECT_EQ(text([&] { FNVector<int>(3) * FNVector<int>(2); }),
              "Vector<>: Scalar product: Wrong dimensions (3, 2)");
    EXPECT_EQ(text([&] { FNVector<FNComplex<float>>(3) * FNVector<FNComplex<float>>(2); }),
              "Vector<>: Scalar product: Wrong dimensions");
    EXPECT_EQ(own, f3);
}

} // namespace
