#include "fakes.h"
#include "kx/set_enroller.h"
#include "kx/set_recognizer.h"
#include "kx/stream_recognizer.h"
#include "moving_face.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

namespace Kx {
namespace {

using namespace Fakes;
using NumberRecords::record;

/// Scores fall from 1, where a picture has the value of the reference, by 0.01 for each step of gray.
const Cmp::FIR reference = record(1);
const Cmp::Score threshold(0.75f);

std::list<SensorSample> samples(const std::vector<unsigned char>& values) {
    std::list<SensorSample> result;
    for (const unsigned char value : values) result.emplace_back(picture(value));
    return result;
}

TEST(SetRecognizer, StopsAtTheFirstPictureThatIsAccepted) {
    const World world;
    const SetRecognizer recognizer(settings<SetRecognizer>(), world.faceFinder(), world.eyesFinder(),
                                   world.strategy());
    Log log;
    log.listenTo(recognizer);
    struct Case {
        std::vector<unsigned char> pictures;
        const char* events;
    };
    const std::vector<Case> cases = {
        {{Nobody, 150, Blurred, 125, 100},
         "0:0 blind0 1:150 eyes1(1,3) probe1(1.5) score1(0.5) no1 2:3 eyes2(1,3) no2 "
         "3:125 eyes3(1,3) probe3(1.25) score3(0.75) yes3 accepted "},
        {{150, OneEyed}, "0:150 eyes0(1,3) probe0(1.5) score0(0.5) no0 1:2 blind1 rejected "},
        {{}, "rejected "},
    };
    for (const Case& c : cases) {
        recognizer.recognize(samples(c.pictures), reference, threshold);
        EXPECT_EQ(log.take(), c.events);
        recognizer.recognize(imageSet(c.pictures), reference, threshold);
        EXPECT_EQ(log.take(), c.events) << "as a set of images";
    }
    recognizer.recognize(samples({100}), record(std::nanf("")), Cmp::Score(0));
    EXPECT_EQ(log.take(), "0:100 eyes0(1,3) probe0(1) score0(nan) no0 rejected ");
    recognizer.recognize({SensorSample(picture(Nobody), leftEye, rightEye)}, record(0), threshold);
    EXPECT_EQ(log.take(), "0:0 eyes0(1,3) probe0(0) score0(1) yes0 accepted ");
}

TEST(Samples, WhoseFaceIsNotInThePictureAreNotTaken) {
    const World world; // whose pictures have 12 x 8 pixels
    const struct {
        FNPos left, right;
        bool taken;
    } cases[] = {
        {{1, 2}, {3, 2}, true},          {{-4, 2}, {4, 2}, true},
        {{8, 2}, {16, 2}, true}, // to the middle
        {{-4.1f, 2}, {4, 2}, false},     {{8, 2}, {16.1f, 2}, false},
        {{4, -4.1f}, {4, 4}, false},     {{4, 4}, {5, 12.1f}, false},
        {{-1, 2}, {13, 2}, false}, // larger than the picture
        {{20, 2}, {24, 2}, false},       {{-9, 2}, {-5, 2}, false},
        {{1, -20}, {3, -20}, false},     {{1, 1e6f}, {3, 1e6f}, false},
        {{1e30f, 0}, {3e30f, 0}, false}, {{std::nanf(""), 2}, {3, 2}, false},
    };
    const SetRecognizer recognizer(settings<SetRecognizer>(), world.faceFinder(), world.eyesFinder(),
                                   world.strategy());
    const SetEnroller enroller(world.faceFinder(), world.eyesFinder(), world.strategy(),
                               settings<SetEnroller>());
    Log recognized, enrolled;
    recognized.listenTo(recognizer);
    enrolled.listenTo(enroller);
    for (const auto& c : cases) {
        const std::list<SensorSample> one{
            SensorSample(picture(100), FacialFeatureLocation{c.left}, FacialFeatureLocation{c.right})};
        recognizer.recognize(one, reference, threshold);
        EXPECT_TRUE(recognized.take().ends_with(c.taken ? "yes0 accepted " : ") no0 rejected "))
            << c.left.x << " " << c.right.x;
        enroller.enrol(one);
        EXPECT_TRUE(enrolled.take().ends_with(c.taken ? "record 1 " : ") failed "))
            << c.left.x << " " << c.right.x;
    }
}

TEST(AnnotatedSetRecognizer, TakesTheEyesAsTheyAre) {
    const World world;
    const AnnotatedSetRecognizer recognizer(world.strategy(), settings<AnnotatedSetRecognizer>());
    Log log;
    log.listenTo(recognizer);
    const std::list<Cmp::Face> faces{Cmp::Face(picture(Nobody), leftEye, rightEye),
                                     Cmp::Face(picture(100), rightEye, leftEye), Cmp::Face(picture(100))};
    recognizer.recognize(faces.begin(), faces.end(), reference, threshold);
    EXPECT_EQ(log.take(), "0:0 eyes0(1,3) probe0(0) score0(0) no0 1:100 eyes1(3,1) probe1(1) score1(1) yes1 "
                          "accepted ");
    EXPECT_EQ(thrownBy([&] { recognizer.recognize(faces.rbegin(), faces.rend(), reference, threshold); }),
              "FNEBadFunCall: There is no left eye EyeFinder information for this face!");
    EXPECT_EQ(log.take(), "0:100 ");
}

Fn::VideoSource camera(const World& world, const std::vector<unsigned char>& pictures) {
    return Fn::VideoSource(FNCountedPtr<Fn::VideoSource::Body>(new Camera(pictures, world.clock)));
}

/// A camera that breaks behind its last picture.
class Breaking final : public Fn::VideoSource::Body {
public:
    explicit Breaking(const std::vector<FNImageReference>& images) : images_(images) {}
    FNImageReference get() override { return images_.at(next_++); }
    std::string name() override { return "breaking"; }

private:
    std::vector<FNImageReference> images_;
    std::size_t next_ = 0;
};

Fn::VideoSource breaking(const std::vector<FNImageReference>& images) {
    return Fn::VideoSource(FNCountedPtr<Fn::VideoSource::Body>(new Breaking(images)));
}

struct StreamVerification {
    explicit StreamVerification(const std::string& values, const World& w = {})
        : world(w), recognizer(world.faceFinder(), world.eyesFinder(), world.strategy(),
                               settings<StreamRecognizer>("It.ImagePeriod = 1\n" + values), world.clock) {
        log.listenTo(recognizer);
    }
    std::string recognize(const Fn::VideoSource& source, const Cmp::FIR& person = reference) {
        recognizer.recognize(source, person, threshold);
        return log.take();
    }

