#include "cmp/b7/reshape_warp.h"

#include "fn/matrix.h"
#include "fn/shape.h"
#include "img/affine/transform.h"

#include <array>
#include <cmath>
#include <vector>

namespace Cmp::B7 {

namespace {

constexpr float eyeRow = 58.666603f;
constexpr float eyeShare = 0.36666626f;   ///< of the height, above the eyes
constexpr float mouthShare = 0.38333374f; ///< of the height, from the eyes to the mouth
constexpr float stripWidth = 12.5f;       ///< in distances of the eyes
constexpr std::uint32_t leastColumns = 800;
constexpr float mostColumns = 1 << 20; ///< wider strips are of no face
/// In a row of 160 pixels, from -1 to 1, the eyes are at plus and minus this.
constexpr double eyePlace = 0.4;
constexpr double eyeDepth = -0.083484888; ///< sqrt(1 - eyePlace^2) - 1

/// The face upright and straight, with much room at both sides, and what of it lies in the image.
struct Strip {
    FNImage<float> pixels;
    Fn::Shape inside;
    Img::Affine::Mapping fromImage;
};

Strip cutStrip(FNImage<float> const& image, FNPos e1, FNPos e2, FNPos mouth) {
    const FN2Vector<float> eyes = e2 - e1;
    const float distance = std::hypot(eyes.x, eyes.y);
    const float h = ((mouth.y - e1.y) * eyes.x - (mouth.x - e1.x) * eyes.y) / distance;
    if (h <= 0) FN_THROW(FNEBadArg, "Vertically, the mouth center must be below the eyes!");
    const FN2Vector<float> v1 = eyes * stripWidth;
    const FN2Vector<float> v2 = FN2Vector<float>(-eyes.y, eyes.x) * (h / distance / mouthShare);
    const float columns = std::trunc(std::hypot(v1.x, v1.y) + 0.5f);
    if (!std::isfinite(h) || !(columns <= mostColumns))
        FN_THROW(FNEBadArg, "The positions of eyes and mouth are not those of a face");
    Strip strip{
        FNImage<float>(std::max(leastColumns, static_cast<std::uint32_t>(columns)), warpedSize), {}, {}};
    const FNPos origin = e1 + eyes * 0.5f - v1 * 0.5f - v2 * eyeShare;
    strip.fromImage = Img::Affine::transform(image, strip.pixels, origin, v1, v2, true, 0.0f).inverse();
    strip.inside =
        Fn::Shape::parallelogram(strip.fromImage({0, 0}), strip.fromImage({0, static_cast<float>(image.h())}),
                                 strip.fromImage({static_cast<float>(image.w()), 0}));
    return strip;
}

/// Where the columns of the result lie in the strip: an arc p * sqrt(1 - u^2) + q * u for u from -1 to 1, on
/// a line of centres that goes through the bridge of the nose and the mouth.
class Unrolling {
public:
    Unrolling(const Img::Affine::Mapping& toStrip, FNPos leftEye, FNPos rightEye, FNPos mouth, FNPos bridge)
        : mouth_(toStrip(mouth)) {
        constexpr double bridgeShare = 0.3; // the bridge stands out from the face
        const double x1 = toStrip(leftEye).x, x2 = toStrip(rightEye).x, middle = (x1 + x2) / 2;
        const FNPos b = toStrip(bridge);
        const double bx = (b.x - middle) * bridgeShare + middle, by = (b.y - eyeRow) * bridgeShare + eyeRow;
        centre_ = bx + (eyeRow - by) * (mouth_.x - bx) / (mouth_.y - by);
        if (!(centre_ > x1)) centre_ = x1 + 1;
        if (!(x2 > centre_)) centre_ = x2 - 1;
        Fn::Matrix<double> arc(2, 2), eyes(2, 1);
        arc(0, 0) = arc(1, 0) = eyeDepth;
        arc(0, 1) = -eyePlace;
        arc(1, 1) = eyePlace;
        eyes(0, 0) = x1 - centre_;
        eyes(1, 0) = x2 - centre_;
        arc.linearSolve(eyes);
        p_ = eyes(0, 0);
        q_ = eyes(1, 0);
    }

