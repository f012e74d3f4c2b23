#pragma once

#include "fn/video_source.h"

#include <list>
#include <memory>
#include <utility>

/// Frames of a source over a time, taken by a thread of their own while the caller works on earlier ones.
///
///     FNImageSequenceFactory factory(source, 40);            // 25 frames in a second at most
///     auto [frame, end] = factory.start(5000);
///     for (; frame != end; ++frame) work(*frame);

class FNImageSequence;

/// Walks the frames of one sequence, and waits for them. The sequence belongs to one reader at a time.
class FNImageSequenceIter {
public:
    /// The end of every sequence.
    FNImageSequenceIter();
    FNImageSequenceIter(const FNImageSequenceIter&);
    FNImageSequenceIter& operator=(const FNImageSequenceIter&);
    ~FNImageSequenceIter();
    /// The first frame; waits for it.
    explicit FNImageSequenceIter(const FNCountedPtr<FNImageSequence>& sequence);

    /// Drops the present frame, and waits for the next one if there is none and the sequence is not complete.
    FNImageSequenceIter& operator++();
    /// @throws FNEBadFunCall at the end.
    FNImageReference operator*() const;

    /// Iterators are equal at the end, or on the same sequence.
    bool operator==(const FNImageSequenceIter& other) const;

private:
    bool atEnd() const;

    FNCountedPtr<FNImageSequence> sequence_;
};

/// Takes frames from a source, on a thread that lives as long as this, from the first start() on. A source
/// that fails ends the thread and with it all sequences.
class FNImageSequenceFactory {
public:
    /// @param source gives a fresh reference for each frame, which gets the time as its attribute
    /// "CaptureTime"
    /// @param intervalMs least time from one frame to the next, milliseconds
    FNImageSequenceFactory(const Fn::VideoSource& source, unsigned int intervalMs);
    /// Several sources take turns, in their order, one at each frame. @throws FNEBadArg if there is none
    FNImageSequenceFactory(const std::list<Fn::VideoSource>& sources, unsigned int intervalMs);
    /// Waits for the frame that is being taken; sequences are complete with what they hold.
    ~FNImageSequenceFactory();
    FNImageSequenceFactory(const FNImageSequenceFactory&) = delete;
    FNImageSequenceFactory& operator=(const FNImageSequenceFactory&) = delete;

    /// Opens a sequence of the frames from now to now + durationMs, of at least one frame, and waits for the
    /// first.
    /// @return begin and end. @throws FNEGeneric if the source has failed.
    std::pair<FNImageSequenceIter, FNImageSequenceIter> start(unsigned int durationMs);

private:
    class Loop;
    std::unique_ptr<Loop> loop_;
};
