#pragma once

#include "orbek/capture_device.h"
#include "orbek/fir.h"
#include "orbek/sample.h"
#include "orbek/score.h"

namespace Orbek::Verification {

/// What an application learns of a verification, by calls during Processor::process(), on its thread. What it
/// throws ends the verification and comes out of process().
class [[gnu::visibility("default")]] FeedbackBody {
public:
    FeedbackBody();
    FeedbackBody(const FeedbackBody&) = delete;
    FeedbackBody& operator=(const FeedbackBody&) = delete;
    virtual ~FeedbackBody();

    virtual void start() = 0;                               ///< once, first
    virtual void processingImage(const Image& image) = 0;   ///< the application's own, or the device's
    virtual void eyesFound(const Eyes::Location& eyes) = 0; ///< in that image
    virtual void eyesNotFound() = 0;                        ///< in that image
    virtual void score(const Score& score) = 0;             ///< of that image
    virtual void match() = 0;                               ///< the outcome: it is the person
    virtual void noMatch() = 0;                             ///< the outcome: it is not, as far as can be told
    virtual void end() = 0;                                 ///< once, last
};

using Feedback = CountedPtr<FeedbackBody>;

/// Tells whether pictures show the person of a record. Each picture is compared for itself, and the first
/// whose score reaches the threshold, is it or more, decides. So each picture is a comparison of its own: the
/// rate of false acceptances of ten pictures is up to ten times that of one.
///
///     const Orbek::Score threshold = Orbek::ScoreMappings(configuration).requestFAR(0.001f);
///     Orbek::Verification::Processor processor(configuration);
///     processor.process(camera, record, threshold, Orbek::Verification::Feedback(new MyFeedback));
///
/// The times of a live verification, and whether it checks that a face is alive, are set below
/// ORBEK.StreamVerifier. Copies share everything, and threads that use them take turns; processors of their
/// own run in parallel.
class [[gnu::visibility("default")]] Processor {
public:
    using SampleIterator = std::list<Sample>::const_iterator;

    /// Reads the model files, if this is the first object of the configuration that needs them.
    /// @throws std::exception that names the file, or tells the value that a setting cannot have;
    /// Configuration::faults() and checkValue() name the setting
    explicit Processor(const Configuration& configuration);
    Processor(const Processor&);
    Processor& operator=(const Processor&);
    ~Processor();

    /// Looks for the eyes of samples that do not have them. One picture after the other: once the feedback
    /// learns of the next one, nothing refers to pixels of those before, which are asked for anew if they are
    /// needed.
    /// @throws std::exception for an image or a record that cannot be used, and what the feedback throws;
    /// end() is not called then
    void process(SampleIterator first, SampleIterator last, const FIR& fir, const Score& threshold,
                 const Feedback& feedback) const;
    /// Takes images until one is accepted, or time is over.
    void process(const CaptureDevice& device, const FIR& fir, const Score& threshold,
                 const Feedback& feedback) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek::Verification
