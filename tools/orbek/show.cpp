// orbek show: what record files hold.

#include "command.h"
#include "configuration_file.h"
#include "output.h"
#include "record_file.h"

#include <memory>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

struct ShowOptions : CommonOptions {
    std::vector<std::string> records;
};

int show(const ShowOptions& options) {
    const FIRBuilder builder(openConfiguration(options.configuration));
    Output output(options, options.records.size());
    for (const std::string& file : options.records) {
        try {
            output.result(describeRecord(readRecord(builder, file), file));
        } catch (const std::exception& e) {
            output.complaint(e.what());
        }
        output.step();
    }
    return output.complained() ? unreadable : done;
}

} // namespace

Command showCommand(CLI::App& program) {
    const auto options = std::make_shared<ShowOptions>();
    CLI::App* const app =
        addCommand(program, "show", "Describe records: version, features and bytes of each.", *options);
    app->add_option("records", options->records, "Files of records")->required()->type_name("FILE");
    return {app, [options] { return show(*options); }};
}

} // namespace Orbek::Tool
