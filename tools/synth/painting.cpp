#include "synth/painting.h"

#include <algorithm>
#include <cmath>

namespace Synth {
namespace {

/// -1 to 1 for a lattice point (integer hash after B. Mulvey).
float lattice(std::int32_t x, std::int32_t y, std::uint32_t seed) {
    std::uint32_t h =
        seed + static_cast<std::uint32_t>(x) * 0x9e3779b1u + static_cast<std::uint32_t>(y) * 0x85ebca77u;
    h = (h ^ (h >> 15)) * 0x2c1b3c6du;
    h = (h ^ (h >> 12)) * 0x297a2d39u;
    h ^= h >> 15;
    return static_cast<float>(h) * (2.0f / 4294967296.0f) - 1;
}

} // namespace

float smoothStep(float from, float to, float x) {
    const float t = std::clamp((x - from) / (to - from), 0.0f, 1.0f);
    return t * t * (3 - 2 * t);
}

float noise(float x, float y, std::uint32_t seed) {
    const float fx = std::floor(x), fy = std::floor(y);
    const auto ix = static_cast<std::int32_t>(fx), iy = static_cast<std::int32_t>(fy);
    const float tx = smoothStep(0, 1, x - fx), ty = smoothStep(0, 1, y - fy);
    const float upper = std::lerp(lattice(ix, iy, seed), lattice(ix + 1, iy, seed), tx);
    const float lower = std::lerp(lattice(ix, iy + 1, seed), lattice(ix + 1, iy + 1, seed), tx);
    return std::lerp(upper, lower, ty);
}

float bilinear(const FNImage<float>& image, FNPos pos) {
    const float x = std::clamp(pos.x - 0.5f, 0.0f, static_cast<float>(image.w()) - 1.001f);
    const float y = std::clamp(pos.y - 0.5f, 0.0f, static_cast<float>(image.h()) - 1.001f);
    const auto x0 = static_cast<std::uint32_t>(x), y0 = static_cast<std::uint32_t>(y);
    const float fx = x - static_cast<float>(x0), fy = y - static_cast<float>(y0);
    const float* const row = image.row(y0) + x0;
    const float* const below = row + image.w();
    return (row[0] * (1 - fx) + row[1] * fx) * (1 - fy) + (below[0] * (1 - fx) + below[1] * fx) * fy;
}

Points smoothed(const Points& polygon) {
    constexpr int steps = 4;
    const std::size_t n = polygon.size();
    Points curve;
    for (std::size_t i = 0; i < n; ++i) {
        const FNPos a = polygon[(i + n - 1) % n], b = polygon[i], c = polygon[(i + 1) % n],
                    d = polygon[(i + 2) % n];
        for (int step = 0; step < steps; ++step) {
            const float t = static_cast<float>(step) / steps;
            curve.push_back((b * 2.0f + (c - a) * t + (a * 2.0f - b * 5.0f + c * 4.0f - d) * (t * t) +
                             (b * 3.0f - a - c * 3.0f + d) * (t * t * t)) /
                            2.0f);
        }
    }
    return curve;
}

float depth(const Points& polygon, FNPos p) {
    bool inside = false;
    float least = INFINITY;
    FNPos a = polygon.back();
    for (const FNPos b : polygon) {
        const FNPos ab = b - a, ap = p - a;
        const float t = std::clamp(dot(ab, ap) / std::max(1e-9f, dot(ab, ab)), 0.0f, 1.0f);
        const FNPos off = ap - ab * t;
        least = std::min(least, dot(off, off));
        if ((a.y > p.y) != (b.y > p.y) && p.x < a.x + ab.x * (p.y - a.y) / ab.y) inside = !inside;
        a = b;
    }
    return inside ? std::sqrt(least) : -std::sqrt(least);
}

} // namespace Synth
