#include "train/quadratic_training.h"

#include "fn/matrix_decomposition.h"
#include "fn/numeric/blas.h"
#include "fn/numeric/lapack.h"

#include <algorithm>
#include <cmath>
#include <numeric>
#include <random>

namespace Train {
namespace {

using Blas = Fn::Numeric::Blas<float>;

constexpr double kernelConstant = 0.5;

/// Solves (a + diagonal) x = b with a symmetric positive `a` (Hestenes, Stiefel 1952).
template <class Multiply>
std::vector<float> conjugateGradients(const std::vector<float>& b, int steps, Multiply multiply) {
    const auto dot = [](const std::vector<float>& u, const std::vector<float>& v) {
        return std::inner_product(u.begin(), u.end(), v.begin(), 0.0);
    };
    constexpr double goodEnough = 1e-8;
    std::vector<float> x(b.size(), 0.0f), residual = b, direction = b;
    double square = dot(residual, residual);
    const double limit = goodEnough * square;
    for (int step = 0; step < steps && square > limit; ++step) {
        const std::vector<float> image = multiply(direction);
        const double length = square / dot(direction, image);
        Blas::axpy(b.size(), static_cast<float>(length), direction.data(), x.data());
        Blas::axpy(b.size(), static_cast<float>(-length), image.data(), residual.data());
        const double next = dot(residual, residual);
        for (std::size_t i = 0; i < b.size(); ++i)
            direction[i] = residual[i] + static_cast<float>(next / square) * direction[i];
        square = next;
    }
    return x;
}

/// Rounds to whole multiples of a step, `most` steps at most. @return the step
double digitize(std::vector<double>& values, double most) {
    double greatest = 0;
    for (const double v : values) greatest = std::max(greatest, std::abs(v));
    const double step = greatest > 0 ? greatest / most : 1;
    for (double& v : values) v = std::round(v / step);
    return step;
}

} // namespace

void balance(FloatSamples& samples) {
    double positive = 0, negative = 0;
    for (std::size_t i = 0; i < samples.size(); ++i)
        (samples.targets[i] > 0 ? positive : negative) += samples.weights[i];
    const double half = static_cast<double>(samples.size()) / 2;
    for (std::size_t i = 0; i < samples.size(); ++i)
        samples.weights[i] *= static_cast<float>(half / (samples.targets[i] > 0 ? positive : negative));
}

double QuadraticFunction::operator()(std::span<const float> x) const {
    double result = constant;
    for (std::size_t k = 0; k < x.size(); ++k) result += linear[k] * static_cast<double>(x[k]);
    for (std::size_t j = 0; j < directions.size(); ++j) {
        const double product = std::inner_product(x.begin(), x.end(), directions[j].begin(), 0.0);
        result += gains[j] * product * product;
    }
    return result;
}

std::vector<double> valuesOf(const QuadraticFunction& function,
                             const std::vector<std::span<const float>>& features) {
    std::vector<double> values;
    for (const auto& x : features) values.push_back(function(x));
    return values;
}

QuadraticRegression::QuadraticRegression(const std::vector<std::span<const float>>& features)
    : n_(features.size()), d_(features.front().size()), mean_(d_), scale_(d_), z_(d_ * n_), gram_(n_ * n_) {
    std::vector<double> sum(d_), squares(d_);
    for (const auto& x : features)
        for (std::size_t k = 0; k < d_; ++k) {
            sum[k] += static_cast<double>(x[k]);
            squares[k] += static_cast<double>(x[k]) * static_cast<double>(x[k]);
        }
    const auto n = static_cast<double>(n_);
    for (std::size_t k = 0; k < d_; ++k) {
        const double mean = sum[k] / n, variance = squares[k] / n - mean * mean;
        mean_[k] = static_cast<float>(mean);
        scale_[k] = variance > 1e-14 ? static_cast<float>(1 / std::sqrt(variance)) : 0.0f;
    }
    for (std::size_t i = 0; i < n_; ++i)
        for (std::size_t k = 0; k < d_; ++k) z_[i * d_ + k] = (features[i][k] - mean_[k]) * scale_[k];
    Blas::gemm(true, false, n_, n_, d_, 1 / static_cast<float>(d_), z_.data(), z_.data(), 0, gram_.data());
}

double QuadraticRegression::kernel(double product) const {
    return (product + kernelConstant) * (product + kernelConstant);
}

template <class Kernel>
std::vector<float>
QuadraticRegression::ridge(const std::vector<std::size_t>& chosen, const std::vector<float>& targets,
                           const std::vector<float>& weights, double penalty, Kernel kernelOf) const {
    constexpr int steps = 80;
    const std::size_t m = chosen.size();
    std::vector<float> k(m * m), diagonal(m);
    for (std::size_t j = 0; j < m; ++j) {
        for (std::size_t i = 0; i < m; ++i)
            k[j * m + i] =
                static_cast<float>(kernelOf(static_cast<double>(gram_[chosen[j] * n_ + chosen[i]])));
        diagonal[j] = static_cast<float>(penalty) / weights[j];
    }
    return conjugateGradients(targets, steps, [&](const std::vector<float>& v) {
        std::vector<float> image(m);
        Blas::gemv(true, m, m, 1, k.data(), v.data(), 0, image.data());
        for (std::size_t i = 0; i < m; ++i) image[i] += diagonal[i] * v[i];
        return image;
    });
}

std::vector<float> QuadraticRegression::solve(const std::vector<std::size_t>& chosen,
                                              const std::vector<float>& targets,
                                              const std::vector<float>& weights, double penalty) const {
    return ridge(chosen, targets, weights, penalty, [&](double product) { return kernel(product); });
}

double QuadraticRegression::predict(const std::vector<std::size_t>& chosen,
                                    const std::vector<float>& solution, std::size_t i) const {
    double sum = 0;
    for (std::size_t j = 0; j < chosen.size(); ++j)
        sum += static_cast<double>(solution[j]) * kernel(static_cast<double>(gram_[i * n_ + chosen[j]]));
    return sum;
}

void QuadraticRegression::addLinear(QuadraticFunction& function, const std::vector<double>& linear) const {
    function.linear.resize(d_);
    for (std::size_t k = 0; k < d_; ++k) {
        const double weight = linear[k] * static_cast<double>(scale_[k]);
        function.linear[k] += weight;
        function.constant -= weight * static_cast<double>(mean_[k]);
    }
}

QuadraticFunction QuadraticRegression::reduced(const std::vector<std::size_t>& chosen,
                                               const std::vector<float>& solution,
                                               std::size_t directions) const {
    constexpr std::size_t more = 8;
    constexpr int rounds = 8;
    constexpr double digits = 31;
    const auto d = static_cast<double>(d_);
    std::vector<float> duals(n_, 0.0f);
    for (std::size_t j = 0; j < chosen.size(); ++j) duals[chosen[j]] += solution[j];

    // The quadratic part is z' A z with A = Z diag(duals) Z' / d^2; its strongest eigenvectors by iteration.
    const std::size_t m = std::min(directions + more, d_);
    Fn::Matrix<float> basis(d_, m);
    std::mt19937 random(1);
    std::normal_distribution<float> normal;
    std::generate_n(basis.getExclusive(), basis.size(), [&] { return normal(random); });
    std::vector<float> products(n_ * m);
    Fn::Matrix<float> image(d_, m);
    const auto multiply = [&](const Fn::Matrix<float>& q) {
        Blas::gemm(true, false, n_, m, d_, 1, z_.data(), q.get(), 0, products.data());
        for (std::size_t j = 0; j < m; ++j)
            for (std::size_t i = 0; i < n_; ++i) products[j * n_ + i] *= duals[i];
        Blas::gemm(false, false, d_, m, n_, static_cast<float>(1 / (d * d)), z_.data(), products.data(), 0,
                   image.getExclusive());
    };
    Fn::Matrix<float> q = Fn::Matrix<float>::createQRDecomposition(basis).Q;
    for (int round = 0; round < rounds; ++round) {
        multiply(q);
        q = Fn::Matrix<float>::createQRDecomposition(image).Q;
    }
    multiply(q);
    std::vector<float> core(m * m), values(m), work(64 * m);
    Blas::gemm(true, false, m, m, d_, 1, q.get(), image.get(), 0, core.data());
    if (Fn::Numeric::Lapack<float>::syev(true, m, core.data(), values.data(), work.data(), work.size()) != 0)
        FN_THROW(FNEGeneric, "The directions of a quadratic function did not converge");
    std::vector<std::size_t> order(m);
    std::iota(order.begin(), order.end(), std::size_t{0});
    std::stable_sort(order.begin(), order.end(),
                     [&](std::size_t a, std::size_t b) { return std::abs(values[a]) > std::abs(values[b]); });

    QuadraticFunction function;
    std::vector<double> linear(d_);
    for (std::size_t i = 0; i < n_; ++i) {
        const double dual = static_cast<double>(duals[i]);
        if (dual == 0) continue;
        for (std::size_t k = 0; k < d_; ++k)
            linear[k] += 2 * kernelConstant / d * dual * static_cast<double>(z_[i * d_ + k]);
        function.constant += kernelConstant * kernelConstant * dual;
    }
    addLinear(function, linear);
    for (std::size_t j = 0; j < std::min(directions, m); ++j) {
        std::vector<float> direction(d_);
        Blas::gemv(false, d_, m, 1, q.get(), &core[order[j] * m], 0, direction.data());
        std::vector<double> raw(d_);
        for (std::size_t k = 0; k < d_; ++k)
            raw[k] = static_cast<double>(direction[k]) * static_cast<double>(scale_[k]);
        const double step = digitize(raw, digits);
        double offset = 0; // of the digitized direction at the mean
        for (std::size_t k = 0; k < d_; ++k) offset += raw[k] * static_cast<double>(mean_[k]);
        // gain * (raw * x - offset)^2
        const double gain = static_cast<double>(values[order[j]]) * step * step;
        for (std::size_t k = 0; k < d_; ++k) function.linear[k] -= 2 * gain * offset * raw[k];
        function.constant += gain * offset * offset;
        function.gains.push_back(gain);
        function.directions.emplace_back(raw.begin(), raw.end());
    }
    return function;
}

QuadraticFunction QuadraticRegression::linearFit(const std::vector<std::size_t>& chosen,
                                                 const std::vector<float>& targets,
                                                 const std::vector<float>& weights, double penalty) const {
    const std::vector<float> duals =
        ridge(chosen, targets, weights, penalty, [](double product) { return product + 1; });
    const std::size_t m = chosen.size();
    QuadraticFunction function;
    std::vector<double> linear(d_);
    for (std::size_t j = 0; j < m; ++j) {
        const double dual = static_cast<double>(duals[j]);
        for (std::size_t i = 0; i < d_; ++i)
            linear[i] += dual / static_cast<double>(d_) * static_cast<double>(z_[chosen[j] * d_ + i]);
        function.constant += dual;
    }
    addLinear(function, linear);
    return function;
}

Eye::FullPolynomialSvm machineOf(const QuadraticFunction& function, double gain, double shift,
                                 const std::string& name) {
    constexpr double digits = 4095;
    Eye::FullPolynomialSvm svm;
    svm.degree = 2;
    svm.constant = 1;
    svm.scale = 1;
    svm.name = name;
    // (v * x + 1)^2 has a linear part and a constant, which the rest takes back.
    std::vector<double> linear = function.linear;
    double constant = function.constant;
    std::vector<float> alphas;
    for (std::size_t j = 0; j < function.directions.size(); ++j) {
        const std::vector<float>& v = function.directions[j];
        alphas.push_back(static_cast<float>(gain * function.gains[j]));
        svm.support.vectors.push_back(FNVector<float>(v));
        constant -= function.gains[j];
        for (std::size_t k = 0; k < v.size(); ++k)
            linear[k] -= 2 * function.gains[j] * static_cast<double>(v[k]);
    }
    // A linear function t is ((u t + 1)^2 - (-u t + 1)^2) / 4 u.
    const double step = digitize(linear, digits), unit = 1.0 / 1024;
    for (const double sign : {1.0, -1.0}) {
        FNVector<float> v(linear.size());
        for (std::size_t k = 0; k < linear.size(); ++k) v[k] = static_cast<float>(sign * unit * linear[k]);
        alphas.push_back(static_cast<float>(gain * sign * step / (4 * unit)));
        svm.support.vectors.push_back(v);
    }
    svm.support.alphas = FNVector<float>(alphas);
    svm.bias = static_cast<float>(-(gain * constant + shift));
    return svm;
}

} // namespace Train
