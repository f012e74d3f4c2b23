// orbek enrol: a record of a person from pictures.

#include "command.h"
#include "configuration_file.h"
#include "orbek/enrollment.h"
#include "picture_lines.h"
#include "pictures.h"
#include "record_file.h"

#include <memory>
#include <optional>

namespace Orbek::Tool {
namespace {

struct EnrolOptions {
    std::vector<std::string> images;
    std::string record;
    std::string configuration;
};

class Enrolled final : public PictureLines<Enrollment::FeedbackBody> {
public:
    Enrolled(Output& output, std::optional<FIR>& record) : PictureLines(output), record_(record) {}
    void success(const FIR& fir) override { record_ = fir; }
    void failure() override {}

private:
    std::optional<FIR>& record_;
};

int enrol(const EnrolOptions& options) {
    const std::vector<std::filesystem::path> files = pictureFiles(options.images);
    const Enrollment::Processor processor(openConfiguration(options.configuration));
    Output output(files.size());
    const std::list<Sample> samples = readSamples(files, output);
    std::optional<FIR> record;
    processor.process(samples.begin(), samples.end(), Enrollment::Feedback(new Enrolled(output, record)));
    if (!record) throw std::runtime_error(options.record + ": not made, too few usable pictures");
    writeRecord(*record, options.record);
    output.result(describeRecord(*record, options.record));
    return output.complained() ? unreadable : done;
}

} // namespace

Command enrolCommand(CLI::App& program) {
    const auto options = std::make_shared<EnrolOptions>();
    CLI::App* const app = program.add_subcommand(
        "enrol", "Make one record from pictures of one person.\n"
                 "Prints one JSON object for each picture, and at last one for the record.");
    app->add_option("images", options->images, "Image files, or folders of them")
        ->required()
        ->type_name("IMAGE");
    app->add_option("-o,--output", options->record, "File for the record")->required()->type_name("FILE");
    app->add_option("--config", options->configuration, "Configuration file in place of the installed one")
        ->type_name("FILE");
    return {app, [options] { return enrol(*options); }};
}

} // namespace Orbek::Tool
