#pragma once

#include "synth/portrait_model.h"

#include <cmath>

/// A model of a face of a few hundred pixels: 68 points on an oval, flat skin, one way to differ.
inline Synth::PortraitModel smallPortraitModel() {
    using namespace Synth;
    Points points(landmarkCount);
    for (std::size_t i = 0; i < landmarkCount; ++i) {
        // Jaw from ear to ear below, the others on small circles where the features are.
        const auto at = [&](FNPos centre, float radius, std::size_t first, std::size_t count) {
            const float angle = 6.2831853f * static_cast<float>(i - first) / static_cast<float>(count);
            return centre + FNPos{std::cos(angle + 0.1f), std::sin(angle + 0.1f)} * radius;
        };
        const float jaw = 3.14159265f * (1 - static_cast<float>(i) / 16);
        points[i] = i < 17   ? FNPos{20 + 16 * std::cos(jaw), 22 + 22 * std::sin(jaw)}
                    : i < 27 ? FNPos{9 + 2.4f * static_cast<float>(i - 17), 17}
                    : i < 36 ? at({20, 27}, 3.5f, 27, 9)
                    : i < 42 ? at({12, 21}, 2.2f, 36, 6)
                    : i < 48 ? at({28, 21}, 2.2f, 42, 6)
                    : i < 60 ? at({20, 36}, 4, 48, 12)
                             : at({20, 36}, 2, 60, 8);
    }
    const TextureFrame frame(points);
    std::vector<float> mean, change(shapeSize + frame.textureSize());
    for (const FNPos p : points) {
        mean.push_back(p.x);
        mean.push_back(p.y);
    }
    mean.insert(mean.end(), frame.luma().size(), 150);
    mean.insert(mean.end(), 2 * frame.chroma().size(), 128);
    for (std::size_t i = 0; i < change.size(); ++i) change[i] = std::sin(static_cast<float>(i)) * 5;
    const std::vector<float> none(change.size());
    return {points, mean, std::vector<Direction>(controlCount, Direction(none)), {Direction(change)}, {0.5f}};
}
