#include "cmp/b7/encoder.h"
#include "cmp/dot_product16.h"

#include "support/each_target.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <random>

namespace {

using namespace Cmp::B7;
using Cmp::Implementation::ComponentBlockCollector;

std::vector<float> noise(std::size_t n, float deviation, unsigned seed) {
    std::mt19937 random(seed);
    std::normal_distribution<float> normal(0, deviation);
    std::vector<float> values(n);
    std::generate(values.begin(), values.end(), [&] { return normal(random); });
    return values;
}

std::vector<unsigned char> encoded(const Encoder& encoder, const std::vector<float>& components) {
    auto bytes = encoder.createEncodedType();
    encoder.encode(FloatingPointFeature{FNVector<float>(components), 3, 5}, bytes.data());
    return bytes;
}
FixedPointFeature fixed(const Encoder& encoder, const std::vector<float>& components) {
    FixedPointFeature feature = encoder.createRawFixedType();
    encoder.decode(encoded(encoder, components).data(), feature);
    return feature;
}
FloatingPointFeature decoded(const Encoder& encoder, const std::vector<float>& components) {
    FloatingPointFeature feature = encoder.createRawType();
    encoder.decode(encoded(encoder, components).data(), feature);
    return feature;
}

TEST(ComponentBlocks, PackCodesFromTheLowestBitsOn) {
    for (unsigned bits = 3; bits <= 8; ++bits) {
        SCOPED_TRACE(bits);
        const int n = 1 << (bits - 1);
        constexpr unsigned count = 23;
        ComponentBlockCollector collector;
        std::vector<ComponentBlockCollector::Group> groups;
        collector.registerBlock(bits, count, 0.5f);
        const auto block = collector.finalizeRegistration(groups).front();
        std::vector<float> components = noise(count, 0.3f, bits);
        components[0] = -100;
        components[1] = 100;
        components[2] = NAN;
        components[3] = 0;
        std::vector<unsigned char> bytes(block->size());
        block->encodeVector(components.data(), bytes.data());

        const unsigned codes = 32 / bits, width = bits == 7 ? 8 : bits;
        ASSERT_EQ(bytes.size(), 4 * ((count + codes - 1) / codes));
        std::vector<float> floats(count);
        block->decodeMem(bytes.data(), floats.data());
        std::vector<short> words(count);
        short* end = words.data();
        if (bits <= 5)
            block->decodeMemToWord(bytes.data(), end);
        else
            EXPECT_EQ(thrownBy([&] { block->decodeMemToWord(bytes.data(), end); }),
                      "FNEBadArg: decoding to word not implemented for this bitsize");
        for (unsigned i = 0; i < count; ++i) {
            const float x = std::isnan(components[i]) ? -100 : components[i];
            const int q = static_cast<int>(
                std::clamp(std::floor(x * static_cast<float>(n) / 0.5f), -float(n), float(n - 1)));
            std::uint32_t word;
            std::memcpy(&word, bytes.data() + i / codes * 4, 4);
            EXPECT_EQ(static_cast<int>(word >> width * (i % codes) & ((1u << bits) - 1)) - n, q) << i;
            EXPECT_NEAR(floats[i], (static_cast<float>(q) + 0.5f) * 0.5f / static_cast<float>(n), 1e-6f);
            // The factor 0.5 is 1 in the unit of the words.
            if (bits <= 5) {
                EXPECT_EQ(words[i], 2 * q + 1);
            }
        }
        std::uint32_t last;
        std::memcpy(&last, bytes.data() + bytes.size() - 4, 4);
        const unsigned used = width * ((count - 1) % codes + 1);
        if (used < 32) {
            EXPECT_EQ(last >> used, 0u);
        }
    }
    ComponentBlockCollector none;
    std::vector<ComponentBlockCollector::Group> groups;
    EXPECT_EQ(thrownBy([&] { none.finalizeRegistration(groups); }),
              "FNEBadArg: Finishing empty bit size block");
    for (const unsigned bits : {2u, 9u})
        EXPECT_EQ(thrownBy([&] { none.registerBlock(bits, 1, 1); }),
                  "FNEBadArg: Invalid bitsize in component block");
}

TEST(B7Encoder, HasTheSizesOfItsRecords) {
    const Encoder encoder;
    EXPECT_EQ(encoder.components(), 5912u);
    EXPECT_EQ(encoder.mementoSize(), 2728u);
    EXPECT_EQ(encoder.words(), 72u + 3312 + 2536);
    const std::vector<Encoder::Group> groups = {
        {66, 9.765625e-08, 10}, {3312, 3.90625e-07, 414}, {2534, 1.5625e-06, 318}};
    ASSERT_EQ(encoder.groups().size(), groups.size());
    for (std::size_t i = 0; i < groups.size(); ++i) {
        EXPECT_EQ(encoder.groups()[i].first, groups[i].first);
        EXPECT_DOUBLE_EQ(encoder.groups()[i].second, groups[i].second);
        EXPECT_EQ(encoder.groups()[i].third, groups[i].third);
    }
    const auto bytes = encoded(encoder, std::vector<float>(5912, 0.0f));
    float header[3];
    std::memcpy(header, bytes.data(), sizeof header);
    EXPECT_EQ(header[0], 3);
    EXPECT_EQ(header[1], 5);
    EXPECT_EQ(header[2], 1);
    const auto back = decoded(encoder, std::vector<float>(5912, 0.0f));
    EXPECT_EQ(back.mean, 3);
    EXPECT_EQ(back.stdDev, 5);
    EXPECT_FLOAT_EQ(back.vector[0], 0.5f * 1.67f / 16) << "0 is the lower end of a code";
    EXPECT_FLOAT_EQ(back.vector[5911], 0.5f * 0.35f / 4);
    EXPECT_EQ(thrownBy([&] { encoded(encoder, std::vector<float>(5911)); }),
              "FNEBadArg: PCLD: feature of 5911 components instead of 5912");
}

TEST(B7Encoder, GivesTheProductsOfDecodedFeaturesByWords) {
    const Encoder encoder;
    const std::vector<float> vectors[] = {noise(5912, 0.25f, 1), noise(5912, 0.6f, 2),
                                          std::vector<float>(5912, -100.0f), // lowest codes
                                          std::vector<float>(5912, 100.0f)}; // highest codes
    forEachTarget([&] {
        for (const auto& a : vectors)
            for (const auto& b : vectors) {
                const auto wa = fixed(encoder, a), wb = fixed(encoder, b);
                const auto fa = decoded(encoder, a), fb = decoded(encoder, b);
                double exact = 0, size = 0;
                for (std::size_t i = 0; i < 5912; ++i) {
                    exact += double{fa.vector[i]} * double{fb.vector[i]};
                    size += std::abs(double{fa.vector[i]} * double{fb.vector[i]});
                }
                const short *x = wa.vector.get(), *y = wb.vector.get();
                const float one = encoder.wordDotProduct(x, y);
                EXPECT_NEAR(one, exact, 1e-6 * size);
                float two[2], four[4];
                encoder.wordDotProduct(x, y, x, two);
                encoder.wordDotProduct(x, y, x, y, four);
                EXPECT_NEAR(two[0], one, 1e-6 * size);
                EXPECT_EQ(two[1], four[0]) << "x * x";
                EXPECT_EQ(two[0], four[1]) << "x * y";
                EXPECT_EQ(four[1], four[2]) << "y * x";
                EXPECT_NEAR(four[3], encoder.wordDotProduct(y, y), 1e-6 * four[3]) << "y * y";
            }
    });
}

TEST(DotProd16, IsExactInAllShapes) {
    std::mt19937 random(9);
    struct Case {
        unsigned n, maxSteps;
        int greatest;
    };
    // Of words up to 4096, 127 products fit; with the greatest ones of all, not even two do.
    const Case cases[] = {{0, 10, 100},  {8, 127, 4096},   {24, 127, 4096},  {5920, 127, 4096},
                          {72, 10, 100}, {5912, 1, 32768}, {5912, 2, 30000}, {5912, 0, 32768}};
    for (const Case& c : cases)
        for (const bool extreme : {false, true}) {
            std::vector<short> v[4];
            for (auto& x : v)
                for (unsigned i = 0; i < c.n; ++i)
                    x.push_back(static_cast<short>(
                        extreme ? -c.greatest
                                : static_cast<int>(random() % (2 * unsigned(c.greatest))) - c.greatest));
            const auto exact = [&](int a, int b) {
                long sum = 0;
                for (unsigned i = 0; i < c.n; ++i) sum += long{v[a][i]} * long{v[b][i]};
                return sum;
            };
            const short *x0 = v[0].data(), *x1 = v[1].data(), *y0 = v[2].data(), *y1 = v[3].data();
            forEachTarget([&] {
                long two[2], four[4];
                Cmp::dotProd16x2(x0, x1, y0, c.n, c.maxSteps, two);
                Cmp::dotProd162x2(x0, x1, y0, y1, c.n, c.maxSteps, four);
                EXPECT_EQ(Cmp::dotProd16(x0, y0, c.n, c.maxSteps), exact(0, 2));
                EXPECT_EQ(two[0], exact(0, 2));
                EXPECT_EQ(two[1], exact(1, 2));
                EXPECT_EQ(four[0], exact(0, 2));
                EXPECT_EQ(four[1], exact(0, 3));
                EXPECT_EQ(four[2], exact(1, 2));
                EXPECT_EQ(four[3], exact(1, 3));
            });
        }
}

} // namespace
