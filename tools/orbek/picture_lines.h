#pragma once

#include "orbek/sample.h"
#include "output.h"

#include <filesystem>
#include <list>
#include <vector>

#include <nlohmann/json.hpp>

/// Pictures of one person, for the processors, and what these tell of them.

namespace Orbek::Tool {

/// One sample for each file that can be read; complains of the others.
std::list<Sample> readSamples(const std::vector<std::filesystem::path>& files, Output& output);

/// Prints a line for each picture. @tparam Body the feedback of a processor
template <class Body> class PictureLines : public Body {
public:
    explicit PictureLines(Output& output) : output_(output) {}

    void start() override {}
    void processingImage(const Image& image) override {
        finish();
        line_["file"] = image->name();
    }
    void eyesFound(const Eyes::Location& eyes) override { line_["eyes"] = eyesJson(eyes); }
    void eyesNotFound() override { line_["eyes"] = nullptr; }
    void end() override { finish(); }

protected:
    nlohmann::ordered_json& line() { return line_; }

private:
    void finish() {
        if (!line_.empty()) output_.result(line_);
        line_ = {};
    }

    Output& output_;
    nlohmann::ordered_json line_; ///< of the present picture
};

} // namespace Orbek::Tool
