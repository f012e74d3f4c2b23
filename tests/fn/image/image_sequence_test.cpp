#include "fn/image_sequence.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <thread>

namespace {

/// Gives images whose width is their number, from 1; after the last one it fails.
class CountingSource final : public Fn::VideoSource::Body {
public:
    explicit CountingSource(unsigned last) : last_(last) {}
    FNImageReference get() override {
        if (count_ == last_) FN_THROW(FNEIOError, "the camera is gone");
        FNImage<unsigned char> image(++count_, 1);
        image.fill(0);
        return FNImageReferenceFactory::create(image);
    }
    std::string name() override { return "counting"; }
    std::atomic<unsigned> count_ = 0;

private:
    const unsigned last_;
};

constexpr unsigned endless = 1u << 20;

struct Counting {
    explicit Counting(unsigned last)
        : body(new CountingSource(last)), source(FNCountedPtr<Fn::VideoSource::Body>(body)) {}
    CountingSource* body;
    Fn::VideoSource source;
};

TEST(ImageSequence, GivesFramesInOrderAndThenEnds) {
    const Counting camera(endless);
    FNImageSequenceFactory factory(camera.source, 1);
    auto [frame, end] = factory.start(50);
    unsigned last = 0, frames = 0;
    Fn::TimeStamp time;
    for (; frame != end; ++frame, ++frames) {
        const FNImageReference image = *frame;
        EXPECT_GT(image.w(), last);
        EXPECT_GE(*Fn::getImageCaptureTime(image.attributes()), time);
        last = image.w();
        time = *Fn::getImageCaptureTime(image.attributes());
    }
    EXPECT_GE(frames, 1u);
    EXPECT_EQ(++frame, end) << "the end stays the end";
    EXPECT_EQ(thrownBy([&] { *end; }),
              "FNEBadFunCall: FNImageSequenceIter::*(): tried to get image beyond end");
}

TEST(ImageSequence, SeveralSourcesTakeTurns) {
    const Counting one(endless), other(2);
    FNImageSequenceFactory factory({one.source, other.source}, 0);
    auto [frame, end] = factory.start(1000000);
    std::string widths;
    for (; frame != end; ++frame) widths += std::to_string((*frame).w()) + " ";
    EXPECT_EQ(widths, "1 1 2 2 3 ") << "from the first frame of each to the failure of one";
    EXPECT_EQ(thrownBy([] { FNImageSequenceFactory(std::list<Fn::VideoSource>{}, 1); }),
              "FNEBadArg: Cannot work with empty Image Source List");
}

TEST(ImageSequence, NoFrameIsTakenBeforeThereIsASequence) {
    const Counting camera(endless);
    { const FNImageSequenceFactory factory(camera.source, 0); }
    EXPECT_EQ(camera.body->count_, 0u);
}

TEST(ImageSequence, ASequenceWithoutTimeHasOneFrame) {
    const Counting camera(endless);
    FNImageSequenceFactory factory(camera.source, 1);
    auto [frame, end] = factory.start(0);
    ASSERT_NE(frame, end);
    const unsigned first = (*frame).w();
    while (camera.body->count_ < first + 3) std::this_thread::yield();
    EXPECT_EQ(++frame, end) << "frames taken after its time are not its own";
}

TEST(ImageSequence, SeveralReadersShareTheFrames) {
    const Counting camera(endless);
    FNImageSequenceFactory factory(camera.source, 1);
    auto one = factory.start(20), two = factory.start(20);
    EXPECT_NE(one.first, two.first);
    unsigned frames = 0;
    for (; two.first != two.second; ++two.first) ++frames;
    EXPECT_GE(frames, 1u);
    EXPECT_NE(one.first, one.second);
}

TEST(ImageSequence, AFailedSourceEndsSequencesAndRefusesNewOnes) {
    const Counting camera(3);
    FNImageSequenceFactory factory(camera.source, 5);
    auto [frame, end] = factory.start(1000000);
    unsigned last = 0;
    for (; frame != end; ++frame) last = (*frame).w();
    EXPECT_EQ(last, 3u);
    EXPECT_EQ(thrownBy([&] { factory.start(10); }),
              "FNEGeneric: FNImageSequenceFactory::start: sequence threaddied");
}

TEST(ImageSequence, OutlivesItsFactory) {
    const Counting camera(endless);
    std::pair<FNImageSequenceIter, FNImageSequenceIter> sequence;
    {
        FNImageSequenceFactory factory(camera.source, 1);
        sequence = factory.start(1000000);
    }
    EXPECT_EQ((*sequence.first).h(), 1u);
    while (sequence.first != sequence.second) ++sequence.first;
}

} // namespace
