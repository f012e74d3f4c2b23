#pragma once

#include <cstddef>
#include <vector>

namespace Train {

/// Weights that give both classes the same total, their mean being 1.
std::vector<float> balancedWeights(const std::vector<float>& labels);

/// A logistic regression f = offset + columns * coefficients + intercept on few columns, by Newton's method
/// with an L2 penalty on the coefficients.
struct LogisticFit {
    std::vector<double> coefficients;
    double intercept = 0;
};

/// @param columns one vector of n values for each coefficient
/// @param offset part of the decision value that is fixed, n values
/// @param start where to begin; its size is the number of columns
LogisticFit fitLogistic(const std::vector<std::vector<float>>& columns, const std::vector<float>& labels,
                        const std::vector<float>& weights, const std::vector<float>& offset, double penalty,
                        LogisticFit start, int steps);

/// A linear classifier on many columns, by gradient descent with momentum (Nesterov 1983) on the logistic
/// loss.
/// @param matrix d by n, a sample in each column
std::vector<float> fitLinear(const std::vector<float>& matrix, std::size_t d,
                             const std::vector<float>& labels, const std::vector<float>& weights,
                             double penalty, int steps);

} // namespace Train
