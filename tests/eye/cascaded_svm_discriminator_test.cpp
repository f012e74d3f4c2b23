#include "eye/discriminator/cascaded_svm_discriminator.h"

#include "eye/discriminator/cascade_scaling.h"
#include "eye/random_svm.h"
#include "fn/deployment/app_config_db.h"
#include "fn/deployment/component.h"
#include "fn/serialize.h"
#include "support/each_target.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <cmath>
#include <filesystem>
#include <fstream>
#include <limits>
#include <sstream>

#include <unistd.h>

namespace {

using namespace Eye::Implementation;
using Signs = Fn::SignValueVector<int>;
using Kernel = TrainedSvm::Kernel;
using PolynomialTrained = CascadedSvmDiscriminator<FpKernelDeg2, TrainedLayout>;
using DotSods = CascadedSvmDiscriminator<DotKernel, CombinedSods16x16>;

constexpr std::uint32_t sodSize = SodConversion::trainedSize(16, 16);
constexpr float passesAll = -1e30f;

/// A cascade whose only step passes everything, so that all scores can be seen.
CascadeSettings open(std::size_t n) {
    return {"open.dat", {{std::to_string(n), passesAll}}};
}

/// By how much the score may differ from the float value: what the integers round off.
template <class K, class L>
double scoreBound(const CascadedSvmDiscriminator<K, L>& disc, const TrainedSvm& svm, const Signs& x) {
    const double n = static_cast<double>(svm.alphas.size()), unit = static_cast<double>(disc.resultScale());
    double bound = unit * (n + 1); // each shift drops up to 1, the bias 1/2
    const double shift = std::ldexp(1.0, static_cast<int>(disc.tables().alphaShift));
    for (std::size_t i = 0; i < svm.alphas.size(); ++i) {
        double k = x * svm.supportVectors[i], alpha = std::abs(static_cast<double>(svm.alphas[i]));
        double kernelRounding = 0;
        if constexpr (std::is_same_v<K, FpKernelDeg2>) {
            const double v = std::abs(k + disc.kernel().offset),
                         scale = std::ldexp(1.0, static_cast<int>(disc.kernel().shift));
            k = v * v / scale;
            kernelRounding = 1 + (v + 0.25) / scale; // of the shift, and of the offset
            alpha *= alphaFactor(disc.kernel());
        }
        bound += unit * std::abs(k) / 2 / shift + alpha * kernelRounding; // alphas are rounded to integers
    }
    return bound * 1.001 + 1e-6; // floats
}

template <class Disc> class CascadedSvmDiscriminatorOf : public testing::Test {};

template <class Disc_, Kernel kernel_, std::uint32_t trainedSize_> struct Instance {
    using Disc = Disc_;
    static constexpr Kernel kernel = kernel_;
    static constexpr std::uint32_t trainedSize = trainedSize_;
};
using Instances = testing::Types<
    Instance<DotSods, Kernel::Dot, sodSize>,
    Instance<CascadedSvmDiscriminator<FpKernelDeg2, CombinedSods16x16>, Kernel::FullPolynomialDegree2,
             sodSize>,
    Instance<PolynomialTrained, Kernel::FullPolynomialDegree2, 7072>,
    Instance<CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<7, 7, 6>>,
             Kernel::FullPolynomialDegree2, 2460>,
    Instance<CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<8, 6, 6>>,
             Kernel::FullPolynomialDegree2, 2400>,
    Instance<CascadedSvmDiscriminator<FpKernelDeg2, SparseGaborSodColumnAlignedLayout<8, 8, 6>>,
             Kernel::FullPolynomialDegree2, 3288>>;
TYPED_TEST_SUITE(CascadedSvmDiscriminatorOf, Instances);

TYPED_TEST(CascadedSvmDiscriminatorOf, ScoresAreTheFloatValuesWithinWhatTheIntegersRoundOff) {
    std::mt19937 random(1);
    double largestShare = 0;
    for (unsigned seed = 0; seed < 20; ++seed) {
        const std::size_t n = 1 + random() % 60;
        const float constant = static_cast<float>(random() % 5) * 0.3f - 0.6f;
        const TrainedSvm svm = randomSvm(TypeParam::kernel, n, TypeParam::trainedSize, seed, constant, 250);
        const typename TypeParam::Disc disc(svm, open(n));
        for (int i = 0; i < 5; ++i) {
            // Random windows have small products; a support vector itself has one of the largest.
            const Signs x = i == 0 ? svm.supportVectors[0] : randomSigns(TypeParam::trainedSize, random);
            float score = 0;
            ASSERT_TRUE(disc(TypeParam::Disc::LayoutType::convert(x, 0), score));
            const double error = std::abs(static_cast<double>(score) - svm.evaluate(x)),
                         bound = scoreBound(disc, svm, x);
            EXPECT_LE(error, bound) << "n " << n << " seed " << seed;
            largestShare = std::max(largestShare, error / bound);
        }
    }
    EXPECT_GT(largestShare, 0.01); // a bound that is never approached proves little
}

TYPED_TEST(CascadedSvmDiscriminatorOf, SurvivesItsPackage) {
    const TrainedSvm svm = randomSvm(TypeParam::kernel, 6, TypeParam::trainedSize, 2);
    const typename TypeParam::Disc disc(svm, {"model.dat", {{"1", -0.5f}, {"6", -0.1f}}});
    const typename TypeParam::Disc read(disc.serialize());
    EXPECT_EQ(read.processingId(), disc.processingId());
    std::mt19937 random(3);
    for (int i = 0; i < 50; ++i) {
        const Signs x = randomSigns(disc.dimension(), random);
        float score = 0, readScore = 1;
        EXPECT_EQ(disc(x, score), read(x, readScore));
        EXPECT_EQ(score, readScore);
    }
    EXPECT_TRUE(Fn::Package(read).cores().size() > 10 && disc.serialize().size() == read.serialize().size());
}

/// Evaluates step by step without leaving early.
template <class K, class L> bool passes(const CascadedSvmDiscriminator<K, L>& disc, const Signs& x) {
    const CascadeTables& t = disc.tables();
    const auto vectors = getVectors(t);
    const auto kernelValue = [&](std::size_t j) -> std::int32_t { return disc.kernel()(x * vectors[j]); };
    if (t.firstStepShortcut && kernelValue(0) < t.firstStepThreshold) return false;
    for (const auto& step : t.steps) {
        std::int64_t sum = -std::int64_t{t.bias};
        for (std::uint32_t j = 0; j < std::max(1u, step.limit); ++j)
            sum += kernelValue(j) * t.alphas[j] >> t.alphaShift;
        if (sum < step.threshold) return false;
    }
    return true;
}

TYPED_TEST(CascadedSvmDiscriminatorOf, DecidesAlikeOnEveryTargetWithAndWithoutEarlyExit) {
    using Disc = typename TypeParam::Disc;
    const TrainedSvm svm = randomSvm(TypeParam::kernel, 40, TypeParam::trainedSize, 4);
    // Thresholds at which a good part of random windows passes each step.
    const Disc scores(svm, open(40));
    std::mt19937 random(5);
    std::vector<float> seen;
    for (int i = 0; i < 101; ++i) {
        float score;
        scores(randomSigns(scores.dimension(), random), score);
        seen.push_back(score);
    }
    std::nth_element(seen.begin(), seen.begin() + 50, seen.end());
    const Disc disc(svm, {"", {{"1", -2.5f}, {"7", seen[50] - 3}, {"40", seen[50]}}});
    std::vector<Signs> windows;
    for (int i = 0; i < 200; ++i) windows.push_back(randomSigns(disc.dimension(), random));
    std::size_t accepted = 0;
    forEachTarget([&] {
        accepted = 0;
        for (const Signs& x : windows) {
            float score = 0;
            const bool expected = passes(disc, x);
            EXPECT_EQ(disc(x, score), expected);
            EXPECT_EQ(score == -99.0f, !expected);
            accepted += expected;
            std::vector<unsigned char> padded(disc.tables().stride);
            std::copy_n(x.bytes(), x.byteCount(), padded.begin());
            std::int64_t fast = 0, plain = 0;
            EXPECT_EQ(evaluateCascade(disc.tables(), disc.kernel(), padded.data(), fast),
                      Plain::evaluateCascade(disc.tables(), disc.kernel(), padded.data(), plain));
            EXPECT_EQ(fast, plain);
        }
    });
    EXPECT_GT(accepted, 10u);
    EXPECT_LT(accepted, 190u);
}

/// Eight values, no kernel constant, scale 1: small enough to follow by hand.
TrainedSvm byHand(const std::vector<float>& alphas, float bias) {
    TrainedSvm svm;
    svm.kernel = Kernel::FullPolynomialDegree2;
    svm.bias = bias;
    svm.alphas = alphas;
    for (std::size_t i = 0; i < alphas.size(); ++i) {
        Signs v(8);
        v.exclusiveBytes()[0] = static_cast<unsigned char>(i);
        svm.supportVectors.push_back(v);
    }
    return svm;
}

TEST(CascadedSvmDiscriminator, ScalesASingleVectorByHand) {
    const PolynomialTrained disc(byHand({2.0f}, 16.0f), open(1));
    const CascadeTables& t = disc.tables();
    EXPECT_EQ(disc.kernel().shift, 0u); // 8 * 8 fits 15 bits
    EXPECT_EQ(t.alphaShift, 1u);
    ASSERT_EQ(t.alphas, std::vector<std::int16_t>{32767});
    EXPECT_EQ(t.bias, 131068);                         // 16 * 32767 / 2 / 2
    EXPECT_FLOAT_EQ(disc.resultScale(), 4.0f / 32767); // 2 / f
    float score = 0;
    ASSERT_TRUE(disc(Signs(8), score));
    EXPECT_FLOAT_EQ(score, 2 * 64 - 16);
    Signs far(8);
    far.exclusiveBytes()[0] = 0x0F;
    ASSERT_TRUE(disc(far, score));
    EXPECT_FLOAT_EQ(score, -16);
}

TEST(CascadedSvmDiscriminator, OrdersVectorsWithinEachStep) {
    const std::vector<float> alphas{1, -1, 2, 1, -3, 0, -3, 5};
    const auto order = [&](const std::vector<FloatStep>& steps) { return evaluationOrder(alphas, steps); };
    EXPECT_EQ(order({{8, 0}}), (std::vector<std::uint32_t>{7, 2, 3, 0, 4, 6, 1, 5}));
    EXPECT_EQ(order({{1, 0}, {4, 0}, {8, 0}}), (std::vector<std::uint32_t>{0, 2, 3, 1, 7, 4, 6, 5}));
}

TEST(CascadedSvmDiscriminator, FirstStepRejectsOnTheProductAlone) {
    TrainedSvm svm = byHand({1.0f, 1.0f}, 0.0f);
    const PolynomialTrained disc(svm, {"", {{"2", -1.0f}, {"1", 40.0f}}});
    EXPECT_TRUE(disc.tables().firstStepShortcut);
    EXPECT_EQ(disc.tables().firstStepThreshold, 40); // (40 + 0) / 1
    float score = 0;
    EXPECT_TRUE(disc(Signs(8), score)); // 64
    Signs x(8);
    x.exclusiveBytes()[0] = 0x10;
    EXPECT_FALSE(disc(x, score)); // 36
    EXPECT_EQ(score, -99.0f);
    EXPECT_FALSE(PolynomialTrained(svm, {"", {{"1", 40.0f}}}).tables().firstStepShortcut);
}

TEST(CascadedSvmDiscriminator, ThresholdsSaturate) {
    const TrainedSvm svm = byHand({1.0f, -1.0f, 0.0f}, 0.0f);
    float score = 0;
    EXPECT_FALSE(PolynomialTrained(svm, {"", {{"3", 1e30f}}})(Signs(8), score));
    EXPECT_TRUE(PolynomialTrained(svm, {"", {{"3", -1e30f}}})(Signs(8), score));
    EXPECT_TRUE(PolynomialTrained(svm, {"", {}})(Signs(8), score)); // -99 at the last vector
}

TEST(CascadedSvmDiscriminator, NamesItsParts) {
    EXPECT_EQ(DotSods(randomSvm(Kernel::Dot, 2, sodSize, 1), {"is1717da.dat", {{"1", -1.9f}, {"2", -0.6f}}})
                  .processingId(),
              "Svm-Dot-Col16x16-is1717da.dat1--1.9-2--0.6");
    EXPECT_EQ(PolynomialTrained(byHand({1.0f}, 0), {"f.dat", {}}).processingId(), "Svm-FP2-TL-f.dat");
}

TEST(CascadedSvmDiscriminator, RefusesWhatDoesNotFitItsIntegers) {
    const std::string dimension =
        "Dimension of support vectors too large for this discriminator implementation!";
    const auto text = [](const TrainedSvm& svm) {
        return thrownText<FNEBadFormat>([&] { PolynomialTrained(svm, {"", {}}); });
    };
    EXPECT_EQ(text(byHand({0.0f, 0.0f}, 1)), "All alphas equal zero!");
    TrainedSvm svm = byHand({1.0f}, 0);
    svm.supportVectors = {Signs(46400)};
    EXPECT_EQ(text(svm), dimension);
    svm = byHand({1.0f}, 0);
    svm.kernelConstant = 46340;
    EXPECT_EQ(text(svm), dimension);
    svm.kernelConstant = 3e9f;
    EXPECT_EQ(text(svm),
              "Absolute value of kernel threshold too large for this discriminator implementation!");
    svm.kernelConstant = std::numeric_limits<float>::quiet_NaN();
    EXPECT_EQ(text(svm),
              "Absolute value of kernel threshold too large for this discriminator implementation!");
    svm = byHand({std::numeric_limits<float>::infinity()}, 0);
    EXPECT_EQ(text(svm), "invalid alphas");
    svm = byHand({1.0f}, 0);
    svm.kernelScale = 0;
    EXPECT_EQ(text(svm), "invalid alphas");
    // The largest that fits: every product is in the range of 16 bits.
    svm = byHand({1.0f}, 0);
    svm.supportVectors = {Signs(46340)};
    const PolynomialTrained disc(svm, open(1));
    float score = 0;
    ASSERT_TRUE(disc(Signs(46340), score));
    EXPECT_NEAR(score, 46340.0 * 46340, 46340.0 * 46340 * 1e-4);
}

TEST(CascadedSvmDiscriminator, RefusesStepsAndWindowsThatDoNotFit) {
    const TrainedSvm svm = byHand({1.0f, -1.0f}, 0);
    for (const std::string entry : {"x", "-1", "", "1x", "99999999999"})
        EXPECT_EQ(thrownText<FNEBadArg>([&] {
                      PolynomialTrained(svm, {"", {{entry, 0.0f}}});
                  }),
                  "CascadedSvmDiscriminator: invalid number of steps [" + entry +
                      "] in configuration of cascade.");
    EXPECT_THROW(PolynomialTrained(svm, {"", {{"3", 0.0f}}}), FNEOutOfRange);
    float score = 0;
    EXPECT_THROW(PolynomialTrained(svm, {"", {}})(Signs(9), score), FNEBadArg);
}

class DiscriminatorFile : public testing::Test {
protected:
    DiscriminatorFile()
        : directory_(std::filesystem::temp_directory_path() / ("orbek_disc_" + std::to_string(getpid()))) {
        std::filesystem::create_directories(directory_);
    }
    ~DiscriminatorFile() override { std::filesystem::remove_all(directory_); }
    void write(const std::string& bytes) { std::ofstream(path(), std::ios::binary) << bytes; }
    std::string path() const { return directory_.string() + "/model.dat"; }
    PolynomialTrained load() const {
        return PolynomialTrained(CascadeSettings{"model.dat", {}}, directory_.string());
    }
    /// The reason behind the path in the failure to load `bytes`.
    std::string reason(const std::string& bytes) {
        write(bytes);
        return reasonOf(thrownText<FNEIOError>([&] { load(); }));
    }
    std::string reasonOf(const std::string& text) const {
        const std::string start =
            "CascadedSvmDiscriminator: error during read of template file `" + path() + "' : ";
        return text.rfind(start, 0) == 0 ? text.substr(start.size()) : text;
    }
    static std::string bytesOf(const TrainedSvm& svm) {
        std::ostringstream stream;
        svm.write(stream);
        return stream.str();
    }

