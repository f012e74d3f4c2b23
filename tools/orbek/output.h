#pragma once

#include "options.h"
#include "orbek/eyes_finder.h"
#include "orbek/face_finder.h"

#include <cstddef>
#include <mutex>
#include <string>

#include <nlohmann/json_fwd.hpp>

namespace Orbek::Tool {

/// The results of a command on standard output, its complaints on standard error, and there, if it is a
/// terminal, a progress bar. May be used from several threads.
class Output {
public:
    /// @param steps until everything is done
    explicit Output(const CommonOptions& options, std::size_t steps = 1);
    /// Removes the bar.
    ~Output();
    Output(const Output&) = delete;
    Output& operator=(const Output&) = delete;

    /// Prints an object, as JSON or else as readableText().
    void result(const nlohmann::ordered_json& json);
    /// Prints an object, as JSON or else as a text without the last line end.
    void result(const nlohmann::ordered_json& json, const std::string& text);
    void complaint(const std::string& text);
    void complaint(const std::string& file, const std::string& reason) { complaint(file + ": " + reason); }
    /// One more step is done.
    void step();
    /// Whether there was a complaint.
    bool complained() const { return complained_; }

private:
    void removeBar();
    void drawBar();

    std::mutex mutex_;
    std::size_t steps_, done_ = 0;
    bool json_, bar_;
    int shownWidth_ = -1; ///< of the filled part, -1 if there is no bar
    bool complained_ = false;
};

/// The text of a result for people: "bob1.jpg: eyes left (87.2, 120.5, 0.99) right (139, 121, 0.98), score
/// 0.9". The file or id comes first, null becomes "no ...", false "not ...", and objects of a list get lines
/// of their own.
std::string readableText(const nlohmann::ordered_json& json);

/// A number as results show it, with so many decimals at most.
double rounded(double value, int decimals);

/// A position and its confidence.
nlohmann::ordered_json placeJson(float x, float y, float confidence);
/// The places of both.
nlohmann::ordered_json eyesJson(const Eyes::Location& eyes);

/// Adds x, y, eye_distance, confidence and rotation.
void addFace(nlohmann::ordered_json& json, const Face::Location& face);

} // namespace Orbek::Tool
