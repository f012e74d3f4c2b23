#include "fakes.h"
#include "kx/set_identifier.h"
#include "kx/stream_identifier.h"
#include "moving_face.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

namespace Kx {
namespace {

using namespace Fakes;

const Cmp::Score threshold(0.7f);

Cmp::Population population(const World& world, const std::vector<std::pair<std::string, float>>& records) {
    Cmp::Population result = world.strategy().algorithm()->createPopulation(0);
    for (const auto& [id, value] : records) result.add(NumberRecords::record(value), id);
    return result;
}

std::list<SensorSample> samples(const std::vector<unsigned char>& values) {
    std::list<SensorSample> result;
    for (const unsigned char value : values) result.emplace_back(picture(value));
    return result;
}

TEST(SetIdentifier, StopsAtTheFirstPictureWithMatches) {
    const World world;
    const SetIdentifier identifier(settings<SetIdentifier>(), world.faceFinder(), world.eyesFinder(),
                                   world.strategy());
    const Cmp::Population people = population(world, {{"ann", 1}, {"bob", 1.25f}, {"eve", 3}});
    Log log;
    log.listenTo(identifier);
    struct Case {
        std::vector<unsigned char> pictures;
        unsigned int maxMatches;
        const char* events;
    };
    const std::vector<Case> cases = {
        {{Nobody, 200, Blurred, 125, 100},
         9,
         "0:0 blind0 1:200 eyes1(1,3) 2:3 eyes2(1,3) 3:125 eyes3(1,3) matches bob=1 ann=0.75 "},
        {{100}, 1, "0:100 eyes0(1,3) matches ann=1 "},
        {{100, 125}, 0, "0:100 eyes0(1,3) 1:125 eyes1(1,3) matches "},
        {{}, 9, "matches "},
    };
    for (const Case& c : cases) {
        identifier.identify(samples(c.pictures), people, threshold, c.maxMatches);
        EXPECT_EQ(log.take(), c.events);
        identifier.identify(imageSet(c.pictures), people, threshold, c.maxMatches);
        EXPECT_EQ(log.take(), c.events) << "as a set of images";
    }
    identifier.identify({SensorSample(picture(100), rightEye, leftEye)}, people, Cmp::Score(0.75f), 9);
    EXPECT_EQ(log.take(), "0:100 eyes0(3,1) matches ann=1 ") << "a match is above the threshold";
}

TEST(AnnotatedSetIdentifier, SearchesAllPopulationsForEachFace) {
    const World world;
    const AnnotatedSetIdentifier identifier(world.strategy(), settings<AnnotatedSetIdentifier>());
    const std::list<Cmp::Population> people{population(world, {{"ann", 1}}), population(world, {{"bob", 2}})};
    Log log;
    log.listenTo(identifier);
    const std::vector<Cmp::Face> faces{Cmp::Face(picture(Nobody), leftEye, rightEye),
                                       Cmp::Face(picture(200), leftEye, rightEye), Cmp::Face(picture(200))};
    identifier.identify(faces.begin(), faces.end(), Fn::View<Cmp::Population>(people).begin(), threshold, 9);
    EXPECT_EQ(log.take(), "0:0 eyes0(1,3) 1:200 eyes1(1,3) matches bob=1 ");
    EXPECT_EQ(
        thrownBy([&] { identifier.identify(faces.rbegin(), faces.rend(), people.front(), threshold, 9); }),
        "FNEBadFunCall: There is no left eye EyeFinder information for this face!");
    EXPECT_EQ(log.take(), "0:200 ");
}

struct StreamIdentification {
    explicit StreamIdentification(const std::string& values = {}, const World& w = {})
        : world(w), identifier(world.faceFinder(), world.eyesFinder(), world.strategy(),
                               settings<StreamIdentifier>(values), world.clock) {
        log.listenTo(identifier);
    }
    /// @param takes what an image takes, milliseconds
    std::string identify(const std::vector<unsigned char>& pictures, unsigned int takes,
                         const Cmp::Population& people) {
        identifier.identify(
            Fn::VideoSource(FNCountedPtr<Fn::VideoSource::Body>(new Camera(pictures, world.clock, takes))),
            people, threshold, 9);
        return log.take();
    }