    std::filesystem::path directory_;
};

TEST_F(DiscriminatorFile, HoldsTheMachine) {
    const TrainedSvm svm = randomSvm(Kernel::FullPolynomialDegree2, 5, 100, 6);
    const std::string bytes = bytesOf(svm);
    EXPECT_EQ(bytes.rfind("FullPolynomial 2 0.5 300 ", 0), 0u);
    write(bytes);
    const PolynomialTrained disc = load(), direct(svm, {"model.dat", {}});
    std::mt19937 random(7);
    for (int i = 0; i < 20; ++i) {
        const Signs x = randomSigns(100, random);
        float score = 0, directScore = 1;
        EXPECT_EQ(disc(x, score), direct(x, directScore));
        EXPECT_EQ(score, directScore);
    }
    std::istringstream stream(bytesOf(randomSvm(Kernel::Dot, 2, 100, 8)));
    EXPECT_EQ(bytesOf(TrainedSvm::read(stream, Kernel::Dot)), stream.str());
}

TEST_F(DiscriminatorFile, IsNamedWithTheReasonOfItsFailure) {
    EXPECT_EQ(reasonOf(thrownText<FNEIOError>([&] { load(); })), "file could not be opened for reading");
    EXPECT_EQ(reason("Dot 1\n"),
              "Kernel Type of template file is Dot and does not match the requested kernel type "
              "FullPolynomialDegree2");
    EXPECT_EQ(reason("FullPolynomial 3 0 1 0\n"), "Kernel degree must be 2!");
    EXPECT_EQ(reason("FullPolynomial 2 0 1 0\n"), "invalid alphas");
    EXPECT_EQ(reason("FullPolynomial 2 0\n"), "invalid kernel scale");

    const auto file = [](const std::list<Fn::Package>& packages) {
        std::ostringstream stream;
        stream << "FullPolynomial 2 0 1 0\n";
        for (const auto& package : packages) package.write(stream);
        return stream.str();
    };
    const Fn::Package alphas(FNVector<float>(2, 1.0f)), vector(Signs(8));
    EXPECT_EQ(reason(file({Fn::Package(1)})), "converting to Vector<T> from an invalid package");
    EXPECT_EQ(reason(file({alphas, vector})), "invalid support vector[1]");
    EXPECT_EQ(reason(file({alphas, vector, Fn::Package(Signs(9))})), "invalid support vector[1]");
    EXPECT_EQ(reason(file({alphas, Fn::Package(1)})), "SignValueVector: construction from invalid package");
    EXPECT_EQ(reason(file({Fn::Package(FNVector<float>(0)), vector})), "invalid alphas");
    // Counts beyond anything that follows.
    EXPECT_EQ(reason("FullPolynomial 2 0 1 0\n\xFF\xFF\xFF\xFF"), "invalid alphas");
    EXPECT_EQ(reason(std::string("FullPolynomial 2 0 1 0\n\0\0\0\2\0\0\0\4\xFF\xFF\xFF\xFF", 35)),
              "invalid alphas");
}

TEST_F(DiscriminatorFile, IsChosenByTheConfiguration) {
    using namespace Fn::Deployment;
    const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB);
    const Component root(db, Property(type<CascadeSettings>(), "Disc", "", "", false));
    root.subComponent("File").write("model.dat");
    root.subComponent("Cascade").write("1 2");
    root.subComponent("Cascade").subComponent("1").write("-2");
    root.subComponent("Cascade").subComponent("2").write("0.5");
    write(bytesOf(byHand({1.0f, -1.0f}, 0)));
    const PolynomialTrained disc(root, directory_.string());
    ASSERT_EQ(disc.tables().steps.size(), 2u);
    EXPECT_LT(disc.tables().steps[0].threshold, 0);
    EXPECT_EQ(disc.processingId(), "Svm-FP2-TL-model.dat1--2-2-0.5");
}

