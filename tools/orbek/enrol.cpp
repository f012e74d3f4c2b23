// orbek enrol: a record of a person from pictures.

#include "command.h"
#include "configuration_file.h"
#include "enrolment.h"
#include "record_file.h"
#include "whole_file.h"

#include <memory>

namespace Orbek::Tool {
namespace {

struct EnrolOptions : CommonOptions {
    std::vector<std::string> images;
    std::string record;
};

int enrol(const EnrolOptions& options) {
    const std::vector<std::filesystem::path> files = pictureFiles(options.images);
    refuseInputs({options.record}, files);
    const Enrollment::Processor processor(openConfiguration(options.configuration));
    Output output(options, files.size());
    const std::optional<FIR> record = enrolPictures(processor, files, output);
    if (!record) throw std::runtime_error(options.record + ": not made, too few usable pictures");
    writeRecord(*record, options.record);
    output.result(describeRecord(*record, options.record));
    return output.complained() ? unreadable : done;
}

} // namespace

Command enrolCommand(CLI::App& program) {
    const auto options = std::make_shared<EnrolOptions>();
    CLI::App* const app = addCommand(program, "enrol",
                                     "Make one record from pictures of one person.\n"
                                     "Tells of each picture, and at last of the record.",
                                     *options);
    addImages(*app, options->images);
    app->add_option("-o,--output", options->record, "File for the record")->required()->type_name("FILE");
    return {app, [options] { return enrol(*options); }};
}

} // namespace Orbek::Tool
