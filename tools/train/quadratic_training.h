#pragma once

#include "eye/discriminator/float_svm.h"

#include <span>
#include <vector>

namespace Train {

/// A set of samples with features of one kind. Features stay where they are.
struct FloatSamples {
    std::vector<std::span<const float>> features;
    std::vector<float> targets;
    std::vector<float> weights;

    std::size_t size() const { return features.size(); }
    void add(std::span<const float> x, float target, float weight = 1) {
        features.push_back(x);
        targets.push_back(target);
        weights.push_back(weight);
    }
};

/// Weights that give the samples of positive and of negative targets the same total, their mean being 1.
void balance(FloatSamples& samples);

/// A function of degree 2: sum of gains[j] * (directions[j] * x)^2 + linear * x + constant.
struct QuadraticFunction {
    std::vector<std::vector<float>> directions;
    std::vector<double> gains;
    std::vector<double> linear;
    double constant = 0;

    double operator()(std::span<const float> x) const;
};

/// Kernel ridge regression with the kernel (x * y / d + c)^2 on features of zero mean and unit spread.
class QuadraticRegression {
public:
    /// Standardises the features and computes all kernel values.
    explicit QuadraticRegression(const std::vector<std::span<const float>>& features);

    /// Solves for the weights of the chosen samples. @param targets,weights of the chosen ones
    std::vector<float> solve(const std::vector<std::size_t>& chosen, const std::vector<float>& targets,
                             const std::vector<float>& weights, double penalty) const;
    /// What the solution says of sample i.
    double predict(const std::vector<std::size_t>& chosen, const std::vector<float>& solution,
                   std::size_t i) const;

    /// The solution as a function of features, with the `directions` strongest of its quadratic part, in 6
    /// bits each.
    QuadraticFunction reduced(const std::vector<std::size_t>& chosen, const std::vector<float>& solution,
                              std::size_t directions) const;
    /// A linear function of the features that fits the chosen samples' targets.
    /// @return linear part and constant
    QuadraticFunction linearFit(const std::vector<std::size_t>& chosen, const std::vector<float>& targets,
                                const std::vector<float>& weights, double penalty) const;

private:
    double kernel(double product) const;
    template <class Kernel>
    std::vector<float> ridge(const std::vector<std::size_t>& chosen, const std::vector<float>& targets,
                             const std::vector<float>& weights, double penalty, Kernel kernelOf) const;
    /// `linear * z` of standardised features z added to a function of features as they are.
    void addLinear(QuadraticFunction& function, const std::vector<double>& linear) const;

    std::size_t n_, d_;
    std::vector<float> mean_, scale_;
    std::vector<float> z_;    ///< d by n
    std::vector<float> gram_; ///< n by n: z * z' / d
};

/// All function values.
std::vector<double> valuesOf(const QuadraticFunction& function,
                             const std::vector<std::span<const float>>& features);

/// The machine that computes gain * function + shift.
Eye::FullPolynomialSvm machineOf(const QuadraticFunction& function, double gain, double shift,
                                 const std::string& name);

} // namespace Train
