// orbek record: facial records of ISO/IEC 19794-5:2005, in which identity documents keep pictures of faces.

#include "command.h"
#include "configuration_file.h"
#include "orbek/image_io.h"
#include "orbek/token_face.h"
#include "orbek/token_face_creator.h"
#include "output.h"
#include "pictures.h"
#include "prominent_eyes.h"
#include "whole_file.h"

#include <fstream>
#include <memory>
#include <sstream>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

using Json = nlohmann::ordered_json;
using ImageWithEyes = std::pair<Image, Eyes::Location>;
namespace fs = std::filesystem;
namespace TokenFace = ISO_19794_5::TokenFace;

struct WriteOptions : CommonOptions {
    std::vector<std::string> images;
    std::string record;
    bool minimal = false, uncut = false;
};

struct ReadOptions : CommonOptions {
    std::string record;
    std::string folder;
};

int write(const WriteOptions& options) {
    const std::vector<fs::path> files = pictureFiles(options.images);
    refuseInputs({options.record}, files);
    const Configuration configuration = openConfiguration(options.configuration);
    const ProminentEyes eyes(configuration);
    const TokenFace::Creator creator(configuration);
    Output output(options, files.size());
    std::list<ImageWithEyes> faces;
    for (const fs::path& file : files) {
        try {
            const Image image(new PictureFile(file));
            const auto found = eyes.find(image);
            Json json{{"file", file.string()}, {"eyes", found ? eyesJson(*found) : Json()}};
            if (options.uncut)
                faces.emplace_back(image, Eyes::Location());
            else if (!found)
                throw std::runtime_error("there are no eyes of a face");
            else
                faces.push_back(options.minimal ? creator.extractMinimal({image, *found})
                                                : creator.extract({image, *found}));
            json["width"] = faces.back().first->width();
            json["height"] = faces.back().first->height();
            output.result(json);
        } catch (const std::exception& e) {
            output.complaint(file.string(), e.what());
        }
        output.step();
    }
    if (faces.empty()) throw std::runtime_error(options.record + ": not made, no usable picture");
    std::ostringstream record;
    TokenFace::write(record, faces);
    writeWhole(options.record, record.str());
    output.result({{"file", options.record}, {"images", faces.size()}, {"bytes", record.str().size()}});
    return output.complained() ? unreadable : done;
}

std::list<ImageWithEyes> readRecordOfFaces(const std::string& fileName) {
    std::ifstream file(fileName, std::ios::binary);
    if (!file || fs::is_directory(fileName)) throw UnreadableInput(fileName + ": cannot be opened");
    try {
        return TokenFace::read(file);
    } catch (const std::exception& e) {
        throw UnreadableInput(fileName + ": " + e.what());
    }
}

int read(const ReadOptions& options) {
    const std::list<ImageWithEyes> faces = readRecordOfFaces(options.record);
    if (!options.folder.empty()) {
        std::error_code failure;
        fs::create_directories(options.folder, failure);
        if (failure) throw std::runtime_error("Cannot make the folder " + options.folder);
    }
    Output output(options);
    unsigned int number = 0;
    for (const auto& [image, eyes] : faces) {
        Json json{{"image", ++number},
                  {"width", image->width()},
                  {"height", image->height()},
                  {"color", image->isColor()},
                  {"eyes", eyesJson(eyes)}};
        if (!options.folder.empty()) {
            // Without a further loss.
            constexpr int level = 6;
            const std::string file = (fs::path(options.folder) / (std::to_string(number) + ".png")).string();
            refuseInputs({file}, {options.record});
            std::ostringstream png;
            Png::save(image, png, level);
            writeWhole(file, png.str());
            json["file"] = file;
        }
        output.result(json);
    }
    output.result({{"file", options.record}, {"images", faces.size()}});
    return done;
}

Command writeCommand(CLI::App& group) {
    const auto options = std::make_shared<WriteOptions>();
    CLI::App* const app = addCommand(
        group, "write",
        "Write the faces of pictures to one record.\n"
        "Cuts each picture to a token image by the eyes of its most prominent face. Tells of each picture "
        "where these are and how large the token image is, and at last of the record.",
        *options);
    addImages(*app, options->images);
    app->add_option("-o,--output", options->record, "File for the record")->required()->type_name("FILE");
    CLI::Option* const minimal = app->add_flag("--minimal", options->minimal,
                                               "Scale token images to the least size, 240 by 320 pixels");
    app->add_flag("--uncut", options->uncut, "Take the pictures as they are, because they are token images")
        ->excludes(minimal);
    return {app, [options] { return write(*options); }};
}

Command readCommand(CLI::App& group) {
    const auto options = std::make_shared<ReadOptions>();
    CLI::App* const app =
        addCommand(group, "read",
                   "Read a record.\n"
                   "Tells of each image its size and where the eyes are, and writes it to a file "
                   "if a folder is given.",
                   *options);
    app->add_option("record", options->record, "File of the record")->required()->type_name("FILE");
    app->add_option("-o,--output", options->folder, "Folder for the images, as 1.png, 2.png and so on")
        ->type_name("DIR");
    return {app, [options] { return read(*options); }};
}

} // namespace

std::vector<Command> recordCommands(CLI::App& program) {
    CLI::App* const group = addGroup(
        program, "record", "Facial records of ISO/IEC 19794-5:2005, as identity documents keep them.");
    return {writeCommand(*group), readCommand(*group)};
}

} // namespace Orbek::Tool
