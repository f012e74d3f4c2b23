#include "train/portrait_lighting.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>

namespace Train {
namespace {

using Cmp::Portrait::SpharTransformator;
using Harmonics = std::array<double, SpharTransformator::coefficients>;
using Pixels = std::vector<double>;

constexpr double radians = std::numbers::pi / 180;

/// Real spherical harmonics up to order 2 (R. Ramamoorthi, P. Hanrahan, "An Efficient Representation for
/// Irradiance Environment Maps", 2001) of a light's direction, divided by the constant one.
Harmonics harmonicsOf(double azimuth, double elevation) {
    const double x = -std::sin(azimuth) * std::cos(elevation), y = std::sin(elevation),
                 z = std::cos(azimuth) * std::cos(elevation);
    const double first = 0.488603 / 0.282095, mixed = 1.092548 / 0.282095, zonal = 0.315392 / 0.282095,
                 last = 0.546274 / 0.282095;
    return {1,
            first * y,
            first * z,
            first * x,
            mixed * x * y,
            mixed * y * z,
            zonal * (3 * z * z - 1),
            mixed * x * z,
            last * (x * x - y * y)};
}

/// Pictures of several persons under one light.
struct Light {
    Harmonics harmonics{};
    std::vector<std::span<const float>> pictures;
};

Pixels meanOfSome(const Light& light, std::mt19937_64& random) {
    constexpr std::size_t persons = 6;
    std::vector<std::size_t> order(light.pictures.size());
    for (std::size_t i = 0; i < order.size(); ++i) order[i] = i;
    std::shuffle(order.begin(), order.end(), random);
    order.resize(std::min(order.size(), persons));
    Pixels mean(light.pictures.front().size());
    for (const std::size_t i : order)
        for (std::size_t k = 0; k < mean.size(); ++k)
            mean[k] += static_cast<double>(light.pictures[i][k]) / static_cast<double>(order.size());
    return mean;
}

} // namespace

SpharTransformator::Data trainLighting(const PortraitSet& light, std::mt19937_64& random) {
    constexpr int means = 4, mixtures = 100;
    constexpr std::size_t fewestPersons = 4;
    constexpr float sigma = 0.15f;
    std::map<std::pair<int, int>, Light> lights;
    for (std::size_t i = 0; i < light.samples.size(); ++i) {
        const auto azimuth = light.rowOf(i).number("light_azimuth"),
                   elevation = light.rowOf(i).number("light_elevation");
        if (!azimuth || !elevation || light.samples[i].split != Labelled::Split::train) continue;
        const double seen = light.samples[i].mirrored ? -*azimuth : *azimuth;
        Light& entry = lights[{static_cast<int>(seen), static_cast<int>(*elevation)}];
        entry.harmonics = harmonicsOf(seen * radians, *elevation * radians);
        entry.pictures.push_back(light.features(PortraitKind::lighting, i));
    }
    std::vector<const Light*> usable;
    for (const auto& [direction, entry] : lights)
        if (entry.pictures.size() >= fewestPersons) usable.push_back(&entry);

    std::vector<std::pair<Pixels, Harmonics>> rows;
    for (const Light* entry : usable)
        for (int i = 0; i < means; ++i) rows.emplace_back(meanOfSome(*entry, random), entry->harmonics);
    std::uniform_real_distribution<double> uniform(0.2, 1);
    for (int i = 0; i < mixtures; ++i) {
        const std::size_t parts = 2 + random() % 5;
        Pixels pixels(usable.front()->pictures.front().size());
        Harmonics harmonics{};
        double total = 0;
        for (std::size_t p = 0; p < parts; ++p) {
            const Light& part = *usable[random() % usable.size()];
            const double weight = uniform(random);
            const Pixels mean = meanOfSome(part, random);
            for (std::size_t k = 0; k < pixels.size(); ++k) pixels[k] += weight * mean[k];
            for (std::size_t k = 0; k < harmonics.size(); ++k) harmonics[k] += weight * part.harmonics[k];
            total += weight;
        }
        for (double& h : harmonics) h /= total;
        rows.emplace_back(pixels, harmonics);
    }

    SpharTransformator::Data data{FNVector<float>(rows.size(), sigma),
                                  Fn::Matrix<float>(rows.size(), rows.front().first.size()),
                                  Fn::Matrix<float>(rows.size(), SpharTransformator::coefficients)};
    for (std::size_t r = 0; r < rows.size(); ++r) {
        // Seven bits of each pixel; the reader brings images to one length.
        constexpr double levels = 127;
        const auto& [pixels, harmonics] = rows[r];
        const double greatest = *std::max_element(pixels.begin(), pixels.end());
        for (std::size_t k = 0; k < pixels.size(); ++k)
            data.images(r, k) = static_cast<float>(std::round(pixels[k] * levels / std::max(greatest, 1e-6)));
        for (std::size_t k = 0; k < harmonics.size(); ++k)
            data.coefficientRows(r, k) = static_cast<float>(harmonics[k]);
    }
    return data;
}

FNImage<float> lightingWindow(std::span<const float> columns) {
    constexpr std::uint32_t side = SpharTransformator::side;
    FNImage<float> window(side, side);
    for (std::uint32_t x = 0; x < side; ++x)
        for (std::uint32_t y = 0; y < side; ++y)
            window.set({static_cast<std::int32_t>(x), static_cast<std::int32_t>(y)}, columns[x * side + y]);
    return window;
}

} // namespace Train
