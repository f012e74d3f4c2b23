#include "orbek/verification.h"

#include "kx/set_recognizer.h"
#include "kx/stream_recognizer.h"
#include "orbek/implementation/comparison.h"
#include "orbek/implementation/processor.h"

namespace Orbek::Verification {

namespace {

class FeedbackTranslator : public TranslatorBase<Feedback> {
public:
    template <class Recognizer> void listen(const Recognizer& recognizer) {
        using namespace Kx::RecognitionInterest;
        listenTo(recognizer);
        on<AchievedScore>(recognizer, [this](const AchievedScore& achieved) {
            tell([&](FeedbackBody& feedback) { feedback.score(achieved.score); });
        });
        on<Result>(recognizer, [this](const Result& result) {
            tell([&](FeedbackBody& feedback) { result.accepted ? feedback.match() : feedback.noMatch(); });
        });
    }
};

} // namespace

class Processor::Implementation : public ProcessorBase<FeedbackTranslator> {
public:
    explicit Implementation(const Configuration& configuration)
        : ProcessorBase(configuration),
          streamRecognizer_(resources().faceFinder(), resources().eyesFinder(), resources().cmpStrategy(),
                            settings("StreamVerifier")),
          setRecognizer_(settings("SetVerifier"), resources().faceFinder(), resources().eyesFinder(),
                         resources().cmpStrategy()) {
        translator_.listen(streamRecognizer_);
        translator_.listen(setRecognizer_);
    }

    void process(SampleIterator first, SampleIterator last, const FIR& fir, const Score& threshold,
                 const Feedback& feedback) {
        processSamples(first, last, feedback, [&](const auto& samples) {
            setRecognizer_.recognize(samples, FIR::Implementation::of(fir), thresholdOf(threshold));
        });
    }
    void process(const CaptureDevice& device, const FIR& fir, const Score& threshold,
                 const Feedback& feedback) {
        processDevice(device, feedback, [&](const auto& source) {
            streamRecognizer_.recognize(source, FIR::Implementation::of(fir), thresholdOf(threshold));
        });
    }

private:
    Kx::StreamRecognizer streamRecognizer_;
    Kx::SetRecognizer setRecognizer_;
};

FeedbackBody::FeedbackBody() = default;
FeedbackBody::~FeedbackBody() = default;

Processor::Processor(const Configuration& configuration)
    : implementation_(new Implementation(configuration)) {}
Processor::Processor(const Processor&) = default;
Processor& Processor::operator=(const Processor&) = default;
Processor::~Processor() = default;

void Processor::process(SampleIterator first, SampleIterator last, const FIR& fir, const Score& threshold,
                        const Feedback& feedback) const {
    implementation_->process(first, last, fir, threshold, feedback);
}

void Processor::process(const CaptureDevice& device, const FIR& fir, const Score& threshold,
                        const Feedback& feedback) const {
    implementation_->process(device, fir, threshold, feedback);
}

} // namespace Orbek::Verification
