#include "eval/yardsticks.h"
#include "fn/imagefile/image_file.h"
#include "labelled/finder_access.h"
#include "labelled/pictures.h"
#include "small_portrait_model.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"
#include "synth/painting.h"
#include "synth/portrait.h"
#include "train/synth_samples.h"

#include <gtest/gtest.h>

#include <random>
#include <set>
#include <sstream>

namespace {

namespace fs = std::filesystem;
using namespace Synth;

float area(std::span<const FNPos> p, const Triangle& t) {
    const FNPos a = p[t[1]] - p[t[0]], b = p[t[2]] - p[t[0]];
    return std::abs(a.x * b.y - a.y * b.x) / 2;
}

TEST(FaceMesh, CoversTheHullOnceAndLeavesNoPixelOut) {
    std::mt19937 random(7);
    std::uniform_real_distribution<float> inside(1, 39);
    Points points{{0, 0}, {40, 0}, {40, 40}, {0, 40}};
    for (int i = 0; i < 60; ++i) points.push_back({inside(random), inside(random)});
    const std::vector<Triangle> triangles = delaunay(points);
    EXPECT_EQ(triangles.size(), 2 * points.size() - 2 - 4) << "by Euler's formula";
    float sum = 0;
    for (const Triangle& t : triangles) sum += area(points, t);
    EXPECT_NEAR(sum, 1600, 0.01);

    Points moved;
    for (const FNPos p : points) moved.push_back({2 * p.x + p.y, p.y - 3});
    std::set<std::pair<int, int>> seen;
    forEachPixel(triangles, points, moved, {0, 0, 40, 40}, [&](FNGridPos at, FNPos from) {
        EXPECT_TRUE(seen.emplace(at.x, at.y).second);
        const FNPos middle = FNPos(at) + FNPos{0.5f, 0.5f};
        EXPECT_NEAR(from.x, 2 * middle.x + middle.y, 1e-3);
        EXPECT_NEAR(from.y, middle.y - 3, 1e-3);
    });
    EXPECT_EQ(seen.size(), 1600u);
}

TEST(Similarity, RecoversTurnScaleAndShift) {
    const Points from{{0, 0}, {10, 0}, {3, 8}, {-4, 5}};
    Points to;
    for (const FNPos p : from) to.push_back({1.2f * p.x - 0.5f * p.y + 7, 0.5f * p.x + 1.2f * p.y - 2});
    const Similarity map(from, to);
    for (std::size_t i = 0; i < from.size(); ++i) {
        EXPECT_LT(length(map(from[i]) - to[i]), 1e-4f);
        EXPECT_LT(length(map.inverse(to[i]) - from[i]), 1e-4f);
    }
}

TEST(Painting, DepthIsTheDistanceToThePolygonAndPositiveInside) {
    const Points square{{0, 0}, {10, 0}, {10, 10}, {0, 10}};
    EXPECT_NEAR(depth(square, {3, 5}), 3, 1e-5);
    EXPECT_NEAR(depth(square, {13, 14}), -5, 1e-5);
}

TEST(PortraitModel, ReadsWhatItWroteAndNamesADamagedFile) {
    const ScratchFolder folder;
    const PortraitModel model = smallPortraitModel();
    std::ostringstream bytes;
    Fn::Package(model).write(bytes);
    const std::string path = folder.write("portrait.dat", bytes.str());
    const PortraitModel read(path);
    const float some[] = {1.5f};
    EXPECT_EQ(read.face({}, some).landmarks, model.face({}, some).landmarks);
    EXPECT_EQ(read.face({}, some).texture.cr, model.face({}, some).texture.cr);
    EXPECT_NE(read.face({}, some).landmarks, read.face({}, {}).landmarks);

    const auto failure = [&] { return thrownBy([&] { PortraitModel{fs::path(path)}; }); };
    fs::resize_file(path, bytes.str().size() - 1);
    EXPECT_EQ(failure().rfind("FNEIOError: " + path, 0), 0u) << failure();
    folder.write("portrait.dat", std::string("\0\0\0\1\0\0\0\1x", 9));
    EXPECT_EQ(failure().rfind("FNEBadFormat: " + path, 0), 0u) << failure();
    fs::remove(path);
    EXPECT_EQ(failure().rfind("FNEIOError: " + path, 0), 0u) << failure();
}

TEST(Portrait, WidthsThatCannotBeDrawnAreRefused) {
    const PortraitModel model = smallPortraitModel();
    const Person person = makePerson(model, "x", true, 1, 1);
    for (const std::uint32_t width : {0u, 89u, 3001u})
        EXPECT_NE(thrownBy([&] { drawPortrait(model, person, {}, width); }).find("FNEBadArg"),
                  std::string::npos);
    EXPECT_EQ(drawPortrait(model, person, {}, 90).image.h(), 120u);
}

const PortraitModel& trainedModel() {
    static const PortraitModel model(fs::path(ORBEK_BINARY_DIR) / "etc/synth/portrait.dat");
    return model;
}

TEST(PortraitWithModels, SeedsDecideEverything) {
    const auto draw = [](std::uint64_t who, std::uint64_t how) {
        Random random(how);
        const Person person = makePerson(trainedModel(), "x", false, who, 0.75f);
        return drawPortrait(trainedModel(), person, drawView({}, random), 120).image;
    };
    EXPECT_EQ(draw(1, 2), draw(1, 2));
    EXPECT_FALSE(draw(1, 2) == draw(1, 3));
    EXPECT_FALSE(draw(1, 2) == draw(2, 2));
}

TEST(PortraitWithModels, ControlsMoveTheLandmarksTheyAreNamedAfter) {
    const Person person = makePerson(trainedModel(), "x", true, 3, 0.5f);
    const auto points = [&](Control control, float value) {
        View view;
        view.controls[control] = value;
        Points local;
        const Points drawn = drawPortrait(trainedModel(), person, view, 150).landmarks;
        for (const FNPos p : drawn) local.push_back(HeadAxes(drawn).local(p));
        return local;
    };
    const auto change = [&](Control control, auto measure) {
        return measure(points(control, 1.5f)) - measure(points(control, -1.5f));
    };
    EXPECT_GT(change(yaw, [](const Points& p) { return p[30].x - (p[0].x + p[16].x) / 2; }), 0.1f);
    EXPECT_GT(change(mouthOpen, [](const Points& p) { return p[62].y - p[66].y; }), 0.05f);
    EXPECT_GT(change(smile, [](const Points& p) { return p[54].x - p[48].x; }), 0.05f);
    EXPECT_GT(change(eyesOpen, [](const Points& p) { return p[37].y - p[41].y; }), 0.02f);

    View tilted;
    tilted.roll = 0.3f;
    const Points p = drawPortrait(trainedModel(), person, tilted, 150).landmarks;
    const FNPos across = rightEye(p) - leftEye(p);
    EXPECT_NEAR(std::atan2(across.y, across.x), 0.3f, 0.01f);
}

/// Of the sample pictures of this repository.
const std::string sampleLabels = std::string(ORBEK_SOURCE_DIR) + "/examples/images/labels.tsv";

std::vector<Labelled::Picture> samples() {
    Labelled::Selection selection;
    selection.labels = {sampleLabels};
    return Labelled::picturesOf(selection);
}

TEST(SynthSamples, AMirrorImageHasTheOtherSideOfEverything) {
    const auto faces = Train::pointedFaces(sampleLabels, 0, {});
    ASSERT_GE(faces.size(), 20u);
    EXPECT_TRUE(Train::pointedFaces(sampleLabels, 200, {}).empty()) << "none is so large";
    const TextureFrame frame(Train::meanShape(faces, 32));
    const Points& mean = frame.mesh();
    EXPECT_NEAR(HeadAxes(std::span(mean).first(landmarkCount)).eyeDistance(), 32, 1);
    EXPECT_NEAR(mean[16].x - mean[8].x, mean[8].x - mean[0].x, 1e-2) << "symmetric";
    const Train::PhotoWarper warper(frame);
    for (std::size_t i = 0; i < faces.size(); i += 7) {
        const auto [face, mirror] = warper.samples(faces[i]);
        EXPECT_NEAR(face.controls[yaw], -mirror.controls[yaw], 1e-3);
        EXPECT_NEAR(face.controls[smile], mirror.controls[smile], 1e-3);
        EXPECT_NEAR(face.controls[lightSide], -mirror.controls[lightSide], 0.02);
        const auto x = [](const Train::SynthSample& sample, std::size_t point) {
            return sample.values[2 * point];
        };
        for (const auto& [point, other] : {std::pair{0, 16},
                                           {17, 26},
                                           {31, 35},
                                           {36, 45},
                                           {41, 46},
                                           {48, 54},
                                           {55, 59},
                                           {60, 64},
                                           {65, 67}})
            EXPECT_NEAR(x(face, point) + x(mirror, other), 2 * mean[8].x, 0.01) << point;
    }
}

TEST(HairRemoval, ReplacesOnTheForeheadWhatIsNoSkin) {
    const auto faces = Train::pointedFaces(sampleLabels, 0, {});
    const TextureFrame frame(Train::meanShape(faces, 32));
    const Train::PhotoWarper warper(frame);
    std::vector<Train::SynthSample> samples;
    for (const Train::PointedFace& face : faces) samples.push_back(warper.samples(face).first);
    Train::HairRemoval removal(frame);
    removal.learn(samples);
    Train::SynthSample fringe = samples.front();
    const HeadAxes head(std::span(frame.mesh()).first(landmarkCount));
    const auto meanOver = [&](const Train::SynthSample& sample, float from, float to) {
        float sum = 0, n = 0;
        for (std::size_t i = 0; i < frame.luma().size(); ++i)
            if (const float y = head.local(FNPos(frame.luma()[i])).y; y > from && y < to) {
                sum += sample.values[shapeSize + i];
                n += 1;
            }
        return sum / n;
    };
    const float before = meanOver(fringe, -1, 0.2f);
    for (std::size_t i = 0; i < frame.luma().size(); ++i)
        if (head.local(FNPos(frame.luma()[i])).y > 0.65f) fringe.values[shapeSize + i] = 20;
    removal.apply(fringe);
    EXPECT_GT(meanOver(fringe, 0.75f, 0.9f), 80);
    EXPECT_NEAR(meanOver(fringe, -1, 0.2f), before, 0.05f * before) << "and leaves the face alone";
}

bool findsTheOneFace(const FaceFinder& finder, const Labelled::Picture& picture) {
    std::list<FaceFinder::Location> faces;
    finder.find(Fn::readImage(picture.file.string()), faces, 0.1, 0.5, FaceFinder::everywhere);
    return !faces.empty() && picture.faces.front().meantBy(faces.front());
}

TEST(SamplePicturesWithModels, FaceAndEyesAreFoundInEach) {
    const fs::path etc = fs::path(ORBEK_BINARY_DIR) / "etc";
    const FaceFinder finder = Labelled::makeFaceFinder(etc);
    const EyesFinder eyesFinder = Labelled::makeEyesFinder(etc, "Strict");
    const auto pictures = samples();
    ASSERT_GE(pictures.size(), 32u);
    for (const Labelled::Picture& picture : pictures) {
        const FNImageReference image = Fn::readImage(picture.file.string());
        EXPECT_GE(image.w(), 300u);
        EXPECT_GE(image.h(), 400u);
        std::list<FaceFinder::Location> faces;
        finder.find(image, faces, 0.1, 0.5, FaceFinder::everywhere);
        ASSERT_EQ(faces.size(), 1u) << picture.file;
        bool foundFirst = false, foundSecond = false;
        FacialFeatureLocation first, second;
        eyesFinder.find(faces.front(), image, foundFirst, first, foundSecond, second);
        ASSERT_TRUE(foundFirst && foundSecond) << picture.file;
        const Labelled::FaceTruth& truth = picture.faces.front();
        if (first.pos.x > second.pos.x) std::swap(first, second);
        const float worst = std::max(length(first.pos - truth.leftEye), length(second.pos - truth.rightEye));
        EXPECT_LT(worst, 0.1f * truth.eyeDistance()) << picture.file;
    }
}

TEST(SamplePictures, OtherDetectorsFindTheFaceInEach) {
    if (Eval::yardstickNames().empty()) GTEST_SKIP() << "built without ORBEK_YARDSTICKS";
    for (const std::string& name : Eval::yardstickNames()) {
        const FaceFinder finder = *Eval::makeYardstick(name);
        for (const Labelled::Picture& picture : samples())
            EXPECT_TRUE(findsTheOneFace(finder, picture)) << name << ", " << picture.file;
    }
}

} // namespace
