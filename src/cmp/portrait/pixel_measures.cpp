#include "cmp/portrait/pixel_measures.h"

#include "cmp/portrait/egg.h"
#include "fn/numeric/vector_primitives.h"
#include "fn/shape.h"

#include <bitset>
#include <cmath>
#include <vector>

namespace Cmp::Portrait {

namespace {

/// The pixels of the image from one corner to the other, whose fractions are dropped.
FNBox boxBetween(FNPos low, FNPos high, const FNBox& image) {
    const FNGridPos first(low), end(high);
    return FNBox{first.x, first.y, end.x, end.y} & image;
}

FNBox boxAround(FNPos centre, float halfSize, const FNBox& image) {
    const FNPos reach(halfSize, halfSize);
    return boxBetween(centre - reach, centre + reach, image);
}

double pixelsOf(const FNBox& box) {
    return static_cast<double>(box.width()) * box.height();
}

} // namespace

float exposure(const FNImage<float>& window) {
    const double mean = Fn::Numeric::sum(window.data(), window.size()) / static_cast<double>(window.size());
    return static_cast<float>(mean * 256 - 0.5);
}

float hotSpots(const FNImage<float>& portrait) {
    const Egg face({54.5f, 32.5f}, {32, 0}, {0, 51.2f}, {0, -32});
    constexpr float below = 58.1f; // middles of pixels, as of the egg: above the mouth
    constexpr float nearlyWhite = 0.96f;
    std::vector<float> values;
    const FNBox box = face.enclosing() & portrait.box();
    for (std::int32_t y = box.y0; y < box.y1 && static_cast<float>(y) + 0.5f < below; ++y)
        for (std::int32_t x = box.x0; x < box.x1; ++x)
            if (const float value = portrait.get({x, y}); value == value && face.containsPixel({x, y}))
                values.push_back(value);
    if (values.empty()) return 0;
    std::sort(values.begin(), values.end());
    const float lower = values[values.size() / 4], upper = values[3 * values.size() / 4];
    const float fence = std::min(upper + 1.5f * (upper - lower), nearlyWhite);
    return static_cast<float>(values.end() - std::upper_bound(values.begin(), values.end(), fence));
}

unsigned int grayScaleDensity(const FNImage<unsigned char>& image, FNPos eye0, FNPos eye1) {
    const Egg face = Egg::ofEyes(eye0, eye1, 1, 1.766f, 1.669f);
    const FNBox box = face.enclosing() & image.box();
    std::bitset<256> levels;
    for (std::int32_t y = box.y0; y < box.y1; ++y) {
        const unsigned char* const row = image.row(static_cast<std::uint32_t>(y));
        for (std::int32_t x = box.x0; x < box.x1; ++x)
            if (!levels[row[x]] && face.containsPixel({x, y})) levels.set(row[x]);
    }
    return static_cast<unsigned int>(levels.count());
}

float naturalSkinColour(const FNImage<Fn::Bgra32>& image, FNPos eye0, FNPos eye1) {
    const FNPos v = eye1 - eye0, down = 0.8f * FNPos(-v.y, v.x);
    const FNPos corner = eye0 + 0.125f * down;
    const Fn::Shape cheeks =
        Fn::Shape::parallelogram(corner, corner + v, corner + down) * Fn::Shape(image.box());
    if (cheeks.empty()) return 0;
    std::uint64_t skin = 0;
    for (Fn::ShapeIter part(cheeks); !part.atEnd(); ++part)
        for (FNConstImIter<Fn::Bgra32> pixel(image, *part); !pixel.atEnd(); ++pixel)
            skin += Implementation::hasNaturalSkinColour(*pixel);
    return static_cast<float>(static_cast<double>(skin) / static_cast<double>(cheeks.area()));
}

float redEye(const FNImage<Fn::Bgra32>& image, FNPos eye, FNPos eye0, FNPos eye1) {
    constexpr int leastRed = 60;
    const FNPos v = eye1 - eye0;
    const FNPos centre = eye + 0.035f * FNPos(v.y, -v.x);
    const float sigma = 0.034f * length(v);
    const FNBox window = boxAround(centre, 3 * sigma, image.box());
    if (window.empty()) return 0;
    double sum = 0;
    for (std::int32_t y = window.y0; y < window.y1; ++y)
        for (std::int32_t x = window.x0; x < window.x1; ++x) {
            const Fn::Bgra32 p = image.row(static_cast<std::uint32_t>(y))[x];
            if (p.r <= leastRed) continue;
            const FNPos offset = FNPos(static_cast<float>(x), static_cast<float>(y)) - centre;
            sum += std::exp(-static_cast<double>(dot(offset, offset) / (2 * sigma * sigma))) * (p.r * p.r) /
                   (1 + p.g * p.g + p.b * p.b);
        }
    return static_cast<float>(sum / pixelsOf(window));
}

float glassTint(const FNImage<Fn::Bgra32>& image, FNPos eye, FNPos eye0, FNPos eye1) {
    const FNPos v = eye1 - eye0;
    const float halfSize = 0.1f * length(v);
    const FNBox lens = boxAround(eye + FNPos(0, 0.2f * v.x), halfSize, image.box());
    const FNBox cheek = boxAround(eye + FNPos(0, 0.7f * v.x), halfSize, image.box());
    if (cheek.empty()) return 0;
    std::int64_t red = 0, green = 0, blue = 0;
    const auto add = [&](const FNBox& box, int sign) {
        for (FNConstImIter<Fn::Bgra32> pixel(image, box); !pixel.atEnd(); ++pixel) {
            red += sign * pixel->r;
            green += sign * pixel->g;
            blue += sign * pixel->b;
        }
    };
    add(cheek, 1);
    add(lens, -1);
    return static_cast<float>(static_cast<double>(std::max({red, green, blue})) / pixelsOf(cheek));
}

} // namespace Cmp::Portrait

namespace Cmp::Implementation {

bool hasNaturalSkinColour(const Fn::Bgra32& pixel) {
    const int r = pixel.r, g = pixel.g, b = pixel.b, sum = r + g + b;
    return g != 0 && 10 * b < 14 * g && r > g && r > b && g - b <= 79 &&
           (1000000 * b > 142857 * sum || 1000000 * g > 285714 * sum) &&
           std::max({r, g, b}) - std::min({r, g, b}) > 9;
}

} // namespace Cmp::Implementation
