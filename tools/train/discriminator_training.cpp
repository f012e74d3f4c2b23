#include "train/discriminator_training.h"

#include "fn/numeric/blas.h"
#include "train/logistic.h"

#include <algorithm>
#include <cmath>
#include <numeric>

namespace Train {
namespace {

using Blas = Fn::Numeric::Blas<float>;
using Eye::Implementation::TrainedSvm;

std::vector<std::size_t> sampleIndices(std::size_t n, std::size_t most, Random& random) {
    std::vector<std::size_t> indices(n);
    std::iota(indices.begin(), indices.end(), std::size_t{0});
    if (n <= most) return indices;
    std::shuffle(indices.begin(), indices.end(), random);
    indices.resize(most);
    return indices;
}

std::vector<float> pick(const std::vector<float>& values, const std::vector<std::size_t>& chosen) {
    std::vector<float> picked;
    for (const std::size_t i : chosen) picked.push_back(values[i]);
    return picked;
}

float kernel(const TrainedSvm& svm, float product) {
    const float value = product / svm.kernelScale + svm.kernelConstant;
    return value * value;
}

/// The growing machine and what it makes of each sample.
class Growth {
public:
    Growth(const SignSet& set, const GrowthSettings& settings, Random& random)
        : set_(set), settings_(settings), random_(random), weights_(balancedWeights(set.labels)),
          offset_(set.size(), 0.0f), decision_(set.size(), 0.0f) {
        svm_.kernel = TrainedSvm::Kernel::FullPolynomialDegree2;
        svm_.kernelConstant = settings.kernelConstant;
        svm_.kernelScale = static_cast<float>(set.dimension());
    }

    TrainedSvm run() {
        constexpr std::size_t refitEvery = 20;
        for (const std::size_t end : settings_.groups) {
            group_.clear();
            fit_.coefficients.clear();
            while (svm_.supportVectors.size() < end) {
                addVector();
                if (group_.size() % refitEvery == 0) refit(2);
            }
            refit(4);
            offset_ = decision_;
            for (float& value : offset_) value -= static_cast<float>(fit_.intercept);
            for (const double alpha : fit_.coefficients) svm_.alphas.push_back(static_cast<float>(alpha));
        }
        return svm_;
    }

private:
    float sigmoid(float f) const { return 1.0f / (1.0f + std::exp(-f)); }

    /// The vector that the samples pull for, drawn by the size of their residual.
    Signs pulledVector() {
        std::vector<double> residuals(set_.size());
        for (std::size_t i = 0; i < set_.size(); ++i)
            residuals[i] = weights_[i] * std::abs(set_.labels[i] - sigmoid(decision_[i]));
        const std::vector<std::size_t> batch = drawn(residuals, settings_.batch, random_);
        std::vector<float> pulls;
        for (const std::size_t i : batch) pulls.push_back(set_.labels[i] > 0.5f ? 1.0f : -1.0f);
        return bestVector(svm_, expanded(set_.vectors, batch), pulls, settings_.ascents, random_);
    }

    void addVector() {
        const Signs vector = pulledVector();
        std::vector<float> response(set_.size());
        for (std::size_t i = 0; i < set_.size(); ++i)
            response[i] = kernel(svm_, static_cast<float>(set_.vectors[i] * vector));
        // A Newton step for the new alpha alone, against the mean response.
        double mean = 0, weight = 0, gain = 0, curvature = 0;
        for (std::size_t i = 0; i < set_.size(); ++i) {
            const float p = sigmoid(decision_[i]);
            mean += weights_[i] * p * (1 - p) * response[i];
            weight += weights_[i] * p * (1 - p);
        }
        mean /= weight + 1e-9;
        for (std::size_t i = 0; i < set_.size(); ++i) {
            const float p = sigmoid(decision_[i]);
            const double centred = response[i] - mean;
            gain += weights_[i] * (set_.labels[i] - p) * centred;
            curvature += weights_[i] * p * (1 - p) * centred * centred;
        }
        const double alpha = gain / (curvature + 1e-6);
        for (std::size_t i = 0; i < set_.size(); ++i)
            decision_[i] += static_cast<float>(alpha * (response[i] - mean));
        fit_.coefficients.push_back(alpha);
        fit_.intercept -= alpha * mean;
        group_.push_back(std::move(response));
        svm_.supportVectors.push_back(vector);
    }

    void refit(int steps) {
        fit_ = fitLogistic(group_, set_.labels, weights_, offset_, settings_.penalty, fit_, steps);
        for (std::size_t i = 0; i < set_.size(); ++i) {
            double f = offset_[i] + fit_.intercept;
            for (std::size_t j = 0; j < group_.size(); ++j) f += fit_.coefficients[j] * group_[j][i];
            decision_[i] = static_cast<float>(f);
        }
    }

