#include "drawn_image.h"
#include "large_blocks.h"
#include "orbek/eyes_finder.h"
#include "orbek/face_tracker.h"
#include "orbek/image_io.h"
#include "orbek/implementation/adapt.h"
#include "orbek/implementation/configuration_implementation.h"
#include "support/labelled_photos.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <sstream>

using namespace Orbek;

namespace {

Configuration installed(const std::string& folder = ORBEK_BINARY_DIR, const std::string& settings = "") {
    std::istringstream text("ORBEK.Substitutions.INSTALLDIR = " + folder + "\n" + settings);
    return Configuration(text);
}

std::list<Face::Location> findEverywhere(const Face::Finder& finder, const Image& image) {
    return finder.find(image, 0.05f, 0.5f, 0, 0, static_cast<int>(image->width()),
                       static_cast<int>(image->height()));
}

TEST(Finders, NeedTheirModelsWhenTheyAreMade) {
    const Configuration configuration = installed("/no/such");
    EXPECT_EQ(thrownBy([&] { Face::Finder finder(configuration); }).rfind("FNEGeneric: Face finder : ", 0),
              0u);
    EXPECT_EQ(thrownBy([&] { Eyes::Finder finder(configuration); }).rfind("FNEGeneric: Eyes finder : ", 0),
              0u);
    EXPECT_NE(thrownBy([&] { Face::Tracker tracker(configuration); }).find("/no/such/etc/cara"),
              std::string::npos);
    EXPECT_EQ(thrownBy([] {
                  Face::Tracker tracker(installed(ORBEK_BINARY_DIR, "ORBEK.FaceTracker.FrameRate = 0\n"));
              }),
              "FNEOutOfRange: Face tracker configuration: frame rate out of range!");
}

TEST(FindersWithModels, RefuseToLookAtHardlyAnything) {
    const std::string key = ".StreamingSubsamplingWidth";
    const auto thrown = [&](const std::string& finder, const std::string& width) {
        const Configuration c = installed(ORBEK_BINARY_DIR, finder + key + " = " + width + "\n");
        return thrownBy([&] {
            const Face::Finder found(c);
            const Face::Tracker tracker(c);
        });
    };
    for (const std::string finder : {"ORBEK.FaceFinder", "ORBEK.FaceTracker.FaceFinder"}) {
        for (const char* width : {"0", "64"}) EXPECT_EQ(thrown(finder, width), "nothing thrown");
        for (const char* width : {"65", "65536", "4294967295"}) {
            const std::string reason = finder + key + ": " + width + " is no width for subsampling, 0 to 64";
            EXPECT_TRUE(thrown(finder, width).ends_with(reason)) << thrown(finder, width);
        }
    }
}

TEST(FindersWithModels, AnImageWithoutAFaceGivesNothing) {
    const Configuration configuration = installed();
    const Image image = grayPattern(200, 150);
    EXPECT_TRUE(findEverywhere(Face::Finder(configuration), image).empty());
    const Image flat(new DrawnImage(200, 150, std::vector<unsigned char>(200 * 150, 100)));
    EXPECT_TRUE(Eyes::Finder(configuration).find(flat, {{100, 75}, 40, 1, 0}).empty());
    Face::Tracker tracker(configuration);
    EXPECT_TRUE(tracker.processFrame(image).empty());
    EXPECT_TRUE(tracker.processImage(colorPattern(200, 150), 40).empty());
}

/// A photo of one person, and where the eyes are.
const char* const photo = "scenes/faces/celeba_001719.jpg";
constexpr Position leftEyeOfPhoto{171.8f, 98.6f}, rightEyeOfPhoto{220.1f, 111.2f};

float distance(const Position& a, const Position& b) {
    return std::hypot(a.x - b.x, a.y - b.y);
}

TEST(FindersOnPhotos, GiveWhatTheEnginesFind) {
    if (labelledPhotos().empty()) GTEST_SKIP() << "the labelled photos are not there";
    const Configuration configuration = installed();
    const Face::Finder finder(configuration);
    const Image image = ImageIO::load((labelledPhotos() / photo).string());
    std::list<::FaceFinder::Location> expected;
    Configuration::Implementation::implementation(configuration)
        ->resources()
        .faceFinder()
        .find(adapt(image), expected, 0.05f, 0.5f, ::FaceFinder::everywhere);
    const std::list<Face::Location> faces = findEverywhere(finder, image);
    ASSERT_FALSE(faces.empty());
    EXPECT_TRUE(std::equal(faces.begin(), faces.end(), expected.begin(), expected.end(),
                           [](const Face::Location& a, const ::FaceFinder::Location& b) {
                               return a.pos == adapt(b.pos) && a.width == b.width &&
                                      a.confidence == b.confidence && a.rotationAngle == b.rotationAngle;
                           }));
    const auto x = static_cast<int>(faces.front().pos.x), y = static_cast<int>(faces.front().pos.y);
    EXPECT_EQ(finder.find(image, 0.05f, 0.5f, x + 10, y + 10, x - 10, y - 10).size(), 1u)
        << "the corners of the box may come in any order";
    EXPECT_TRUE(finder.find(image, 0.05f, 0.5f, 0, 0, 20, 20).empty());

    const auto eyes = Eyes::Finder(configuration).find(image, faces.front());
    ASSERT_EQ(eyes.size(), 1u);
    EXPECT_LT(distance(eyes.front().first, leftEyeOfPhoto), 5);
    EXPECT_LT(distance(eyes.front().second, rightEyeOfPhoto), 5);
}

TEST(FindersOnPhotos, ATrackerIsSharedByItsCopies) {
    if (labelledPhotos().empty()) GTEST_SKIP() << "the labelled photos are not there";
    const Image image = ImageIO::load((labelledPhotos() / photo).string());
    Face::Tracker tracker(installed());
    Face::Tracker copy = tracker;
    const auto first = tracker.processFrame(image), second = copy.processFrame(image),
               late = tracker.processImage(image, 5000);
    ASSERT_FALSE(first.empty());
    EXPECT_LT(distance(first.front().second.pos, {196, 105}), 15);
    EXPECT_EQ(second.front().first, first.front().first);
    EXPECT_EQ(late.front().first, first.front().first);
}

/// Blocks that are as large as the application's image, or larger.
TEST(FindersWithModels, AnApplicationsImageIsCopiedByNothingButTheConversionTo16Bits) {
    const unsigned int w = 1920, h = 1080;
    const Face::Finder finder(installed());
    for (const Image& image : {grayPattern(w, h), colorPattern(w, h)}) {
        const LargeBlocks blocks(std::size_t{w} * h);
        finder.find(image, 0.1f, 0.4f, 0, 0, w, h);
        ASSERT_EQ(blocks.sizes().size(), 1u);
        EXPECT_LE(blocks.sizes().front(), std::size_t{w} * h * sizeof(unsigned short) + 8);
    }
}

} // namespace
