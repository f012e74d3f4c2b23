#pragma once

#include "orbek/sample.h"
#include "output.h"
#include "pictures.h"

#include <filesystem>
#include <functional>
#include <list>
#include <vector>

#include <nlohmann/json.hpp>

/// Pictures of one person, for the processors, and what these tell of them.

namespace Orbek::Tool {

/// One sample for each file. The files are read by PictureLines, each in its turn.
std::list<Sample> samplesOf(const std::vector<std::filesystem::path>& files);

/// Takes the result of a picture.
using TellPicture = std::function<void(const nlohmann::ordered_json&)>;

/// Makes a result of each picture, and holds the pixels of one at a time. Complains of files that cannot be
/// read, which count as pictures without eyes. @tparam Body the feedback of a processor
template <class Body> class PictureLines : public Body {
public:
    /// @param tell prints the result if it is empty
    explicit PictureLines(Output& output, const TellPicture& tell = {})
        : output_(output), tell_(tell ? tell : [&](const auto& line) { output.result(line); }) {}

    void start() override {}
    void processingImage(const Image& image) override {
        finish();
        present_ = image;
        line_["file"] = image->name();
        try {
            file().read();
        } catch (const std::exception& e) {
            output_.complaint(image->name(), e.what());
            file().blank();
            line_ = {};
        }
    }
    void eyesFound(const Eyes::Location& eyes) override { line_["eyes"] = eyesJson(eyes); }
    void eyesNotFound() override {
        if (!line_.empty()) line_["eyes"] = nullptr;
    }
    void end() override { finish(); }

protected:
    nlohmann::ordered_json& line() { return line_; }

private:
    const PictureFile& file() const { return dynamic_cast<const PictureFile&>(*present_); }
    void finish() {
        if (!present_) return;
        if (!line_.empty()) tell_(line_);
        line_ = {};
        file().forget();
        present_ = Image();
        output_.step();
    }

    Output& output_;
    TellPicture tell_;
    Image present_;
    nlohmann::ordered_json line_; ///< of the present picture; empty if it could not be read
};

} // namespace Orbek::Tool
