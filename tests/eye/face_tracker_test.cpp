#include "eye/tracker/reference_face_tracker.h"

#include "fn/deployment/app_config_db.h"
#include "fn/image_reference.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

namespace {

using namespace Fn::Deployment;
using Eye::ReferenceFaceTracker;
using FaceInfo = Eye::FaceTracker::FaceInfo;
using Locations = std::list<FaceFinder::Location>;

/// Finds what the test says, and keeps how it was asked.
class ScriptedFinder final : public FaceFinder::Body {
public:
    bool find(const FNImageReference&, Locations& locations, double least, double greatest,
              const FNBox&) const override {
        asked = {least, greatest, -1};
        locations = next;
        return !next.empty();
    }
    bool findInStream(const FNImageReference& image, Locations& locations, double least, double greatest,
                      int frameNumber, const FNBox& box) override {
        const bool found = find(image, locations, least, greatest, box);
        asked.frameNumber = frameNumber;
        return found;
    }
    std::string processingId() const override { return "scripted"; }

    struct Asked {
        double least, greatest;
        int frameNumber;
    };
    Locations next;
    mutable Asked asked{};
};

using Settings = std::map<std::string, std::string>;

/// A tracker with a scripted finder and an observer. With the default field of view and frames of 1000
/// columns, a face with an eye distance of 70 pixels is 0.866 m away and a pixel there is a millimetre.
class Stream {
public:
    explicit Stream(const Settings& settings = {}) {
        for (const auto& [key, value] : settings) db_->set("T." + key, value);
        const Component component(db_, Property(type<ReferenceFaceTracker>(), "T", "", "", false));
        tracker_ = FNCountedPtr<ReferenceFaceTracker>(
            new ReferenceFaceTracker(component, FaceFinder(FNCountedPtr<FaceFinder::Body>(finder_))));
        tracker_->addObserver([this](const FNImageReference&, const Eye::FaceTracker::FaceInfos& faces) {
            ++broadcasts;
            faces_ = faces;
        });
    }

