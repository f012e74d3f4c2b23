#include "eye/discriminator/svm_fp_discriminator.h"

#include "eye/discriminator/alpha_order.h"
#include "eye/discriminator/template_stream.h"
#include "fn/numeric/vector_primitives.h"

#include <algorithm>
#include <cmath>
#include <numeric>

namespace Eye {
namespace {

/// The machine with its support vectors in order of evaluation.
FullPolynomialSvm ordered(const FullPolynomialSvm& svm) {
    svm.support.requireConsistent();
    const FNVector<float>& alphas = svm.support.alphas;
    std::vector<std::size_t> order(alphas.size());
    std::iota(order.begin(), order.end(), std::size_t{0});
    Implementation::sortByAlpha(order.begin(), order.end(), alphas.get());
    FullPolynomialSvm result(svm);
    for (std::size_t i = 0; i < order.size(); ++i) {
        result.support.alphas[i] = alphas.get()[order[i]];
        result.support.vectors[i] = svm.support.vectors[order[i]];
    }
    return result;
}

/// Sums up alpha * k^degree for the kernel bases k that `base(i)` gives.
template <class Base>
bool evaluate(const FullPolynomialSvm& svm, double threshold, double& score, Base base) {
    const float* const alphas = svm.support.alphas.get();
    const std::size_t n = svm.support.alphas.size();
    const bool even = svm.degree % 2 == 0;
    score = -static_cast<double>(svm.bias);
    for (std::size_t i = 0; i < n; ++i) {
        const double k = static_cast<double>(base(i));
        double power = 1;
        for (int d = 0; d < svm.degree; ++d) power *= k;
        score += static_cast<double>(alphas[i]) * power;
        if (even && i + 1 < n && alphas[i + 1] < 0 && score < threshold) return false;
    }
    return score > threshold;
}

void requireSize(std::size_t found, std::size_t expected, const char* name) {
    if (found != expected)
        FN_THROW(FNEBadArg, std::string(name) + ": feature vector of " + std::to_string(found) +
                                " instead of " + std::to_string(expected) + " values");
}

} // namespace

SVMFPDiscriminator::SVMFPDiscriminator(const FullPolynomialSvm& svm, const double& threshold,
                                       const FloatLayout& layout)
    : svm_(ordered(svm)), threshold_(threshold), layout_(layout), vectors_(layout->variants()) {
    for (unsigned int variant = 0; variant < layout_->variants(); ++variant)
        for (const auto& vector : svm_.support.vectors)
            vectors_[variant].push_back(
                layout_->canonicalToIntermediate(Img::FeatureVector<float>(vector), variant).values());
}

SVMFPDiscriminator::SVMFPDiscriminator(std::istream& stream, const double& threshold,
                                       const FloatLayout& layout)
    : SVMFPDiscriminator(FullPolynomialSvm::read(stream, "SVMFPDiscriminator"), threshold, layout) {}

SVMFPDiscriminator SVMFPDiscriminator::create(const std::string& directory, const std::string& file,
                                              const double& threshold, const FloatLayout& layout) {
    return Implementation::readTemplate(directory, file, "SVMFPDiscriminator", [&](std::istream& stream) {
        return SVMFPDiscriminator(stream, threshold, layout);
    });
}

bool SVMFPDiscriminator::operator()(const Img::FeatureVector<float>& x, double& score) const {
    requireSize(x.size(), dimension(), "SVMFPDiscriminator");
    const Img::FeatureVector<float> features = x.canonical() ? layout_->canonicalToIntermediate(x, 0) : x;
    const auto& vectors = vectors_.at(features.variant());
    const float* const values = features.values().get();
    return evaluate(svm_, threshold_, score, [&](std::size_t i) {
        return Fn::Numeric::dot(values, vectors[i].get(), features.size()) / svm_.scale + svm_.constant;
    });
}

SVMFPDiscriminatorFixed::SVMFPDiscriminatorFixed(const FullPolynomialSvm& svm, const double& threshold)
    : svm_(ordered(svm)), threshold_(threshold) {
    for (const auto& vector : svm_.support.vectors) {
        float largest = 0;
        for (const float v : vector) {
            if (!std::isfinite(v)) FN_THROW(FNEBadFormat, "SVMFPDiscriminatorFixed: value that is no number");
            largest = std::max(largest, std::abs(v));
        }
        int exponent;
        SvmDisc::getRepresentation(largest, exponent);
        FixedVector fixed{std::vector<signed char>(vector.size()), SvmDisc::ipow2(exponent) / 127};
        std::transform(vector.begin(), vector.end(), fixed.values.begin(), [&](float v) {
            return static_cast<signed char>(std::round(std::ldexp(v, -exponent) * 127));
        });
        vectors_.push_back(std::move(fixed));
    }
}

SVMFPDiscriminatorFixed::SVMFPDiscriminatorFixed(std::istream& stream, const double& threshold)
    : SVMFPDiscriminatorFixed(FullPolynomialSvm::read(stream, "SVMFPDiscriminatorFixed"), threshold) {}

SVMFPDiscriminatorFixed SVMFPDiscriminatorFixed::create(const std::string& directory, const std::string& file,
                                                        const double& threshold) {
    return Implementation::readTemplate(
        directory, file, "SVMFPDiscriminatorFixed",
        [&](std::istream& stream) { return SVMFPDiscriminatorFixed(stream, threshold); });
}

bool SVMFPDiscriminatorFixed::operator()(const Img::FeatureVector<short>& x, double& score) const {
    requireSize(x.size(), svm_.support.dimension(), "SVMFPDiscriminatorFixed");
    return evaluate(svm_, threshold_, score, [&](std::size_t i) {
        const std::int64_t product = Fn::Numeric::dot(vectors_[i].values.data(), x.values().get(), x.size());
        return static_cast<float>(product) * vectors_[i].unit / svm_.scale + svm_.constant;
    });
}

float SvmDisc::ipow2(int exponent) {
    return std::ldexp(1.0f, exponent);
}

signed char SvmDisc::getRepresentation(float v, int& exponent) {
    std::frexp(v, &exponent);
    return static_cast<signed char>(std::round(std::ldexp(v, -exponent) * 127));
}

} // namespace Eye
