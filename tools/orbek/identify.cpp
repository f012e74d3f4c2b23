// orbek identify: whom of a gallery pictures show.

#include "command.h"
#include "configuration_file.h"
#include "enrolment.h"
#include "gallery_search.h"

#include <memory>

namespace Orbek::Tool {
namespace {

enum IdentifyStatus : int { found = 0, nobody = 1, undecided = 2 };

struct IdentifyOptions : CommonOptions {
    std::string gallery;
    std::vector<std::string> images;
    unsigned int top = 10;
    float far = 0.001f;
    unsigned int jobs = 0;
};

/// Lets enrolments look for eyes as identifications do.
void enrolAsIdentified(Configuration& configuration) {
    for (const std::string limit : {"MinEyeDistance", "MaxEyeDistance"})
        configuration.setValue("ORBEK.SetEnroller.EyeDistanceRange." + limit,
                               configuration.getValue("ORBEK.SetIdentifier.EyeDistanceRange." + limit));
    configuration.setValue("ORBEK.SetEnroller.MinNumOfSamples", "1");
}

int identify(const IdentifyOptions& options) {
    const std::vector<std::filesystem::path> files = pictureFiles(options.images);
    const GalleryFile gallery(options.gallery);
    Configuration configuration = openConfiguration(options.configuration);
    enrolAsIdentified(configuration);
    const GallerySearch search(configuration, options.jobs);
    const Score threshold = ScoreMappings(configuration).requestFAR(options.far);
    const Enrollment::Processor processor(configuration);
    Output output(options, files.size());
    std::list<Match> matches;
    for (auto file = files.begin(); file != files.end() && matches.empty(); ++file)
        if (const std::optional<FIR> record = enrolPictures(processor, {*file}, output))
            matches = search.bestMatches(*record, gallery, threshold, options.top);
    nlohmann::ordered_json list = nlohmann::ordered_json::array();
    for (const Match& match : matches)
        list.push_back({{"id", match.name}, {"score", rounded(match.score, 6)}});
    output.result({{"threshold", rounded(threshold, 6)}, {"matches", list}});
    return !matches.empty() ? found : output.complained() ? undecided : nobody;
}

} // namespace

Command identifyCommand(CLI::App& program) {
    const auto options = std::make_shared<IdentifyOptions>();
    CLI::App* const app = addCommand(
        program, "identify",
        "Tell whom of a gallery pictures show.\n"
        "Tells of each picture up to the first that shows somebody, and at last of the matches, best first.\n"
        "Exit status: 0 somebody was found, 1 nobody, 2 something went wrong.",
        *options);
    app->add_option("gallery", options->gallery, "File of the gallery")->required()->type_name("FILE");
    addImages(*app, options->images);
    app->add_option("--top", options->top, "Matches to list at most")
        ->check(CLI::Range(1u, 1000000u))
        ->capture_default_str();
    addShare(*app, "--far", options->far,
             "Share of other people's records that may be taken for the person's");
    addJobs(*app, options->jobs);
    return {app, [options] { return identify(*options); }, undecided};
}

} // namespace Orbek::Tool
