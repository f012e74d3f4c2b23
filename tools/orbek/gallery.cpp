// orbek gallery: populations on disk.

#include "command.h"
#include "configuration_file.h"
#include "enrolment.h"
#include "gallery_file.h"
#include "gallery_import.h"
#include "record_file.h"

#include <algorithm>
#include <memory>

namespace Orbek::Tool {
namespace {

using Json = nlohmann::ordered_json;

struct GalleryOptions : CommonOptions {
    std::string gallery;
    std::vector<std::string> ids;     ///< to remove
    std::string id;                   ///< to add
    std::vector<std::string> sources; ///< of its record
    bool replace = false;
};

int create(const GalleryOptions& options) {
    GalleryFile::create(options.gallery);
    return done;
}

int list(const GalleryOptions& options) {
    Output output(options);
    for (const std::string& id : GalleryFile(options.gallery).ids()) output.result({{"id", id}});
    return done;
}

int remove(const GalleryOptions& options) {
    Output output(options);
    for (const std::string& id : GalleryFile(options.gallery).remove(options.ids))
        output.complaint(options.gallery, "has no \"" + id + "\"");
    return output.complained() ? unreadable : done;
}

bool isRecordName(const std::string& name) {
    return std::filesystem::path(name).extension() == ".fir";
}

/// The record in a file, or the one of pictures.
FIR recordOf(const GalleryOptions& options, const Configuration& configuration, Output& output) {
    if (std::ranges::any_of(options.sources, isRecordName)) {
        if (options.sources.size() != 1)
            throw std::runtime_error("An entry is made from one record, or from pictures");
        return readRecord(FIRBuilder(configuration), options.sources.front());
    }
    const std::optional<FIR> record =
        enrolPictures(Enrollment::Processor(configuration), pictureFiles(options.sources), output);
    if (!record) throw std::runtime_error(options.id + ": not added, too few usable pictures");
    return *record;
}

int add(const GalleryOptions& options) {
    GalleryFile gallery(options.gallery);
    const auto refuse = [&] {
        throw std::runtime_error(options.gallery + ": has \"" + options.id + "\" already");
    };
    if (!options.replace && gallery.has(options.id)) refuse(); // before any work
    const Configuration configuration = openConfiguration(options.configuration);
    Output output(options, options.sources.size());
    const FIR record = recordOf(options, configuration, output);
    const auto present = options.replace ? GalleryFile::Present::Replaced : GalleryFile::Present::Kept;
    if (!gallery.add({entryOf(options.id, record)}, present, FIRBuilder(configuration)).empty()) refuse();
    output.result({{"id", options.id}, {"features", numberOfFeatures(record)}});
    return output.complained() ? unreadable : done;
}

/// Adds one of the commands, with the gallery as its first argument.
template <class Options>
Command command(CLI::App& group, const char* name, const char* description,
                const std::shared_ptr<Options>& options, int (*run)(const Options&)) {
    CLI::App* const app = addCommand(group, name, description, *options);
    app->add_option("gallery", options->gallery, "File of the gallery")->required()->type_name("FILE");
    return {app, [options, run] { return run(*options); }};
}

} // namespace

std::vector<Command> galleryCommands(CLI::App& program) {
    CLI::App* const group = addGroup(program, "gallery", "Keep the records of many people in a file.");
    const auto options = std::make_shared<GalleryOptions>();
    std::vector<Command> commands;
    commands.push_back(command(*group, "create", "Make an empty gallery.", options, create));

    commands.push_back(command(*group, "add", "Add a person, from a record or from pictures.", options, add));
    CLI::App* app = commands.back().app;
    app->add_option("id", options->id, "Id of the person")
        ->required()
        ->type_name("ID")
        ->check([](const auto& id) { return id.empty() ? "an id is not empty" : ""; });
    app->add_option("sources", options->sources,
                    "File of a record (.fir), or image files, or folders of them")
        ->required()
        ->type_name("RECORD|IMAGE");
    app->add_flag("--replace", options->replace, "Take the place of the record that is there");

    commands.push_back(command(*group, "remove", "Remove people.", options, remove));
    commands.back().app->add_option("ids", options->ids, "Ids of the people")->required()->type_name("ID");

    commands.push_back(command(*group, "list", "Tell the ids of all people.", options, list));

    const auto importOptions = std::make_shared<ImportOptions>();
    commands.push_back(
        command(*group, "import",
                "Add the people of a folder tree, one folder of pictures for each.\n"
                "Their ids are the folders' paths in the tree. People who are there already are left "
                "out, so that an import that was interrupted goes on where it was.",
                importOptions, importFolders));
    app = commands.back().app;
    app->add_option("folder", importOptions->folder, "Root of the tree")->required()->type_name("DIR");
    app->add_flag("--replace", importOptions->replace, "Enrol people anew who are there already");
    addJobs(*app, importOptions->jobs);
    return commands;
}

} // namespace Orbek::Tool