    bool finite() const { return std::isfinite(p_) && std::isfinite(q_) && std::isfinite(mouth_.x); }
    /// Where the arc of a row would begin if it were flat.
    double row(double y) const {
        return (y - mouth_.y) / (eyeRow - mouth_.y) * centre_ +
               (y - eyeRow) / (mouth_.y - eyeRow) * mouth_.x - p_;
    }
    /// Strip column, relative to row(), of the left border of a column of the result.
    double column(std::uint32_t x) const {
        constexpr double half = warpedSize / 2;
        const double u = (x - half) / half;
        return std::sqrt(1 - u * u) * p_ + u * q_;
    }

private:
    FN2Vector<double> mouth_;
    double centre_, p_, q_;
};

/// Sum of the row's values in the columns from `begin` to below `end`; beyond the row they are 0.
double sumOf(std::span<const float> row, double begin, double end) {
    const auto size = static_cast<double>(row.size());
    double sum = 0;
    const auto first = static_cast<std::size_t>(std::clamp(begin, 0.0, size));
    const auto last = static_cast<std::size_t>(std::clamp(end, 0.0, size));
    for (std::size_t i = first; i < last; ++i) sum += double{row[i]};
    return sum;
}

/// Mean over the columns from a to b.
double mean(std::span<const float> row, double a, double b) {
    const double ca = std::ceil(a), fb = std::floor(b);
    const double first = sumOf(row, ca - 1, ca);
    if (fb < ca || a == b) return first;
    return ((ca - a) * first + sumOf(row, ca, fb) + (b - fb) * sumOf(row, fb, fb + 1)) / (b - a);
}

/// Columns of one row that lie in the image.
using Segments = std::vector<std::pair<double, double>>;

Segments segmentsOf(const Fn::Shape& inside, std::uint32_t y) {
    Segments segments;
    for (Fn::ShapeLineIter i(inside, static_cast<std::int32_t>(y)); !i.atEnd(); ++i)
        segments.emplace_back(i->x0, i->x1);
    return segments;
}

/// Share of the columns from a to b that is in none of the segments.
double padding(const Segments& inside, double a, double b) {
    const bool single = std::floor(b) < std::ceil(a) || a == b;
    if (single) {
        a = std::ceil(a) - 1;
        b = a + 1;
    }
    double covered = 0;
    for (const auto& [begin, end] : inside) covered += std::max(0.0, std::min(b, end) - std::max(a, begin));
    return 1 - covered / (b - a);
}

} // namespace

FNImage<float> reshapeWarp(FNImage<float> const& image, FNPos const& leftEye, FNPos const& rightEye,
                           FNPos const& mouth, FNPos const& bridge, float& paddingRatio) {
    const Strip strip = cutStrip(image, leftEye, rightEye, mouth);
    const Unrolling unrolling(strip.fromImage, leftEye, rightEye, mouth, bridge);
    if (!unrolling.finite()) FN_THROW(FNEBadArg, "The positions of eyes and mouth are not those of a face");
    FNImage<float> result(warpedSize, warpedSize);
    float* out = result.getExclusive();
    double outside = 0;
    std::array<double, warpedSize + 1> borders;
    for (std::uint32_t x = 0; x <= warpedSize; ++x) borders[x] = unrolling.column(x);
    for (std::uint32_t y = 0; y < warpedSize; ++y) {
        const std::span<const float> row(strip.pixels.row(y), strip.pixels.w());
        const Segments inside = segmentsOf(strip.inside, y);
        const double start = unrolling.row(y);
        for (std::uint32_t x = 0; x < warpedSize; ++x, ++out) {
            const double a = borders[x] + start, b = borders[x + 1] + start;
            if (b < a) {
                *out = 0;
                continue;
            }
            *out = static_cast<float>(mean(row, a, b));
            outside += padding(inside, a, b);
        }
    }
    paddingRatio = static_cast<float>(outside / result.size());
    return result;
}

} // namespace Cmp::B7
