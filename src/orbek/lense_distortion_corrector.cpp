#include "orbek/lense_distortion_corrector.h"

#include "orbek/implementation/adapt.h"
#include "orbek/implementation/lense_distortion.h"

#include <cmath>
#include <cstdio>
#include <numbers>

namespace Orbek {
namespace {

constexpr float parameterUnit = 100000.0f;
constexpr int longestDisplacement = 255;
/// A centre so far away that the table would be larger than this is refused.
constexpr std::int64_t mostTableEntries = std::int64_t{1} << 28;

constexpr Fn::Bgra32 black(0, 0, 0);

[[noreturn]] void throwDisplacement(const char* format, int x, int y) {
    char text[80];
    std::snprintf(text, sizeof text, format, x, y);
    FN_THROW(FNEBadArg, text);
}

} // namespace

FN2Vector<double> distortedPoint(FN2Vector<double> undistorted, double k) {
    const double r = std::hypot(undistorted.x, undistorted.y);
    if (r == 0 || k == 0) return undistorted;
    const double p = 1 / (3 * k), q = r / (2 * k);
    const double discriminant = p * p * p + q * q;
    double distorted;
    if (discriminant >= 0) {
        const double root = std::sqrt(discriminant);
        distorted = std::cbrt(q + root) + std::cbrt(q - root);
    } else {
        const double t = std::sqrt(-discriminant);
        const double m = std::hypot(q, t), third = std::atan2(t, q) / 3;
        distorted = std::cbrt(m) * (std::numbers::sqrt3 * std::sin(third) - std::cos(third));
    }
    return undistorted * (distorted / r);
}

LenseDistortionCorrector::Implementation::Implementation(float parameter, std::uint32_t width,
                                                         std::uint32_t height, int centerOffsetX,
                                                         int centerOffsetY)
    : width_(width), height_(height), centerX_(std::int64_t{width / 2} + centerOffsetX),
      centerY_(std::int64_t{height / 2} + centerOffsetY), k_(std::abs(parameter) / parameterUnit),
      positive_(parameter > 0) {
    const std::int64_t columns = std::max(width_ - centerX_, centerX_) + 1,
                       rows = std::max(height_ - centerY_, centerY_) + 1;
    if (columns > mostTableEntries / rows)
        FN_THROW(FNEBadArg, "The image is too large, or the centre of distortion too far from it");
    tableWidth_ = static_cast<std::uint64_t>(columns);
    const auto squaredRadius = static_cast<double>(columns * columns + rows * rows);
    const double scale = 1 + k_ * squaredRadius; // the table's far corner maps onto itself
    table_.reserve(static_cast<std::size_t>(columns * rows));
    for (std::int64_t y = 0; y < rows; ++y)
        for (std::int64_t x = 0; x < columns; ++x) table_.push_back(entry(x, y, scale));
    if (!(parameter >= -1 && parameter <= 1)) FN_THROW(FNEBadArg, "Distortion parameter out of range");
}

auto LenseDistortionCorrector::Implementation::entry(std::int64_t x, std::int64_t y, double scale) const
    -> Entry {
    const FN2Vector<double> pixel(static_cast<double>(x), static_cast<double>(y));
    const FN2Vector<std::int32_t> shift(distortedPoint(pixel * scale, k_) - pixel);
    if (shift.x < 0 || shift.y < 0)
        throwDisplacement("Wrong sign of displacement (%d,%d)\n", shift.x, shift.y);
    if (shift.x > longestDisplacement || shift.y > longestDisplacement)
        throwDisplacement("Wrong size of displacement (%d,%d)\n", shift.x, shift.y);
    return static_cast<Entry>(shift.x | shift.y << 8);
}

/// The pixels from corner to corner, all if both corners are the origin.
FNBox LenseDistortionCorrector::Implementation::region(const Position& lowerCorner,
                                                       const Position& upperCorner) const {
    const FNBox whole{0, 0, static_cast<std::int32_t>(width_), static_cast<std::int32_t>(height_)};
    if (lowerCorner == Position{} && upperCorner == Position{}) return whole;
    const bool ordered = lowerCorner.x < upperCorner.x && lowerCorner.y < upperCorner.y;
    const FNGridPos lower(FNPos{std::floor(lowerCorner.x), std::floor(lowerCorner.y)}),
        upper(FNPos{std::floor(upperCorner.x), std::floor(upperCorner.y)});
    const FNBox box{lower.x, lower.y, upper.x, upper.y};
    if (!ordered || !((box & whole) == box)) FN_THROW(FNEBadArg, "Invalid image subregion specified");
    return box;
}

Image LenseDistortionCorrector::Implementation::undistort(const Image& image, const Position& lowerCorner,
                                                          const Position& upperCorner) const {
    const FNImageReference reference = adapt(image);
    if (reference.w() != width_ || reference.h() != height_)
        FN_THROW(FNEBadArg, "Size of image passed to undistort() does not match corrector's image size");
    const FNBox box = region(lowerCorner, upperCorner);
    const FNImage<Fn::Bgra32> source = reference.toBgra32();
    FNImage<Fn::Bgra32> result(box.width(), box.height());
    Fn::Bgra32* target = result.getExclusive();
    const auto moved = [this](std::int64_t at, std::int64_t center, std::int64_t shift) {
        return (at >= center) == positive_ ? at + shift : at - shift;
    };
    for (std::int64_t y = box.y0; y < box.y1; ++y) {
        const Entry* const row =
            table_.data() + static_cast<std::uint64_t>(std::abs(y - centerY_)) * tableWidth_;
        for (std::int64_t x = box.x0; x < box.x1; ++x) {
            const Entry shift = row[std::abs(x - centerX_)];
            const std::int64_t sourceX = moved(x, centerX_, shift & 0xFF),
                               sourceY = moved(y, centerY_, shift >> 8);
            const bool inside = sourceX >= 0 && sourceX < width_ && sourceY >= 0 && sourceY < height_;
            *target++ = inside ? source.row(static_cast<std::uint32_t>(sourceY))[sourceX] : black;
        }
    }
    return adapt(FNImageReferenceFactory::create(result), "");
}

LenseDistortionCorrector::LenseDistortionCorrector(const Configuration&, const float& parameter,
                                                   unsigned int width, unsigned int height, int centerOffsetX,
                                                   int centerOffsetY)
    : implementation_(new Implementation(parameter, width, height, centerOffsetX, centerOffsetY)) {}
LenseDistortionCorrector::LenseDistortionCorrector(const LenseDistortionCorrector&) = default;
LenseDistortionCorrector& LenseDistortionCorrector::operator=(const LenseDistortionCorrector&) = default;
LenseDistortionCorrector::~LenseDistortionCorrector() = default;

Image LenseDistortionCorrector::undistort(const Image& image) const {
    return implementation_->undistort(image, {}, {});
}

Image LenseDistortionCorrector::undistort(const Image& image, const Position& lowerCorner,
                                          const Position& upperCorner) const {
    return implementation_->undistort(image, lowerCorner, upperCorner);
}

} // namespace Orbek
