#include "fn/sign_value_vector.h"

#include "fn/numeric/sign_bits.h"
#include "support/each_target.h"
#include "support/thrown_text.h"

#include <random>
#include <vector>

namespace {

using Signs = Fn::SignValueVector<int>;

Signs randomSigns(std::uint32_t n, unsigned seed) {
    std::mt19937 random(seed);
    Fn::SVVectorSequentialBuilder<int> builder(n);
    while (builder.position() < n) builder.setNextSign(random() & 1);
    return builder.vector();
}

TEST(SignValueVector, ProductIsThatOfTheValuesOnEveryTarget) {
    forEachTarget([] {
        for (const std::uint32_t n :
             {0u, 1u, 7u, 8u, 9u, 63u, 64u, 511u, 512u, 513u, 2048u, 2460u, 7072u, 40001u}) {
            const Signs a = randomSigns(n, 1), b = randomSigns(n, 2);
            int expected = 0;
            for (std::uint32_t i = 0; i < n; ++i) expected += a[i] * b[i];
            EXPECT_EQ(a * b, expected) << n;
            EXPECT_EQ(a * a, static_cast<int>(n));
        }
    });
}

TEST(SignValueVector, CountsDifferingBitsOfUnalignedBytesLikeTheTable) {
    std::mt19937 random(3);
    std::vector<unsigned char> a(5000), b(5000);
    for (auto& byte : a) byte = static_cast<unsigned char>(random());
    for (auto& byte : b) byte = static_cast<unsigned char>(random());
    std::fill(a.begin() + 1000, a.begin() + 4000, static_cast<unsigned char>(0)); // counts of 8 in every byte
    std::fill(b.begin() + 1000, b.begin() + 4000, static_cast<unsigned char>(0xFF));
    forEachTarget([&] {
        for (std::size_t offset = 0; offset < 3; ++offset)
            for (const std::size_t n : {0, 1, 63, 64, 65, 200, 4997})
                EXPECT_EQ(Fn::Numeric::differingBits(a.data() + offset, b.data() + 2, n),
                          Fn::Numeric::Plain::differingBits(a.data() + offset, b.data() + 2, n));
    });
}

TEST(SignValueVector, BuilderFillsFromTheLowestBitAndNoFurtherThanTheEnd) {
    Fn::SVVectorSequentialBuilder<int> builder(10);
    builder.setNextSignPositive();
    builder.setNextSignNegative();
    builder.setNextSignPositive();
    while (builder.position() < 9) builder.setNextSignNegative();
    builder.setNextSignPositive();
    EXPECT_EQ(builder.vector().bytes()[0], 5);
    EXPECT_EQ(builder.vector().bytes()[1], 2);
    EXPECT_THROW(builder.setNextSignPositive(), FNEOutOfRange);
}

TEST(SignValueVector, PacksSizeAndBytes) {
    const Signs signs = randomSigns(13, 4);
    const Fn::Package package(signs);
    const unsigned char size[] = {0, 0, 0, 13};
    ASSERT_EQ(package.cores().size(), 2u);
    EXPECT_TRUE(std::equal(size, size + 4, package.cores().front().begin()));
    EXPECT_EQ(package.cores().back().size(), 2u);
    EXPECT_EQ(Signs(package), signs);
}

TEST(SignValueVector, BitsBehindTheLastValueDoNotCount) {
    Fn::Package::Core size(4), bits(2);
    std::copy_n("\0\0\0\x09", 4, size.getExclusive());
    std::copy_n("\xFF\xFF", 2, bits.getExclusive());
    const Signs read(Fn::Package(std::list<Fn::Package::Core>{size, bits}));
    EXPECT_EQ(read * read, 9);
    EXPECT_EQ(read * Signs(9), -9);
    EXPECT_EQ(bits[1], 0xFF); // the package keeps what it had
}

TEST(SignValueVector, NamesWhatDoesNotFit) {
    EXPECT_EQ(thrownText<FNEBadArg>([] { Signs(8) * Signs(9); }),
              "Fn::SignValueVector::dotProduct: inequal sizes of vectors 8 and 9!");
    EXPECT_EQ(thrownText<FNEBadArg>([] { Signs{Fn::Package(1)}; }),
              "SignValueVector: construction from invalid package");
    Fn::Package::Core size(4);
    std::copy_n("\xFF\xFF\xFF\xFF", 4, size.getExclusive());
    const Fn::Package absurd(std::list<Fn::Package::Core>{size, Fn::Package::Core(3)});
    EXPECT_EQ(thrownText<FNEBadArg>([&] { Signs{absurd}; }),
              "SignValueVector: construction from package: the size [4294967295] of the vector contradicts "
              "the number "
              "of bytes found in the package.( expected:536870912, found:3)");
}

} // namespace
