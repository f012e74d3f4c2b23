#include "fakes.h"
#include "kx/set_enroller.h"
#include "kx/set_identifier.h"
#include "kx/set_recognizer.h"
#include "kx/stream_enroller.h"
#include "kx/stream_identifier.h"
#include "kx/stream_recognizer.h"

#include <gtest/gtest.h>

namespace Kx {
namespace {

using namespace Fakes;

/// A picture whose attributes say where the eyes are that no finder finds in it.
FNImageReference attributed() {
    FNImageReference image = picture(Nobody);
    image.attributes() = {{"EyeFinderID", "eyesfaces"}, {"EyePositions", "5:6:1:8:6:0.5"}};
    return image;
}

class AttributedCamera final : public Fn::VideoSource::Body {
public:
    FNImageReference get() override { return attributed(); }
    std::string name() override { return "attributed"; }
};

class AttributedSet final : public FNImageSet::Body {
public:
    int count() const override { return 1; }
    FNImageReference get(int) const override { return attributed(); }
};

/// What an operation says of the eyes in it, as samples, as a set of images or from a camera.
struct Attributed {
    const World world;
    const std::list<SensorSample> samples{SensorSample(attributed())};
    const FNImageSet set{FNCountedPtr<FNImageSet::Body>(new AttributedSet)};
    const std::list<Fn::VideoSource> cameras{
        Fn::VideoSource(FNCountedPtr<Fn::VideoSource::Body>(new AttributedCamera))};
    const Cmp::FIR nobody = NumberRecords::record(9);
    const Cmp::Population people = world.strategy().algorithm()->createPopulation(0);

    template <class Operation> Operation ofSet() const {
        return Operation(settings<Operation>(), world.faceFinder(), world.eyesFinder(), world.strategy());
    }
    template <class Operation> Operation ofStream(const std::string& values) const {
        return Operation(world.faceFinder(), world.eyesFinder(), world.strategy(),
                         settings<Operation>(values), world.clock);
    }
    /// @return the first event behind that of the sample, of each run
    template <class Operation, class... Runs>
    std::vector<std::string> eyesOf(const Operation& operation, Runs... runs) const {
        Log log;
        log.listenTo(operation);
        log.atEachSample = [this] { world.clock->pass(10); };
        const auto eyes = [&](auto run) {
            run(operation);
            std::istringstream words(log.take());
            std::string word;
            words >> word >> word;
            return word;
        };
        return {eyes(runs)...};
    }
};

TEST(EyeAttributes, AreBelievedWhereSetsAreEnrolledOrRecognized) {
    const Attributed a;
    const Cmp::Score threshold(0.5f);
    using Words = std::vector<std::string>;
    const Words believed(2, "eyes0(5,8)"), searched(2, "blind0");
    const SetEnroller enroller(a.world.faceFinder(), a.world.eyesFinder(), a.world.strategy(),
                               settings<SetEnroller>());
    EXPECT_EQ(a.eyesOf(
                  enroller, [&](auto& o) { o.enrol(a.samples); }, [&](auto& o) { o.enrol(a.set); }),
              believed);
    EXPECT_EQ(a.eyesOf(
                  a.ofSet<SetRecognizer>(), [&](auto& o) { o.recognize(a.samples, a.nobody, threshold); },
                  [&](auto& o) { o.recognize(a.set, a.nobody, threshold); }),
              believed);
    EXPECT_EQ(a.eyesOf(
                  a.ofSet<SetIdentifier>(), [&](auto& o) { o.identify(a.samples, a.people, threshold, 1); },
                  [&](auto& o) { o.identify(a.set, a.people, threshold, 1); }),
              searched);

    const Words fromCamera(1, "blind0");
    EXPECT_EQ(a.eyesOf(a.ofStream<StreamEnroller>("It.TotalEnrollmentTime = 5"),
                       [&](auto& o) { o.enrol(a.cameras); }),
              fromCamera);
    EXPECT_EQ(a.eyesOf(a.ofStream<StreamRecognizer>("It.MaxNumOfImages = 1"),
                       [&](auto& o) { o.recognize(a.cameras, a.nobody, threshold); }),
              fromCamera);
    EXPECT_EQ(a.eyesOf(a.ofStream<StreamIdentifier>("It.TotalTime = 5"),
                       [&](auto& o) { o.identify(a.cameras.front(), a.people, threshold, 1); }),
              fromCamera);
}

} // namespace
} // namespace Kx
