#include "train/working_point.h"

#include "fn/exception.h"
#include "fn/numeric/blas.h"
#include "fn/numeric/lapack.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <numeric>
#include <optional>

namespace Train {
namespace {

using Eye::Implementation::CascadeSettings;
using Eye::Implementation::TrainedSvm;

double kernel(const TrainedSvm& svm, const Signs& x, std::size_t vector) {
    return svm.kernel == TrainedSvm::Kernel::Dot ? x * svm.supportVectors[vector] : response(svm, x, vector);
}

double medianScore(const TrainedSvm& svm, const std::vector<Signs>& faces) {
    std::vector<double> scores;
    for (const Signs& face : faces) scores.push_back(svm.evaluate(face));
    const auto middle = scores.begin() + static_cast<std::ptrdiff_t>(scores.size() / 2);
    std::nth_element(scores.begin(), middle, scores.end());
    return *middle;
}

} // namespace

float response(const TrainedSvm& svm, const Signs& window, std::size_t vector) {
    const float value =
        static_cast<float>(window * svm.supportVectors[vector]) / svm.kernelScale + svm.kernelConstant;
    return value * value;
}

std::vector<double> solved(std::vector<double> a, std::vector<double> b) {
    std::vector<int> pivots(b.size());
    if (Fn::Numeric::Lapack<double>::gesv(b.size(), 1, a.data(), pivots.data(), b.data()) != 0)
        FN_THROW(FNEBadArg, "The responses of a machine depend on each other");
    return b;
}

std::vector<double> evenRaise(const std::vector<double>& covariance, const std::vector<double>& mean) {
    std::vector<double> raise = solved(covariance, mean);
    const double gain = std::inner_product(mean.begin(), mean.end(), raise.begin(), 0.0);
    for (double& value : raise) value /= gain;
    return raise;
}

std::vector<double> reachedSums(const TrainedSvm& svm, const std::vector<Signs>& faces,
                                const std::vector<WorkingStep>& steps) {
    std::vector<double> sums(faces.size(), 0.0), reached;
    std::size_t seen = 0;
    for (const WorkingStep& step : steps) {
        for (; seen < step.vectors; ++seen)
            for (std::size_t i = 0; i < faces.size(); ++i)
                sums[i] += svm.alphas[seen] * kernel(svm, faces[i], seen);
        std::vector<double> sorted = sums;
        const auto rank = static_cast<std::ptrdiff_t>((1 - step.keep) * static_cast<double>(sorted.size()));
        std::nth_element(sorted.begin(), sorted.begin() + rank, sorted.end());
        reached.push_back(sorted[static_cast<std::size_t>(rank)]);
    }
    return reached;
}

void setWorkingPoint(TrainedSvm& svm, const std::vector<Signs>& faces,
                     const std::vector<WorkingStep>& steps) {
    const std::vector<double> reached = reachedSums(svm, faces, steps);
    std::optional<double> gain;
    for (std::size_t i = 0; i + 1 < steps.size(); ++i) {
        const double rise = reached.back() - reached[i];
        const double wanted = (steps.back().threshold - steps[i].threshold) / rise;
        if (rise > 0 && (!gain || wanted < *gain)) gain = wanted;
    }
    svm.bias = 0;
    // A single step, or none that binds: half a unit between the threshold and the median face.
    if (!gain) gain = 0.5 / std::max(medianScore(svm, faces) - reached.back(), 1e-9);
    for (float& alpha : svm.alphas) alpha = static_cast<float>(alpha * *gain);
    svm.bias = static_cast<float>(*gain * reached.back() - steps.back().threshold);
}

void setWorkingPoints(TrainedSvm& svm, const std::vector<Signs>& faces, const std::vector<WorkingStep>& steps,
                      const std::vector<Signs>& windows) {
    setWorkingPoint(svm, faces, steps);
    for (std::size_t i = 0; i + 1 < steps.size(); ++i) {
        const std::size_t from = steps[i].vectors, m = steps[i + 1].vectors - from;
        std::vector<float> responses;
        std::vector<double> mean(m, 0.0);
        for (const Signs& window : windows)
            for (std::size_t j = 0; j < m; ++j) {
                responses.push_back(response(svm, window, from + j));
                mean[j] += responses.back() / static_cast<double>(windows.size());
            }
        for (std::size_t k = 0; k < responses.size(); ++k) responses[k] -= static_cast<float>(mean[k % m]);
        std::vector<float> lower(m * m, 0.0f);
        Fn::Numeric::Blas<float>::syrk(m, windows.size(), responses.data(), lower.data());
        const std::vector<double> raise = evenRaise(damped(lower, windows.size()), mean);

        constexpr int approaches = 4; // no raise is quite even
        for (int approach = 0; approach < approaches; ++approach) {
            const std::vector<double> reached = reachedSums(svm, faces, steps);
            const double missing =
                steps[i + 1].threshold - steps[i].threshold - (reached[i + 1] - reached[i]);
            for (std::size_t j = 0; j < m; ++j)
                svm.alphas[from + j] += static_cast<float>(missing * raise[j]);
        }
    }
    svm.bias = static_cast<float>(reachedSums(svm, faces, steps).back() - steps.back().threshold);
}

std::vector<double> damped(const std::vector<float>& lower, std::size_t samples) {
    constexpr double damping = 0.01; // of the mean variance
    const auto m = static_cast<std::size_t>(std::lround(std::sqrt(static_cast<double>(lower.size()))));
    std::vector<double> result(m * m);
    double trace = 0;
    for (std::size_t j = 0; j < m; ++j)
        for (std::size_t i = j; i < m; ++i) {
            result[i + j * m] = result[j + i * m] = lower[i + j * m] / static_cast<double>(samples);
            if (i == j) trace += result[i + j * m];
        }
    for (std::size_t j = 0; j < m; ++j) result[j + j * m] += damping * trace / static_cast<double>(m);
    return result;
}

void spreadScores(TrainedSvm& svm, double threshold, double gain) {
    for (float& alpha : svm.alphas) alpha = static_cast<float>(alpha * gain);
    svm.bias = static_cast<float>(gain * (svm.bias + threshold) - threshold);
}

CascadeSettings settingsOf(const std::string& file, const std::vector<WorkingStep>& steps) {
    CascadeSettings settings{file, {}};
    for (const WorkingStep& step : steps)
        settings.cascade.push_back({std::to_string(step.vectors), static_cast<float>(step.threshold)});
    return settings;
}

void save(const TrainedSvm& svm, const std::filesystem::path& file) {
    std::ofstream stream(file, std::ios::binary);
    if (!stream) FN_THROW(FNEIOError, "Cannot write " + file.string());
    svm.write(stream);
    std::printf("%s: %zu vectors\n", file.filename().c_str(), svm.supportVectors.size());
    std::fflush(stdout);
}

} // namespace Train
