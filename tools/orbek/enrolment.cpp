#include "enrolment.h"

namespace Orbek::Tool {
namespace {

class Enrolled final : public PictureLines<Enrollment::FeedbackBody> {
public:
    Enrolled(Output& output, const TellPicture& tell, std::optional<FIR>& record)
        : PictureLines(output, tell), record_(record) {}
    void success(const FIR& fir) override { record_ = fir; }
    void failure() override {}

private:
    std::optional<FIR>& record_;
};

} // namespace

std::optional<FIR> enrolPictures(const Enrollment::Processor& processor,
                                 const std::vector<std::filesystem::path>& files, Output& output,
                                 const TellPicture& tell) {
    const std::list<Sample> samples = samplesOf(files);
    std::optional<FIR> record;
    processor.process(samples.begin(), samples.end(),
                      Enrollment::Feedback(new Enrolled(output, tell, record)));
    return record;
}

} // namespace Orbek::Tool
