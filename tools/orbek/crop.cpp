// orbek token, orbek frontal: portraits cut for documents.

#include "command.h"
#include "configuration_file.h"
#include "orbek/full_frontal_creator.h"
#include "orbek/image_io.h"
#include "orbek/token_face_creator.h"
#include "output.h"
#include "pictures.h"
#include "prominent_eyes.h"
#include "whole_file.h"

#include <algorithm>
#include <cctype>
#include <functional>
#include <memory>
#include <sstream>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

namespace fs = std::filesystem;
using ImageWithEyes = std::pair<Image, Eyes::Location>;
using Cut = std::function<ImageWithEyes(const ImageWithEyes&)>;

struct CropOptions : CommonOptions {
    std::vector<std::string> images;
    std::string output;
};

bool endsAsOneOf(const fs::path& path, std::initializer_list<const char*> endings) {
    std::string ending = path.extension().string();
    std::ranges::transform(ending, ending.begin(), [](unsigned char c) { return std::tolower(c); });
    return std::ranges::find(endings, ending) != endings.end();
}

/// A file for each source: the output itself if it is named like a picture, otherwise files in that folder.
std::vector<fs::path> outputFiles(const std::string& output, const std::vector<fs::path>& sources) {
    if (!endsAsOneOf(output, {".jpg", ".jpeg", ".png"})) return PictureFolder(output, sources).files();
    if (sources.size() != 1)
        throw std::runtime_error(output + ": one file for " + std::to_string(sources.size()) +
                                 " pictures; give a folder");
    refuseInputs({output}, sources);
    return {output};
}

void write(const Image& picture, const fs::path& file) {
    constexpr int bestQuality = 100, usualLevel = -1;
    std::ostringstream bytes;
    if (endsAsOneOf(file, {".png"}))
        Png::save(picture, bytes, usualLevel);
    else
        Jpeg::save(picture, bytes, bestQuality);
    writeWhole(file.string(), bytes.str());
}

int crop(const CropOptions& options, const Configuration& configuration, const Cut& cut) {
    const std::vector<fs::path> files = pictureFiles(options.images),
                                written = outputFiles(options.output, files);
    const ProminentEyes finder(configuration);
    Output output(options, files.size());
    for (std::size_t i = 0; i < files.size(); ++i, output.step()) {
        const std::string file = files[i].string();
        ImageWithEyes picture;
        nlohmann::ordered_json json{{"file", file}};
        try {
            const Image image(new PictureFile(files[i]));
            const auto eyes = finder.find(image);
            if (!eyes) throw std::runtime_error("there are no eyes of a face");
            json["eyes"] = eyesJson(*eyes);
            picture = cut({image, *eyes});
        } catch (const std::exception& e) {
            output.complaint(file, e.what());
            continue;
        }
        write(picture.first, written[i]);
        json["picture"] = {{"file", written[i].string()},
                           {"width", picture.first->width()},
                           {"height", picture.first->height()},
                           {"eyes", eyesJson(picture.second)}};
        output.result(json, file + ": " + written[i].string() + ", " +
                                std::to_string(picture.first->width()) + " x " +
                                std::to_string(picture.first->height()));
    }
    return output.complained() ? unreadable : done;
}

/// Adds a command with the options that both have.
CLI::App* addCropCommand(CLI::App& program, const std::string& name, const std::string& what,
                         CropOptions& options) {
    CLI::App* const app = addCommand(program, name,
                                     "Cut the face that is seen best in each picture to " + what +
                                         " of ISO/IEC 19794-5.\n"
                                         "Tells of each picture where the eyes are, and of what was cut.",
                                     options);
    addImages(*app, options.images);
    app->add_option("-o,--output", options.output,
                    "File (.jpg, .png) for one picture, or folder for JPEG files of several")
        ->required()
        ->type_name("PATH");
    return app;
}

struct TokenOptions : CropOptions {
    bool minimal = false;
};

int token(const TokenOptions& options) {
    const Configuration configuration = openConfiguration(options.configuration);
    const ISO_19794_5::TokenFace::Creator creator(configuration);
    return crop(options, configuration, [&](const ImageWithEyes& portrait) {
        return options.minimal ? creator.extractMinimal(portrait) : creator.extract(portrait);
    });
}

struct FrontalOptions : CropOptions {
    /// Values of settings; empty for those of the configuration.
    std::string lengthRatio, position, width;
};

int frontal(const FrontalOptions& options) {
    Configuration configuration = openConfiguration(options.configuration);
    const auto set = [&](const char* key, const std::string& value) {
        configuration.setValue(std::string("ORBEK.CropFullFrontal.") + key, value);
    };
    if (!options.lengthRatio.empty()) set("HeadLengthToImageLengthRatio", options.lengthRatio);
    if (!options.position.empty()) set("HeadToImagePositionRatio", options.position);
    if (!options.width.empty()) {
        set("Scaling", "Enabled");
        set("Scaling.Enabled.TargetWidth", options.width);
    }
    const ISO_19794_5::FullFrontal::Creator creator(configuration);
    return crop(options, configuration,
                [&](const ImageWithEyes& portrait) { return creator.extract(portrait); });
}

Command tokenCommand(CLI::App& program) {
    const auto options = std::make_shared<TokenOptions>();
    CLI::App* const app = addCropCommand(program, "token", "the token image", *options);
    app->add_flag("--minimal", options->minimal,
                  "Scale to 240 x 320 pixels, instead of keeping the scale of the picture");
    return {app, [options] { return token(*options); }};
}

Command frontalCommand(CLI::App& program) {
    const auto options = std::make_shared<FrontalOptions>();
    CLI::App* const app = addCropCommand(program, "frontal", "a full frontal image", *options);
    const auto add = [&](const char* name, std::string& value, const char* description, const auto& check) {
        app->add_option(name, value, description)->check(check)->type_name("NUMBER");
    };
    add("--length-ratio", options->lengthRatio, "Length of the head, in heights of the result, up to 0.8",
        CLI::Range(0.01, 10.0));
    add("--position", options->position,
        "Where the eyes are, in heights of the result above its lower edge, up to 0.7", CLI::Range(0.0, 1.0));
    add("--width", options->width, "Width of the result in pixels, instead of the scale of the picture",
        CLI::Range(1, 65535));
    return {app, [options] { return frontal(*options); }};
}

} // namespace

std::vector<Command> cropCommands(CLI::App& program) {
    return {tokenCommand(program), frontalCommand(program)};
}

} // namespace Orbek::Tool
