// orbek compare: how alike two records are.

#include "command.h"
#include "configuration_file.h"
#include "orbek/facial_matching_engine.h"
#include "output.h"
#include "record_file.h"

#include <memory>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

struct CompareOptions : CommonOptions {
    std::string first, second;
};

int compare(const CompareOptions& options) {
    const Configuration configuration = openConfiguration(options.configuration);
    const FIRBuilder builder(configuration);
    const FIR first = readRecord(builder, options.first), second = readRecord(builder, options.second);
    const Score score = FacialMatchingEngine(configuration).compare(first, second);
    const ScoreMappings mappings(configuration);
    Output(options).result({{"score", rounded(score, 6)},
                            {"far", rounded(mappings.expectedFAR(score), 8)},
                            {"frr", rounded(mappings.expectedFRR(score), 8)}});
    return done;
}

} // namespace

Command compareCommand(CLI::App& program) {
    const auto options = std::make_shared<CompareOptions>();
    CLI::App* const app = addCommand(program, "compare",
                                     "Compare two records.\n"
                                     "Tells the score, and the rates of false acceptance (far) and false "
                                     "rejection (frr) of a threshold of that score.",
                                     *options);
    app->add_option("first", options->first, "File of a record")->required()->type_name("FILE");
    app->add_option("second", options->second, "File of another one")->required()->type_name("FILE");
    return {app, [options] { return compare(*options); }};
}

} // namespace Orbek::Tool
