#pragma once

#include "orbek/capture_device.h"
#include "orbek/fir.h"
#include "orbek/sample.h"

namespace Orbek::Enrollment {

/// What an application learns of an enrollment, by calls during Processor::process(), on its thread. What it
/// throws ends the enrollment and comes out of process().
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
    virtual void success(const FIR& fir) = 0;               ///< the outcome is a record
    virtual void failure() = 0; ///< there is no record: too few images, or no time
    virtual void end() = 0;     ///< once, last
};

using Feedback = CountedPtr<FeedbackBody>;

/// Makes a record from pictures of one person.
///
///     std::list<Orbek::Sample> samples;
///     samples.emplace_back(Orbek::ImageIO::load("ann1.jpg"));
///     Orbek::Enrollment::Processor processor(configuration);
///     processor.process(samples.begin(), samples.end(), Orbek::Enrollment::Feedback(new MyFeedback));
///
/// How many usable pictures it takes, and the times of a live enrollment, are set below ORBEK.SetEnroller and
/// ORBEK.StreamEnroller. Copies share everything, and threads that use them take turns; processors of their
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
    /// @throws std::exception for an image that cannot be used, and what the feedback throws; end() is not
    /// called then
    void process(SampleIterator first, SampleIterator last, const Feedback& feedback) const;
    /// Takes images until there are enough good ones, or time is over.
    void process(const CaptureDevice& device, const Feedback& feedback) const;

    /// One record from two of the same person. @throws std::exception for a record of another algorithm
    FIR merge(const FIR& first, const FIR& second) const;

    class [[gnu::visibility("hidden")]] Implementation;

private:
    CountedPtr<Implementation> implementation_;
};

} // namespace Orbek::Enrollment