TEST(CascadedSvmDiscriminator, RefusesPackagesThatContradictThemselves) {
    const PolynomialTrained disc(byHand({1.0f, -1.0f}, 0), {"", {}});
    const std::list<Fn::Package> parts = disc.serialize();
    const auto with = [&](std::size_t index, const Fn::Package& part) {
        auto changed = parts;
        *std::next(changed.begin(), static_cast<std::ptrdiff_t>(index)) = part;
        return Fn::Package(changed);
    };
    ASSERT_NO_THROW(PolynomialTrained(with(2, Fn::Package(7))));
    EXPECT_THROW(PolynomialTrained(with(1, Fn::Package(FNVector<short>(3)))), FNEBadArg); // an alpha too many
    EXPECT_THROW(PolynomialTrained(with(5, Fn::Package(Fn::SerializableVector<unsigned int>{3}))), FNEBadArg);
    EXPECT_THROW(PolynomialTrained(with(7, Fn::Package(32u))), FNEBadArg);    // a shift too wide
    EXPECT_THROW(PolynomialTrained(with(10, Fn::Package(40000))), FNEBadArg); // not in 16 bits
    EXPECT_THROW(PolynomialTrained{Fn::Package(1)}, FNEBadArg);
    EXPECT_THROW(DotSods{disc.serialize()}, FNEBadArg); // a kernel with fields
}

} // namespace