    const SignSet& set_;
    const GrowthSettings& settings_;
    Random& random_;
    TrainedSvm svm_;
    std::vector<float> weights_, offset_, decision_;
    std::vector<std::vector<float>> group_; // responses to the vectors of the present group
    LogisticFit fit_;
};

} // namespace

Signs bestVector(const TrainedSvm& svm, const std::vector<float>& batch, const std::vector<float>& pulls,
                 int ascents, Random& random) {
    constexpr std::size_t candidates = 6;
    const std::size_t b = pulls.size(), d = batch.size() / b;
    // Half of the candidates shall respond to what is pulled up, half to the rest; they start at the mean
    // pull or at a sample.
    std::vector<float> s(d * candidates), product(b * candidates), gradient(d * candidates);
    for (std::size_t k = 0; k < candidates; ++k) {
        const float side = k % 2 == 0 ? 1.0f : -1.0f;
        if (k < 2) {
            Blas::gemv(false, d, b, side, batch.data(), pulls.data(), 0.0f, &s[k * d]);
        } else {
            std::size_t at = random() % b;
            for (int tries = 0; tries < 50 && pulls[at] * side <= 0; ++tries) at = random() % b;
            std::copy_n(&batch[at * d], d, &s[k * d]);
        }
        for (std::size_t i = 0; i < d; ++i) s[k * d + i] = s[k * d + i] >= 0 ? 1.0f : -1.0f;
    }
    for (int ascent = 0; ascent < ascents; ++ascent) {
        Blas::gemm(true, false, b, candidates, d, 1.0f, batch.data(), s.data(), 0.0f, product.data());
        for (std::size_t k = 0; k < candidates; ++k)
            for (std::size_t i = 0; i < b; ++i) {
                const float side = k % 2 == 0 ? pulls[i] : -pulls[i];
                product[k * b + i] = side * (product[k * b + i] / svm.kernelScale + svm.kernelConstant);
            }
        Blas::gemm(false, false, d, candidates, b, 1.0f, batch.data(), product.data(), 0.0f, gradient.data());
        for (std::size_t i = 0; i < s.size(); ++i) s[i] = gradient[i] >= 0 ? 1.0f : -1.0f;
    }

    Blas::gemm(true, false, b, candidates, d, 1.0f, batch.data(), s.data(), 0.0f, product.data());
    double bestGain = -1;
    std::size_t best = 0;
    for (std::size_t k = 0; k < candidates; ++k) {
        double mean = 0, square = 0, pull = 0, pullSum = 0;
        for (std::size_t i = 0; i < b; ++i) {
            const double value = kernel(svm, product[k * b + i]);
            mean += value;
            square += value * value;
            pull += pulls[i] * value;
            pullSum += pulls[i];
        }
        mean /= static_cast<double>(b);
        const double variance = square / static_cast<double>(b) - mean * mean;
        const double gain = std::abs(pull - pullSum * mean) / std::sqrt(variance + 1e-12);
        if (gain > bestGain) {
            bestGain = gain;
            best = k;
        }
    }
    return signsOf(&s[best * d], static_cast<std::uint32_t>(d));
}

std::vector<std::size_t> drawn(const std::vector<double>& weights, std::size_t n, Random& random) {
    std::vector<double> cumulated(weights.size());
    std::partial_sum(weights.begin(), weights.end(), cumulated.begin());
    std::uniform_real_distribution<double> uniform(0, cumulated.back());
    std::vector<std::size_t> chosen;
    for (std::size_t k = 0; k < n; ++k) {
        const auto at = std::lower_bound(cumulated.begin(), cumulated.end(), uniform(random));
        chosen.push_back(static_cast<std::size_t>(std::min<std::ptrdiff_t>(
            at - cumulated.begin(), static_cast<std::ptrdiff_t>(weights.size()) - 1)));
    }
    return chosen;
}

TrainedSvm trainDot(const SignSet& set, std::size_t count, Random& random) {
    constexpr std::size_t mostSamples = 50000;
    constexpr int descents = 150;
    const std::vector<std::size_t> chosen = sampleIndices(set.size(), mostSamples, random);
    const std::vector<float> labels = pick(set.labels, chosen), weights = balancedWeights(labels);
    const std::uint32_t d = set.dimension();
    std::vector<float> rest = fitLinear(expanded(set.vectors, chosen), d, labels, weights, 20.0, descents);

    TrainedSvm svm;
    svm.kernel = TrainedSvm::Kernel::Dot;
    std::vector<std::vector<float>> responses;
    for (std::size_t k = 0; k < count; ++k) {
        const Signs vector = signsOf(rest.data(), d);
        float size = 0;
        for (const float w : rest) size += std::abs(w) / static_cast<float>(d);
        for (std::uint32_t i = 0; i < d; ++i) rest[i] -= size * static_cast<float>(vector[i]);
        std::vector<float> response;
        for (const std::size_t i : chosen) response.push_back(static_cast<float>(set.vectors[i] * vector));
        responses.push_back(std::move(response));
        svm.supportVectors.push_back(vector);
    }
    LogisticFit start;
    start.coefficients.assign(count, 0.0);
    const LogisticFit fit =
        fitLogistic(responses, labels, weights, std::vector<float>(labels.size(), 0.0f), 1.0, start, 8);
    for (const double alpha : fit.coefficients) svm.alphas.push_back(static_cast<float>(alpha));
    return svm;
}

TrainedSvm growPolynomial(const SignSet& set, const GrowthSettings& settings, Random& random) {
    return Growth(set, settings, random).run();
}

} // namespace Train
