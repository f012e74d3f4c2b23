#include "orbek/identification.h"

#include "kx/set_identifier.h"
#include "kx/stream_identifier.h"
#include "orbek/implementation/comparison.h"
#include "orbek/implementation/processor.h"

namespace Orbek::Identification {

namespace {

class FeedbackTranslator : public TranslatorBase<Feedback> {
public:
    template <class Identifier> void listen(const Identifier& identifier) {
        listenTo(identifier);
        on<Cmp::Matches>(identifier, [this](const Cmp::Matches& matches) {
            std::list<Match> result;
            for (const Cmp::Match& match : matches) result.push_back({match.id, match.score.value()});
            tell([&](FeedbackBody& feedback) { feedback.matches(result); });
        });
    }
};

} // namespace

class Processor::Implementation : public ProcessorBase<FeedbackTranslator> {
public:
    Implementation(const Configuration& configuration, const Population& population)
        : ProcessorBase(configuration),
          streamIdentifier_(resources().faceFinder(), resources().eyesFinder(), resources().cmpStrategy(),
                            settings("StreamIdentifier")),
          setIdentifier_(settings("SetIdentifier"), resources().faceFinder(), resources().eyesFinder(),
                         resources().cmpStrategy()),
          population_(Population::Implementation::of(population)) {
        translator_.listen(streamIdentifier_);
        translator_.listen(setIdentifier_);
    }

    void process(SampleIterator first, SampleIterator last, const Score& threshold, const Feedback& feedback,
                 unsigned int maxMatches) {
        processSamples(first, last, feedback, [&](const auto& samples) {
            setIdentifier_.identify(samples, population_, thresholdOf(threshold), maxMatches);
        });
    }
    void process(const CaptureDevice& device, const Score& threshold, const Feedback& feedback,
                 unsigned int maxMatches) {
        processDevice(device, feedback, [&](const auto& source) {
            streamIdentifier_.identify(source, population_, thresholdOf(threshold), maxMatches);
        });
    }

private:
    Kx::StreamIdentifier streamIdentifier_;
    Kx::SetIdentifier setIdentifier_;
    Cmp::Population population_;
};

FeedbackBody::FeedbackBody() = default;
FeedbackBody::~FeedbackBody() = default;

Processor::Processor(const Configuration& configuration, const Population& population)
    : implementation_(new Implementation(configuration, population)) {}
Processor::Processor(const Processor&) = default;
Processor& Processor::operator=(const Processor&) = default;
Processor::~Processor() = default;

void Processor::process(SampleIterator first, SampleIterator last, const Score& threshold,
                        const Feedback& feedback, unsigned int maxMatches) const {
    implementation_->process(first, last, threshold, feedback, maxMatches);
}

void Processor::process(const CaptureDevice& device, const Score& threshold, const Feedback& feedback,
                        unsigned int maxMatches) const {
    implementation_->process(device, threshold, feedback, maxMatches);
}

} // namespace Orbek::Identification
