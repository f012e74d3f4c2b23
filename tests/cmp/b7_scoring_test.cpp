#include "cmp/b7/packed_scoring.h"
#include "cmp/b7/scoring.h"
#include "cmp/strategy.h"
#include "support/b7_setup.h"
#include "support/each_target.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cstring>
#include <limits>

namespace {

using namespace Cmp::B7;
using Cmp::FIR;
using Packed = std::vector<unsigned char>;

/// Features of noise, and of the least and greatest codes.
std::vector<Packed> extremeFeatures(const Encoder& encoder) {
    std::mt19937 random(1);
    std::normal_distribution<float> normal(0, 0.4f);
    const std::vector<std::function<float(std::size_t)>> kinds = {
        [](std::size_t) { return -100.0f; },
        [](std::size_t) { return 100.0f; },
        [](std::size_t i) { return i % 2 == 0 ? -100.0f : 100.0f; },
        [&](std::size_t) { return normal(random); },
        [&](std::size_t) { return normal(random); },
        [](std::size_t i) { return i % 7 == 0 ? 100.0f : 0.01f; },
        [&](std::size_t) { return normal(random); }};
    std::vector<Packed> features;
    for (const auto& kind : kinds) {
        FloatingPointFeature feature = encoder.createRawType();
        for (std::size_t i = 0; i < encoder.components(); ++i) feature.vector.getExclusive()[i] = kind(i);
        features.push_back(encoder.createEncodedType());
        encoder.encode(feature, features.back().data());
    }
    // Bits that no code uses count for nothing.
    Packed dirty = features.back();
    for (std::size_t at = 12 + 4 * (11 + 414); at < dirty.size(); at += 4) dirty[at + 3] |= 0xc0;
    dirty.back() |= 0xf0;
    features.push_back(dirty);
    return features;
}

TEST(PackedProducts, AreThoseOfWordsOnAllVectorUnits) {
    const Encoder encoder;
    const std::vector<Packed> features = extremeFeatures(encoder);
    std::vector<FixedPointFeature> words;
    std::vector<const unsigned char*> codes;
    for (const Packed& feature : features) {
        words.push_back(encoder.createRawFixedType());
        encoder.decode(feature.data(), words.back());
        codes.push_back(feature.data() + Encoder::headerSize);
    }
    forEachTarget([&] {
        for (std::size_t n = 1; n <= codes.size(); ++n) {
            const auto probes = encoder.packedProducts().prepare({codes.data(), n});
            for (std::size_t g = 0; g < features.size(); ++g) {
                std::vector<PackedProducts::Sums> sums(n);
                encoder.packedProducts().sums(codes[g], probes, sums.data(), codes[0]);
                for (std::size_t p = 0; p < n; ++p) {
                    const short *a = words[g].vector.get(), *b = words[p].vector.get();
                    for (std::size_t group = 0; group < 3; ++group) {
                        const std::size_t size = (encoder.groups()[group].first + 7) / 8 * 8;
                        std::int64_t sum = 0;
                        for (std::size_t i = 0; i < size; ++i) sum += int{a[i]} * int{b[i]};
                        ASSERT_EQ(sums[p][group], sum) << n << " " << g << " " << p << " " << group;
                        a += size;
                        b += size;
                    }
                    float quarters[4];
                    encoder.wordDotProduct(words[g].vector.get(), words[g].vector.get(),
                                           words[p].vector.get(), words[p].vector.get(), quarters);
                    ASSERT_EQ(encoder.productByGroups(sums[p]), quarters[3]);
                    ASSERT_EQ(encoder.product(sums[p]),
                              encoder.wordDotProduct(words[g].vector.get(), words[p].vector.get()));
                }
            }
        }
    });
}

TEST(PackedProducts, RefuseBlocksThatTheyCannotMultiply) {
    using Cmp::Implementation::ComponentBlockCollector;
    const auto thrown = [](const std::vector<std::tuple<unsigned, unsigned, float>>& blocks) {
        ComponentBlockCollector collector;
        std::vector<ComponentBlockCollector::Group> groups;
        for (const auto& [bits, count, factor] : blocks) collector.registerBlock(bits, count, factor);
        const auto made = collector.finalizeRegistration(groups);
        return thrownBy([&] { PackedProducts products(made); });
    };
    EXPECT_EQ(thrown({{6, 100, 1}}), "FNEBadArg: Products of blocks of other bits");
    EXPECT_EQ(thrown({{3, 100, 1}}), "FNEBadArg: Products of features that are too short");
    EXPECT_EQ(thrown({{3, 160, 1}}), "nothing thrown");
    EXPECT_EQ(thrown({{4, 128, 1}, {4, 128, 1.99f}}), "FNEBadArg: Products of features do not fit");
}

/// A record of some of the features.
FIR record(const Cmp::RecordBuilder& builder, const std::vector<Packed>& features,
           const std::vector<std::size_t>& which) {
    Packed flat(4);
    const auto count = static_cast<std::uint32_t>(which.size());
    std::memcpy(flat.data(), &count, 4);
    for (const std::size_t i : which) flat.insert(flat.end(), features[i].begin(), features[i].end());
    unsigned char* memory = flat.data();
    const FIR borrowed = builder->createFromMemento(memory);
    return builder->create(borrowed.serialize()); // outlives the memory
}

using B7Search = B7Setup;

TEST_F(B7Search, GivesTheScoresOfDecodedFeaturesBitForBit) {
    const Encoder encoder;
    std::vector<Packed> features = extremeFeatures(encoder);
    const float header[] = {0.25f, 3.0f};
    std::memcpy(features[4].data(), header, sizeof header); // a mean and a deviation that count
    std::vector<FixedPointFeature> words;
    for (const Packed& feature : features) {
        words.push_back(encoder.createRawFixedType());
        encoder.decode(feature.data(), words.back());
    }
    using Which = std::vector<std::size_t>;
    const std::vector<Which> probes = {{3}, {4, 6, 5}, {}, {0, 1, 2, 3, 4}, {4}};
    const std::vector<Which> people = {{6}, {5, 4, 3}, {4}, {}, {1, 2}, {0}, {6, 5, 4, 3, 2}, {3, 3}, {4}};
    for (const bool two : {true, false}) {
        const auto made = algorithm(two ? "" : "X.ProcessTwoItemsAtOnce = false\n");
        const Cmp::RecordBuilder builder = made->createRecordBuilder();
        Cmp::Population population = made->createPopulation(0);
        std::vector<FIR> probeRecords;
        std::vector<FixedPointFeatures> probeWords;
        std::vector<const short*> flatProbes;
        std::vector<std::size_t> counts;
        for (const Which& which : probes) {
            probeRecords.push_back(record(builder, features, which));
            probeWords.emplace_back();
            for (const std::size_t i : which) {
                probeWords.back().push_back(words[i]);
                flatProbes.push_back(words[i].vector.get());
            }
            counts.push_back(which.size());
        }
        for (const Which& which : people) population.add(record(builder, features, which), "x");
        const auto walks =
            made->prepareFew2Many(probeRecords, Fn::View<Cmp::Population>({population}).begin(), 1);
        ASSERT_EQ(walks.size(), 1u);
        std::size_t at = 0;
        while (const std::size_t loaded = walks.front()->loadNextItems()) {
            ASSERT_EQ(loaded, two && at + 1 < people.size() ? 2u : 1u);
            const auto items = walks.front()->compare();
            std::vector<float> expected[2] = {std::vector<float>(probes.size()),
                                              std::vector<float>(probes.size())};
            std::vector<FixedPointFeature> gallery;
            std::vector<const short*> galleryWords;
            for (std::size_t i = 0; i < loaded; ++i)
                for (const std::size_t f : people[at + i]) {
                    gallery.push_back(words[f]);
                    galleryWords.push_back(words[f].vector.get());
                }
            if (loaded == 1)
                score(probeWords, gallery, expected[0], encoder);
            else
                score(flatProbes, counts, galleryWords, people[at].size(), people[at + 1].size(), expected[0],
                      expected[1], encoder);
            for (std::size_t i = 0; i < loaded; ++i, ++at) EXPECT_EQ(items[i].scores, expected[i]) << at;
        }
        EXPECT_EQ(at, people.size());
        for (std::size_t p = 0; p < probes.size(); ++p) {
            FixedPointFeatures person;
            for (const std::size_t f : people[1]) person.push_back(words[f]);
            EXPECT_EQ(made->one2one(probeRecords[p], record(builder, features, people[1])),
                      score(probeWords[p], person, encoder));
        }
        EXPECT_EQ(made->one2one(probeRecords[0], probeRecords[2]), std::numeric_limits<float>::lowest());
    }
}

TEST_F(B7Search, CountsAllScoresForNormalization) {
    const auto made = algorithm("X.ScoreNormalization = Enabled\n");
    const Cmp::RecordBuilder builder = made->createRecordBuilder();
    const std::vector<Packed> features = extremeFeatures(Encoder());
    Cmp::Population population = made->createPopulation(0);
    for (std::size_t i = 0; i < 7; ++i) population.add(record(builder, features, {i}), std::to_string(i));
    const FIR probe = record(builder, features, {0}), none = builder->createVoid();
    for (const unsigned int threads : {1u, 3u}) {
        const Cmp::Strategy strategy(made, FNCountedPtr<Cmp::Implementation::ScoreMapping>(),
                                     FNCountedPtr<Cmp::Implementation::RatesMapping>(), threads);
        const auto results = strategy.compareRaw({{probe, 0.0f, 2}, {none, 0.0f, 2}}, population);
        const Cmp::ScoreHistogram &counts = results.distributions->front(),
                                  &nothing = results.distributions->back();
        ASSERT_EQ(counts.size(), 4000u);
        EXPECT_EQ(counts.sum(), 6u) << "the opposite is below the least value";
        EXPECT_EQ(counts[3999], 0u);
        EXPECT_EQ(nothing.sum(), 0u);
    }
}

TEST_F(B7Search, EndsBeforeAnyWorkOnRecordsOfAnotherGeneration) {
    const auto made = algorithm();
    const Cmp::RecordBuilder builder = made->createRecordBuilder();
    Cmp::Population own = made->createPopulation(0);
    own.add(builder->createVoid(), "a");
    struct Foreign final : Cmp::FIR::Body {
        Fn::Package serialize() const override { return {}; }
        void createMemento(unsigned char*&) const override {}
        std::size_t mementoSize() const override { return 0; }
        std::string version() const override { return {}; }
    };
    const FIR foreign(FNCountedPtr<FIR::Body>(new Foreign));
    const Cmp::Population others(FNCountedPtr<Cmp::Population::Body>(new Cmp::FeatureSets<Foreign>));
    EXPECT_THROW(own.add(foreign, "b"), std::bad_cast);
    EXPECT_THROW(made->one2one(builder->createVoid(), foreign), std::bad_cast);
    EXPECT_THROW(made->prepareFew2Many({foreign}, Fn::View<Cmp::Population>({own}).begin(), 1),
                 std::bad_cast);
    EXPECT_THROW(made->prepareFew2Many({builder->createVoid()},
                                       Fn::View<Cmp::Population>({own, own, others}).begin(), 1),
                 std::bad_cast);
    EXPECT_EQ(thrownBy([&] {
                  made->prepareFew2Many({}, Fn::View<Cmp::Population>(std::list<Cmp::Population>{}).begin(),
                                        0);
              }),
              "FNEBadArg: Pcld: Number of partitions has to be >= 1");
}

} // namespace
