#include "eye/cara/face_finder.h"

#include "fn/deployment/app_config_db.h"
#include "fn/image_reference.h"
#include "fn/imagefile/image_file.h"
#include "fn/package.h"
#include "labelled/labels.h"
#include "support/each_target.h"
#include "support/labelled_photos.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <thread>

namespace {

using namespace Fn::Deployment;
using Engine = Eye::Cara::T8::FaceFinder;
using Locations = std::list<FaceFinder::Location>;

FNCountedPtr<Engine> makeFinder(const std::string& templatePath) {
    const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB);
    db->set("F.TemplatePath", templatePath);
    return FNCountedPtr<Engine>(new Engine(Component(db, Property(type<Engine>(), "F", "", "", false))));
}

const Engine& trainedFinder() {
    static const FNCountedPtr<Engine> finder = makeFinder(std::string(ORBEK_BINARY_DIR) + "/etc/cara");
    return *finder;
}

FNImageReference gray(std::uint32_t w, std::uint32_t h, unsigned noise) {
    std::mt19937 random(w * 31 + h);
    FNImage<unsigned char> image(w, h);
    unsigned char* const pixels = image.getExclusive();
    for (std::uint64_t i = 0; i < image.size(); ++i)
        pixels[i] = static_cast<unsigned char>(100 + random() % noise);
    return FNImageReferenceFactory::create(image);
}

TEST(FaceFinder, MissingModelFilesAreNamed) {
    const std::string failure = thrownBy([] { makeFinder("/no/such/folder"); });
    EXPECT_NE(failure.find("/no/such/folder/"), std::string::npos) << failure;
    EXPECT_NE(failure.find("could not be opened"), std::string::npos) << failure;
}

TEST(FaceFinderWithModels, SmallFlatAndNarrowImagesHaveNoFaces) {
    for (const auto& [w, h, noise] :
         {std::array{1u, 1u, 1u}, std::array{1u, 10000u, 5u}, std::array{10000u, 1u, 5u},
          std::array{16u, 16u, 50u}, std::array{17u, 17u, 1u}, std::array{400u, 300u, 1u}}) {
        Locations faces(3);
        EXPECT_FALSE(trainedFinder().find(gray(w, h, noise), faces, 0.0, 1.0, FaceFinder::everywhere));
        EXPECT_TRUE(faces.empty()) << w << "x" << h;
    }
}

TEST(FaceFinderWithModels, NothingIsFoundWhereNothingIsSearched) {
    const FNImageReference image = gray(200, 200, 100);
    Locations faces;
    EXPECT_FALSE(trainedFinder().find(image, faces, 0.5, 0.1, FaceFinder::everywhere));
    EXPECT_FALSE(trainedFinder().find(image, faces, 0.05, 0.4, {1000, 1000, 1100, 1100}));
    EXPECT_FALSE(trainedFinder().find(image, faces, 0.05, 0.4, {150, 150, 50, 50})) << "inside out";
    EXPECT_FALSE(trainedFinder().find(image, faces, 0.05, 0.4, {0, 0, 0, 0}));
}

/// Pictures of the test split with at least one labelled face, and their labels.
struct Photo {
    FNImageReference image;
    std::vector<std::pair<FNPos, FNPos>> eyes;
};

std::vector<Photo> testPhotos(std::size_t most) {
    std::vector<Photo> photos;
    std::filesystem::path last;
    for (const Labelled::Row& row : Labelled::readLabels(labelledPhotos() / "scenes/faces/labels.tsv")) {
        const auto left = row.position("eye_left"), right = row.position("eye_right");
        if (Labelled::splitOf(row.splitKey()) != Labelled::Split::test || !left || !right) continue;
        if (row.image() != last) {
            if (photos.size() == most) break;
            photos.push_back({Fn::readImage(row.image().string()), {}});
        }
        last = row.image();
        photos.back().eyes.emplace_back(*left, *right);
    }
    return photos;
}

bool foundAt(const Locations& faces, const std::pair<FNPos, FNPos>& eyes) {
    const float distance = length(eyes.second - eyes.first);
    for (const FaceFinder::Location& face : faces)
        if (length(face.pos - (eyes.first + eyes.second) / 2.0f) < 0.35f * distance &&
            std::abs(face.width / distance - 1) < 0.4f)
            return true;
    return false;
}

TEST(FaceFinderOnPhotos, FindsFacesOfPeopleThatTrainingDidNotSee) {
    if (labelledPhotos().empty()) GTEST_SKIP() << "the labelled photos are not there";
    std::size_t labelled = 0, found = 0;
    for (const Photo& photo : testPhotos(60)) {
        Locations faces;
        trainedFinder().find(photo.image, faces, 0.03, 0.5, FaceFinder::everywhere);
        for (const auto& eyes : photo.eyes) {
            ++labelled;
            found += foundAt(faces, eyes);
        }
        for (auto face = faces.begin(); face != faces.end() && std::next(face) != faces.end(); ++face)
            EXPECT_GE(face->confidence, std::next(face)->confidence);
    }
    EXPECT_GE(100 * found, 92 * labelled) << found << " of " << labelled;
}

bool same(const Locations& a, const Locations& b) {
    return std::equal(a.begin(), a.end(), b.begin(), b.end(), [](const auto& x, const auto& y) {
        return x.pos == y.pos && x.width == y.width && x.confidence == y.confidence &&
               x.rotationAngle == y.rotationAngle;
    });
}

TEST(FaceFinderOnPhotos, GivesTheSameFromEveryThreadInstructionSetAndPackage) {
    if (labelledPhotos().empty()) GTEST_SKIP() << "the labelled photos are not there";
    const Photo photo = testPhotos(1).front();
    Locations expected;
    ASSERT_TRUE(trainedFinder().find(photo.image, expected, 0.05, 0.5, FaceFinder::everywhere));
    Locations fromPackage;
    Engine(trainedFinder().serialize()).find(photo.image, fromPackage, 0.05, 0.5, FaceFinder::everywhere);
    EXPECT_TRUE(same(expected, fromPackage));
    forEachTarget([&] {
        Locations faces;
        trainedFinder().find(photo.image, faces, 0.05, 0.5, FaceFinder::everywhere);
        EXPECT_TRUE(same(expected, faces));
    });
    std::vector<std::thread> threads;
    std::array<Locations, 4> results;
    for (Locations& result : results)
        threads.emplace_back(
            [&] { trainedFinder().find(photo.image, result, 0.05, 0.5, FaceFinder::everywhere); });
    for (std::thread& thread : threads) thread.join();
    for (const Locations& result : results) EXPECT_TRUE(same(expected, result));
}

TEST(FaceFinderOnPhotos, AStreamComesToSeeWhatAStillImageShows) {
    if (labelledPhotos().empty()) GTEST_SKIP() << "the labelled photos are not there";
    const Photo photo = testPhotos(1).front();
    const FNCountedPtr<Engine> finder = makeFinder(std::string(ORBEK_BINARY_DIR) + "/etc/cara");
    Locations faces;
    bool found = false;
    constexpr int cycle = 49;
    for (int frame = 0; frame <= cycle && !found; ++frame) {
        finder->findInStream(photo.image, faces, 0.05, 0.5, frame, FaceFinder::everywhere);
        found = foundAt(faces, photo.eyes.front());
    }
    EXPECT_TRUE(found);
}

} // namespace
