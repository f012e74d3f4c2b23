#include "drawing.h"

#include "orbek/implementation/adapt.h"

#include <array>
#include <cmath>
#include <string>

namespace Orbek::Tool {
namespace {

using Fn::Bgra32;

constexpr Bgra32 boxColor(255, 208, 0), eyeColor(0, 230, 118), featureColor(64, 196, 255),
    plateColor(32, 32, 32);

/// The box of a face around the middle of the eyes, in eye distances.
constexpr float boxHalfWidth = 1.0f, boxAbove = 0.9f, boxBelow = 1.7f;

constexpr int digitColumns = 5, digitRows = 7;

/// Digits in dots: one number a row, the highest of five bits is the left dot.
constexpr std::array<std::array<unsigned char, digitRows>, 10> digits{{
    {0x0E, 0x11, 0x13, 0x15, 0x19, 0x11, 0x0E},
    {0x04, 0x0C, 0x04, 0x04, 0x04, 0x04, 0x0E},
    {0x0E, 0x11, 0x01, 0x02, 0x04, 0x08, 0x1F},
    {0x1F, 0x02, 0x04, 0x02, 0x01, 0x11, 0x0E},
    {0x02, 0x06, 0x0A, 0x12, 0x1F, 0x02, 0x02},
    {0x1F, 0x10, 0x1E, 0x01, 0x01, 0x11, 0x0E},
    {0x06, 0x08, 0x10, 0x1E, 0x11, 0x11, 0x0E},
    {0x1F, 0x01, 0x02, 0x04, 0x08, 0x08, 0x08},
    {0x0E, 0x11, 0x11, 0x0E, 0x11, 0x11, 0x0E},
    {0x0E, 0x11, 0x11, 0x0F, 0x01, 0x02, 0x0C},
}};

float penOf(float eyeDistance) {
    return std::max(eyeDistance / 25, 1.0f);
}

FNBox boxOf(FNPos from, FNPos to) {
    const FNGridPos lower(FNPos{std::floor(from.x + 0.5f), std::floor(from.y + 0.5f)}),
        upper(FNPos{std::floor(to.x + 0.5f), std::floor(to.y + 0.5f)});
    return {lower.x, lower.y, upper.x, upper.y};
}

} // namespace

void Drawing::fill(const FNBox& box, const Bgra32& color) {
    for (FNImIter<Bgra32> pixel(image_, box); !pixel.atEnd(); ++pixel) *pixel = color;
}

void Drawing::line(FNPos from, FNPos to, float thickness, const Bgra32& color) {
    const FNPos half{thickness / 2, thickness / 2};
    const float extent = std::max(std::abs(to.x - from.x), std::abs(to.y - from.y));
    // A face has at most some widths of the image, so that the number of steps is bounded by it, too.
    const int steps = std::max(static_cast<int>(std::min(std::ceil(extent), 1e6f)), 1);
    for (int i = 0; i <= steps; ++i) {
        const FNPos at = from + (to - from) * (static_cast<float>(i) / static_cast<float>(steps));
        fill(boxOf(at - half, at + half), color);
    }
}

void Drawing::disc(FNPos center, float radius, const Bgra32& color) {
    const FNPos reach{radius, radius};
    const FNBox around = boxOf(center - reach, center + reach) & image_.box();
    for (FNImIter<Bgra32> pixel(image_, around); !pixel.atEnd(); ++pixel) {
        const FNPos middle{static_cast<float>(around.x0) + static_cast<float>(pixel.x()) + 0.5f,
                           static_cast<float>(around.y0) + static_cast<float>(pixel.y()) + 0.5f};
        if (length(middle - center) <= radius) *pixel = color;
    }
}

void Drawing::number(FNPos corner, unsigned int number, float height, const Bgra32& color) {
    const std::string text = std::to_string(number);
    const float dot = std::max(std::round(height / digitRows), 1.0f);
    const auto length = static_cast<float>(text.size());
    fill(boxOf(corner, corner + FNPos{(length * (digitColumns + 1) + 1) * dot, (digitRows + 2) * dot}),
         plateColor);
    FNPos at = corner + FNPos{dot, dot};
    for (const char c : text) {
        const auto& rows = digits[static_cast<std::size_t>(c - '0')];
        for (int y = 0; y < digitRows; ++y)
            for (int x = 0; x < digitColumns; ++x) {
                if (!(rows[static_cast<std::size_t>(y)] >> (digitColumns - 1 - x) & 1)) continue;
                const FNPos place = at + FNPos{static_cast<float>(x), static_cast<float>(y)} * dot;
                fill(boxOf(place, place + FNPos{dot, dot}), color);
            }
        at.x += (digitColumns + 1) * dot;
    }
}

void Drawing::face(const Face::Location& face, unsigned int faceNumber) {
    const FNPos right = FNPos{std::cos(face.rotationAngle), std::sin(face.rotationAngle)} * face.width,
                down{-right.y, right.x};
    const FNPos middle = adapt(face.pos);
    const std::array corners{
        middle - right * boxHalfWidth - down * boxAbove, middle + right * boxHalfWidth - down * boxAbove,
        middle + right * boxHalfWidth + down * boxBelow, middle - right * boxHalfWidth + down * boxBelow};
    for (std::size_t i = 0; i < corners.size(); ++i)
        line(corners[i], corners[(i + 1) % corners.size()], penOf(face.width), boxColor);
    number(corners.front(), faceNumber, std::max(face.width / 4, 7.0f), boxColor);
}

void Drawing::eyes(const Eyes::Location& eyes) {
    const FNPos first = adapt(eyes.first), second = adapt(eyes.second);
    const float radius = std::max(length(second - first) / 16, 1.5f);
    disc(first, radius, eyeColor);
    disc(second, radius, eyeColor);
}

void Drawing::feature(FNPos pos, float eyeDistance) {
    disc(pos, std::max(eyeDistance / 20, 1.5f), featureColor);
}

} // namespace Orbek::Tool
