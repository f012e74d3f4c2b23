#include "output.h"

#include <cmath>
#include <iostream>

#include <nlohmann/json.hpp>
#include <unistd.h>

namespace Orbek::Tool {
namespace {

constexpr int barWidth = 40;

} // namespace

Output::Output(std::size_t steps) : steps_(steps), terminal_(isatty(STDERR_FILENO) == 1) {
    drawBar();
}

Output::~Output() {
    removeBar();
}

void Output::result(const nlohmann::ordered_json& json) {
    // File names need not be UTF-8.
    const std::string line = json.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace);
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
    if (!terminal_ || steps_ < 2) return;
    const int filled = static_cast<int>(barWidth * done_ / steps_);
    if (filled == shownWidth_) return;
    shownWidth_ = filled;
    std::cerr << "\r[" << std::string(static_cast<std::size_t>(filled), '#')
              << std::string(static_cast<std::size_t>(barWidth - filled), '.') << "] " << done_ << "/"
              << steps_ << std::flush;
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
