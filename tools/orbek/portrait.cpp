// orbek portrait: what portraits are like, and whether they are fit for identity documents.

#include "command.h"
#include "configuration_file.h"
#include "orbek/token_face_creator.h"
#include "output.h"
#include "pictures.h"
#include "portrait_page.h"
#include "prominent_eyes.h"
#include "whole_file.h"

#include <array>
#include <memory>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

using Json = nlohmann::ordered_json;

enum PortraitStatus : int { compliant = 0, notCompliant = 1, undecided = 2 };

struct PortraitOptions : CommonOptions {
    std::vector<std::string> images;
    std::string report;
};

/// What all portraits are assessed with.
class Assessor {
public:
    explicit Assessor(const Configuration& configuration)
        : eyes_(configuration), analyzer_(configuration), features_(configuration), test_(configuration),
          tokens_(configuration) {}

    std::optional<Eyes::Location> findEyes(const Image& image) const { return eyes_.find(image); }

    /// @param cutToken whether the token image is wanted
    AssessedPortrait assess(const Image& image, const Eyes::Location& eyes, bool cutToken) const {
        const auto portrait = analyzer_.analyze({image, eyes});
        const auto compliance = test_.assess(portrait);
        const auto limits = test_.boundaries();
        return {image,
                eyes,
                portrait,
                features_.assess(portrait),
                compliance,
                limits,
                portraitChecks(portrait, compliance, limits),
                cutToken ? tokenOf({image, eyes}) : Image()};
    }

private:
    /// Null if the settings do not allow it, for instance because of what would have to be filled.
    Image tokenOf(const std::pair<Image, Eyes::Location>& found) const {
        try {
            return tokens_.extract(found).first;
        } catch (const std::exception&) {
            return Image();
        }
    }

    ProminentEyes eyes_;
    Portrait::Analyzer analyzer_;
    Portrait::Feature::Test features_;
    ISO_19794_5::FullFrontal::Test test_;
    ISO_19794_5::TokenFace::Creator tokens_;
};

Json featuresJson(const Portrait::Feature::Set& features) {
    using namespace Portrait::Feature;
    constexpr std::array ethnicities{"white", "black", "asian"};
    return {{"glasses", features.wearsGlasses()},
            {"gender", features.gender() == Gender::Male ? "male" : "female"},
            {"ethnicity", ethnicities.at(static_cast<std::size_t>(features.ethnicity()))},
            {"age", rounded(features.age(), 1)}};
}

Json describe(const std::string& file, const AssessedPortrait& a) {
    const Box head = earToEarChinCrownSurroundingBox(a.portrait);
    return {{"file", file},
            {"width", a.portrait.width()},
            {"height", a.portrait.height()},
            {"faces", a.portrait.numberOfFaces()},
            {"eyes", eyesJson(a.eyes)},
            {"head", {head.x0, head.y0, head.x1, head.y1}},
            {"compliant", a.compliance.isCompliant()},
            {"best_practice", a.compliance.isBestPractice()},
            {"features", featuresJson(a.features)},
            {"tests", checksJson(a.checks)}};
}

std::string textOf(const std::string& file, const AssessedPortrait& a) {
    return file + (a.compliance.isCompliant() ? ": compliant, " : ": not compliant, ") +
           (a.compliance.isBestPractice() ? "best practice" : "not best practice") + "; " +
           featuresText(a.features) + checksText(a.checks);
}

int portrait(const PortraitOptions& options) {
    const std::vector<std::filesystem::path> files = pictureFiles(options.images);
    if (!options.report.empty()) refuseInputs({options.report}, files);
    const Assessor assessor(openConfiguration(options.configuration));
    const bool reported = !options.report.empty();
    PortraitPage page;
    bool all = true;
    Output output(options, files.size());
    for (const std::filesystem::path& path : files) {
        const std::string file = path.string();
        try {
            const Image image(new PictureFile(path));
            if (const auto eyes = assessor.findEyes(image)) {
                const AssessedPortrait assessed = assessor.assess(image, *eyes, reported);
                all = all && assessed.compliance.isCompliant();
                output.result(describe(file, assessed), textOf(file, assessed));
                if (reported) page.add(file, assessed);
            } else {
                all = false;
                output.result(
                    {{"file", file}, {"eyes", nullptr}, {"compliant", false}, {"best_practice", false}});
                if (reported) page.add(file, "There are no eyes of a face in the picture.");
            }
        } catch (const std::exception& e) {
            output.complaint(file, e.what());
        }
        output.step();
    }
    if (reported) page.write(options.report);
    return output.complained() ? undecided : all ? compliant : notCompliant;
}

} // namespace

Command portraitCommand(CLI::App& program) {
    const auto options = std::make_shared<PortraitOptions>();
    CLI::App* const app = addCommand(
        program, "portrait",
        "Test whether portraits are fit for identity documents (ISO/IEC 19794-5:2005, full frontal).\n"
        "Tells of each picture whether it complies with the standard and with its best practice, what is "
        "told of the person, and of each test its values and limits.\n"
        "Exit status: 0 all comply, 1 not all, 2 something went wrong.",
        *options);
    addImages(*app, options->images);
    app->add_option("--report", options->report, "File for a page of HTML with pictures and tests")
        ->type_name("FILE");
    return {app, [options] { return portrait(*options); }, undecided};
}

} // namespace Orbek::Tool
