#include "orbek/enrollment.h"

#include "kx/set_enroller.h"
#include "kx/stream_enroller.h"
#include "orbek/implementation/comparison.h"
#include "orbek/implementation/processor.h"

namespace Orbek::Enrollment {

namespace {

class FeedbackTranslator : public TranslatorBase<Feedback> {
public:
    void listen(const Kx::SetEnroller& enroller) { listenToAny(enroller); }
    void listen(const Kx::StreamEnroller& enroller) {
        listenToAny(enroller);
        using Kx::OperationInterest::ProcessingTimeExceeded;
        on<ProcessingTimeExceeded>(enroller, [this](const ProcessingTimeExceeded&) { failure(); });
    }

private:
    template <class Enroller> void listenToAny(const Enroller& enroller) {
        using namespace Kx::EnrolmentInterest;
        listenTo(enroller);
        on<DoneProcessing>(enroller, [this](const DoneProcessing& done) {
            tell([&](FeedbackBody& feedback) { feedback.success(FIR::Implementation::make(done.fir)); });
        });
        on<NotEnoughGoodImages>(enroller, [this](const NotEnoughGoodImages&) { failure(); });
    }
    void failure() {
        tell([](FeedbackBody& feedback) { feedback.failure(); });
    }
};

} // namespace

class Processor::Implementation : public ProcessorBase<FeedbackTranslator> {
public:
    explicit Implementation(const Configuration& configuration)
        : ProcessorBase(configuration), strategy_(resources().cmpStrategy()),
          streamEnroller_(resources().faceFinder(), resources().eyesFinder(), strategy_,
                          settings("StreamEnroller")),
          setEnroller_(resources().faceFinder(), resources().eyesFinder(), strategy_,
                       settings("SetEnroller")) {
        translator_.listen(streamEnroller_);
        translator_.listen(setEnroller_);
    }

    void process(SampleIterator first, SampleIterator last, const Feedback& feedback) {
        processSamples(first, last, feedback, [&](const auto& samples) { setEnroller_.enrol(samples); });
    }
    void process(const CaptureDevice& device, const Feedback& feedback) {
        processDevice(device, feedback, [&](const auto& source) { streamEnroller_.enrol({source}); });
    }
    FIR merge(const FIR& first, const FIR& second) const {
        return FIR::Implementation::make(
            strategy_.algorithm()->merge({FIR::Implementation::of(second)}, FIR::Implementation::of(first)));
    }

private:
    Cmp::Strategy strategy_;
    Kx::StreamEnroller streamEnroller_;
    Kx::SetEnroller setEnroller_;
};

FeedbackBody::FeedbackBody() = default;
FeedbackBody::~FeedbackBody() = default;

Processor::Processor(const Configuration& configuration)
    : implementation_(new Implementation(configuration)) {}
Processor::Processor(const Processor&) = default;
Processor& Processor::operator=(const Processor&) = default;
Processor::~Processor() = default;

void Processor::process(SampleIterator first, SampleIterator last, const Feedback& feedback) const {
    implementation_->process(first, last, feedback);
}

void Processor::process(const CaptureDevice& device, const Feedback& feedback) const {
    implementation_->process(device, feedback);
}

FIR Processor::merge(const FIR& first, const FIR& second) const {
    return implementation_->merge(first, second);
}

} // namespace Orbek::Enrollment
