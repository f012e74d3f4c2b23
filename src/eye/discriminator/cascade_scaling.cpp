#include "eye/discriminator/cascade_scaling.h"

#include "eye/discriminator/alpha_order.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <limits>
#include <map>
#include <numeric>

namespace Eye::Implementation {
namespace {

constexpr double twoTo31 = 2147483648.0;

/// Half away from zero, saturated.
template <class Int> Int roundTo(double value) {
    constexpr double least = std::numeric_limits<Int>::min(), greatest = std::numeric_limits<Int>::max();
    return static_cast<Int>(std::clamp(std::round(value), least, greatest));
}

/// Toward zero, saturated; NaN gives the least number.
template <class Int> Int truncateTo(double value) {
    constexpr double least = std::numeric_limits<Int>::min(), greatest = std::numeric_limits<Int>::max();
    if (!(value > least)) return std::numeric_limits<Int>::min();
    return static_cast<Int>(std::min(std::trunc(value), greatest));
}

std::uint32_t parseStep(const std::string& entry) {
    std::uint32_t number = 0;
    const auto [end, error] = std::from_chars(entry.data(), entry.data() + entry.size(), number);
    if (error != std::errc() || end != entry.data() + entry.size())
        FN_THROW(FNEBadArg, "CascadedSvmDiscriminator: invalid number of steps [" + entry +
                                "] in configuration of cascade.");
    return number;
}

void requireDimension(bool fits) {
    if (!fits)
        FN_THROW(FNEBadFormat,
                 "Dimension of support vectors too large for this discriminator implementation!");
}

} // namespace

std::vector<FloatStep> readSteps(const CascadeSettings& settings, std::size_t n) {
    constexpr float passesAll = -99.0f;
    if (settings.cascade.empty()) return {{static_cast<std::uint32_t>(n), passesAll}};
    std::map<std::uint32_t, float> ordered;
    for (const auto& entry : settings.cascade) ordered[parseStep(entry.steps)] = entry.threshold;
    std::vector<FloatStep> steps;
    for (const auto& [limit, threshold] : ordered) {
        if (limit > n)
            FN_THROW(FNEOutOfRange, "CascadedSvmDiscriminator: step " + std::to_string(limit) +
                                        " of the cascade of `" + settings.file + "' lies beyond its " +
                                        std::to_string(n) + " support vectors");
        steps.push_back({limit, threshold});
    }
    return steps;
}

std::vector<std::uint32_t> evaluationOrder(const std::vector<float>& alphas,
                                           const std::vector<FloatStep>& steps) {
    std::vector<std::uint32_t> order(alphas.size());
    std::iota(order.begin(), order.end(), 0u);
    std::uint32_t first = 0;
    for (const FloatStep& step : steps) {
        sortByAlpha(order.begin() + first, order.begin() + step.limit, alphas.data());
        first = step.limit;
    }
    return order;
}

void scaleKernel(const TrainedSvm& trained, std::uint32_t dimension, FpKernelDeg2& kernel) {
    const double offset =
        static_cast<double>(trained.kernelConstant) * static_cast<double>(trained.kernelScale);
    if (!(std::abs(offset) <= twoTo31))
        FN_THROW(FNEBadFormat,
                 "Absolute value of kernel threshold too large for this discriminator implementation!");
    kernel.scale = trained.kernelScale;
    kernel.offset = roundTo<std::int32_t>(offset);
    kernel.hasOffset = kernel.offset != 0;

    const float largest = std::abs(static_cast<float>(kernel.offset)) + static_cast<float>(dimension);
    const float square = largest * largest;
    requireDimension(static_cast<double>(square) <= twoTo31);
    kernel.shift = 0;
    while (static_cast<double>(square) > std::ldexp(32767.0, static_cast<int>(kernel.shift))) ++kernel.shift;
}

void scaleKernel(const TrainedSvm&, std::uint32_t dimension, DotKernel&) {
    requireDimension(dimension <= 32767);
}

double alphaFactor(const FpKernelDeg2& kernel) {
    const double scale = static_cast<double>(kernel.scale);
    return std::ldexp(1.0, static_cast<int>(kernel.shift)) / (scale * scale);
}

double alphaFactor(const DotKernel&) {
    return 1;
}

float scaleTables(const std::vector<float>& alphas, float bias, const std::vector<FloatStep>& steps,
                  CascadeTables& tables) {
    double greatest = 0;
    for (const float alpha : alphas) {
        if (!std::isfinite(alpha)) FN_THROW(FNEBadFormat, "invalid alphas");
        greatest = std::max(greatest, std::abs(static_cast<double>(alpha)));
    }
    if (greatest == 0) FN_THROW(FNEBadFormat, "All alphas equal zero!");
    if (!std::isfinite(bias)) FN_THROW(FNEBadFormat, "invalid bias");

    // The sum of n products of 15 by 15 bits, each shifted by ceil(log2(n + 1)), stays in 32 bits.
    tables.alphaShift = 0;
    while ((std::size_t{1} << tables.alphaShift) < alphas.size() + 1) ++tables.alphaShift;
    const double unit = std::ldexp(1.0, static_cast<int>(tables.alphaShift));
    const double magnitude = std::abs(static_cast<double>(bias));
    const double factor = std::min(32767 / greatest, twoTo31 * unit / magnitude); // infinite for the bias 0

    tables.alphas.clear();
    for (const float alpha : alphas)
        tables.alphas.push_back(roundTo<std::int16_t>(factor * static_cast<double>(alpha)));
    tables.bias = roundTo<std::int32_t>(factor * static_cast<double>(bias) / unit);
    tables.steps.clear();
    for (const FloatStep& step : steps)
        tables.steps.push_back(
            {step.limit, truncateTo<std::int32_t>(factor * static_cast<double>(step.threshold) / unit)});

    tables.firstStepShortcut = steps.size() > 1 && steps.front().limit == 1;
    tables.firstStepThreshold = 0;
    if (tables.firstStepShortcut) {
        const double least = static_cast<double>(steps.front().threshold) + static_cast<double>(bias);
        tables.firstStepThreshold = truncateTo<std::int16_t>(least / static_cast<double>(alphas.front()));
    }
    return static_cast<float>(unit / factor);
}

void setVectors(const std::vector<Fn::SignValueVector<int>>& vectors, CascadeTables& tables) {
    constexpr std::uint32_t block = 64;
    const std::uint32_t bytes = vectors.front().byteCount();
    tables.dimension = vectors.front().size();
    tables.stride = std::max(block, (bytes + block - 1) / block * block);
    tables.vectors = FNRMem<unsigned char>(FNRMemCore(vectors.size() * tables.stride, block));
    unsigned char* out = tables.vectors.getExclusive();
    for (const auto& vector : vectors) {
        std::fill(std::copy_n(vector.bytes(), bytes, out), out + tables.stride,
                  static_cast<unsigned char>(0));
        out += tables.stride;
    }
}

std::vector<Fn::SignValueVector<int>> getVectors(const CascadeTables& tables) {
    std::vector<Fn::SignValueVector<int>> vectors;
    for (std::size_t i = 0; i < tables.alphas.size(); ++i)
        vectors.emplace_back(tables.dimension,
                             FNRMem<unsigned char>(tables.vectors, i * tables.stride, tables.stride));
    return vectors;
}

} // namespace Eye::Implementation