    World world;
    StreamIdentifier identifier;
    Log log;
};

TEST(StreamIdentifier, KeepsThePeriodOfTheLifeCheck) {
    EXPECT_EQ(StreamIdentification().identifier.lifeImagePeriod(), 200);
    StreamIdentification search("It.LifeImagePeriod = 7000");
    EXPECT_EQ(search.identifier.lifeImagePeriod(), 7000);
    search.identify({200, 200, 100}, 10, population(search.world, {{"ann", 1}}));
    EXPECT_TRUE(search.world.clock->slept.empty()) << "the source sets the pace";
    EXPECT_EQ(thrownBy([] { StreamIdentification("It.LifeImagePeriod = soon"); }).substr(0, 10),
              "FNEGeneric");
}

TEST(StreamIdentifier, SearchesUntilAnImageHasMatchesOrTimeIsOver) {
    StreamIdentification search("It.TotalTime = 1000");
    const Cmp::Population people = population(search.world, {{"ann", 1}});
    EXPECT_EQ(search.identify({Nobody, 200, Blurred, 100}, 250, people),
              "0:0 blind0 1:200 eyes1(1,3) 2:3 eyes2(1,3) 3:100 eyes3(1,3) matches ann=1 ")
        << "at its end time is not over yet";
    EXPECT_EQ(search.identify({Nobody, 200, 100}, 500, people),
              "0:0 blind0 1:200 eyes1(1,3) 2:100 eyes2(1,3) late matches ann=1 ")
        << "what is found late is found";
    EXPECT_EQ(search.identify({200}, 500, people),
              "0:200 eyes0(1,3) 1:200 eyes1(1,3) 2:200 eyes2(1,3) late matches ");
    EXPECT_EQ(search.identify({100}, 1500, population(search.world, {})), "0:100 eyes0(1,3) late matches ");
}

/// Plays pictures, the last one for ever, at a quarter of a second each.
class Film final : public Fn::VideoSource::Body {
public:
    Film(const std::vector<FNImageReference>& images, const FNCountedPtr<TestClock>& clock)
        : images_(images), clock_(clock) {}
    FNImageReference get() override {
        clock_->pass(250);
        return FNImageReferenceFactory::duplicate(images_[std::min(next_++, images_.size() - 1)]);
    }
    std::string name() override { return "film"; }

private:
    std::vector<FNImageReference> images_;
    std::size_t next_ = 0;
    FNCountedPtr<TestClock> clock_;
};

TEST(StreamIdentifier, WithLifeCheckWithholdsMatchesUntilTheFaceMovesInDepth) {
    const World world;
    const StreamIdentifier identifier(
        MovingFace::faceFinder(), MovingFace::eyesFinder(), world.strategy(),
        settings<StreamIdentifier>("It.TotalTime = 1000\nIt.UseLifeCheck = true"), world.clock);
    Log log;
    log.listenTo(identifier);
    const FNImageReference still = MovingFace::picture(0), turned = MovingFace::picture(5);
    /// @return indexes of the samples and of their eyes, and the outcome
    const auto identify = [&](const std::vector<FNImageReference>& images, float person) {
        identifier.identify(
            Fn::VideoSource(FNCountedPtr<Fn::VideoSource::Body>(new Film(images, world.clock))),
            population(world, {{"ann", person}}), threshold, 9);
        std::istringstream words(log.take());
        std::string result;
        for (std::string word; words >> word;) result += word.substr(0, word.find_first_of(":(=")) + " ";
        return result;
    };
    const float ann = static_cast<float>(valueOf(still) + valueOf(turned)) / 200;
    EXPECT_EQ(identify({still, still, turned}, ann), "0 eyes0 1 eyes0 1 eyes0 matches ann ");
    EXPECT_EQ(identify({still}, ann), "0 eyes0 1 eyes0 1 eyes0 1 eyes0 1 eyes0 late matches ");
    EXPECT_EQ(identify({turned, still}, 9), "0 eyes0 1 eyes1 2 eyes2 3 eyes3 4 eyes4 late matches ");
}

} // namespace
} // namespace Kx