    /// The faces of a frame, -1 as time for the next at the frame rate.
    std::vector<FaceInfo> frame(const Locations& locations, long time = -1, std::uint32_t width = 1000) {
        finder_.get()->next = locations;
        const FNImageReference image = FNImageReferenceFactory::create(FNImage<unsigned char>(width, 10));
        if (time < 0)
            tracker_->processFrame(image);
        else
            tracker_->processFrame(image, static_cast<unsigned int>(time));
        return {faces_.begin(), faces_.end()};
    }
    const ScriptedFinder& finder() const { return *finder_; }
    int broadcasts = 0;

private:
    FNCountedPtr<AppConfigDB> db_{new AppVolatileConfigDB};
    FNCountedPtr<ScriptedFinder> finder_{new ScriptedFinder};
    FNCountedPtr<ReferenceFaceTracker> tracker_;
    Eye::FaceTracker::FaceInfos faces_;
};

FaceFinder::Location at(float x, float y, float width = 70, float confidence = 1) {
    return {{x, y}, width, confidence, 0};
}

TEST(ReferenceFaceTracker, AFaceKeepsItsIdentityAsFarAsItCanHaveMoved) {
    // 40 ms at 1 m/s are 40 mm.
    for (const auto& [x, width, same] :
         {std::tuple{539.0f, 70.0f, true}, std::tuple{541.0f, 70.0f, false},
          std::tuple{500.0f, 72.0f, true},     // 3 % nearer: within the tolerance of depth
          std::tuple{500.0f, 78.0f, true},     // 90 mm nearer, of which the tolerance takes 82
          std::tuple{500.0f, 87.0f, false}}) { // 169 mm nearer, of which the tolerance takes 78
        Stream stream;
        const auto first = stream.frame({at(500, 5)}), second = stream.frame({at(x, 5, width)});
        ASSERT_EQ(second.size(), 1u);
        EXPECT_EQ(first.front().identity() == second.front().identity(), same) << x << ", " << width;
    }
    Stream fast(Settings{{"MaxAllowedFaceSpeed", "2"}, {"FrameRate", "10"}});
    const auto first = fast.frame({at(500, 5)}), second = fast.frame({at(699, 5)}),
               third = fast.frame({at(901, 5)});
    EXPECT_EQ(first.front().identity(), second.front().identity());
    EXPECT_NE(second.front().identity(), third.front().identity());
}

TEST(ReferenceFaceTracker, IdentitiesGoToTheMoreConfidentAndToTheNearest) {
    Stream stream;
    const auto first = stream.frame({at(500, 5), at(600, 5)});
    ASSERT_NE(first[0].identity(), first[1].identity());
    const auto second = stream.frame({at(505, 5), at(595, 5), at(598, 5)});
    ASSERT_EQ(second.size(), 3u);
    EXPECT_EQ(second[0].identity(), first[0].identity());
    EXPECT_EQ(second[1].identity(), first[1].identity());
    EXPECT_NE(second[2].identity(), first[0].identity());
    EXPECT_NE(second[2].identity(), first[1].identity());
    EXPECT_EQ(second[1].location().pos, (FNPos{595, 5}));
    EXPECT_NEAR(second[1].distanceFromCamera(), 0.866, 0.001);

    Stream nearest;
    const auto before = nearest.frame({at(500, 5), at(520, 5)});
    EXPECT_EQ(nearest.frame({at(515, 5)}).front().identity(), before[1].identity());
}

TEST(ReferenceFaceTracker, TracksEndWithAMissedFrameAndWithAnotherSize) {
    Stream stream;
    const std::string first = stream.frame({at(500, 5)}).front().identity();
    EXPECT_TRUE(stream.frame({}).empty());
    EXPECT_EQ(stream.broadcasts, 2) << "empty lists are told, too";
    const std::string again = stream.frame({at(500, 5)}).front().identity();
    EXPECT_NE(again, first);
    EXPECT_NE(stream.frame({at(500, 5)}, -1, 999).front().identity(), again);
}

TEST(ReferenceFaceTracker, TheCallersClockCounts) {
    Stream stream;
    const std::string id = stream.frame({at(500, 5)}, 1000).front().identity();
    EXPECT_EQ(stream.frame({at(500, 5)}, 1000).front().identity(), id) << "nothing moved, no time passed";
    EXPECT_EQ(stream.frame({at(599, 5)}, 900).front().identity(), id) << "whatever the order of times";
    EXPECT_NE(stream.frame({at(600, 5)}, 900).front().identity(), id);
    // The last tick before the wrap; the next frame is far away in time, so that anything can match.
    const std::string last = stream.frame({at(100, 5)}, 2073599999).front().identity();
    EXPECT_EQ(stream.frame({at(900, 5)}).front().identity(), last);
}

TEST(ReferenceFaceTracker, UnsureFacesAreFollowedButNotReturned) {
    Stream stream(Settings{{"ReturnFacesWithNoEyesThreshold", "0.5"}});
    const std::string id = stream.frame({at(500, 5)}).front().identity();
    EXPECT_TRUE(stream.frame({at(530, 5, 70, 0.4f)}).empty());
    EXPECT_EQ(stream.frame({at(560, 5)}).front().identity(), id);
}

TEST(ReferenceFaceTracker, AsksTheFinderAsConfigured) {
    Stream stream(Settings{{"FaceFinderRange.MinEyeDistance", "0.05"}, {"ExhaustiveTracking", "false"}});
    stream.frame({}, 1234);
    EXPECT_EQ(stream.finder().asked.frameNumber, 1234);
    EXPECT_EQ(stream.finder().asked.least, double{0.05f});
    EXPECT_EQ(stream.finder().asked.greatest, double{0.4f});
    Stream exhaustive;
    exhaustive.frame({}, 1234);
    EXPECT_EQ(exhaustive.finder().asked.frameNumber, -1);
}

TEST(ReferenceFaceTracker, RefusesSettingsOutOfRange) {
    for (const char* angle : {"0.009", "180", "-60"})
        EXPECT_EQ(thrownBy([&] {
                      Stream(Settings{{"FieldOfViewAngle", angle}});
                  }),
                  "FNEOutOfRange: Face tracker configuration: field of view angle out of range!");
    for (const char* rate : {"0", "1000"})
        EXPECT_EQ(thrownBy([&] {
                      Stream(Settings{{"FrameRate", rate}});
                  }),
                  "FNEOutOfRange: Face tracker configuration: frame rate out of range!");
    EXPECT_NO_THROW(Stream(Settings{{"FieldOfViewAngle", "0.01"}, {"FrameRate", "999.9"}}));
}

TEST(FaceInfo, TellsWhatIsUndefined) {
    FaceInfo nothing("7f", FaceFinder::Location{});
    EXPECT_EQ(thrownBy([&] { nothing.location(); }),
              "std::exception: location(): location is undefined! (ID = 7f)");
    EXPECT_EQ(thrownBy([&] { nothing.scaleshift(2, {}); }),
              "std::exception: scaleshift(): location is undefined! (ID = 7f)");
    EXPECT_EQ(thrownBy([&] { nothing.pixVelocity(); }),
              "std::exception: pixVelocity(): pixel velocity is undefined! (ID = 7f)");
    EXPECT_EQ(thrownBy([&] { nothing.velocity(); }),
              "std::exception: velocity(): velocity is undefined! (ID = 7f)");
    EXPECT_EQ(thrownBy([&] { nothing.distanceFromCamera(); }),
              "std::exception: distanceFromCamera(): distance from camera is undefined! (ID = 7f)");
}

TEST(FaceInfo, SurvivesItsPackageAndAChangeOfScale) {
    FaceInfo face("a", {{10, 20}, 30, 0.5f, -0.1f}, 1.5f);
    face.velocityInfo(2, 90);
    const Eye::FaceTracker::FaceInfos scaled = Eye::scaleshift({face}, 2, {1, -1});
    const FaceInfo read(static_cast<Fn::Package>(scaled.front()));
    EXPECT_EQ(read.identity(), "a");
    EXPECT_EQ(read.location().pos, (FNPos{21, 39}));
    EXPECT_EQ(read.location().width, 60);
    EXPECT_EQ(read.location().confidence, 0.5f);
    EXPECT_EQ(read.location().rotationAngle, -0.1f);
    EXPECT_EQ(read.distanceFromCamera(), 1.5f);
    EXPECT_EQ(read.velocity(), 2);
    EXPECT_EQ(read.pixVelocity(), 90);
    EXPECT_NE(thrownBy([] { FaceInfo(Fn::Package(std::list<Fn::Package>{Fn::Package(1)})); }),
              "nothing thrown");
}

} // namespace
