// orbek verify: whether pictures show the person of a record.

#include "command.h"
#include "configuration_file.h"
#include "orbek/verification.h"
#include "picture_lines.h"
#include "record_file.h"

#include <memory>
#include <optional>

namespace Orbek::Tool {
namespace {

enum VerifyStatus : int { same = 0, other = 1, undecided = 2 };

struct VerifyOptions : CommonOptions {
    std::string record;
    std::vector<std::string> images;
    float far = 0.001f;
    std::optional<float> score;
};

class Verified final : public PictureLines<Verification::FeedbackBody> {
public:
    Verified(Output& output, bool& matched) : PictureLines(output), matched_(matched) {}
    void score(const Score& score) override { line()["score"] = rounded(score, 6); }
    void match() override { matched_ = true; }
    void noMatch() override { matched_ = false; }

private:
    bool& matched_;
};

int verify(const VerifyOptions& options) {
    const std::vector<std::filesystem::path> files = pictureFiles(options.images);
    const Configuration configuration = openConfiguration(options.configuration);
    const FIR record = readRecord(FIRBuilder(configuration), options.record);
    const Score threshold =
        options.score ? Score(*options.score) : ScoreMappings(configuration).requestFAR(options.far);
    const Verification::Processor processor(configuration);
    Output output(options, files.size());
    const std::list<Sample> samples = samplesOf(files);
    bool matched = false;
    processor.process(samples.begin(), samples.end(), record, threshold,
                      Verification::Feedback(new Verified(output, matched)));
    output.result({{"match", matched}, {"threshold", rounded(threshold, 6)}});
    return matched ? same : output.complained() ? undecided : other;
}

} // namespace

Command verifyCommand(CLI::App& program) {
    const auto options = std::make_shared<VerifyOptions>();
    CLI::App* const app =
        addCommand(program, "verify",
                   "Tell whether pictures show the person of a record.\n"
                   "Tells of each picture up to the first that is accepted, and at last of the outcome.\n"
                   "Exit status: 0 a match, 1 no match, 2 something went wrong.",
                   *options);
    app->add_option("record", options->record, "File of the record")->required()->type_name("FILE");
    addImages(*app, options->images);
    CLI::Option* const score = addShare(*app, "--score", options->score, "Least score of a match");
    addShare(*app, "--far", options->far, "Share of other people that may be taken for the person")
        ->excludes(score);
    return {app, [options] { return verify(*options); }, undecided};
}

} // namespace Orbek::Tool
