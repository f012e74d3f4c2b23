// orbek find: faces, eyes, mouth and bridge of the nose in images.

#include "command.h"
#include "configuration_file.h"
#include "drawing.h"
#include "feature_finders.h"
#include "orbek/implementation/adapt.h"
#include "output.h"
#include "parallel.h"
#include "pictures.h"

#include <memory>
#include <mutex>
#include <optional>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

using Json = nlohmann::ordered_json;

struct FindOptions : CommonOptions {
    std::vector<std::string> images;
    std::string drawFolder;
    float minEye = 0.05f, maxEye = 0.4f;
    std::vector<int> box;
    unsigned int jobs = 0;
};

/// What was found of a face; what is not there was not found.
struct FoundFace {
    Face::Location face;
    std::optional<Eyes::Location> eyes;
    std::optional<FacialFeatureLocation> mouth, bridge;
};

/// The finders that all threads share.
class Finders {
public:
    explicit Finders(const Configuration& configuration)
        : faces_(configuration), eyes_(configuration), features_(configuration) {}

    std::vector<FoundFace> find(const Image& image, const FindOptions& options) const;

private:
    Face::Finder faces_;
    Eyes::Finder eyes_;
    FeatureFinders features_;
};

std::vector<FoundFace> Finders::find(const Image& image, const FindOptions& options) const {
    const std::vector<int> everywhere{0, 0, static_cast<int>(image->width()),
                                      static_cast<int>(image->height())};
    const std::vector<int>& box = options.box.empty() ? everywhere : options.box;
    const FNImageReference reference = adapt(image);
    std::vector<FoundFace> found;
    for (const Face::Location& face :
         faces_.find(image, options.minEye, options.maxEye, box[0], box[1], box[2], box[3])) {
        FoundFace& result = found.emplace_back(FoundFace{face, {}, {}, {}});
        const std::list<Eyes::Location> eyes = eyes_.find(image, face);
        if (eyes.empty()) continue;
        result.eyes = eyes.front();
        const FacialFeatureLocation left = leftEye(*result.eyes), right = rightEye(*result.eyes);
        FacialFeatureLocation feature;
        if (features_.mouth.find(left, right, reference, feature)) result.mouth = feature;
        if (features_.bridge.find(left, right, reference, feature)) result.bridge = feature;
    }
    return found;
}

Json faceJson(const FoundFace& found) {
    Json json;
    addFace(json, found.face);
    if (found.eyes) json["eyes"] = eyesJson(*found.eyes);
    if (const auto& mouth = found.mouth)
        json["mouth"] = placeJson(mouth->pos.x, mouth->pos.y, mouth->confidence);
    if (const auto& bridge = found.bridge)
        json["bridge"] = placeJson(bridge->pos.x, bridge->pos.y, bridge->confidence);
    return json;
}

FNImageReference drawn(const FNImageReference& image, const std::vector<FoundFace>& faces) {
    Drawing drawing(image);
    unsigned int number = 0;
    for (const FoundFace& found : faces) {
        drawing.face(found.face, ++number);
        if (found.eyes) drawing.eyes(*found.eyes);
        for (const auto& feature : {found.mouth, found.bridge})
            if (feature) drawing.feature(feature->pos, found.face.width);
    }
    return drawing.picture();
}

/// Works through the pictures with several threads, and prints the results in the order of the files.
class FindRun {
public:
    explicit FindRun(const FindOptions& options)
        : options_(options), files_(pictureFiles(options.images)),
          finders_(openConfiguration(options.configuration)), output_(options, files_.size()) {
        if (!options.drawFolder.empty()) drawings_.emplace(options.drawFolder, files_);
        lines_.resize(files_.size());
    }

    int run() {
        inParallel(options_.jobs, files_.size(),
                   [this](std::size_t, std::size_t index) { finish(index, process(index)); });
        return output_.complained() ? unreadable : done;
    }

private:
    /// The result of one picture: its line, or why there is none.
    struct Line {
        Json json;
        std::string complaint;
    };

    Line process(std::size_t index) const {
        FNImageReference reference;
        std::vector<FoundFace> faces;
        try {
            reference = readUpright(files_[index]);
            faces = finders_.find(adapt(reference, files_[index].string()), options_);
        } catch (const std::exception& e) {
            return {{}, e.what()};
        }
        Json json;
        json["file"] = files_[index].string();
        json["width"] = reference.w();
        json["height"] = reference.h();
        json["faces"] = Json::array();
        for (const FoundFace& face : faces) json["faces"].push_back(faceJson(face));
        if (drawings_) drawings_->write(index, drawn(reference, faces));
        return {json, ""};
    }

    /// Prints all lines that can be printed now.
    void finish(std::size_t index, const Line& line) {
        const std::lock_guard lock(mutex_);
        lines_[index] = line;
        for (; printed_ < lines_.size() && lines_[printed_]; ++printed_) {
            if (lines_[printed_]->complaint.empty())
                output_.result(lines_[printed_]->json);
            else
                output_.complaint(files_[printed_].string(), lines_[printed_]->complaint);
            lines_[printed_] = Line{};
        }
        output_.step();
    }

    const FindOptions& options_;
    const std::vector<std::filesystem::path> files_;
    const Finders finders_;
    std::optional<PictureFolder> drawings_;
    Output output_;
    std::mutex mutex_; ///< guards the rest
    std::vector<std::optional<Line>> lines_;
    std::size_t printed_ = 0;
};

} // namespace

Command findCommand(CLI::App& program) {
    const auto options = std::make_shared<FindOptions>();
    CLI::App* const app =
        addCommand(program, "find",
                   "Find faces, eyes, mouth and bridge of the nose in images.\n"
                   "Tells of each image, in pixels of the upright image; left and right are "
                   "those of the observer.",
                   *options);
    addImages(*app, options->images);
    app->add_option("--draw", options->drawFolder, "Folder for the pictures with boxes, eyes and ids drawn")
        ->type_name("DIR");
    addShare(*app, "--min-eye", options->minEye, "Smallest eye distance, in widths of the image")
        ->capture_default_str();
    addShare(*app, "--max-eye", options->maxEye, "Largest eye distance, in widths of the image")
        ->capture_default_str();
    app->add_option("--box", options->box, "Where to look: two corners, in pixels of the upright image")
        ->expected(4)
        ->type_name("X0 Y0 X1 Y1");
    addJobs(*app, options->jobs);
    return {app, [options] { return FindRun(*options).run(); }};
}

} // namespace Orbek::Tool
