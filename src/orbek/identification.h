#pragma once

#include "orbek/capture_device.h"
#include "orbek/facial_matching_engine.h"
#include "orbek/sample.h"

namespace Orbek::Identification {

/// What an application learns of an identification, by calls during Processor::process(), on its thread. What
/// it throws ends the identification and comes out of process().
class [[gnu::visibility("default")]] FeedbackBody {
public:
    FeedbackBody();
    FeedbackBody(const FeedbackBody&) = delete;
    FeedbackBody& operator=(const FeedbackBody&) = delete;
    virtual ~FeedbackBody();

    virtual void start() = 0;                                  ///< once, first
    virtual void processingImage(const Image& image) = 0;      ///< the application's own, or the device's
    virtual void eyesFound(const Eyes::Location& eyes) = 0;    ///< in that image
    virtual void eyesNotFound() = 0;                           ///< in that image
    virtual void matches(const std::list<Match>& matches) = 0; ///< the outcome, best first; may be empty
    virtual void end() = 0;                                    ///< once, last
};

using Feedback = CountedPtr<FeedbackBody>;

/// Tells whom of a population pictures show. Each picture is compared for itself, and the first that has
/// matches decides.
///
///     Orbek::Identification::Processor processor(configuration, people);
///     processor.process(camera, threshold, Orbek::Identification::Feedback(new MyFeedback), 10);
///
/// The times of a live identification, and whether it checks that a face is alive, are set below
/// ORBEK.StreamIdentifier. Copies share everything, and threads that use them take turns; processors of their
/// own run in parallel.
class [[gnu::visibility("default")]] Processor {
public:
    using SampleIterator = std::list<Sample>::const_iterator;

    /// Reads the model files, if this is the first object of the configuration that needs them.
    /// @param population shared: later changes show. Nobody changes it during process().
    /// @throws std::exception that names the file, or tells the value that a setting cannot have;
    /// Configuration::faults() and checkValue() name the setting
    Processor(const Configuration& configuration, const Population& population);
    Processor(const Processor&);
    Processor& operator=(const Processor&);
    ~Processor();

    /// Looks for the eyes of samples that do not have them. One picture after the other: once the feedback
    /// learns of the next one, nothing refers to pixels of those before, which are asked for anew if they are
    /// needed.
    /// @param threshold that matches reach, as FacialMatchingEngine::bestMatches() tells
    /// @param maxMatches to list at most
    /// @throws std::exception for an image or a population that cannot be used, and what the feedback throws;
    /// end() is not called then
    void process(SampleIterator first, SampleIterator last, const Score& threshold, const Feedback& feedback,
                 unsigned int maxMatches) const;
    /// Takes images until one has matches, or time is over. Each image is a search of its own, so the rate of
    /// false acceptances counts for each: a stranger who stays before the camera for 100 images has 100 times
    /// the chance to be taken for somebody.
    void process(const CaptureDevice& device, const Score& threshold, const Feedback& feedback,
                 unsigned int maxMatches) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek::Identification