    World world;
    StreamRecognizer recognizer;
    Log log;
};

TEST(StreamRecognizer, TriesUntilAnImageIsAccepted) {
    StreamVerification verification("");
    EXPECT_EQ(verification.recognize(camera(verification.world, {Nobody, 150, Blurred, 100})),
              "0:0 blind0 1:150 eyes1(1,3) probe1(1.5) score1(0.5) no1 2:3 eyes2(1,3) no2 "
              "3:100 eyes3(1,3) probe3(1) score3(1) yes3 accepted ");
    EXPECT_EQ(verification.recognize(breaking({picture(Nobody), picture(Blind)})),
              "0:0 blind0 1:1 blind1 rejected ")
        << "the end of the source";
    EXPECT_EQ(thrownBy([&] {
                  verification.recognizer.recognize(std::list<Fn::VideoSource>{}, reference, threshold);
              }),
              "FNEBadArg: Cannot work with empty Image Source List");
    EXPECT_EQ(verification.log.take(), "");
}

TEST(StreamRecognizer, KeepsToTheNumberOfImages) {
    for (const char* images : {"1", "0"}) {
        StreamVerification verification(std::string("It.MaxNumOfImages = ") + images);
        EXPECT_EQ(verification.recognize(camera(verification.world, {Nobody})), "0:0 blind0 rejected ");
    }
    StreamVerification three("It.MaxNumOfImages = 3");
    EXPECT_EQ(three.recognize(camera(three.world, {Nobody})), "0:0 blind0 1:0 blind1 2:0 blind2 rejected ");
}

TEST(StreamRecognizer, AsksTheTimeAfterEachImage) {
    World slow;
    slow.findingTakes = 500;
    StreamVerification late("It.TotalTime = 1000", slow);
    EXPECT_EQ(late.recognize(camera(slow, {Nobody})), "0:0 blind0 1:0 blind1 late rejected ")
        << "at the limit";
    StreamVerification inTime("It.TotalTime = 1001", slow);
    EXPECT_EQ(inTime.recognize(camera(slow, {Nobody})), "0:0 blind0 1:0 blind1 2:0 blind2 late rejected ");
    StreamVerification none("It.TotalTime = 0");
    EXPECT_EQ(none.recognize(camera(none.world, {100})),
              "0:100 eyes0(1,3) probe0(1) score0(1) yes0 late accepted ")
        << "what is accepted stays so";
    StreamVerification both("It.TotalTime = 0\nIt.MaxNumOfImages = 1");
    EXPECT_EQ(both.recognize(camera(both.world, {Nobody})), "0:0 blind0 late rejected ");
}

TEST(StreamRecognizer, MakesItsReferenceOfFaces) {
    StreamVerification verification("");
    const auto recognize = [&](const std::list<Cmp::Face>& faces) {
        verification.recognizer.recognize(std::list{camera(verification.world, {200})}, faces, threshold);
    };
    recognize({Cmp::Face(picture(Nobody)), Cmp::Face(picture(100)), Cmp::Face(picture(Blurred)),
               Cmp::Face(picture(101), leftEye, rightEye)});
    EXPECT_EQ(verification.log.take().substr(0, 38), "0:200 eyes0(1,3) probe0(2) score0(0.99");
    for (const std::list<Cmp::Face>& faces :
         {std::list<Cmp::Face>{}, {Cmp::Face(picture(Nobody)), Cmp::Face(picture(Blurred))}})
        EXPECT_EQ(thrownBy([&] { recognize(faces); }), "FNEGeneric: Creation of FIR failed");
}

TEST(StreamRecognizer, WithLifeCheckAcceptsAFaceThatMovesInDepth) {
    const World world;
    const StreamRecognizer recognizer(
        MovingFace::faceFinder(), MovingFace::eyesFinder(), world.strategy(),
        settings<StreamRecognizer>("It.ImagePeriod = 1\nIt.UseLifeCheck = true"), world.clock);
    Log log;
    log.listenTo(recognizer);
    const FNImageReference still = MovingFace::picture(0), turned = MovingFace::picture(5);
    const Cmp::FIR both = record(static_cast<float>(valueOf(still) + valueOf(turned)) / 200);
    /// @return which pictures were accepted, and the outcome
    const auto recognize = [&](const std::vector<FNImageReference>& images, const Cmp::FIR& person) {
        recognizer.recognize(breaking(images), person, threshold);
        std::istringstream words(log.take());
        std::string result;
        for (std::string word; words >> word;)
            if (word.starts_with("yes") || word.starts_with("no") || word.ends_with("ted"))
                result += word + " ";
        return result;
    };
    EXPECT_EQ(recognize({still, still, turned, still}, both), "yes0 yes1 yes2 accepted ");
    EXPECT_EQ(recognize({still, still, still}, both), "yes0 yes1 yes2 rejected ");
    EXPECT_EQ(recognize({still}, both), "yes0 rejected ");
    EXPECT_EQ(recognize({turned, still, turned}, record(9)), "no0 no1 no2 rejected ");
}

} // namespace
} // namespace Kx
