// orbek track: faces through the frames of a video, given as images.

#include "command.h"
#include "configuration_file.h"
#include "drawing.h"
#include "orbek/face_tracker.h"
#include "orbek/implementation/adapt.h"
#include "output.h"
#include "pictures.h"

#include <cmath>
#include <map>
#include <memory>
#include <optional>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

using Json = nlohmann::ordered_json;

const std::string trackerKey = "ORBEK.FaceTracker.";

struct TrackOptions : CommonOptions {
    std::vector<std::string> images;
    std::string drawFolder;
    std::optional<float> framesPerSecond, minEye, maxEye;
    bool sparse = false;
};

Configuration configurationOf(const TrackOptions& options) {
    Configuration configuration = openConfiguration(options.configuration);
    const auto set = [&](const std::string& key, const std::optional<float>& value) {
        if (value) configuration.setValue(trackerKey + key, std::to_string(*value));
    };
    set("FrameRate", options.framesPerSecond);
    set("FaceFinderRange.MinEyeDistance", options.minEye);
    set("FaceFinderRange.MaxEyeDistance", options.maxEye);
    if (options.sparse) configuration.setValue(trackerKey + "ExhaustiveTracking", "false");
    return configuration;
}

/// Short numbers for the ids of the tracker, in the order in which they appear.
class TrackNumbers {
public:
    unsigned int operator()(const std::string& id) {
        return numbers_.emplace(id, static_cast<unsigned int>(numbers_.size()) + 1).first->second;
    }

private:
    std::map<std::string, unsigned int> numbers_;
};

int track(const TrackOptions& options) {
    const std::vector<std::filesystem::path> files = pictureFiles(options.images);
    const Configuration configuration = configurationOf(options);
    Face::Tracker tracker(configuration);
    const double frameRate = std::stod(configuration.getValue(trackerKey + "FrameRate"));
    std::optional<PictureFolder> drawings;
    if (!options.drawFolder.empty()) drawings.emplace(options.drawFolder, files);

    TrackNumbers numbers;
    Output output(options, files.size());
    for (std::size_t frame = 0; frame < files.size(); ++frame, output.step()) {
        const auto time =
            static_cast<unsigned int>(std::llround(static_cast<double>(frame) * 1000 / frameRate));
        FNImageReference image;
        std::list<Face::Tracker::TrackedFace> faces;
        try {
            image = readUpright(files[frame]);
            faces = tracker.processImage(adapt(image, files[frame].string()), time);
        } catch (const std::exception& e) {
            output.complaint(files[frame].string(), e.what());
            continue;
        }
        Json json;
        json["file"] = files[frame].string();
        json["frame"] = frame;
        json["time"] = time;
        json["width"] = image.w();
        json["height"] = image.h();
        json["faces"] = Json::array();
        std::optional<Drawing> drawing;
        if (drawings) drawing.emplace(image);
        for (const auto& [id, face] : faces) {
            const unsigned int number = numbers(id);
            Json& entry = json["faces"].emplace_back();
            entry["id"] = id;
            entry["track"] = number;
            addFace(entry, face);
            if (drawing) drawing->face(face, number);
        }
        if (drawing) drawings->write(frame, drawing->picture());
        output.result(json);
    }
    return output.complained() ? unreadable : done;
}

} // namespace

Command trackCommand(CLI::App& program) {
    const auto options = std::make_shared<TrackOptions>();
    CLI::App* const app = addCommand(program, "track",
                                     "Follow faces through the frames of a video.\n"
                                     "Tells of each frame; a face has the same id (and number of its track) "
                                     "as long as it is followed.",
                                     *options);
    addImages(*app, options->images, "The frames in order: image files, or folders of them");
    app->add_option("--draw", options->drawFolder, "Folder for the frames with boxes and track numbers drawn")
        ->type_name("DIR");
    app->add_option("--fps", options->framesPerSecond, "Frames per second; the configuration's otherwise");
    addShare(*app, "--min-eye", options->minEye,
             "Smallest eye distance, in widths of the image; the configuration's otherwise");
    addShare(*app, "--max-eye", options->maxEye,
             "Largest eye distance, in widths of the image; the configuration's otherwise");
    app->add_flag("--sparse", options->sparse,
                  "Look at a part of each frame only, and again around earlier finds");
    return {app, [options] { return track(*options); }};
}

} // namespace Orbek::Tool
