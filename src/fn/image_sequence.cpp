#include "fn/image_sequence.h"

#include "fn/thread/event.h"
#include "fn/thread/resource.h"
#include "fn/thread/thread.h"

#include <chrono>
#include <list>

using Clock = std::chrono::steady_clock;
using std::chrono::milliseconds;

/// The frames that a reader has not dropped yet.
class FNImageSequence {
public:
    explicit FNImageSequence(Clock::time_point end) : end_(end) {}

    // ---- the taking thread's side

    /// Takes a frame if it needs one, and becomes complete once it needs no more.
    void update(const FNImageReference& frame) {
        const Fn::ModifierLock lock(frames_);
        if (needsFrame()) {
            list_.push_back(frame);
            wakeReader();
        }
        if (!needsFrame()) complete_ = true;
    }
    void complete() {
        const Fn::ModifierLock lock(frames_);
        complete_ = true;
        wakeReader();
    }
    bool isComplete() const {
        const Fn::ReadOnlyLock lock(frames_);
        return complete_;
    }

    // ---- the reader's side

    void drop() {
        const Fn::ModifierLock lock(frames_);
        if (!list_.empty()) list_.pop_front();
    }
    void wait() {
        while (askForFrame()) event_.wait();
    }
    bool atEnd() const {
        const Fn::ReadOnlyLock lock(frames_);
        return list_.empty() && complete_;
    }
    FNImageReference front() const {
        const Fn::ReadOnlyLock lock(frames_);
        return list_.front();
    }

private:
    bool needsFrame() const { return readerWaits_ || list_.empty() || Clock::now() < end_; }
    /// @return whether the reader has to wait.
    bool askForFrame() {
        const Fn::ModifierLock lock(frames_);
        return readerWaits_ = list_.empty() && !complete_;
    }
    void wakeReader() {
        if (readerWaits_) event_.signal();
        readerWaits_ = false;
    }

    const Clock::time_point end_;
    Fn::FairResource frames_; ///< guards what follows
    std::list<FNImageReference> list_;
    bool complete_ = false;
    bool readerWaits_ = false;
    FNEvent event_;
};

namespace {

class InTurn final : public Fn::VideoSource::Body {
public:
    explicit InTurn(const std::list<Fn::VideoSource>& sources) : sources_(sources) {
        if (sources_.empty()) FN_THROW(FNEBadArg, "Cannot work with empty Image Source List");
    }

    FNImageReference get() override {
        sources_.splice(sources_.end(), sources_, sources_.begin());
        return sources_.back().get();
    }
    /// Of the source that has given the last frame.
    std::string name() override { return sources_.back().name(); }

private:
    std::list<Fn::VideoSource> sources_; ///< the next one first
};

} // namespace

/// The thread that takes the frames, and the sequences that are not complete.
class FNImageSequenceFactory::Loop {
public:
    Loop(const Fn::VideoSource& source, unsigned int intervalMs)
        : source_(source), interval_(intervalMs),
          thread_(FNSpawnNamedMember("FNImageSequenceFactory::loop", *this, &Loop::run)) {
        thread_.start();
    }
    ~Loop() {
        thread_.requestCancel();
        opened_.signal(); // it may never have been
        thread_.join();
    }
    Loop(const Loop&) = delete;
    Loop& operator=(const Loop&) = delete;

    /// @return false if the thread has ended.
    bool open(const FNCountedPtr<FNImageSequence>& sequence) {
        const Fn::ModifierLock lock(open_);
        if (ended_) return false;
        sequences_.push_back(sequence);
        opened_.signal();
        return true;
    }

private:
    /// However the thread ends, nobody waits for it any more.
    struct End {
        Loop& loop;
        ~End() {
            const Fn::ModifierLock lock(loop.open_);
            loop.ended_ = true;
            for (const auto& sequence : loop.sequences_) sequence->complete();
            loop.sequences_.clear();
        }
    };

    void run() {
        const End end{*this};
        opened_.wait(); // a frame that nobody waits for would be lost
        FNThreadSelf::serviceCancel();
        for (;;) {
            const Clock::time_point start = Clock::now();
            FNImageReference frame = source_.get();
            Fn::addImageCaptureTime(frame.attributes(), Fn::TimeStamp::now());
            distribute(frame);
            const auto rest = interval_ - std::chrono::duration_cast<milliseconds>(Clock::now() - start);
            FNThreadSelf::sleep(static_cast<unsigned long>(std::max(rest.count(), milliseconds::rep{0})));
        }
    }

    void distribute(const FNImageReference& frame) {
        const Fn::ModifierLock lock(open_);
        sequences_.remove_if([&](const FNCountedPtr<FNImageSequence>& sequence) {
            if (sequence.count() == 1) return true; // its readers are gone
            sequence->update(frame);
            return sequence->isComplete();
        });
    }

    Fn::VideoSource source_;
    const milliseconds interval_;
    Fn::FairResource open_; ///< guards the next two
    std::list<FNCountedPtr<FNImageSequence>> sequences_;
    bool ended_ = false;
    FNEvent opened_; ///< signalled for each sequence
    FNThread thread_;
};

FNImageSequenceFactory::FNImageSequenceFactory(const Fn::VideoSource& source, unsigned int intervalMs)
    : loop_(std::make_unique<Loop>(source, intervalMs)) {}

FNImageSequenceFactory::FNImageSequenceFactory(const std::list<Fn::VideoSource>& sources,
                                               unsigned int intervalMs)
    : FNImageSequenceFactory(Fn::VideoSource(FNCountedPtr<Fn::VideoSource::Body>(new InTurn(sources))),
                             intervalMs) {}

FNImageSequenceFactory::~FNImageSequenceFactory() = default;

std::pair<FNImageSequenceIter, FNImageSequenceIter> FNImageSequenceFactory::start(unsigned int durationMs) {
    const FNCountedPtr<FNImageSequence> sequence(
        new FNImageSequence(Clock::now() + milliseconds(durationMs)));
    if (!loop_->open(sequence)) FN_THROW(FNEGeneric, "FNImageSequenceFactory::start: sequence threaddied");
    return {FNImageSequenceIter(sequence), FNImageSequenceIter()};
}

FNImageSequenceIter::FNImageSequenceIter() = default;
FNImageSequenceIter::FNImageSequenceIter(const FNImageSequenceIter&) = default;
FNImageSequenceIter& FNImageSequenceIter::operator=(const FNImageSequenceIter&) = default;
FNImageSequenceIter::~FNImageSequenceIter() = default;

FNImageSequenceIter::FNImageSequenceIter(const FNCountedPtr<FNImageSequence>& sequence)
    : sequence_(sequence) {
    sequence_->wait();
}

FNImageSequenceIter& FNImageSequenceIter::operator++() {
    if (atEnd()) return *this;
    sequence_->drop();
    sequence_->wait();
    return *this;
}

FNImageReference FNImageSequenceIter::operator*() const {
    if (atEnd()) FN_THROW(FNEBadFunCall, "FNImageSequenceIter::*(): tried to get image beyond end");
    return sequence_->front();
}

bool FNImageSequenceIter::operator==(const FNImageSequenceIter& other) const {
    return atEnd() ? other.atEnd() : !other.atEnd() && sequence_ == other.sequence_;
}

bool FNImageSequenceIter::atEnd() const {
    return !sequence_ || sequence_->atEnd();
}
