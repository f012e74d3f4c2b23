#pragma once

#include "fn/vector3.h"

#include <algorithm>
#include <cmath>
#include <random>
#include <vector>

/// A surface like that of a face, 200 mm wide and high, seen by a scanner with some noise.
inline std::vector<FN3Vector<double>> scanOf200000Points() {
    std::mt19937 random(1);
    std::uniform_real_distribution<double> along(-100, 100);
    std::normal_distribution<double> noise(0, 0.1);
    std::vector<FN3Vector<double>> points(200000);
    for (auto& p : points) {
        const double x = along(random), y = along(random), r = x * x + y * y;
        p = {x, y, 80 - 0.006 * r + 25 * std::exp(-r / 300) + noise(random)};
    }
    return points;
}

/// Positions within some millimetres of that surface.
inline std::vector<FN3Vector<double>> queryPositions() {
    auto points = scanOf200000Points();
    std::mt19937 random(2);
    std::normal_distribution<double> offset(0, 1);
    std::shuffle(points.begin(), points.end(), random);
    points.resize(10000);
    for (auto& p : points) p += {offset(random), offset(random), offset(random)};
    return points;
}
