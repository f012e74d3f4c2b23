#include "cmp/b7/feature_set_builder.h"
#include "cmp/b7/score_normalization.h"
#include "cmp/b7/value_histogram.h"
#include "support/b7_setup.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <numbers>

namespace {

using namespace Cmp::B7;
using Cmp::RecordBuilder;

/// Measures that only padding and similarity count for, so that an image tells its quality.
const std::string quiet = "X.SampleSelector.SampleEvaluator.RegardSharpness = false\n"
                          "X.SampleSelector.SampleEvaluator.RegardDeviationFromFrontalPose = false\n"
                          "X.SampleSelector.SampleEvaluator.RegardMotionBlurStrength = false\n";

constexpr FNPos left{120, 100}, right{180, 102}, mouth{148, 170}, bridge{150, 103};

B7Setup::Found everything() {
    const auto at = [](FNPos p) { return FacialFeatureLocation{p, 60, 1}; };
    return {at(left), at(right), at(mouth), at(bridge), {0.5f, 0}};
}

FNImage<unsigned char> noise(unsigned seed) {
    std::mt19937 random(seed);
    FNImage<unsigned char> image(300, 300);
    std::generate_n(image.getExclusive(), image.size(),
                    [&] { return static_cast<unsigned char>(random() % 256); });
    return image;
}

/// @param aside moves the face out of the image, which makes it worse
Cmp::Sample sample(unsigned seed, float aside = 0) {
    const FNPos shift(aside, 0);
    return {FNImageReferenceFactory::create(noise(seed)), left + shift, right + shift};
}

using B7Builder = B7Setup;

TEST_F(B7Builder, MakesRecordsOfTheFeaturesOfItsSamples) {
    const Algorithm made = algorithm(quiet, everything());
    EXPECT_EQ(made->name(), "B7-0 FIR11.0");
    const RecordBuilder builder = made->createRecordBuilder();
    EXPECT_EQ(thrownBy([&] { builder->generate(); }),
              "FNEBadFunCall: No faces are provided to FIR generation!");
    EXPECT_EQ(thrownBy([&] { builder->bestFace(); }),
              "FNEOutOfRange: No best face available. No Sample has been accepted so far.");
    EXPECT_EQ(builder->pushSample(Cmp::Sample()), -1);
    EXPECT_EQ(builder->pushSample(sample(1)), 0);
    EXPECT_EQ(builder->pushSample(sample(2)), 1);
    EXPECT_EQ(builder->numberOfSamples(), 2u);
    EXPECT_EQ(builder->bestFace().mouth(), mouth);

    const Cmp::FIR both = builder->generate();
    EXPECT_EQ(both.mementoSize(), 4 + 2 * 2728u);
    EXPECT_EQ(thrownBy([&] { builder->bestFace(); }),
              "FNEOutOfRange: Sample with best quality not accessible.");
    EXPECT_TRUE(builder->generate().serialize() == both.serialize()) << "features are kept";

    builder->removeSample(0);
    const auto feature =
        made->processSample(FNImageReferenceFactory::create(noise(2)), {}, left, right, mouth, bridge);
    const Cmp::FIR second = builder->generate();
    EXPECT_TRUE(second.serialize() == made->record({feature}).serialize());
    EXPECT_EQ(second.mementoSize(), 4 + 2728u);
    EXPECT_EQ(made->one2one(both, second), made->one2one(second, second));

    EXPECT_TRUE(made->merge({}, both).serialize() == both.serialize());
    EXPECT_EQ(made->merge({both, both}, both).mementoSize(), 4 + 5 * 2728u);
    const std::list<Fn::Package> children = second.serialize();
    EXPECT_EQ(Fn::deSerialize<std::string>(children.front()), "B7-0 FIR11.0::RefSet");
    EXPECT_EQ(children.back().cores().back().size(), 679u * 4);
    EXPECT_EQ(builder->dumpSize(), made->record({6, feature}).serialize().size());
    builder->clear();
    EXPECT_EQ(builder->numberOfSamples(), 0u);
    EXPECT_EQ(builder->pushSample(sample(3)), 0);
    EXPECT_EQ(thrownBy([&] { made->reconstructSample(feature.vector); }),
              "FNEBadArg: CmpAlgorithm::reconstructSample: not implemented");
}

TEST_F(B7Builder, TakesKnownEyesWithoutMouthAndBridge) {
    Found eyes = everything();
    eyes.mouth.confidence = eyes.bridge.confidence = 0;
    EXPECT_EQ(algorithm(quiet, eyes)->createRecordBuilder()->pushSample(sample(1)), 0);
}

TEST_F(B7Builder, RefusesRecordsThatAreNotItsOwn) {
    const Algorithm made = algorithm("", everything()), other = algorithm("X.FIRVersion = 10\n");
    const RecordBuilder builder = made->createRecordBuilder();
    EXPECT_EQ(thrownBy([&] { builder->create(other->record({}).serialize()); }),
              "FNEBadArg: PCLD: loadFeatureSet: incompatible data: wrong version [B7-0 FIR10::RefSet]");
    EXPECT_EQ(thrownBy([&] { builder->create(Fn::Package()); }),
              "FNEBadArg: PCLD: loadrefSet: incompatible data");
    for (const std::size_t words : {678u, 680u, 0u}) {
        const Fn::Package feature(std::list<Fn::Package>{
            Fn::Package(0.0f), Fn::Package(1.0f), Fn::Package(1.0f), Fn::serialize(FNVector<int>(words, 0))});
        const Fn::Package record(
            std::list<Fn::Package>{Fn::serialize<std::string>("B7-0 FIR11.0::RefSet"), feature});
        EXPECT_EQ(thrownBy([&] { builder->create(record); }),
                  "FNEBadArg: PCLD: loadFeatureSet: incompatible data: B7-0 FIR11.0: feature of " +
                      std::to_string(words) + " words instead of 679");
    }
}

TEST_F(B7Builder, KeepsTheBestSamples) {
    const Algorithm made = algorithm(quiet + "X.SampleSelector.MaxSamples = 2\n", everything());
    const RecordBuilder builder = made->createRecordBuilder();
    // The eyes are known; the farther they are from where the mouth is found, the more of the warp is
    // outside.
    EXPECT_EQ(builder->pushSample(sample(1, 140)), 0);
    EXPECT_EQ(builder->pushSample(sample(2)), 1) << "much better";
    EXPECT_EQ(builder->numberOfSamples(), 1u);
    EXPECT_EQ(builder->pushSample(sample(3, 140)), -1) << "below nine tenths of the best";
    EXPECT_EQ(builder->pushSample(sample(4)), 3);
    EXPECT_EQ(builder->numberOfSamples(), 2u);
    builder->pushSample(sample(5));
    EXPECT_EQ(builder->numberOfSamples(), 2u);
}

TEST(SampleSelection, DropsTheWorstWhenThereAreTooMany) {
    SampleSelector limits;
    limits.maxSamples = 3;
    SampleSelection selection(limits);
    const SampleEntryValue value({}, FloatingPointFeature{FNVector<float>(1, 0.0f)});
    EXPECT_TRUE(selection.tryAddSample({0, 0}, 0.50f, value));
    EXPECT_TRUE(selection.tryAddSample({0, 1}, 0.48f, value));
    EXPECT_FALSE(selection.tryAddSample({1, 0}, 0.44f, value)) << "below 0.45";
    EXPECT_TRUE(selection.tryAddSample({2, 0}, 0.46f, value));
    EXPECT_FALSE(selection.tryAddSample({3, 0}, 0.45f, value));
    EXPECT_TRUE(selection.tryAddSample({4, 0}, 0.49f, value));
    EXPECT_FALSE(selection.samples().contains({2, 0}));
    EXPECT_NEAR(selection.meanQuality(), 0.49f, 1e-6);
    selection.removeSample(0);
    EXPECT_EQ(selection.size(), 1u);
    EXPECT_TRUE(selection.tryAddSample({5, 0}, 0.9f, value));
    EXPECT_EQ(selection.size(), 1u) << "the others are not good enough any more";
    EXPECT_EQ(thrownBy([&] {
                  selection.tryAddSample({6, 0}, 1, {});
              }).substr(0, 27),
              "FNEGeneric: tryAddSample():");
    EXPECT_EQ(thrownBy([&] { selection.restore({}, selection.qualities()); }),
              "FNEBadArg: Quality of a sample that is not there");
    EXPECT_EQ(SampleSelection(limits).meanQuality(), 0);
}

TEST(SampleEvaluator, RatesByTheMeanOfWhatCounts) {
    const SampleEvaluator all;
    const double best = std::exp2(40) * 8.987831e-13; // about 1
    // The best of each: nothing is bad but for what the curve of the pose leaves.
    EXPECT_NEAR(all.quality(100, -100, 0, 0, 1), best, 1e-3);
    EXPECT_NEAR(all.quality(100, -100, 0, 0, 0.29f), std::exp(-27.725887f / 5), 1e-4) << "one of five";
    float before = 2;
    for (const float padding : {0.05f, 0.1f, 0.2f}) {
        const float quality = all.quality(0.5, 0, 0.15f, padding, 0.5f);
        EXPECT_LT(quality, before);
        before = quality;
    }
    EXPECT_GT(all.quality(0.9, 0, 0.15f, 0, 0.5f), all.quality(0.1, 0, 0.15f, 0, 0.5f));
    EXPECT_GT(all.quality(0.5, 0, 0.15f, 0, 0.5f), all.quality(0.5, 2, 0.15f, 0, 0.5f));
    EXPECT_GT(all.quality(0.5, 0, 0.15f, 0, 0.5f), all.quality(0.5, 0, 0.6f, 0, 0.5f));
    // By hand: 0.30613106 / 2 - 0.12914619 for the sharpness alone.
    const SampleEvaluator sharp({true, false, false, false, false}, 0.3f);
    EXPECT_NEAR(sharp.quality(0.24185032, 9, 9, 9, 0), best * std::exp(-0.02391934 * 27.725887), 1e-4);
    EXPECT_NEAR(SampleEvaluator({false, false, false, false, false}, 0.3f).quality(0, 9, 9, 9, 0), best,
                1e-5);
}

TEST(SampleEvaluator, ComparesHistogramsWithAnEvenOne) {
    FNImage<unsigned char> image(16, 16);
    for (std::uint32_t i = 0; i < 256; ++i) image.getExclusive()[i] = static_cast<unsigned char>(i);
    EXPECT_FLOAT_EQ(imgSimToIdeal(image, 0), 1);
    for (std::uint32_t i = 0; i < 256; ++i) image.getExclusive()[i] = i < 64 ? 10 : 19;
    EXPECT_FLOAT_EQ(imgSimToIdeal(image, 0),
                    static_cast<float>(256 / std::sqrt(10.0 * (64 * 64 + 192 * 192))));
    image.fill(7);
    EXPECT_FLOAT_EQ(imgSimToIdeal(image, 0), 1);
    EXPECT_EQ(imgSimToIdeal(FNImage<unsigned char>(0, 0), 0), 0);
}

TEST(MotionBlur, IsTheWayOfTheFasterEyeInEyeDistances) {
    const auto at = [](int ms) { return Fn::TimeStamp(std::chrono::milliseconds(ms)); };
    EXPECT_NEAR(motionBlur({0, 0}, {50, 0}, 50, at(0), {3, 4}, {50, 1}, 30, at(100), 0.02f),
                0.02 * 5 / 0.1 / 40, 1e-6);
    EXPECT_EQ(thrownBy([&] {
                  motionBlur({0, 0}, {0, 0}, 0, at(0), {0, 0}, {1, 0}, 1, at(1), 1);
              }),
              "std::exception: motionBlur(): previous frame eye distance should not be zero");
    EXPECT_EQ(thrownBy([&] {
                  motionBlur({0, 0}, {1, 0}, 1, at(5), {0, 0}, {1, 0}, 1, at(5), 1);
              }),
              "std::exception: motionBlur(): time delta between the frames capture times should not be zero");
}

/// A stream of a frame for each letter; those of 't' tell when they were taken.
Cmp::FaceStream stream(const std::string& frames) {
    Cmp::Evidence evidence("e");
    for (std::size_t i = 0; i < frames.size(); ++i) {
        const Fn::TimeStamp time{std::chrono::milliseconds(40 * i)};
        FNImageAttributes attributes;
        if (frames[i] == 't') {
            Fn::addImageCaptureTime(attributes, time);
            Fn::addImageExposureTime(attributes, 10000);
        }
        const FaceFinder::Location face{{150, 101}, 60, 1, 0};
        evidence.push_back({FNImageReferenceFactory::create(noise(9), attributes),
                            Cmp::EvidenceFrame::FaceInfos({{"a", face}}), time, true});
    }
    return {"a", evidence};
}

TEST_F(B7Builder, TakesTheFramesOfAStreamAsOneSample) {
    const std::string motion = "X.SampleSelector.SampleEvaluator.RegardPaddingRatio = false\n"
                               "X.SampleSelector.SampleEvaluator.RegardSimToIdeal = false\n";
    Found found = everything();
    const RecordBuilder builder = algorithm(motion, found)->createRecordBuilder();
    EXPECT_EQ(builder->pushSample(Cmp::Sample(stream("ttt"))), 0);
    EXPECT_EQ(builder->numberOfSamples(), 3u);
    EXPECT_EQ(builder->quality().duration, 80);
    const float still = builder->quality().mean;
    // Without times the motion is not known, which is worse than none.
    builder->clear();
    EXPECT_EQ(builder->quality().duration, 0);
    EXPECT_EQ(builder->pushSample(Cmp::Sample(stream("uuu"))), 0);
    EXPECT_LT(builder->quality().mean, still);

    found.left.confidence = 0;
    EXPECT_EQ(algorithm(motion, found)->createRecordBuilder()->pushSample(Cmp::Sample(stream("tt"))), -1);
    EXPECT_EQ(algorithm(motion + "X.SampleSelector.StrictLandmarkLocalization = false\n", found)
                  ->createRecordBuilder()
                  ->pushSample(Cmp::Sample(stream("tt"))),
              0)
        << "one eye, mouth and bridge are enough";
}

TEST_F(B7Builder, RatesEachFrameByItsMotion) {
    Found found = everything();
    found.speed = {1500, 0};
    const float m = 0.01f * 1500 / length(right - left); // of the exposure, in eye distances
    const Algorithm made = algorithm("X.SampleSelector.SampleQualityFraction = 0\n"
                                     "X.SampleSelector.SampleEvaluator.RegardPaddingRatio = false\n"
                                     "X.SampleSelector.SampleEvaluator.RegardSimToIdeal = false\n",
                                     found);
    const SampleEvaluator evaluator({true, true, true, false, false}, 0.3f);
    const std::pair<const char*, std::vector<float>> cases[] = {
        {"t", {0}},
        {"tt", {m, m}},
        {"ttt", {m, m, m}},
        {"u", {0.15f}},
        {"tu", {0, 0.15f}},
        {"tut", {0, 0.15f, 0.15f}}, // the frame before does not tell its time
        {"tutt", {m, 0.15f, 0.15f, m}},
        {"uutt", {0.15f, 0.15f, 0.15f, m}},
        {"tuuttu", {m, 0.15f, 0.15f, 0.15f, m, 0.15f}},
    };
    for (const auto& [frames, motions] : cases) {
        const RecordBuilder builder = made->createRecordBuilder();
        EXPECT_EQ(builder->pushSample(Cmp::Sample(stream(frames))), 0);
        const std::list<Fn::Package> memento = builder->createMemento();
        const SampleSelection::Samples samples(*std::next(memento.begin(), 6));
        const SampleSelection::Qualities qualities(*std::next(memento.begin(), 7));
        EXPECT_EQ(samples.size(), motions.size()) << frames;
        ASSERT_EQ(qualities.size(), motions.size()) << frames;
        for (const auto& [quality, key] : qualities) {
            const float expected =
                evaluator.quality(0.5, 0, motions.at(static_cast<std::size_t>(key.frame)), 0, 0);
            EXPECT_NEAR(quality, expected, 1e-5f) << frames << " " << key.frame;
            EXPECT_EQ(samples.at(key).primary->quality, quality);
        }
    }
}

TEST_F(B7Builder, GoesOnFromItsMemento) {
    const Algorithm made = algorithm("", everything());
    const RecordBuilder builder = made->createRecordBuilder(), other = made->createRecordBuilder();
    builder->pushSample(sample(1));
    builder->generate();
    builder->pushSample(sample(2));
    const Fn::Package memento = builder->createMemento();
    other->setMemento(memento);
    EXPECT_TRUE(other->createMemento() == memento);
    EXPECT_EQ(other->numberOfSamples(), 2u);
    EXPECT_TRUE(other->generate().serialize() == builder->generate().serialize());
    EXPECT_EQ(other->pushSample(sample(3)), 2);

    std::list<Fn::Package> parts = memento;
    parts.pop_back();
    EXPECT_THROW(other->setMemento(Fn::Package(parts)), FNEBadArg);
    EXPECT_EQ(other->numberOfSamples(), 3u) << "unchanged";
}

TEST_F(B7Builder, ReadsItsSettings) {
    const auto thrown = [&](const std::string& text) { return thrownBy([&] { algorithm(text); }); };
    const std::string selector = "X.SampleSelector.", invalid = " is invalid value for ";
    EXPECT_EQ(thrown(selector + "SampleQualityFraction = 1.5\n"),
              "FNEBadArg: CmpAlgorithm(): 1.5" + invalid + "SampleQualityFraction [0 <= value <= 1]");
    EXPECT_EQ(thrown(selector + "MaxSamples = 0\n"), "FNEBadArg: CmpAlgorithm(): 0" + invalid + "MaxSamples");
    EXPECT_EQ(thrown("X.TransfFile = none.dat\n"), "FNEIOError: CmpAlgorithm: File '" +
                                                       folder().file("none.dat") +
                                                       "' could not be opened for reading.");
    const auto mapping = [&](const std::string& normalization) {
        return thrownBy([&] { algorithm("X.ScoreNormalization = " + normalization + "\n")->scoreMapping(); });
    };
    for (const std::string set : {"Disabled b7", "Enabled b7-sn"}) {
        const std::size_t blank = set.find(' ');
        EXPECT_EQ(mapping(set.substr(0, blank)), "FNEBadArg: CmpAlgorithm: File `" +
                                                     folder().file("smap-" + set.substr(blank + 1) + ".dat") +
                                                     "' could not be opened for reading.");
    }
    EXPECT_EQ(
        algorithm("X.ScoreNormalization.Disabled.SimMappingFile = \n")->scoreMapping()->convert(2.0f).value(),
        2);
    // One file is read once, as long as somebody has it.
    const Algorithm first = algorithm();
    const std::string file = folder().file("trans-b7.dat"), away = folder().file("away");
    std::filesystem::rename(file, away);
    EXPECT_EQ(thrown(""), "nothing thrown");
    std::filesystem::rename(away, file);
    EXPECT_EQ(algorithm("X.FIRVersion = 12\n")->name(), "B7-0 FIR12");
}

/// Scores as a search counts them: normal distributions of so many, with mean and deviation.
Cmp::ScoreHistogram histogram(const std::vector<std::tuple<double, double, double>>& parts) {
    Cmp::ScoreHistogram counts(4000, 0u);
    for (const auto& [number, mean, deviation] : parts)
        for (std::size_t i = 0; i < 4000; ++i) {
            const double x = static_cast<double>(i) * 1.375 - 500 + 0.6875, z = (x - mean) / deviation;
            counts.getExclusive()[i] += static_cast<unsigned int>(
                number * 1.375 * std::exp(-z * z / 2) / (deviation * std::sqrt(2 * std::numbers::pi)) + 0.5);
        }
    return counts;
}

TEST(ScoreNormalization, TakesTheDistributionOfTheSearchOut) {
    // Offsets and scales were computed apart from this code, in double.
    struct Case {
        std::vector<std::tuple<double, double, double>> parts;
        float offset, scale;
    };
    const std::vector<Case> cases = {{{{100000, 0, 4}}, 8.572f, 1691.63f},
                                     {{{100000, 0, 4}, {50, 40, 6}}, 11.7912f, 1439.63f},
                                     {{{100000, 8, 6}, {500, 55, 8}}, 25.2333f, 1994.95f},
                                     {{{1000, -3, 2}}, 10.0068f, 1956.43f}};
    for (const Case& c : cases) {
        const Cmp::RawMatches normalized =
            normalizeRawScores({{{10, "a"}, {60, "b"}, {35, "c"}}}, histogram(c.parts));
        ASSERT_EQ(normalized.size(), 3u);
        EXPECT_EQ(normalized.begin()->id, "a");
        EXPECT_EQ(normalized.rbegin()->id, "b");
        const float scale = 50 / (normalized.rbegin()->score - normalized.begin()->score);
        EXPECT_NEAR(scale, c.scale, 0.01 * c.scale);
        EXPECT_NEAR(10 - normalized.begin()->score * scale, c.offset, 0.2);
    }
    EXPECT_TRUE(normalizeRawScores({}, histogram({})).empty());
}

TEST(ScoreNormalization, FitsTwoNormalDistributions) {
    FNVector<float> bins(200);
    FNVector<unsigned int> counts(200);
    const auto density = [](float x, float m, float d) {
        return std::exp(-(x - m) * (x - m) / (2 * d * d)) / (d * 2.5066283f);
    };
    for (std::size_t i = 0; i < 200; ++i) {
        const float x = bins.getExclusive()[i] = static_cast<float>(i) * 0.1f - 10;
        counts.getExclusive()[i] =
            static_cast<unsigned int>(10000 * (0.3f * density(x, -4, 1) + 0.7f * density(x, 3, 1.5f)));
        EXPECT_NEAR(EM::linearApproxOfGaussDensity(x, 1.0f, 2.0f), density(x, 1, 2), 0.02f);
    }
    float m1 = -5, m2 = 5, d1 = 2, d2 = 2, weight = 0.5f;
    ASSERT_TRUE(EM::estimateBinomialGauss(bins, counts, m1, m2, d1, d2, weight));
    EXPECT_NEAR(m1, -4, 0.2); // it stops at a twentieth of the distance of the means
    EXPECT_NEAR(m2, 3, 0.2);
    EXPECT_NEAR(d1, 1, 0.25);
    EXPECT_NEAR(d2, 1.5, 0.1);
    EXPECT_NEAR(weight, 0.3, 0.02);
    EXPECT_FALSE(EM::estimateBinomialGauss(FNVector<float>(), {}, m1, m2, d1, d2, weight));
    EXPECT_EQ(EM::linearApproxOfGaussDensity(1.0f, 1.0f, 0.0f), 1);
    EXPECT_EQ(EM::linearApproxOfGaussDensity(1.1f, 1.0f, 0.0f), 0);
}

TEST(ValueHistogram, CountsWhatIsAboveInTheLastBin) {
    ValueHistogram histogram(-1, 1, 4);
    for (const float value : {-1.1f, -1.0f, -0.6f, 0.0f, 0.999999f, 1.0f, 50.0f, NAN}) histogram.add(value);
    EXPECT_EQ(std::vector<unsigned int>(histogram.counts().begin(), histogram.counts().end()),
              (std::vector<unsigned int>{2, 0, 1, 3}));
    EXPECT_EQ(thrownBy([] { ValueHistogram(1, 0, 4); }),
              "FNEBadArg: minvalue larger than maxvalue for binning interval");
    EXPECT_EQ(thrownBy([] { ValueHistogram(0, 1, 0); }), "FNEBadArg: Number of bins cannot be 0");
    EXPECT_EQ(thrownBy([] { ValueHistogram(1, 1, 4); }), "FNEBadArg: Diminishing binning subinterval");
}

} // namespace
