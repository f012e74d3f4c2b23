#include "cmp/pcld/pcld.h"

#include "cmp/clustering.h"
#include "cmp/pcld/rank_tables.h"
#include "cmp/strategy.h"
#include "fn/deployment/app_config_db.h"
#include "img/gabor/gabor_filter.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <limits>
#include <numbers>
#include <random>
#include <sstream>

namespace {

using namespace Cmp::Implementation;
using namespace Cmp::Pcld;
using Vector = FNVector<float>;

FNImage<float> randomImage(std::uint32_t w, std::uint32_t h, unsigned seed) {
    std::mt19937 random(seed);
    FNImage<float> image(w, h);
    for (float* p = image.getExclusive(); p != image.getExclusive() + image.size(); ++p)
        *p = static_cast<float>(random() % 1000) / 1000;
    return image;
}

/// Squared magnitudes of one filter's response by full transforms, everywhere.
FNImage<float> denseResponse(const FNImage<float>& image, double waveNumber, double angle, double sigma) {
    FNImage<FNComplex<float>> filter(image.w(), image.h());
    Img::gaborInFourier(sigma, FN2Vector<double>(std::cos(angle), std::sin(angle)) * waveNumber, filter,
                        1e-6);
    const ImgFFTFloat fft(image.w(), image.h());
    auto product = fft.transformReal(image, fft.create());
    FNComplex<float>* const p = product.getExclusive();
    for (std::size_t i = 0; i < product.size(); ++i) p[i] = p[i] * filter.data()[i].re;
    const auto response = fft.inverse(product, fft.create());
    FNImage<float> result(image.w(), image.h());
    for (std::size_t i = 0; i < result.size(); ++i) {
        const FNComplex<float> c = response.data()[i];
        result.getExclusive()[i] = c.re * c.re + c.im * c.im;
    }
    return result;
}

/// The rank features of L5, written down from scratch.
std::vector<float> plainL5(const FNImage<float>& image, const float* rank) {
    constexpr int angles = 8, scales = 5, side = 80, margin = 8;
    constexpr int spacing[scales] = {4, 5, 8, 11, 16};
    std::vector<FNImage<float>> responses;
    for (int s = 0; s < scales; ++s)
        for (int a = 0; a < angles; ++a)
            responses.push_back(denseResponse(image, std::numbers::pi * std::pow(2, -(s + 2) / 2.0),
                                              a * std::numbers::pi / angles, 2 * std::numbers::pi));
    std::vector<float> features;
    for (int s = 0; s < scales; ++s) {
        const int S = spacing[s], first = S / 2 + margin, end = side - margin;
        const auto inside = [&](int x) { return x >= first && x < end; };
        for (int y = first; y < end; y += S)
            for (int x = first; x < end; x += S)
                for (int a = 0; a < angles; ++a) {
                    const auto at = [&](int s2, int a2, int x2, int y2) {
                        return responses[static_cast<std::size_t>(s2 * angles + a2)](
                            static_cast<std::uint32_t>(x2), static_cast<std::uint32_t>(y2));
                    };
                    int total = 0, greater = 0;
                    for (int s2 = s - 1; s2 <= s + 1; ++s2)
                        for (int d = -1; d <= 1; ++d)
                            for (int y2 = y - S; y2 <= y + S; y2 += S)
                                for (int x2 = x - S; x2 <= x + S; x2 += S) {
                                    if (s2 < 0 || s2 >= scales || !inside(x2) || !inside(y2)) continue;
                                    ++total;
                                    greater += at(s2, (a + d + angles) % angles, x2, y2) > at(s, a, x, y);
                                }
                    if (total == 81) {
                        features.push_back(rank[greater]);
                        continue;
                    }
                    const float pos =
                        81.0f / static_cast<float>(total) * (static_cast<float>(greater) + 0.5f);
                    const int i = static_cast<int>(pos - 0.5f);
                    const float t = pos - (static_cast<float>(i) + 0.5f);
                    features.push_back((1 - t) * rank[i] + t * rank[i + 1]);
                }
    }
    return features;
}

TEST(GaborPyrRankNormProcessor, IsThePlainForm) {
    const FNImage<float> image = randomImage(80, 80, 1);
    for (const char direction : {'x', 'z'}) {
        const GaborPyrRankNormProcessor processor(l5Params(direction));
        ASSERT_EQ(processor.featureSize(), 4328u);
        const Vector features = processor(image);
        const auto plain = plainL5(image, (direction == 'x' ? rankTableX : rankTableZ).data());
        ASSERT_EQ(plain.size(), 4328u);
        int different = 0; // where two responses are equal up to the order of additions
        for (std::size_t i = 0; i < plain.size(); ++i)
            different += std::abs(features.get()[i] - plain[i]) > 1e-6f;
        EXPECT_LE(different, 4);
    }
    EXPECT_THROW(GaborPyrRankNormProcessor(l5Params('x'))(randomImage(80, 79, 1)), FNEBadArg);
}

TEST(RankTables, AreTheTrainedOnes) {
    // Moments of the tables as they were published with the transformations.
    const struct {
        const std::array<float, rankTableSize>& table;
        double sum, first, second;
    } cases[] = {{rankTableX, 4.519202080, 113.390265950, 4712.908909430},
                 {rankTableZ, 3.357742410, 81.969384750, 3357.324445090}};
    for (const auto& c : cases) {
        double sum = 0, first = 0, second = 0;
        for (std::size_t i = 0; i < c.table.size(); ++i) {
            const double v = c.table[i], k = static_cast<double>(i);
            sum += v;
            first += k * v;
            second += k * k * v;
        }
        EXPECT_NEAR(sum, c.sum, 1e-7);
        EXPECT_NEAR(first, c.first, 1e-5);
        EXPECT_NEAR(second, c.second, 1e-3);
    }
}

TEST(L5Face, HasTheEyesInTheirRow) {
    for (const bool vertical : {false, true}) {
        FNImage<float> ramp(160, 140); // each pixel is its place
        for (std::uint32_t i = 0; i < ramp.size(); ++i)
            ramp.getExclusive()[i] = static_cast<float>(vertical ? i / ramp.w() : i % ramp.w()) + 0.5f;
        const FNImageReference image = FNImageReferenceFactory::create(ramp);
        const FNImage<float> same = l5Face(image, {54, 60}, {86, 60}),
                             half = l5Face(image, {60, 60}, {76, 60});
        ASSERT_EQ(same.w(), 80u);
        ASSERT_EQ(same.h(), 80u);
        // The left eye comes to (24, 29.333334), the right one to (56, 29.333334).
        for (const auto& [x, y] : {std::pair{10u, 20u}, {24u, 29u}, {60u, 70u}}) {
            const double right = x + 0.5 - 24, down = y + 0.5 - 29.333334;
            EXPECT_NEAR(same(x, y), vertical ? 60 + down : 54 + right, 1e-3);
            EXPECT_NEAR(half(x, y), vertical ? 60 + down / 2 : 60 + right / 2, 1e-3);
        }
    }
}

TEST(GaborPyrProcessor, MagnitudesAreThoseOfFullTransforms) {
    // The window and the filters of one portrait measure.
    const GaborPyrProcessor::Params params{72, 40, 1, 5, 8, 4.0f, 4, 4, 0, 0, 6.2831855f};
    const FNImage<float> image = randomImage(72, 40, 2);
    const Vector features = GaborPyrProcessor(params)(image);
    // Scale 1, angle 3, at the second place of the first row: (6 + 4, 6).
    const FNImage<float> first = denseResponse(image, std::numbers::pi / std::sqrt(2.0),
                                               3 * std::numbers::pi / 8, 2 * std::numbers::pi);
    EXPECT_NEAR(features.get()[8 + 3], std::sqrt(first(10, 6)) / (72 * 40), 1e-5);
    // A threshold leaves out little: features stay about the same.
    GaborPyrProcessor::Params pruned = params;
    pruned.filterThreshold = 0.003068f;
    const Vector rough = GaborPyrProcessor(pruned)(image);
    ASSERT_EQ(rough.size(), features.size());
    double difference = 0, size = 0;
    for (std::size_t i = 0; i < rough.size(); ++i) {
        difference += std::pow(rough.get()[i] - features.get()[i], 2);
        size += std::pow(features.get()[i], 2);
    }
    EXPECT_LT(std::sqrt(difference / size), 0.01);

    for (const auto& wrong : {GaborPyrProcessor::Params{72, 40, 5, 5, 8, 4, 4, 4, 0, 0, 6},
                              GaborPyrProcessor::Params{72, 40, 1, 5, 8, 0.5f, 4, 4, 0, 0, 6},
                              GaborPyrProcessor::Params{72, 40, 1, 5, 8, 4, 4, 4, 1, 0, 6},
                              GaborPyrProcessor::Params{72, 40, 1, 5000, 8, 4, 4, 4, 0, 0, 6}})
        EXPECT_EQ(thrownBy([&] { GaborPyrProcessor p(wrong); }),
                  "FNEBadArg: Gabor pyramid: invalid parameters");
}

TEST(Preprocessor, NormalizationTakesContrastOut) {
    const auto gpyr = PCLD::initializePreprocessor(
        "GPyr", GaborPyrProcessor::Params{64, 64, 2, 6, 4, 4.0f, 8, 8, 0, 0, 6.2831855f});
    const FNImage<float> image = randomImage(64, 64, 3);
    FNImage<float> darker = image;
    for (float* p = darker.getExclusive(); p != darker.getExclusive() + darker.size(); ++p)
        *p = 0.25f * *p + 0.1f;
    const Vector a = (*gpyr)(image), b = (*gpyr)(darker);
    EXPECT_LT(std::sqrt((a - b) * (a - b)), 1e-3 * std::sqrt(a * a));
    const std::string refusal =
        "FNEBadArg: PCLD: Configured preprocessor GPyr is not compatible for initialization with "
        "GaborPyrRankNormProcessor::Params!";
    EXPECT_EQ(thrownBy([] { PCLD::initializePreprocessor("GPyr", l5Params('x')); }), refusal);
}

TEST(Preprocessor, EachTypeTakesParametersOfItsKind) {
    const GaborPyrProcessor::Params plain{80, 80, 2, 5, 4, 4.0f, 8, 8, 0, 0, 6.2831855f};
    const FNImage<float> image = randomImage(80, 80, 4);
    const Vector unprocessed = GaborPyrProcessor(plain)(image),
                 ranks = GaborPyrRankNormProcessor(l5Params('x'))(image);
    for (const std::string type :
         {"GPyr", "GPyrENRLH", "B4Preprocessor", "GPyrNoPreproc", "GPyrRankNormNoPreproc", "other"}) {
        const bool takesPlain = type.starts_with("GPyr") && !type.starts_with("GPyrRank");
        const auto check = [&](bool taken, const auto& params, const Vector& expected, const char* same) {
            if (!taken) {
                EXPECT_EQ(thrownBy([&] { PCLD::initializePreprocessor(type, params); }).substr(0, 45),
                          ("FNEBadArg: PCLD: Configured preprocessor " + type + " is not").substr(0, 45));
                return;
            }
            const auto made = PCLD::initializePreprocessor(type, params);
            EXPECT_EQ(made->algorithmName(), type);
            EXPECT_EQ(made->featureSize(), expected.size());
            EXPECT_EQ((*made)(image) == expected, type == same) << type;
        };
        check(takesPlain, plain, unprocessed, "GPyrNoPreproc");
        check(!takesPlain && type != "other", l5Params('x'), ranks, "GPyrRankNormNoPreproc");
    }
}

TEST(Cluster, SettlesInOrderUpToTheFirstThatMoves) {
    // Numbers around means; each centre tells how often it was asked to settle.
    struct Mean {
        explicit Mean(float c) : centre(c) {}
        float similarity(float f) const { return -std::abs(f - centre); }
        void add(float f) { sum += f, ++count; }
        bool settle() {
            if (count == 0) return true;
            const float mean = sum / static_cast<float>(count);
            sum = 0;
            count = 0;
            if (mean == centre) return true;
            centre = mean;
            return false;
        }
        float centre, sum = 0;
        int count = 0;
    };
    const std::vector<float> features{0, 10, 1, 11, 12, -1};
    const auto clusters = cluster<Mean>(features, 2);
    ASSERT_EQ(clusters.size(), 2u);
    EXPECT_EQ(clusters[0].centre, 0);
    EXPECT_EQ(clusters[1].centre, 11);
    EXPECT_EQ(cluster<Mean>(std::vector<float>{7}, 5).size(), 1u);
    EXPECT_TRUE(cluster<Mean>(std::vector<float>{}, 5).empty());
    // Equal features: the second keeps its start.
    EXPECT_EQ(cluster<Mean>(std::vector<float>{3, 3, 3}, 2)[1].centre, 3);
}

constexpr std::size_t featureSize = 24;

/// A folder with a random projection, and algorithms with it.
struct L5 : ScratchFolder {
    explicit L5(unsigned seed = 5, std::size_t rows = 4328, std::size_t average = 4328) {
        std::mt19937 random(seed);
        Transformation t{Fn::Matrix<float>(rows, featureSize), Vector(average, 0.05f)};
        for (float* p = t.matrix.getExclusive(); p != t.matrix.getExclusive() + t.matrix.size(); ++p)
            *p = static_cast<float>(random() % 2001) / 1000 - 1;
        t.write(file("trans-l5x.dat"));
    }
    PCLD algorithm(const std::string& text = {}) const {
        std::istringstream stream("X.DataDir = " + path().string() + "\n" + text);
        const Fn::Deployment::Type& type = Fn::Deployment::type<L5Settings>();
        return PCLD(L5Settings(
            Fn::Deployment::Component(FNCountedPtr<AppConfigDB>(new AppVolatileConfigDB(stream)),
                                      Fn::Deployment::Property(type, "X", type.defaultValue(), "", false))));
    }
};

Cmp::Sample sample(unsigned seed) {
    return {FNImageReferenceFactory::create(randomImage(100, 100, seed)), {34, 40}, {66, 42}};
}

Cmp::FIR enrol(const PCLD& algorithm, const std::vector<unsigned>& seeds) {
    const Cmp::RecordBuilder builder = algorithm.createRecordBuilder();
    for (const unsigned seed : seeds) builder->pushSample(sample(seed));
    return builder->generate();
}

TEST(PCLD, RecordsKeepTheirFormAndTheirScores) {
    const L5 l5;
    const PCLD algorithm = l5.algorithm();
    EXPECT_EQ(algorithm.name(), "FIR 7.9 GPyrRankNormNoPreprocL5");
    const Cmp::RecordBuilder builder = algorithm.createRecordBuilder();
    EXPECT_EQ(thrownBy([&] { builder->generate(); }), "FNEBadFunCall: No faces provided to FIR generation!");
    EXPECT_EQ(thrownBy([&] { builder->pushSample(Cmp::Sample()); }),
              "FNEBadFunCall: Optional data accessed but not set!");
    EXPECT_EQ(thrownBy([&] { builder->createMemento(); }),
              "FNEBadFunCall: Recordbuilder::createMemento not supported");

    const Cmp::FIR a = enrol(algorithm, {1}), b = enrol(algorithm, {2, 3});
    const Cmp::FIR restored = builder->create(a.serialize()), none = builder->createVoid();
    EXPECT_TRUE(restored.serialize() == a.serialize());
    constexpr float greatest = std::numeric_limits<float>::max(),
                    least = std::numeric_limits<float>::lowest();
    EXPECT_EQ(algorithm.one2one(a, restored), greatest);
    EXPECT_EQ(algorithm.one2one(a, none), least);
    EXPECT_EQ(algorithm.one2one(a, b), algorithm.one2one(b, a));
    EXPECT_LT(algorithm.one2one(a, b), 0.99f);
    // The greatest of the cosines of what was pushed.
    const auto unit = [&](unsigned seed) {
        const Cmp::Sample s = sample(seed);
        const Vector v = algorithm.processSample(*s.intensityImage, *s.leftEye, *s.rightEye);
        return v / std::sqrt(v * v);
    };
    EXPECT_NEAR(algorithm.one2one(a, b), std::max(unit(1) * unit(2), unit(1) * unit(3)), 1e-5);

    std::vector<unsigned char> flat(b.mementoSize());
    unsigned char* memory = flat.data();
    b.createMemento(memory);
    EXPECT_EQ(memory, flat.data() + flat.size());
    EXPECT_EQ(flat.size(), 4 + 2 * 4 * (3 + featureSize));
    memory = flat.data();
    EXPECT_TRUE(builder->createFromMemento(memory).serialize() == b.serialize());
    EXPECT_EQ(memory, flat.data() + flat.size());
    EXPECT_EQ(builder->dumpSize(), enrol(algorithm, {1, 2, 3, 4, 5, 6, 7}).serialize().size());
    EXPECT_TRUE(algorithm.merge({}, a).serialize() == a.serialize());
    EXPECT_EQ(algorithm.merge({a, b}, a).mementoSize(), 4 + 4 * 4 * (3 + featureSize));
}

TEST(PCLD, ACentreMovesByWhatIsMoreThanRounding) {
    const L5 l5;
    const PCLD algorithm = l5.algorithm("X.MaxNumOfClusters = 1\n");
    const Cmp::RecordBuilder builder = algorithm.createRecordBuilder();
    /// A record of the unit vector at that angle in the plane of the first two components.
    const auto record = [&](double angle) {
        FNVector<int> words(featureSize, 0);
        words[0] = std::bit_cast<int>(static_cast<float>(std::cos(angle)));
        words[1] = std::bit_cast<int>(static_cast<float>(std::sin(angle)));
        return builder->create(Fn::Package(std::list<Fn::Package>{
            Fn::serialize<std::string>("FIR 7.9 GPyrRankNormNoPreprocL5::RefSet"),
            Fn::Package(std::list<Fn::Package>{Fn::Package(0.0f), Fn::Package(1.0f), Fn::Package(1.0f),
                                               Fn::serialize(words)})}));
    };
    const Cmp::FIR first = record(0);
    for (const auto& [distance, moves] : {std::pair{1.1e-5, false}, {1.3e-5, true}}) {
        const double angle = 2 * std::acos(1 - distance); // the mean of both is at half of it
        EXPECT_EQ(algorithm.merge({first}, record(angle)).serialize() == first.serialize(), !moves)
            << distance;
    }
    EXPECT_EQ(algorithm.merge({first, record(1)}, record(2)).mementoSize(), first.mementoSize())
        << "one cluster";
    EXPECT_TRUE(algorithm.sampleRequirements() == (Cmp::Sample::Requirements{true, true}));
}

TEST(PCLD, RefusesRecordsThatAreNotItsOwn) {
    const L5 l5;
    const PCLD algorithm = l5.algorithm(), other = l5.algorithm("X.FIRVersion = FIR 8\n");
    const Cmp::RecordBuilder builder = algorithm.createRecordBuilder();
    const Fn::Package record = enrol(algorithm, {1}).serialize();
    std::list<Fn::Package> children = record;
    const auto with = [&](const Fn::Package& feature) {
        return Fn::Package(std::list<Fn::Package>{children.front(), feature});
    };
    const auto words = [&](std::size_t n) {
        return Fn::Package(std::list<Fn::Package>{Fn::Package(0.0f), Fn::Package(1.0f), Fn::Package(1.0f),
                                                  Fn::serialize(FNVector<int>(n, 0))});
    };
    const std::string incompatible = "FNEBadArg: PCLD: loadrefSet: incompatible data";
    for (const auto& [package, text] : std::vector<std::pair<Fn::Package, std::string>>{
             {enrol(other, {1}).serialize(),
              "FNEBadArg: PCLD: loadFeatureSet: incompatible data: wrong version [FIR 8 "
              "GPyrRankNormNoPreprocL5::RefSet]"},
             {Fn::Package(), incompatible},
             {Fn::Package(std::list<Fn::Package>()), incompatible},
             {Fn::Package(7.0), "FNEBadArg: "},
             {with(Fn::Package(1)), "FNEBadArg: "},
             {with(words(featureSize - 1)), "FNEBadArg: PCLD: loadFeatureSet: incompatible data: FIR 7.9 "
                                            "GPyrRankNormNoPreprocL5: feature of 23 words instead of 24"},
             {with(words(featureSize)), "nothing thrown"}})
        EXPECT_EQ(thrownBy([&p = package, &builder] { builder->create(p); }).substr(0, text.size()), text);
}

TEST(PCLD, SearchesLikeItComparesOneByOne) {
    const L5 l5;
    const FNCountedPtr<ComparisonAlgorithm> algorithm(new PCLD(l5.algorithm()));
    const Cmp::FIR probe = enrol(l5.algorithm(), {1, 2});
    Cmp::Population people = algorithm->createPopulation(9);
    std::vector<std::pair<float, std::string>> expected;
    for (unsigned i = 0; i < 9; ++i) {
        const Cmp::FIR record = enrol(l5.algorithm(), {10 + i, 20 + i});
        people.add(record, std::to_string(i));
        expected.emplace_back(algorithm->one2one(probe, record), std::to_string(i));
    }
    std::ranges::sort(expected, std::greater());
    for (const unsigned int threads : {1u, 2u, 5u}) {
        const Cmp::Strategy strategy(algorithm, FNCountedPtr<ScoreMapping>(new IdentityScoreMapping),
                                     FNCountedPtr<RatesMapping>(), threads);
        const auto matches = strategy.compareRaw({{probe, -2.0f, 4}}, people).matches->front();
        std::size_t i = 0;
        for (auto match = matches.rbegin(); match != matches.rend(); ++match, ++i) {
            EXPECT_EQ(match->score, expected[i].first);
            EXPECT_EQ(match->id, expected[i].second);
        }
        EXPECT_EQ(i, 4u);
    }
    EXPECT_EQ(
        thrownBy([&] { algorithm->prepareFew2Many({probe}, Fn::View<Cmp::Population>({}).begin(), 0); }),
        "FNEBadArg: Pcld: Number of partitions has to be >= 1");
}

TEST(PCLD, IsotropisationNormalizesScores) {
    const L5 l5;
    const auto basis = [](std::size_t i, float length) {
        Vector v(featureSize, 0.0f);
        v[i] = length;
        return v;
    };
    std::ofstream file(l5.file("isotdb.dat"), std::ios::binary);
    Fn::serialize(Fn::SerializableList<Vector>({basis(0, 2), basis(1, 3), basis(2, 1)})).write(file);
    file.close();
    const PCLD algorithm = l5.algorithm("X.IsoTropisation = Enabled\n"), plain = l5.algorithm();
    const float cosine = plain.one2one(enrol(plain, {1}), enrol(plain, {2}));
    const auto statistics = [&](unsigned seed, double& mean) {
        const Cmp::Sample s = sample(seed);
        const Vector v = plain.processSample(*s.intensityImage, *s.leftEye, *s.rightEye);
        return (Vector(v.span().first(3)) / std::sqrt(v * v)).stdDeviation(mean);
    };
    double meanA = 0, meanB = 0;
    const double deviationA = statistics(1, meanA), deviationB = statistics(2, meanB);
    const double variance =
        (deviationA * deviationA + deviationB * deviationB) / 2 + std::pow((meanA - meanB) / 2, 2);
    EXPECT_NEAR(algorithm.one2one(enrol(algorithm, {1}), enrol(algorithm, {2})),
                (cosine - (meanA + meanB) / 2) / std::sqrt(variance), 1e-4);
    std::ofstream zero(l5.file("isotdb.dat"), std::ios::binary);
    Fn::serialize(Fn::SerializableList<Vector>({basis(0, 0)})).write(zero);
    zero.close();
    EXPECT_EQ(thrownBy([] { readIsotropisationData("/no/such"); }),
              "FNEIOError: PCLD: File `/no/such' could not be opened for reading.");
    EXPECT_EQ(thrownBy([&] { readIsotropisationData(l5.file("isotdb.dat")); }).substr(0, 11), "FNEBadArg: ");
}

TEST(PCLD, NamesWhatIsWrongWithItsSettingsAndFiles) {
    const L5 l5;
    const auto thrown = [](const L5& folder, const std::string& text) {
        return thrownBy([&] { folder.algorithm(text); });
    };
    EXPECT_EQ(thrown(l5, "X.Dir = y\n"), "FNEBadArg: L5Settings: invalid direction");
    EXPECT_EQ(thrown(l5, "X.Dir = z\n"), "nothing thrown");
    EXPECT_EQ(thrown(l5, "X.FIREncoding = ByteEncoding\n"), "FNEBadArg: Encoder not known.");
    EXPECT_EQ(thrown(l5, "X.Preprocessor = GPyr\n").substr(0, 45),
              "FNEBadArg: PCLD: Configured preprocessor GPyr");
    EXPECT_EQ(thrown(l5, "X.TransfFile = none.dat\n"),
              "FNEIOError: PCLD: File `" + l5.file("none.dat") + "' could not be opened for reading.");
    const std::string reading = " package reading file `";
    for (const auto& [rows, average, what] :
         {std::tuple{4320, 4328, "matrix"}, {4328, 4320, "average vector"}}) {
        const L5 wrong(1, static_cast<std::size_t>(rows), static_cast<std::size_t>(average));
        EXPECT_EQ(thrown(wrong, ""), std::string("FNEIOError: PCLD: invalid ") + what + reading +
                                         wrong.file("trans-l5x.dat") + "'.");
    }
    const std::string whole = l5.read("trans-l5x.dat");
    l5.write("cut.dat", whole.substr(0, whole.size() - 1));
    EXPECT_EQ(thrown(l5, "X.TransfFile = cut.dat\n"),
              "FNEIOError: PCLD: invalid average vector" + reading + l5.file("cut.dat") + "'.");
    EXPECT_EQ(thrownBy([&] { l5.algorithm().scoreMapping(); }),
              "FNEBadArg: PCLD: File `" + l5.file("smap-b5l5.dat") + "' could not be opened for reading.");
    EXPECT_EQ(l5.algorithm("X.SimMappingFile = \n").scoreMapping()->convert(3.5f).value(), 3.5f);
}

} // namespace
