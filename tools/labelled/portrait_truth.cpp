#include "labelled/portrait_truth.h"

#include <algorithm>
#include <cmath>
#include <sstream>

namespace Labelled {
namespace {

// Places in the usual order of 68 points.
constexpr std::size_t earLeft = 0, chinPoint = 8, earRight = 16, noseTip = 30, eyeLeft = 36, eyeRight = 42;

FNPos down(FNPos across) {
    return {-across.y, across.x};
}

float mean(const FNImage<float>& image, FNPos centre, float from, float to) {
    float sum = 0;
    int n = 0;
    const auto reach = static_cast<std::int32_t>(std::ceil(to));
    const FNGridPos middle(centre);
    for (std::int32_t y = middle.y - reach; y <= middle.y + reach; ++y)
        for (std::int32_t x = middle.x - reach; x <= middle.x + reach; ++x) {
            const FNPos offset = FNPos(static_cast<float>(x) + 0.5f, static_cast<float>(y) + 0.5f) - centre;
            const float distance = length(offset);
            if (distance < from || distance > to || !image.box().contains({x, y})) continue;
            sum += image.get({x, y});
            ++n;
        }
    return n == 0 ? 1.0f : sum / static_cast<float>(n);
}

} // namespace

std::optional<Points68> Points68::of(const Row& row) {
    std::istringstream text(row.text("points68"));
    Points68 result;
    for (FNPos& point : result.points_)
        if (!(text >> point.x >> point.y)) return {};
    return result;
}

FNPos Points68::mean(std::size_t first, std::size_t count) const {
    FNPos sum;
    for (std::size_t i = first; i < first + count; ++i) sum += points_[i];
    return sum / static_cast<float>(count);
}

float Points68::eyeDistance() const {
    return length(mean(eyeRight, 6) - mean(eyeLeft, 6));
}

float Points68::lipGap() const {
    float sum = 0;
    for (const auto& [upper, lower] : {std::pair(61, 67), std::pair(62, 66), std::pair(63, 65)})
        sum += length(points_[static_cast<std::size_t>(upper)] - points_[static_cast<std::size_t>(lower)]);
    return sum / 3 / eyeDistance();
}

float Points68::eyeOpening(Side side) const {
    const std::size_t first = side == Side::left ? eyeLeft : eyeRight;
    const float height =
        length(points_[first + 1] - points_[first + 5]) + length(points_[first + 2] - points_[first + 4]);
    return height / 2 / length(points_[first + 3] - points_[first]);
}

float Points68::yaw() const {
    // Medians of this ratio on faces labelled as frontal and as turned by about 30 degrees lie 0.57 apart.
    constexpr float degreesOfRatio = 55;
    const FNPos across = mean(eyeRight, 6) - mean(eyeLeft, 6);
    const auto along = [&](std::size_t i) { return dot(points_[i], across); };
    const float left = along(noseTip) - along(earLeft + 1), right = along(earRight - 1) - along(noseTip);
    return degreesOfRatio * (left - right) / std::max(left + right, 1e-3f);
}

std::optional<float> Points68::irisOffset(const FNImage<float>& image, Side side) const {
    constexpr float leastOpening = 0.2f, leastWidth = 12, radius = 0.2f, ring = 0.32f;
    const std::size_t first = side == Side::left ? eyeLeft : eyeRight;
    const FNPos corner = points_[first], across = points_[first + 3] - corner;
    const float width = length(across);
    if (eyeOpening(side) < leastOpening || width < leastWidth) return {};
    const FNPos middle = this->mean(first, 6);
    std::optional<float> best;
    float bestContrast = 0.08f;
    for (int i = -16; i <= 16; ++i)
        for (int j = -2; j <= 2; ++j) {
            const float u = 0.02f * static_cast<float>(i), v = 0.03f * static_cast<float>(j);
            const FNPos centre = middle + across * u + down(across) * v;
            // Beside the disc there is white at one side at least.
            const float inside = Labelled::mean(image, centre, 0, radius * width);
            const float outside = std::max(Labelled::mean(image, centre - across * ring, 0, 0.08f * width),
                                           Labelled::mean(image, centre + across * ring, 0, 0.08f * width));
            if (outside - inside > bestContrast) {
                bestContrast = outside - inside;
                best = u;
            }
        }
    return best;
}

Points68::Extent Points68::extent(FNPos leftEye, FNPos rightEye) const {
    const FNPos centre = (leftEye + rightEye) / 2.0f, across = rightEye - leftEye;
    const float square = dot(across, across);
    const auto along = [&](std::size_t i, FNPos axis) { return dot(points_[i] - centre, axis) / square; };
    float left = 0, right = 0;
    for (std::size_t i = 0; i < 3; ++i) {
        left = std::max(left, -along(earLeft + i, across));
        right = std::max(right, along(earRight - i, across));
    }
    return {along(chinPoint, down(across)), left, right};
}

std::optional<bool> frontalLight(const Row& row) {
    constexpr double frontal = 25, lateral = 45, high = 50;
    const auto azimuth = row.number("light_azimuth"), elevation = row.number("light_elevation");
    if (!azimuth || !elevation) return {};
    if (std::abs(*azimuth) > lateral) return false;
    if (std::abs(*azimuth) <= frontal && std::abs(*elevation) < high) return true;
    return {};
}

std::optional<double> ageOf(const Row& row) {
    if (const auto years = row.number("age")) return years;
    const std::string text = row.text("age");
    if (text == "more than 70") return 76.0;
    double first = 0, last = 0;
    char dash = 0;
    if (std::istringstream(text) >> first >> dash >> last && dash == '-') return (first + last + 1) / 2;
    return {};
}

std::optional<Ethnicity> ethnicityOf(const Row& row) {
    const std::string text = row.text("ethnicity");
    if (text.empty()) return {};
    if (text == "White") return Ethnicity::white;
    if (text == "Black") return Ethnicity::black;
    for (const char* asian : {"Asian", "East Asian", "Southeast Asian"})
        if (text == asian) return Ethnicity::asian;
    return Ethnicity::other;
}

} // namespace Labelled
