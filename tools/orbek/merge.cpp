// orbek merge: one record from several of one person.

#include "command.h"
#include "configuration_file.h"
#include "orbek/enrollment.h"
#include "output.h"
#include "record_file.h"

#include <memory>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

struct MergeOptions : CommonOptions {
    std::vector<std::string> records;
    std::string merged;
};

int merge(const MergeOptions& options) {
    const Configuration configuration = openConfiguration(options.configuration);
    const FIRBuilder builder(configuration);
    const Enrollment::Processor processor(configuration);
    FIR merged = readRecord(builder, options.records.front());
    for (std::size_t i = 1; i < options.records.size(); ++i)
        merged = processor.merge(readRecord(builder, options.records[i]), merged);
    writeRecord(merged, options.merged);
    Output(options).result(describeRecord(merged, options.merged));
    return done;
}

} // namespace

Command mergeCommand(CLI::App& program) {
    const auto options = std::make_shared<MergeOptions>();
    CLI::App* const app = addCommand(
        program, "merge", "Make one record from several of one person.\nTells of the new record.", *options);
    app->add_option("records", options->records, "Files of records")->required()->type_name("FILE");
    app->add_option("-o,--output", options->merged, "File for the new record")->required()->type_name("FILE");
    return {app, [options] { return merge(*options); }};
}

} // namespace Orbek::Tool
