#include "fakes.h"
#include "kx/annotated_set_enroller.h"
#include "kx/set_enroller.h"
#include "kx/stream_enroller.h"
#include "kx/time_flow_controller.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

namespace Kx {
namespace {

using namespace Fakes;

std::list<SensorSample> samples(const std::vector<unsigned char>& values) {
    std::list<SensorSample> result;
    for (const unsigned char value : values) result.emplace_back(picture(value));
    return result;
}

TEST(SetEnroller, TellsOfEachPictureAndThenOfTheRecord) {
    const World world;
    struct Case {
        const char* settings;
        std::vector<unsigned char> pictures;
        const char* events;
    };
    const std::vector<Case> cases = {
        {"", {100, Nobody, 120}, "0:100 eyes0(1,3) 1:0 blind1 2:120 eyes2(1,3) record 2.2 "},
        {"", {Blind, OneEyed, Blurred}, "0:1 blind0 1:2 blind1 2:3 eyes2(1,3) failed "},
        {"It.MinNumOfSamples = 2", {100, Blurred}, "0:100 eyes0(1,3) 1:3 eyes1(1,3) failed "},
        {"It.MinNumOfSamples = 0", {Nobody}, "0:0 blind0 record 0 "},
        {"", {}, "failed "},
        {"It.EyeDistanceRange.MinEyeDistance = 0.2", {100}, "0:100 blind0 failed "},
    };
    for (const Case& c : cases) {
        const SetEnroller enroller(world.faceFinder(), world.eyesFinder(), world.strategy(),
                                   settings<SetEnroller>(c.settings));
        Log log;
        log.listenTo(enroller);
        enroller.enrol(samples(c.pictures));
        EXPECT_EQ(log.take(), c.events);
        enroller.enrol(imageSet(c.pictures));
        EXPECT_EQ(log.take(), c.events) << "as a set of images";
    }
}

TEST(SetEnroller, LooksForEyesThatAreNotBothKnown) {
    const World world;
    const SetEnroller enroller(world.faceFinder(), world.eyesFinder(), world.strategy(),
                               settings<SetEnroller>());
    Log log;
    log.listenTo(enroller);
    std::list<SensorSample> known;
    known.emplace_back(picture(Nobody), FacialFeatureLocation{{7, 1}}, FacialFeatureLocation{{9, 1}});
    for (const unsigned char value : {Person, Nobody}) {
        known.emplace_back(picture(value));
        known.back().leftEye = FacialFeatureLocation{{7, 1}};
    }
    enroller.enrol(known);
    EXPECT_EQ(log.take(), "0:0 eyes0(7,9) 1:100 eyes1(1,3) 2:0 blind2 record 1 ");
}

TEST(SetEnroller, BelievesAttributesOfItsOwnFinders) {
    const World world;
    const SetEnroller enroller(world.faceFinder(), world.eyesFinder(), world.strategy(),
                               settings<SetEnroller>());
    Log log;
    log.listenTo(enroller);
    struct Case {
        const char *id, *positions, *events;
    };
    const std::vector<Case> cases = {
        {"eyesfaces", "5:6:1: 8.5:6:0.5", "0:0 eyes0(5,8.5) record 0 "},
        {"eyesfaces", "0.5:0.5:1:8:6:0.5", "0:0 blind0 failed "},
        {"eyesfaces", "0.5:6:1:8:0.5:0.5", "0:0 eyes0(0.5,8) record 0 "},
        {"eyesfaces", "5:6:1:8:6", "0:0 blind0 failed "},
        {"eyesfaces", "5:6:1:8:6:1:1", "0:0 blind0 failed "},
        {"eyesfaces", "5:6:1:8::1", "0:0 blind0 failed "},
        {"eyesfaces", "5:6:1:nan:6:1", "0:0 blind0 failed "},
        {"eyesfaces", "", "0:0 blind0 failed "},
        {"faceseyes", "5:6:1:8:6:1", "0:0 blind0 failed "},
    };
    for (const Case& c : cases) {
        SensorSample sample(picture(Nobody));
        sample.image.attributes() = {{"EyeFinderID", c.id}, {"EyePositions", c.positions}};
        enroller.enrol({sample});
        EXPECT_EQ(log.take(), c.events) << c.id << " " << c.positions;
    }
}

TEST(SetEnroller, DropsAndMergesWhatItIsTold) {
    const World world;
    const SetEnroller enroller(world.faceFinder(), world.eyesFinder(), world.strategy(),
                               settings<SetEnroller>("It.MinNumOfSamples = 2"));
    Log log;
    log.listenTo(enroller);
    const auto dropping = [&](const std::list<int>& dropped, const std::list<Cmp::FIR>& firs) {
        enroller.enrol(
            samples({100, 120, 150}), [=] { return dropped; }, [=] { return firs; });
        return log.take().substr(std::string("0:100 eyes0(1,3) 1:120 eyes1(1,3) 2:150 eyes2(1,3) ").size());
    };
    EXPECT_EQ(dropping({1, 7}, {NumberRecords::record(10), NumberRecords::record(20)}), "record 32.5 ");
    EXPECT_EQ(dropping({1, 0}, {}), "failed ");
}

TEST(SetEnroller, AnObserverThatFailsIsLeftOut) {
    const World world;
    const SetEnroller enroller(world.faceFinder(), world.eyesFinder(), world.strategy(),
                               settings<SetEnroller>());
    int calls = 0;
    enroller.addObserver(
        Fn::Functor1<OperationInterest::ProcessingSample>([&](const OperationInterest::ProcessingSample&) {
            ++calls;
            throw std::runtime_error("no");
        }));
    Log log;
    log.listenTo(enroller);
    enroller.enrol(samples({100, 110}));
    EXPECT_EQ(log.take(), "0:100 eyes0(1,3) 1:110 eyes1(1,3) record 2.1 ");
    EXPECT_EQ(calls, 1);
}

TEST(SampleDataCollector, KeepsTheLastOfAnIndex) {
    Implementation::SampleDataCollector samples;
    samples.insert(3, 0, picture(1));
    samples.remove(3);
    samples.remove(4);
    EXPECT_TRUE(samples.accepted().empty());
    EXPECT_EQ(samples.removed().at(3).id, 0);
    samples.insert(3, 1, picture(2));
    EXPECT_EQ(samples.accepted().at(3).id, 1);
    EXPECT_TRUE(samples.removed().empty());
}

TEST(AnnotatedSetEnroller, TakesTheEyesFromTheFace) {
    const World world;
    const AnnotatedSetEnroller enroller(world.strategy(), settings<AnnotatedSetEnroller>());
    Log log;
    log.listenTo(enroller);
    const Cmp::Face found(picture(100), FaceFinder::Location{{2, 2}, 3, 1, 0});
    const std::vector<Cmp::Face> faces{found, found, Cmp::Face(picture(100), leftEye, rightEye)};
    enroller.enrol(faces.begin(), faces.begin() + 2);
    EXPECT_EQ(log.take(), "0:100 face0(3) 1:100 face1(3) record 2 ");
    EXPECT_EQ(thrownBy([&] { enroller.enrol(faces.begin() + 1, faces.end()); }),
              "FNEBadFunCall: There is no FaceFinder information for this face!");
    EXPECT_EQ(log.take(), "0:100 face0(3) 1:100 ");
}

TEST(SensorSample, CarriesWhatItHasToTheComparison) {
    SensorSample sample(picture(1));
    EXPECT_EQ(thrownBy([&] { sample.cmpSample(); }),
              "FNEBadFunCall: Cannot form Cmp Sample without annotations");
    sample.leftEye = leftEye;
    sample.rightEye = rightEye;
    sample.vertexImage = FNCountedPtr<Fn::VertexImage>(new Fn::VertexImage(2, 2));
    sample.firstEye3D = FN3Vector<double>{1, 2, 3};
    const Cmp::Sample scan = sample.cmpSample();
    EXPECT_EQ(scan.rightEye->x, 3);
    EXPECT_TRUE(scan.vertexImage && !scan.shapeLeftEye);
    sample.pointSet = FNCountedPtr<ShapeImage::TexturedPointSet>(new ShapeImage::TexturedPointSet);
    sample.secondEye3D = FN3Vector<double>{4, 5, 6};
    const Cmp::Sample points = sample.cmpSample();
    EXPECT_TRUE(points.pointSet && !points.vertexImage);
    EXPECT_EQ(points.shapeRightEye->y, 5);
}

TEST(TimeFlowController, CountsWhatIsNotHeld) {
    const FNCountedPtr<TestClock> clock(new TestClock);
    TimeFlowController time(1000, 250, clock);
    clock->pass(1000);
    EXPECT_FALSE(time.elapsed()) << "exactly the limit";
    time.hold();
    clock->pass(400);
    time.hold();
    clock->pass(100);
    EXPECT_FALSE(time.elapsed()) << "while it is held";
    time.release();
    time.release();
    EXPECT_FALSE(time.elapsed());
    clock->pass(125);
    EXPECT_TRUE(time.elapsed());
    time.waitMinPeriod();
    clock->pass(125);
    time.waitMinPeriod();
    EXPECT_EQ(clock->slept, (std::vector<unsigned int>{125}));
}

/// A stream enrolment on cameras.
struct Stream {
    explicit Stream(const std::string& values, const World& w = {})
        : world(w), enroller(world.faceFinder(), world.eyesFinder(), world.strategy(),
                             settings<StreamEnroller>(values), world.clock) {
        log.listenTo(enroller);
    }
    void camera(const std::vector<unsigned char>& pictures, unsigned int takes = 0) {
        sources.emplace_back(FNCountedPtr<Fn::VideoSource::Body>(new Camera(pictures, world.clock, takes)));
    }
    std::string enrol(const Fn::Functor0Ret<bool>& morePasses = {}) {
        enroller.enrol(sources, morePasses);
        return log.take();
    }

