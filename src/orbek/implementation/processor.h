#pragma once

#include "kx/events.h"
#include "orbek/capture_device.h"
#include "orbek/implementation/adapt_sample.h"
#include "orbek/implementation/configuration_implementation.h"
#include "orbek/implementation/image_src.h"

#include <exception>

/// What the processors of enrollment, verification and identification have in common.

namespace Orbek {

/// Turns the events of engines into calls on an application's feedback, which is there for one process() at a
/// time. Without one, events go nowhere.
template <class Feedback> class TranslatorBase {
public:
    TranslatorBase() = default;
    TranslatorBase(const TranslatorBase&) = delete;
    TranslatorBase& operator=(const TranslatorBase&) = delete;

    /// Appends to the queue of images that engines are going to work on. May be called by any thread.
    void push(const Image& image) {
        const FNMutexLock lock(mutex_);
        images_.push_back(image);
    }
    void clear() {
        const FNMutexLock lock(mutex_);
        images_.clear();
    }

    void attach(const Feedback& feedback) {
        feedback_ = feedback;
        if (feedback) feedback->start();
    }
    void detach() {
        if (const Feedback feedback = feedback_) feedback->end();
        feedback_ = Feedback();
        clear();
    }

    /// What a feedback has thrown. It is no std::exception, because an event's subject swallows those of its
    /// observers.
    struct Failure {
        std::exception_ptr cause;
    };

protected:
    /// Subscribes to the events that all engines send.
    template <class Engine> void listenTo(const Engine& engine) {
        using namespace Kx::OperationInterest;
        on<ProcessingSample>(engine, [this](const ProcessingSample&) { processing(); });
        on<EyesFound>(engine, [this](const EyesFound& eyes) {
            tell([&](auto& feedback) { feedback.eyesFound(adapt(eyes.left, eyes.right)); });
        });
        on<EyesNotFound>(
            engine, [this](const EyesNotFound&) { tell([](auto& feedback) { feedback.eyesNotFound(); }); });
    }
    template <class Event, class Engine, class React> static void on(const Engine& engine, React react) {
        engine.addObserver(Fn::Functor1<Event>(react));
    }

    /// @throws Failure
    template <class Call> void tell(Call call) {
        try {
            if (const Feedback feedback = feedback_) call(*feedback);
        } catch (...) {
            throw Failure{std::current_exception()};
        }
    }

private:
    /// The image that the application gave, or the device: the next one in the queue.
    void processing() {
        Image image;
        {
            const FNMutexLock lock(mutex_);
            if (images_.empty()) return;
            image = images_.front();
            images_.pop_front();
        }
        tell([&](auto& feedback) { feedback.processingImage(image); });
    }

    Feedback feedback_;
    FNMutex mutex_{FNMutex::recursive}; ///< guards the images
    std::list<Image> images_;
};

/// One process() at a time, with a translator that listens to the engines of the derived class.
template <class Translator> class ProcessorBase {
public:
    using SampleIterator = std::list<Sample>::const_iterator;

    ProcessorBase(const ProcessorBase&) = delete;
    ProcessorBase& operator=(const ProcessorBase&) = delete;

protected:
    explicit ProcessorBase(const Configuration& configuration)
        : configuration_(configuration),
          resources_(Configuration::Implementation::implementation(configuration)->resources()) {}

    const Resources& resources() const { return resources_; }
    /// Of an engine.
    Fn::Deployment::Component settings(const char* key) const {
        return resources_.rootComponent().subComponent(key);
    }

    /// Calls `run(samples)` between start() and end(). @throws what the feedback throws, or `run`
    template <class Feedback, class Run>
    void processSamples(SampleIterator first, SampleIterator last, const Feedback& feedback, Run run) {
        const FNMutexLock lock(mutex_);
        translator_.clear(); // of a process() that has failed
        const std::list<Kx::SensorSample> samples =
            adapt(first, last, [this](const Image& image) { translator_.push(image); });
        attended(feedback, [&] { run(samples); });
    }
    /// Calls `run(source)` likewise. @throws what the device throws, too, if `run` cannot go on without it
    template <class Feedback, class Run>
    void processDevice(const CaptureDevice& device, const Feedback& feedback, Run run) {
        if (!device) FN_THROW(FNEBadArg, "Processor: the capture device is a null handle");
        const FNMutexLock lock(mutex_);
        translator_.clear();
        std::exception_ptr failure; // an engine may ask the device on a thread of its own, and know no reason
        const auto capture = [&] {
            try {
                const Image image = device->capture();
                translator_.push(image);
                return image;
            } catch (const std::exception&) { // not the end of a thread
                failure = std::current_exception();
                throw;
            }
        };
        const Fn::VideoSource source(FNCountedPtr<Fn::VideoSource::Body>(new ImageSrc(capture)));
        attended(feedback, [&] {
            try {
                run(source);
            } catch (const typename Translator::Failure&) {
                throw;
            } catch (...) {
                if (failure) std::rethrow_exception(failure);
                throw;
            }
        });
    }

private:
    template <class Feedback, class Run> void attended(const Feedback& feedback, Run run) {
        translator_.attach(feedback);
        try {
            run();
        } catch (const typename Translator::Failure& failure) {
            std::rethrow_exception(failure.cause);
        }
        translator_.detach();
    }

    FNMutex mutex_{FNMutex::recursive}; ///< held by process()
    Configuration configuration_;       ///< keeps the resources
    const Resources& resources_;

protected:
    Translator translator_;
};

} // namespace Orbek
