#include "eye/discriminator/linear_discriminator.h"
#include "eye/discriminator/svm_fp_discriminator.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <sstream>

namespace {

using Features = Img::FeatureVector<float>;

FNVector<float> vectorOf(const std::vector<float>& values) {
    return FNVector<float>(values);
}

FNVector<float> randomVector(std::size_t n, std::mt19937& random) {
    FNVector<float> values(n);
    for (std::size_t i = 0; i < n; ++i) values[i] = std::uniform_real_distribution<float>(-1, 1)(random);
    return values;
}

Eye::FullPolynomialSvm randomSvm(std::size_t n, std::size_t dimension, int degree, unsigned seed) {
    std::mt19937 random(seed);
    Eye::FullPolynomialSvm svm;
    svm.degree = degree;
    svm.constant = 0.5f;
    svm.scale = 4;
    svm.bias = 0.1f;
    svm.name = "random";
    svm.support.alphas = randomVector(n, random);
    for (std::size_t i = 0; i < n; ++i) svm.support.vectors.push_back(randomVector(dimension, random));
    return svm;
}

/// The definition, in double.
double evaluate(const Eye::FullPolynomialSvm& svm, const FNVector<float>& x) {
    double result = -svm.bias;
    for (std::size_t i = 0; i < svm.support.vectors.size(); ++i) {
        double product = 0;
        for (std::size_t j = 0; j < x.size(); ++j)
            product += double{x.get()[j]} * double{svm.support.vectors[i].get()[j]};
        result += svm.support.alphas[i] * std::pow(product / svm.scale + svm.constant, svm.degree);
    }
    return result;
}

template <class Model> std::string bytesOf(const Model& model) {
    std::ostringstream stream;
    model.write(stream);
    return stream.str();
}

TEST(SVMFPDiscriminator, ScoresAreThoseOfTheDefinition) {
    std::mt19937 random(1);
    for (const int degree : {1, 2, 3}) {
        const auto svm = randomSvm(20, 300, degree, 2);
        const Eye::SVMFPDiscriminator disc(svm, -1e9);
        for (int i = 0; i < 5; ++i) {
            const auto x = randomVector(300, random);
            double score = 0;
            EXPECT_TRUE(disc(Features(x), score));
            EXPECT_NEAR(score, evaluate(svm, x), 1e-3);
        }
    }
}

TEST(SVMFPDiscriminator, LeavesEarlyOnlyWithWhatIsRejectedAnyway) {
    const auto svm = randomSvm(30, 50, 2, 3);
    std::mt19937 random(4);
    std::size_t early = 0;
    for (int i = 0; i < 100; ++i) {
        const auto x = randomVector(50, random);
        double full = 0, score = 0;
        Eye::SVMFPDiscriminator(svm, -1e9)(Features(x), full);
        const double threshold = 1;
        EXPECT_EQ(Eye::SVMFPDiscriminator(svm, threshold)(Features(x), score), full > threshold);
        early += score != full;
        EXPECT_TRUE(score == full || score < threshold);
    }
    EXPECT_GT(early, 0u);
}

/// Two variants: the values in reverse order, and rotated by one.
class TwoVariants final : public Img::FeatureVectorLayout<float> {
public:
    unsigned int variants() const override { return 2; }
    Features canonicalToIntermediate(const Features& canonical, unsigned int variant) const override {
        const auto& values = canonical.values();
        FNVector<float> result(values.size());
        for (std::size_t i = 0; i < values.size(); ++i)
            result[i] = values.get()[variant == 0 ? values.size() - 1 - i : (i + 1) % values.size()];
        return Features(result, variant);
    }
};

TEST(FloatDiscriminators, GiveOneScoreInEveryVariantOfALayout) {
    const Eye::FloatLayout layout = FNCountedPtr<TwoVariants>(new TwoVariants);
    const auto svm = randomSvm(5, 40, 2, 5);
    std::mt19937 random(6);
    const auto weights = randomVector(40, random), x = randomVector(40, random);
    const Eye::SVMFPDiscriminator disc(svm, -1e9, layout);
    const Eye::LdDiscriminator linear(weights, -1e9, layout);
    for (const Features& form : {Features(x), layout->canonicalToIntermediate(Features(x), 0),
                                 layout->canonicalToIntermediate(Features(x), 1)}) {
        double score = 0;
        disc(form, score);
        EXPECT_NEAR(score, evaluate(svm, x), 1e-4);
        linear(form, score);
        EXPECT_NEAR(score, weights * x, 1e-5);
    }
}

TEST(CompositeDiscriminator, AsksTheSecondOnlyAboutWhatTheFirstAccepts) {
    const auto svm = randomSvm(1, 2, 2, 7);
    const Eye::CompositeDiscriminator composite(Eye::LdDiscriminator(vectorOf({1, 0}), 1.0),
                                                Eye::SVMFPDiscriminator(svm, -1e9));
    double score = 0;
    EXPECT_FALSE(composite(Features(vectorOf({1, 5})), score)); // equal is not above
    EXPECT_EQ(score, 1);
    EXPECT_TRUE(composite(Features(vectorOf({2, 5})), score));
    EXPECT_NEAR(score, evaluate(svm, vectorOf({2, 5})), 1e-4);
}

TEST(SVMHyperbolicDiscriminator, LeavesOutTheSquaresOfSingleFeatures) {
    Eye::SVMHyperbolicDiscriminator disc;
    disc.constant = 1;
    disc.scale = 2;
    disc.bias = 3;
    disc.support.alphas = vectorOf({2});
    disc.support.vectors = {vectorOf({1, 2})};
    double score = 0;
    // x * v = 3 + 8 = 11, squares 9 + 64: 2 * ((1 + 11 / 2)^2 - 73 / 4) - 3
    EXPECT_TRUE(disc(Features(vectorOf({3, 4})), score));
    EXPECT_DOUBLE_EQ(score, 45);
    EXPECT_THROW(disc(Features(vectorOf({3})), score), FNEBadArg);
}

TEST(SVMFPDiscriminatorFixed, FollowsTheFloatFormWithinEightBits) {
    auto svm = randomSvm(10, 200, 2, 8);
    svm.scale = 100000;
    const Eye::SVMFPDiscriminatorFixed fixed(svm, -1e9);
    std::mt19937 random(9);
    for (int i = 0; i < 5; ++i) {
        FNVector<short> x(200);
        FNVector<float> same(200);
        for (std::size_t j = 0; j < 200; ++j) same[j] = x[j] = static_cast<short>(random() % 65536);
        double score = 0;
        fixed(Img::FeatureVector<short>(x), score);
        EXPECT_NEAR(score, evaluate(svm, same), 0.05 * (std::abs(evaluate(svm, same)) + 1));
    }
}

TEST(SvmDisc, RepresentsNumbersByAPowerOfTwoAboveThem) {
    struct Case {
        float v;
        int value, exponent;
    };
    for (const Case& c :
         {Case{0, 0, 0}, {1, 64, 1}, {-1, -64, 1}, {0.75f, 95, 0}, {0.25f, 64, -1}, {1000, 124, 10}}) {
        int exponent = 99;
        EXPECT_EQ(Eye::SvmDisc::getRepresentation(c.v, exponent), c.value) << c.v;
        EXPECT_EQ(exponent, c.exponent) << c.v;
    }
    EXPECT_EQ(Eye::SvmDisc::ipow2(-3), 0.125f);
    EXPECT_EQ(Eye::SvmDisc::ipow2(5), 32);
}

TEST(FloatDiscriminatorFiles, AreReadAsWritten) {
    const auto svm = randomSvm(3, 4, 2, 10);
    const std::string bytes = bytesOf(svm);
    EXPECT_EQ(bytes.rfind("FullPolynomial 2 0.5 4 0.100000001 3 4 , random\n", 0), 0u);
    std::istringstream stream(bytes);
    EXPECT_EQ(bytesOf(Eye::FullPolynomialSvm::read(stream, "")), bytes);

    const Eye::LdDiscriminator linear(vectorOf({1, 2, 3}), 0, Eye::canonicalLayout(), "weights");
    EXPECT_EQ(bytesOf(linear).rfind("ld 3 , weights\n", 0), 0u);
    std::istringstream linearStream(bytesOf(linear));
    EXPECT_EQ(bytesOf(Eye::LdDiscriminator(linearStream, 0)), bytesOf(linear));

    Eye::SVMHyperbolicDiscriminator hyperbolic;
    hyperbolic.support = svm.support;
    std::istringstream hyperbolicStream(bytesOf(hyperbolic));
    EXPECT_EQ(bytesOf(Eye::SVMHyperbolicDiscriminator(hyperbolicStream)), bytesOf(hyperbolic));

    Eye::SVMRBFDiscriminator rbf;
    rbf.gamma = 0.1;
    rbf.support = svm.support;
    std::istringstream rbfStream(bytesOf(rbf));
    EXPECT_EQ(bytesOf(Eye::SVMRBFDiscriminator(rbfStream)), bytesOf(rbf));

    Eye::QuadDiscriminator quad;
    quad.dimension = 2;
    quad.coefficients = FNVector<double>(5, 0.1);
    std::istringstream quadStream(bytesOf(quad));
    EXPECT_EQ(bytesOf(Eye::QuadDiscriminator(quadStream)), bytesOf(quad));
}

TEST(FloatDiscriminatorFiles, AreRefusedWithTheirReason) {
    const auto text = [](const std::string& bytes) {
        return thrownText<FNEBadFormat>([&] {
            std::istringstream stream(bytes);
            Eye::SVMFPDiscriminator(stream, 0);
        });
    };
    const std::string mismatch = "SVMFPDiscriminator: Data file format mismatch!",
                      corrupt = "Found corrupt template file";
    EXPECT_EQ(text(""), mismatch);
    EXPECT_EQ(text("FullPolynomia 2"), mismatch);
    EXPECT_EQ(text("Hyperbolic 1 2 3 0 0 , x\n"), mismatch);
    const std::string good = bytesOf(randomSvm(2, 3, 2, 11));
    EXPECT_EQ(text(good), "nothing thrown");
    for (std::size_t length = 14; length < good.size(); ++length)
        EXPECT_EQ(text(good.substr(0, length)), corrupt) << length;
    EXPECT_EQ(text("FullPolynomial 2 1 1 0 2 3 , a name of more than 27 characters\n"), corrupt);
    EXPECT_EQ(text("FullPolynomial 2 1 1 0 -2 3 , x\n"), corrupt);
    EXPECT_EQ(text("FullPolynomial 2000000000 1 1 0 2 3 , x" + good.substr(good.find('\n'))), corrupt);
    EXPECT_EQ(text("FullPolynomial 2 1 1 0 2000000000 3 , x" + good.substr(good.find('\n'))), corrupt);
    EXPECT_EQ(thrownText<FNEIOError>([] { Eye::SVMFPDiscriminator::create("/nowhere", "disc.dat", 0); }),
              "SVMFPDiscriminator: error opening template file `/nowhere/disc.dat'.");
    Eye::QuadDiscriminator unnamed;
    unnamed.name = "a\nb";
    EXPECT_THROW(bytesOf(unnamed), FNEBadArg);
}

} // namespace