    World world;
    StreamEnroller enroller;
    Log log;
    std::list<Fn::VideoSource> sources;
};

TEST(StreamEnroller, CountsAcquisitionsWithASample) {
    Stream stream("It.NumOfAcquisitions = 2\nIt.MinImageTime = 0");
    stream.camera({Nobody, 100, Blurred, 120});
    EXPECT_EQ(stream.enrol(), "0:0 blind0 0:100 eyes0(1,3) 1:3 eyes1(1,3) 1:120 eyes1(1,3) record 2.2 ");
    Stream pair("It.NumOfAcquisitions = 2\nIt.MinImageTime = 0");
    pair.camera({100, Nobody, Nobody});
    pair.camera({Nobody, Nobody, 150, 1});
    EXPECT_EQ(pair.enrol(), "0:100 eyes0(1,3) 1:0 blind1 2:0 blind2 3:0 blind3 2:0 blind2 3:150 eyes3(1,3) "
                            "record 2.5 ");
    EXPECT_TRUE(pair.world.clock->slept.empty());
}

TEST(StreamEnroller, WithoutSourcesOrAcquisitionsThereIsNothing) {
    Stream none("");
    int asked = 0;
    EXPECT_EQ(none.enrol([&] { return ++asked < 3; }), "failed ");
    EXPECT_EQ(asked, 3);
    Stream zero("It.NumOfAcquisitions = 0");
    zero.camera({100});
    EXPECT_EQ(zero.enrol(), "failed ");
}

TEST(StreamEnroller, PassesGoOnWithTheSamplesOfTheOnesBefore) {
    Stream stream("It.NumOfAcquisitions = 1\nIt.TotalEnrollmentTime = 300\nIt.MinImageTime = 0");
    stream.camera({100, 110, 120}, 200);
    int passes = 0;
    EXPECT_EQ(stream.enrol([&] { return ++passes < 3; }),
              "0:100 eyes0(1,3) 1:110 eyes1(1,3) 2:120 eyes2(1,3) record 3.3 ")
        << "each pass has a time of its own";
}

TEST(StreamEnroller, EndsWithoutARecordWhenTimeIsOver) {
    Stream stream("It.TotalEnrollmentTime = 1000\nIt.MinImageTime = 0");
    stream.camera({Nobody}, 500);
    EXPECT_EQ(stream.enrol(), "0:0 blind0 0:0 blind0 0:0 blind0 late ");
    World slow;
    slow.findingTakes = 400;
    slow.extractionTakes = 5000; // does not count, as do observers
    Stream busy("It.TotalEnrollmentTime = 1000\nIt.MinImageTime = 0", slow);
    busy.log.atEachSample = [&] { slow.clock->pass(3000); };
    busy.camera({100}, 100);
    EXPECT_EQ(busy.enrol(), "0:100 eyes0(1,3) 1:100 eyes1(1,3) 2:100 eyes2(1,3) late ");
}

TEST(StreamEnroller, WaitsBeforeAllButTheFirstAcquisition) {
    World world;
    world.findingTakes = 250;
    Stream stream("It.NumOfAcquisitions = 3\nIt.MinImageTime = 1000", world);
    stream.camera({Nobody, 100, 100, 100}, 125);
    stream.enrol();
    // The second one has the index of the first, which did not count: no wait. The third is taken at 875 ms,
    // the fourth 375 ms after the end of that wait.
    EXPECT_EQ(world.clock->slept, (std::vector<unsigned int>{125, 625}));
}

TEST(StreamEnroller, ImagesBearTheNameOfTheirSource) {
    Stream stream("It.NumOfAcquisitions = 1");
    stream.camera({100});
    stream.camera({100, 100});
    std::string names;
    stream.enroller.addObserver(
        Fn::Functor1<OperationInterest::ProcessingSample>([&](const OperationInterest::ProcessingSample& e) {
            names += *Fn::getImageSrcNameAttribute(e.image.attributes()) + " ";
        }));
    stream.enrol();
    EXPECT_EQ(names, "camera1 camera2 ");
}

/// Counts conversions.
class Counting final : public FNImageReference::Representation {
public:
    explicit Counting(int& conversions) : conversions_(conversions) {}
    std::uint32_t w() const override { return image_.w(); }
    std::uint32_t h() const override { return image_.h(); }
    void setSerializationStrategy(FNImageReference::SerializationStrategy) const override {}
    FNImageReference::SerializationStrategy getSerializationStrategy() const override { return {}; }
    FNImage<unsigned char> toMono8() const override { return ++conversions_, image_.toMono8(); }
    FNImage<unsigned short> toMono16() const override { return ++conversions_, image_.toMono16(); }
    FNImage<float> toMonoFloat() const override { return ++conversions_, image_.toMonoFloat(); }
    FNImage<Fn::Bgra32> toBgra32() const override { return image_.toBgra32(); }
    FNImage<Fn::Rgb48> toRgb48() const override { return image_.toRgb48(); }
    const FNImageAttributes& attributes() const override { return image_.attributes(); }
    FNImageAttributes& attributes() override { return image_.attributes(); }
    bool isColor() const override { return true; }
    FNImageReference::PixelType native() const override { return FNImageReference::BGRA32; }

private:
    FNImageReference image_ = picture(100);
    int& conversions_;
};

TEST(IntensityCachingImage, MakesEachGrayFormOnce) {
    const World world;
    const SetEnroller enroller(world.faceFinder(), world.eyesFinder(), world.strategy(),
                               settings<SetEnroller>());
    int conversions = 0;
    const SensorSample sample(
        FNImageReference(FNCountedPtr<FNImageReference::Representation>(new Counting(conversions))));
    enroller.enrol({sample});
    EXPECT_EQ(conversions, 1) << "for the face, the eyes and the record";
    const FNImageReference caching = Implementation::cachingIntensity(sample.image);
    for (int i = 0; i < 2; ++i) {
        EXPECT_EQ(caching.toMono16().get({0, 0}), sample.image.toMono16().get({0, 0}));
        EXPECT_EQ(caching.toMonoFloat().get({0, 0}), sample.image.toMonoFloat().get({0, 0}));
    }
    EXPECT_EQ(conversions, 1 + 2 + 4);
    EXPECT_EQ(caching.native(), FNImageReference::BGRA32);
}

} // namespace
} // namespace Kx
