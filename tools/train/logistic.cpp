#include "train/logistic.h"

#include "fn/numeric/blas.h"
#include "fn/numeric/lapack.h"

#include <algorithm>
#include <cmath>
#include <numeric>

namespace Train {
namespace {

using Blas = Fn::Numeric::Blas<float>;

float sigmoid(float f) {
    return 1.0f / (1.0f + std::exp(-f));
}

} // namespace

std::vector<float> balancedWeights(const std::vector<float>& labels) {
    const auto n = static_cast<float>(labels.size());
    const float faces = std::accumulate(labels.begin(), labels.end(), 0.0f);
    std::vector<float> weights;
    for (const float label : labels) weights.push_back(label > 0 ? n / (2 * faces) : n / (2 * (n - faces)));
    return weights;
}

LogisticFit fitLogistic(const std::vector<std::vector<float>>& columns, const std::vector<float>& labels,
                        const std::vector<float>& weights, const std::vector<float>& offset, double penalty,
                        LogisticFit fit, int steps) {
    const std::size_t n = labels.size(), m = columns.size() + 1; // the last is the intercept
    // Columns are brought to unit spread, so that one penalty suits all.
    std::vector<double> scale(m, 1.0);
    for (std::size_t j = 0; j + 1 < m; ++j) {
        const double mean =
            std::accumulate(columns[j].begin(), columns[j].end(), 0.0) / static_cast<double>(n);
        double spread = 0;
        for (const float value : columns[j]) spread += (value - mean) * (value - mean);
        scale[j] = 1 / std::sqrt(spread / static_cast<double>(n) + 1e-12);
    }
    for (int step = 0; step < steps; ++step) {
        std::vector<float> gradient(n), curved(n * m);
        for (std::size_t i = 0; i < n; ++i) {
            double f = offset[i] + fit.intercept;
            for (std::size_t j = 0; j + 1 < m; ++j) f += fit.coefficients[j] * columns[j][i];
            const float p = sigmoid(static_cast<float>(f));
            gradient[i] = weights[i] * (labels[i] - p);
            const float root = std::sqrt(weights[i] * std::max(p * (1 - p), 1e-6f));
            for (std::size_t j = 0; j < m; ++j)
                curved[i * m + j] = root * (j + 1 < m ? static_cast<float>(scale[j]) * columns[j][i] : 1.0f);
        }
        std::vector<float> hessian(m * m, 0.0f);
        Blas::syrk(m, n, curved.data(), hessian.data());
        std::vector<double> h(hessian.begin(), hessian.end()), g(m);
        for (std::size_t j = 0; j < m; ++j) {
            double sum = 0;
            for (std::size_t i = 0; i < n; ++i)
                sum += gradient[i] * (j + 1 < m ? scale[j] * columns[j][i] : 1.0);
            g[j] = sum - (j + 1 < m ? penalty * fit.coefficients[j] / scale[j] : 0.0);
            h[j + j * m] += j + 1 < m ? penalty : 1e-6;
        }
        std::vector<int> pivots(m);
        for (std::size_t j = 1; j < m; ++j)
            for (std::size_t i = 0; i < j; ++i)
                h[i + j * m] = h[j + i * m]; // only the lower triangle was set
        if (Fn::Numeric::Lapack<double>::gesv(m, 1, h.data(), pivots.data(), g.data()) != 0) break;
        for (std::size_t j = 0; j + 1 < m; ++j) fit.coefficients[j] += g[j] * scale[j];
        fit.intercept += g[m - 1];
    }
    return fit;
}

std::vector<float> fitLinear(const std::vector<float>& matrix, std::size_t d,
                             const std::vector<float>& labels, const std::vector<float>& weights,
                             double penalty, int steps) {
    const std::size_t n = labels.size();
    std::vector<float> w(d, 0.0f), previous(d, 0.0f), look(d), f(n), gradient(d);
    float intercept = 0, previousIntercept = 0;
    // A quarter of the mean squared length bounds the curvature; correlated signs need far less than that
    // times d.
    const float rate = 40.0f / (static_cast<float>(n) * static_cast<float>(d));
    for (int step = 0; step < steps; ++step) {
        const float momentum = static_cast<float>(step) / static_cast<float>(step + 3);
        for (std::size_t k = 0; k < d; ++k) look[k] = w[k] + momentum * (w[k] - previous[k]);
        const float lookIntercept = intercept + momentum * (intercept - previousIntercept);
        previous = w;
        previousIntercept = intercept;
        Blas::gemv(true, d, n, 1.0f, matrix.data(), look.data(), 0.0f, f.data());
        float sum = 0;
        for (std::size_t i = 0; i < n; ++i)
            sum += f[i] = weights[i] * (labels[i] - sigmoid(f[i] + lookIntercept));
        Blas::gemv(false, d, n, 1.0f, matrix.data(), f.data(), 0.0f, gradient.data());
        for (std::size_t k = 0; k < d; ++k)
            w[k] = look[k] + rate * (gradient[k] - static_cast<float>(penalty) * look[k]);
        intercept = lookIntercept + rate * static_cast<float>(d) * 0.1f * sum;
    }
    return w;
}

} // namespace Train
