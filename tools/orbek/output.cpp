#include "output.h"

#include <algorithm>
#include <cmath>
#include <iostream>

#include <nlohmann/json.hpp>
#include <unistd.h>

namespace Orbek::Tool {
namespace {

using Json = nlohmann::ordered_json;

constexpr int barWidth = 40;

/// The text of a value of any kind. File names need not be UTF-8.
std::string plain(const Json& value) {
    if (value.is_string()) return value.get<std::string>();
    return value.dump(-1, ' ', false, Json::error_handler_t::replace);
}

/// What tells whose result it is.
bool isHeading(const std::string& key) {
    return key == "file" || key == "id";
}

std::string valueText(const Json& value) {
    std::string text;
    if (value.is_array()) {
        for (const Json& element : value) text += (text.empty() ? "" : ", ") + plain(element);
        return "(" + text + ")";
    }
    if (!value.is_object()) return plain(value);
    for (const auto& [key, element] : value.items())
        text += (text.empty() ? "" : " ") + key + " " + valueText(element);
    return text;
}

std::string fieldText(std::string key, const Json& value) {
    std::ranges::replace(key, '_', ' ');
    const bool isThing = key == "match"; // all others tell of what the result is
    if (value.is_null() || (value == false && isThing)) return "no " + key;
    if (value == false) return "not " + key;
    if (value == true) return key;
    return key + " " + valueText(value);
}

/// "1 match", "2 matches". @param things plural, as lists are named
std::string countText(std::size_t count, std::string things) {
    if (count == 1) things.resize(things.size() - (things.ends_with("ches") ? 2 : 1));
    return std::to_string(count) + " " + things;
}

} // namespace

Output::Output(const CommonOptions& options, std::size_t steps)
    : steps_(steps), json_(options.json), bar_(!options.quiet && steps > 1 && isatty(STDERR_FILENO) == 1) {
    drawBar();
}

Output::~Output() {
    removeBar();
}

void Output::result(const nlohmann::ordered_json& json) {
    result(json, json_ ? "" : readableText(json));
}

void Output::result(const nlohmann::ordered_json& json, const std::string& text) {
    const std::string line = json_ ? plain(json) : text;
    const std::lock_guard lock(mutex_);
    removeBar();
    std::cout << line << "\n" << std::flush;
    drawBar();
}

void Output::complaint(const std::string& text) {
    const std::lock_guard lock(mutex_);
    removeBar();
    std::cerr << "orbek: " << text << std::endl;
    complained_ = true;
    drawBar();
}

void Output::step() {
    const std::lock_guard lock(mutex_);
    ++done_;
    drawBar();
}

void Output::removeBar() {
    if (shownWidth_ < 0) return;
    std::cerr << "\r\033[K" << std::flush;
    shownWidth_ = -1;
}

void Output::drawBar() {
    if (!bar_) return;
    const int filled = static_cast<int>(barWidth * done_ / steps_);
    if (filled == shownWidth_) return;
    shownWidth_ = filled;
    std::cerr << "\r[" << std::string(static_cast<std::size_t>(filled), '#')
              << std::string(static_cast<std::size_t>(barWidth - filled), '.') << "] " << done_ << "/"
              << steps_ << std::flush;
}

std::string readableText(const nlohmann::ordered_json& json) {
    std::string heading, fields, lists;
    for (const auto& [key, value] : json.items()) {
        if (isHeading(key) && heading.empty()) {
            heading = plain(value);
            continue;
        }
        fields += fields.empty() ? "" : ", ";
        const bool list = value.is_array() && (value.empty() || value.front().is_object());
        fields += list ? countText(value.size(), key) : fieldText(key, value);
        if (list)
            for (const Json& element : value) lists += "\n  " + readableText(element);
    }
    return heading + (heading.empty() || fields.empty() ? "" : ": ") + fields + lists;
}

double rounded(double value, int decimals) {
    const double unit = std::pow(10.0, decimals);
    return std::round(value * unit) / unit;
}

nlohmann::ordered_json placeJson(float x, float y, float confidence) {
    return {rounded(x, 2), rounded(y, 2), rounded(confidence, 4)};
}

nlohmann::ordered_json eyesJson(const Eyes::Location& eyes) {
    return {{"left", placeJson(eyes.first.x, eyes.first.y, eyes.firstConfidence)},
            {"right", placeJson(eyes.second.x, eyes.second.y, eyes.secondConfidence)}};
}

void addFace(nlohmann::ordered_json& json, const Face::Location& face) {
    json["x"] = rounded(face.pos.x, 2);
    json["y"] = rounded(face.pos.y, 2);
    json["eye_distance"] = rounded(face.width, 2);
    json["confidence"] = rounded(face.confidence, 4);
    json["rotation"] = rounded(face.rotationAngle, 4);
}

} // namespace Orbek::Tool
