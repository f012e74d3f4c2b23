#include "kx/eye_finder.h"

#include <array>
#include <charconv>
#include <optional>
#include <string_view>

namespace Kx::Implementation {

namespace {

constexpr FNPos undefined{0.5f, 0.5f};

/// The number at the start of a field, behind blanks.
std::optional<float> number(std::string_view field) {
    field.remove_prefix(std::min(field.find_first_not_of(" \t"), field.size()));
    float value = 0;
    const auto [end, error] = std::from_chars(field.data(), field.data() + field.size(), value);
    return error == std::errc() && std::isfinite(value) ? std::optional(value) : std::nullopt;
}

/// Six numbers with colons between them.
std::optional<std::array<float, 6>> sixNumbers(std::string_view text) {
    std::array<float, 6> numbers;
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        const std::size_t colon = text.find(':');
        if ((colon == std::string_view::npos) != (i + 1 == numbers.size())) return {};
        const std::optional<float> value = number(text.substr(0, colon));
        if (!value) return {};
        numbers[i] = *value;
        text.remove_prefix(colon == std::string_view::npos ? text.size() : colon + 1);
    }
    return numbers;
}

bool define(FacialFeatureLocation& eye, FNPos pos, float confidence) {
    if (pos == undefined) return false;
    eye.pos = pos;
    eye.confidence = confidence;
    return true;
}

} // namespace

bool EyeFinder::findInAttributes(const FNImageAttributes& attributes, FacialFeatureLocation& left,
                                 FacialFeatureLocation& right) const {
    const auto id = attributes.find("EyeFinderID");
    const auto positions = attributes.find("EyePositions");
    if (id == attributes.end() || id->second != id_ || positions == attributes.end()) return false;
    const auto numbers = sixNumbers(positions->second);
    if (!numbers) return false;
    const auto& [leftX, leftY, leftConfidence, rightX, rightY, rightConfidence] = *numbers;
    const bool hasLeft = define(left, {leftX, leftY}, leftConfidence);
    const bool hasRight = define(right, {rightX, rightY}, rightConfidence);
    return hasLeft && hasRight;
}

int EyeFinder::find(const FNImageReference& image, FacialFeatureLocation& left, FacialFeatureLocation& right,
                    double minEyeDistance, double maxEyeDistance) const {
    if (useAttributes_ && findInAttributes(image.attributes(), left, right)) return BothEyes;
    std::list<FaceFinder::Location> faces;
    if (!faceFinder_.find(image, faces, minEyeDistance, maxEyeDistance, FaceFinder::everywhere))
        return NoFace;
    bool foundLeft = false, foundRight = false;
    eyesFinder_.find(faces.front(), image, foundLeft, left, foundRight, right);
    return foundLeft ? (foundRight ? BothEyes : LeftEye) : (foundRight ? RightEye : NoEye);
}

} // namespace Kx::Implementation
