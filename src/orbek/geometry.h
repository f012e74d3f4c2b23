#pragma once

#include <algorithm>
#include <cstdint>

/// Places in an image and in space, as the public classes speak of them.

namespace Orbek {

/// A place in an image, in pixels: x points right, y points down, the origin is the upper left corner.
struct Position {
    float x = 0;
    float y = 0;

    friend bool operator==(const Position&, const Position&) = default;
};

/// A rectangle of an image, in pixels: x0 <= x < x1 and y0 <= y < y1.
struct Box {
    std::int32_t x0 = 0;
    std::int32_t y0 = 0;
    std::int32_t x1 = 0;
    std::int32_t y1 = 0;

    Box() = default;
    /// From two opposite corners in any order.
    Box(int cornerX, int cornerY, int oppositeX, int oppositeY)
        : x0(std::min(cornerX, oppositeX)), y0(std::min(cornerY, oppositeY)),
          x1(std::max(cornerX, oppositeX)), y1(std::max(cornerY, oppositeY)) {}

    friend bool operator==(const Box&, const Box&) = default;
};

/// A point in space, in millimetres.
struct Vertex {
    double x = 0;
    double y = 0;
    double z = 0;

    friend bool operator==(const Vertex&, const Vertex&) = default;
};

} // namespace Orbek
