#include "train/working_point.h"

#include "fn/exception.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>

namespace Train {
namespace {

using Eye::Implementation::CascadeSettings;
using Eye::Implementation::TrainedSvm;

double kernel(const TrainedSvm& svm, const Signs& x, const Signs& vector) {
    const double product = x * vector;
    if (svm.kernel == TrainedSvm::Kernel::Dot) return product;
    const double value = product / svm.kernelScale + svm.kernelConstant;
    return value * value;
}

} // namespace

void setWorkingPoint(TrainedSvm& svm, const std::vector<Signs>& faces,
                     const std::vector<WorkingStep>& steps) {
    std::vector<double> sums(faces.size(), 0.0), reached;
    std::size_t seen = 0;
    for (const WorkingStep& step : steps) {
        for (; seen < step.vectors; ++seen)
            for (std::size_t i = 0; i < faces.size(); ++i)
                sums[i] += svm.alphas[seen] * kernel(svm, faces[i], svm.supportVectors[seen]);
        std::vector<double> sorted = sums;
        const auto rank = static_cast<std::size_t>((1 - step.keep) * static_cast<double>(sorted.size()));
        std::nth_element(sorted.begin(), sorted.begin() + static_cast<std::ptrdiff_t>(rank), sorted.end());
        reached.push_back(sorted[rank]);
    }
    double gain = 1e9;
    for (std::size_t i = 0; i + 1 < steps.size(); ++i) {
        const double rise = reached.back() - reached[i];
        if (rise > 0) gain = std::min(gain, (steps.back().threshold - steps[i].threshold) / rise);
    }
    if (gain ==
        1e9) { // a single step, or none that binds: half a unit between the threshold and the median face
        std::nth_element(sums.begin(), sums.begin() + static_cast<std::ptrdiff_t>(sums.size() / 2),
                         sums.end());
        gain = 0.5 / std::max(sums[sums.size() / 2] - reached.back(), 1e-9);
    }
    for (float& alpha : svm.alphas) alpha = static_cast<float>(alpha * gain);
    svm.bias = static_cast<float>(gain * reached.back() - steps.back().threshold);
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
