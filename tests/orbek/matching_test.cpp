#include "orbek/facial_matching_engine.h"
#include "orbek/fir_builder.h"
#include "orbek/identification.h"
#include "orbek/implementation/comparison.h"
#include "orbek/verification.h"
#include "support/b7_setup.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <functional>
#include <sstream>

using namespace Orbek;

namespace {

/// A device that nobody asks for an image.
class Dark : public CaptureDeviceBody {
    Image capture() override { return Image(); }
};

/// A folder with mappings from raw scores of 0 to 4000 to scores, and a projection that is not used.
class MatchingWithModels : public B7Setup {
protected:
    static void SetUpTestSuite() {
        B7Setup::SetUpTestSuite();
        writeMappings();
    }

    static Configuration configuration(const std::string& more = {}) {
        std::istringstream text("ORBEK.Substitutions.INSTALLDIR = " ORBEK_BINARY_DIR "\n"
                                "ORBEK.ComparisonAlgorithm.AlgorithmVersion.B7.DataDir = " +
                                folder().path().string() + "\n" + more);
        return Configuration(text);
    }

    /// The flat form of a record of one feature, all codes of which are the same share of the greatest one.
    static std::vector<unsigned char> flat(unsigned int share) {
        std::vector<unsigned char> bytes(4 + 2728, 0);
        const std::uint32_t one = 1;
        const float header[] = {0, 1, 1};
        std::memcpy(bytes.data(), &one, 4);
        std::memcpy(bytes.data() + 4, header, sizeof header);
        // The first component of each word; the rest have the least code.
        for (std::size_t at = 16; at < bytes.size(); at += 4) bytes[at] = static_cast<unsigned char>(share);
        return bytes;
    }
    static FIR record(const FIRBuilder& builder, unsigned int share) {
        auto bytes = flat(share);
        unsigned char* memory = bytes.data();
        std::stringstream stream;
        stream << builder.build(memory);
        return builder.build(stream);
    }
};

TEST_F(MatchingWithModels, RecordsComeBackFromTheirBytes) {
    const FIRBuilder builder(configuration());
    auto bytes = flat(3);
    unsigned char* memory = bytes.data();
    const FIR fir = builder.build(memory);
    EXPECT_EQ(memory, bytes.data() + bytes.size());
    EXPECT_EQ(fir.version(), "B7-0 FIR11.0");
    EXPECT_EQ(fir.flatSize(), bytes.size());
    std::vector<unsigned char> written(fir.flatSize()), package(fir.size());
    memory = written.data();
    fir.writeTo(memory);
    EXPECT_EQ(written, bytes);
    EXPECT_EQ(memory, written.data() + written.size());

    fir.serialize(package.data());
    std::stringstream stream;
    fir.serialize(stream);
    EXPECT_EQ(stream.str(), std::string(package.begin(), package.end()));
    const FIR again = builder.build(package.data(), static_cast<unsigned int>(package.size()));
    FIR copy = builder.buildVoidFIR();
    EXPECT_GT(copy.size(), 20u);
    EXPECT_EQ(copy.flatSize(), 4u);
    copy = again;
    EXPECT_TRUE(copy == again);
    EXPECT_FALSE(again == fir) << "equal bytes, another record";
    const FacialMatchingEngine engine(configuration());
    EXPECT_EQ(engine.compare(again, fir), engine.compare(fir, fir));
    EXPECT_NE(thrownBy([&] { builder.build(package.data(), 100); }), "nothing thrown");
    const FIRBuilder other(configuration("ORBEK.ComparisonAlgorithm.AlgorithmVersion.B7.FIRVersion = 9\n"));
    EXPECT_EQ(thrownBy([&] { other.build(stream); }),
              "FNEBadArg: PCLD: loadFeatureSet: incompatible data: wrong version [B7-0 FIR11.0::RefSet]");
}

TEST_F(MatchingWithModels, FindsTheBestOfAPopulation) {
    const Configuration c = configuration("ORBEK.ComparisonAlgorithm.NumberOfThreads = 2\n");
    const FIRBuilder builder(c);
    const FacialMatchingEngine engine(c);
    Population people(c);
    const Population same = people;
    const FIR probe = record(builder, 0);
    EXPECT_TRUE(engine.bestMatches(probe, people, 0, 5)->empty());
    people.append(record(builder, 3), "b");
    people.append(probe, "a");
    people.append(record(builder, 3), "c");
    people.append(builder.buildVoidFIR(), "nobody");
    people.append(record(builder, 7), "a");

    std::vector<float> scores;
    const auto all = engine.compare(probe, same);
    for (const Score& score : *all) scores.push_back(score);
    ASSERT_EQ(scores.size(), 5u);
    // Several at once are rounded otherwise.
    EXPECT_NEAR(scores[0], engine.compare(probe, record(builder, 3)), 1e-5);
    EXPECT_EQ(scores[0], scores[2]);
    EXPECT_EQ(scores[3], 0);
    EXPECT_GT(scores[1], scores[0]);
    EXPECT_GT(scores[0], scores[4]);
    std::string names;
    const auto best = engine.bestMatches(probe, same, scores[4] / 2, 10);
    for (const Match& match : *best) names += match.name;
    EXPECT_EQ(names, "acba") << "the best first, of equals the greater id";
    EXPECT_EQ(engine.bestMatches(probe, people, 0, 2)->back().name, "c");
    EXPECT_TRUE(engine.bestMatches(probe, people, 0, 0)->empty());
    EXPECT_TRUE(engine.bestMatches(probe, people, 7, 5)->empty()) << "a threshold of 7 counts as 1";

    for (const std::string threads : {"0", "-3", "1", "7"}) {
        const FacialMatchingEngine other(
            configuration("ORBEK.ComparisonAlgorithm.NumberOfThreads = " + threads + "\n"));
        names.clear();
        const auto matches = other.bestMatches(probe, same, scores[4] / 2, 10);
        for (const Match& match : *matches) names += match.name;
        EXPECT_EQ(names, "acba") << threads;
    }
    EXPECT_TRUE(people.get("a") == probe);
    people.remove("a");
    EXPECT_FALSE(same.get("a") == probe);
    people.remove("a");
    EXPECT_EQ(thrownBy([&] { same.get("a"); }), "FNEBadArg: Attempting to retrieve nonexisting element");
}

TEST_F(MatchingWithModels, ScoresTellRatesAndRawScores) {
    const ScoreMappings mappings(configuration());
    EXPECT_FLOAT_EQ(mappings.requestFAR(0.25f), 0.75f);
    EXPECT_FLOAT_EQ(mappings.requestFRR(0.25f), 0.5f);
    EXPECT_FLOAT_EQ(mappings.expectedFAR(0.25f), 0.75f);
    EXPECT_FLOAT_EQ(mappings.expectedFRR(9), 0.5f) << "a score of 9 counts as 1";
    const InternalScoreMappings internal(configuration());
    EXPECT_FLOAT_EQ(internal.convert(1000.0f), 0.25f);
    EXPECT_FLOAT_EQ(internal.convert(Score(0.25f)), 1000);
    EXPECT_EQ(Score(RawScore(3)), 3);
}

TEST_F(MatchingWithModels, WhatIsNoNumberIsNoRateAndNoThreshold) {
    const Configuration c = configuration();
    const FIRBuilder builder(c);
    const FIR fir = record(builder, 3);
    Population people(c);
    people.append(fir, "a");
    const float nan = std::nanf("");
    const ScoreMappings rates(c);
    const InternalScoreMappings raw(c);
    const FacialMatchingEngine engine(c);
    const Verification::Processor verification(c);
    const Identification::Processor identification(c, people);
    const std::list<Sample> none;
    const CaptureDevice device(new Dark);
    const struct {
        const char* argument;
        std::function<void()> call;
    } cases[] = {
        {"The false acceptance rate", [&] { rates.requestFAR(nan); }},
        {"The false rejection rate", [&] { rates.requestFRR(nan); }},
        {"The threshold", [&] { rates.expectedFAR(nan); }},
        {"The threshold", [&] { rates.expectedFRR(nan); }},
        {"The raw score", [&] { raw.convert(nan); }},
        {"The score", [&] { raw.convert(Score(nan)); }},
        {"The threshold", [&] { engine.bestMatches(fir, people, nan, 5); }},
        {"The threshold", [&] { verification.process(none.begin(), none.end(), fir, nan, {}); }},
        {"The threshold", [&] { verification.process(device, fir, nan, {}); }},
        {"The threshold", [&] { identification.process(none.begin(), none.end(), nan, {}, 5); }},
        {"The threshold", [&] { identification.process(device, nan, {}, 5); }},
    };
    for (const auto& each : cases)
        EXPECT_EQ(thrownBy(each.call), std::string("FNEBadArg: ") + each.argument + " is not a number");
}

TEST_F(MatchingWithModels, SamplesAreMeasuredByThePortraitAnalyzer) {
    const std::string models = folder().path().string();
    const Configuration c = configuration(
        "ORBEK.ComparisonAlgorithm.AlgorithmVersion.B7.PortraitAnalyzer.DataDir = " + models + "\n");
    const Cmp::RecordBuilder builder = Comparison(c).strategy().algorithm()->createRecordBuilder();
    FNImage<unsigned char> image(300, 300);
    for (std::uint32_t i = 0; i < image.size(); ++i)
        image.getExclusive()[i] = static_cast<unsigned char>(i * 2654435761u >> 24);
    const Cmp::Sample sample(FNImageReferenceFactory::create(image), {120, 100}, {180, 100});
    EXPECT_EQ(thrownBy([&] { builder->pushSample(sample); }),
              "FNEIOError: Could not open data file " + models + "/fpdisc.dat for reading");
}

TEST(Matching, NeedsItsModelsWhenItIsFirstUsed) {
    std::istringstream none("ORBEK.Substitutions.INSTALLDIR = /no/such\n"),
        wrong("ORBEK.ComparisonAlgorithm.AlgorithmVersion = X\n");
    const Configuration missing(none), unknown(wrong);
    const FacialMatchingEngine engine(missing);
    const std::string title = "FNEGeneric: Comparison module : ";
    EXPECT_EQ(thrownBy([&] { FIRBuilder builder(missing); }).rfind(title, 0), 0u);
    EXPECT_EQ(thrownBy([&] { Population population(missing); }).rfind(title, 0), 0u);
    EXPECT_EQ(thrownBy([&] { InternalScoreMappings mappings(missing); }).rfind(title, 0), 0u);
    EXPECT_EQ(thrownBy([&] { FIRBuilder builder(unknown); }).rfind(title, 0), 0u);
    for (const std::string listed : {"B6", "A14", "B6L5"}) {
        std::istringstream text("ORBEK.ComparisonAlgorithm.AlgorithmVersion = " + listed + "\n");
        const Configuration c(text);
        EXPECT_EQ(thrownBy([&] { FIRBuilder builder(c); }),
                  title + "Illegal value for Comparison Algorithm: " + listed +
                      " is not part of this library, which has: B7");
    }
}

} // namespace
