#include "fn/image_attributes.h"

#include <array>
#include <charconv>

namespace Fn {

namespace {

constexpr const char* sourceNameKey = "SRCNAME";
constexpr const char* eyePositionsKey = "EYEPOS";
constexpr const char* captureTimeKey = "CaptureTime";
constexpr const char* exposureTimeKey = "ExposureTime";

Optional<std::string> find(const FNImageAttributes& attributes, const char* key) {
    const auto entry = attributes.find(key);
    return entry == attributes.end() ? Optional<std::string>() : Optional<std::string>(entry->second);
}

/// The shortest decimal text that reads back as the same number, whatever the locale.
std::string decimal(float number) {
    std::array<char, 64> text; // the longest finite float has 39 digits before or 45 behind the point
    const auto end = std::to_chars(text.data(), text.data() + text.size(), number, std::chars_format::fixed);
    return {text.data(), end.ptr};
}

EyePositions parseEyePositions(const std::string& text) {
    std::array<float, 4> numbers;
    const char* next = text.data();
    const char* const end = next + text.size();
    for (float& number : numbers) {
        while (next != end && *next == ' ') ++next;
        const auto [behind, error] = std::from_chars(next, end, number);
        if (error != std::errc()) FN_THROW(FNEBadFormat, "EYEPOS: '" + text + "' is not four numbers");
        next = behind;
    }
    if (next != end) FN_THROW(FNEBadFormat, "EYEPOS: '" + text + "' is not four numbers");
    return {{numbers[0], numbers[1]}, {numbers[2], numbers[3]}};
}

} // namespace

void addImageSrcNameAttribute(FNImageAttributes& attributes, const std::string& name) {
    attributes[sourceNameKey] = name;
}

Optional<std::string> getImageSrcNameAttribute(const FNImageAttributes& attributes) {
    return find(attributes, sourceNameKey);
}

void addEyePosAttributes(FNImageAttributes& attributes, FNPos left, FNPos right) {
    attributes[eyePositionsKey] =
        decimal(left.x) + ' ' + decimal(left.y) + ' ' + decimal(right.x) + ' ' + decimal(right.y);
}

Optional<EyePositions> getEyePosAttributes(const FNImageAttributes& attributes) {
    const Optional<std::string> text = find(attributes, eyePositionsKey);
    return text.isSet() ? Optional<EyePositions>(parseEyePositions(*text)) : Optional<EyePositions>();
}

void addImageCaptureTime(FNImageAttributes& attributes, const TimeStamp& time) {
    attributes[captureTimeKey] = time.asString();
}

Optional<TimeStamp> getImageCaptureTime(const FNImageAttributes& attributes) {
    const Optional<std::string> text = find(attributes, captureTimeKey);
    return text.isSet() ? Optional<TimeStamp>(TimeStamp::fromString(*text)) : Optional<TimeStamp>();
}

void addImageExposureTime(FNImageAttributes& attributes, unsigned int microseconds) {
    attributes[exposureTimeKey] = std::to_string(microseconds);
}

Optional<unsigned int> getImageExposureTime(const FNImageAttributes& attributes) {
    const Optional<std::string> text = find(attributes, exposureTimeKey);
    if (!text.isSet()) return {};
    unsigned int microseconds = 0;
    const char* const end = text->data() + text->size();
    const auto [behind, error] = std::from_chars(text->data(), end, microseconds);
    if (error != std::errc() || behind != end)
        FN_THROW(FNEBadFormat, "ExposureTime: '" + *text + "' is not a number of microseconds");
    return microseconds;
}

} // namespace Fn
