#include "cmp/face/face.h"

#include "support/thrown.h"

#include <gtest/gtest.h>

#include <functional>
#include <numbers>
#include <numeric>

namespace {

using Cmp::Face;

/// Values count up from 1.
template <class T = unsigned char> FNImageReference picture(std::uint32_t w, std::uint32_t h) {
    FNImage<T> image(w, h);
    if constexpr (std::is_arithmetic_v<T>)
        std::iota(image.getExclusive(), image.getExclusive() + image.size(), T{1});
    else
        image.fill(T(1, 2, 3));
    return FNImageReferenceFactory::create(image, {{"EYEPOS", "1 2 3 4"}, {"SRCNAME", "a"}},
                                           FNImageReference::COMPRESSED_PNG);
}

Face eyesOnly(FNPos left, FNPos right, const FNImageReference& image = picture(100, 100)) {
    return Face(image, FacialFeatureLocation{left, 4, 0.5f}, FacialFeatureLocation{right, 4, 0.25f});
}
Face located(FNPos pos, float width, float angle) {
    return Face(picture(100, 100), FaceFinder::Location{pos, width, 0.75f, angle});
}
/// With all five results.
Face complete() {
    const auto feature = [](float x, float y) {
        return Face::FeatureLocation(new FacialFeatureLocation{{x, y}, 4, 1});
    };
    return Face(picture(100, 100), Face::FaceLocation(new FaceFinder::Location{{50, 51}, 20, 0.75f, 0.125f}),
                feature(40, 50), feature(60, 51), feature(50, 45), feature(52, 70));
}

void expectNear(FNPos p, FNPos q) {
    EXPECT_NEAR(p.x, q.x, 1e-4f);
    EXPECT_NEAR(p.y, q.y, 1e-4f);
}

TEST(Face, AnswersFromTheBestSource) {
    const Face eyes = eyesOnly({0, 0}, {10, 0});
    expectNear(eyes.mouth(), {5, 10.2f});
    expectNear(eyes.nasion(), {5, 0});
    EXPECT_EQ(eyes.eyeDistance(), 10);
    EXPECT_EQ(eyes.rollAngle(), 0);

    const Face face = located({50, 50}, 20, 0);
    expectNear(face.leftEye(), {40, 50});
    expectNear(face.rightEye(), {60, 50});
    expectNear(face.mouth(), {50, 70.4f});
    expectNear(face.nasion(), {50, 50});

    const Face turned = located({50, 50}, 20, std::numbers::pi_v<float> / 2);
    expectNear(turned.leftEye(), {50, 40});
    expectNear(turned.mouth(), {29.6f, 50});
    EXPECT_FLOAT_EQ(turned.rollAngle(), std::numbers::pi_v<float> / 2);

    const Face all = complete();
    expectNear(all.mouth(), {52, 70});
    expectNear(all.nasion(), {50, 45});
    expectNear(all.leftEye(), {40, 50});
    expectNear(all.facePosition(), {50, 50.5f});
    expectNear(all.ffMouth(), Cmp::faceToMouthPos({50, 51}, 0.125f, 20));
    EXPECT_FLOAT_EQ(all.rollAngle(), std::atan2(1.0f, 20.0f));
    // One eye alone does not tell where the face is.
    const Face oneEye(picture(9, 9), {}, Face::FeatureLocation(new FacialFeatureLocation{{3, 4}, 1, 1}));
    expectNear(oneEye.leftEye(), {3, 4});
    EXPECT_EQ(thrownBy([&] { oneEye.mouth(); }),
              "FNEBadFunCall: There is no FaceFinder information for this face!");
}

TEST(Face, SaysWhatIsMissing) {
    const Face face;
    const struct {
        std::function<void()> call;
        const char* what;
    } cases[] = {
        {[&] { face.faceFinderLocation(); }, "FaceFinder"},
        {[&] { face.leftEyeLocation(); }, "left eye EyeFinder"},
        {[&] { face.efRollAngle(); }, "left eye EyeFinder"},
        {[&] { face.rightEyeLocation(); }, "right eye EyeFinder"},
        {[&] { face.nasionLocation(); }, "NasionFinder"},
        {[&] { face.mouthLocation(); }, "MouthFinder"},
        {[&] { face.rollAngle(); }, "FaceFinder"},
    };
    for (const auto& c : cases)
        EXPECT_EQ(thrownBy(c.call),
                  std::string("FNEBadFunCall: There is no ") + c.what + " information for this face!");
    EXPECT_EQ(thrownBy([&] { cropFace(face, 1); }),
              "FNEBadFunCall: Cannot crop the face because there is no sufficient information about the "
              "location and size of this face!");
    const Face squint = eyesOnly({7, 7}, {7, 7});
    for (const auto& call : std::initializer_list<std::function<void()>>{
             [&] { squint.eyeDistance(); }, [&] { squint.rollAngle(); }, [&] { squint.facePosition(); }})
        EXPECT_THROW(call(), std::invalid_argument);
}

TEST(Face, IsPackedAndUnpacked) {
    const Face all = complete(), eyes = eyesOnly({1, 2}, {3, 4});
    for (const Face& face : {all, eyes, Face()}) {
        const Face back(face.serialize());
        EXPECT_EQ(back.serialize(), face.serialize());
        EXPECT_EQ(back.hasFaceFinderInfo(), face.hasFaceFinderInfo());
        EXPECT_EQ(back.hasBothEyeLocations(), face.hasBothEyeLocations());
        EXPECT_EQ(back.hasMouthInfo(), face.hasMouthInfo());
    }
    const Face back(all.serialize());
    EXPECT_EQ(back.faceFinderLocation().rotationAngle, 0.125f);
    EXPECT_EQ(back.faceFinderLocation().confidence, 0.75f);
    EXPECT_EQ(back.nasionLocation().pos, FNPos(50, 45));
    EXPECT_EQ(back.mouthLocation().pos, FNPos(52, 70));
    EXPECT_THROW(Face(Fn::Package(3)), FNEBadArg);
}

TEST(Face, ScalesInPlace) {
    Face face = complete();
    const auto* before = &face.image().representation();
    face.scale(1);
    EXPECT_EQ(&face.image().representation(), before);
    face.scale(0.255f);
    EXPECT_EQ(face.image().w(), 25u);
    expectNear(face.faceFinderLocation().pos, {12.75f, 13.005f});
    EXPECT_FLOAT_EQ(face.faceFinderLocation().width, 5.1f);
    EXPECT_FLOAT_EQ(face.mouthLocation().size, 1.02f);
    EXPECT_EQ(face.image().getSerializationStrategy(), FNImageReference::COMPRESSED_PNG);
    EXPECT_EQ(face.image().attributes(), (FNImageAttributes{{"SRCNAME", "a"}}));

    const FNImageReference native[] = {picture<unsigned short>(8, 6), picture<float>(8, 6),
                                       picture<Fn::Bgra32>(8, 6)};
    for (const auto& image : native) {
        Face each(image);
        each.scale(0.5f);
        EXPECT_EQ(each.image().h(), 3u);
        EXPECT_EQ(each.image().native(), image.native());
    }
    Face deep(picture<Fn::Rgb48>(8, 6));
    EXPECT_EQ(thrownBy([&] { deep.scale(0.5f); }),
              "std::exception: unsupported facial image representation format");
    for (const float factor : {-1.0f, std::nanf(""), 1e30f}) EXPECT_THROW(face.scale(factor), FNEBadArg);
    face.scale(0);
    EXPECT_EQ(face.image().w(), 0u);
}

TEST(Face, IsReshapedIntoTheMiddle) {
    const struct {
        std::uint32_t w, h;
        int width, height;
        FNBox inner;
        FNPos eye; // what was at (2, 1)
    } cases[] = {
        {4, 2, 8, 9, {0, 2, 8, 6}, {4.5f, 4.5f}},
        {4, 8, 8, 8, {2, 0, 6, 8}, {4.5f, 1.5f}},
        {4, 4, 7, 7, {0, 0, 7, 7}, {4, 2.25f}},
    };
    for (const auto& c : cases) {
        Face face = eyesOnly({2, 1}, {3, 1}, picture(c.w, c.h));
        face.reshape(c.width, c.height);
        expectNear(face.leftEye(), c.eye);
        const auto image = face.image().toMono8();
        ASSERT_EQ(image.box(), (FNBox{0, 0, c.width, c.height}));
        for (int y = 0; y < c.height; ++y)
            for (int x = 0; x < c.width; ++x)
                ASSERT_EQ(image.get({x, y}) != 0, c.inner.contains({x, y})) << x << " " << y;
    }
    Face face = complete();
    EXPECT_THROW(face.reshape(0, 5), FNEBadArg);
}

TEST(Face, IsMirrored) {
    const Face face = complete(), mirrored = vertReflection(face);
    expectNear(mirrored.leftEye(), {60, 50});
    expectNear(mirrored.rightEye(), {40, 51});
    EXPECT_EQ(mirrored.faceFinderLocation().rotationAngle, 0.125f);
    EXPECT_EQ(mirrored.image().toMono8()(99, 3), face.image().toMono8()(0, 3));
    expectNear(face.leftEye(), {40, 50});
    EXPECT_EQ(Cmp::vertReflection(picture<Fn::Rgb48>(3, 2)).native(), FNImageReference::RGB48);
}

TEST(Face, IsCroppedWithinItsImage) {
    const Face face = eyesOnly({40, 50}, {60, 50});
    const Face crop = cropFace(face, 0.5f);
    EXPECT_EQ(crop.image().box(), (FNBox{0, 0, 72, 88})) << "14..86, 12..100";
    EXPECT_EQ(crop.image().toMono8()(0, 0), face.image().toMono8()(14, 12));
    expectNear(crop.leftEye(), {26, 38});
    expectNear(face.leftEye(), {40, 50});
    EXPECT_EQ(cropFace(face, 2).image().box(), (FNBox{0, 0, 100, 100}));
    // Corners are truncated toward 0.
    EXPECT_EQ(cropFace(eyesOnly({0.5f, 2}, {1.5f, 2}), 1).image().box(), (FNBox{0, 0, 2, 5}));

    const Face away = cropFace(located({500, 500}, 10, 0), 1);
    EXPECT_EQ(away.image().w(), 0u);
    expectNear(away.facePosition(), {500, 500});
}

TEST(FaceGeometry, RegionPutsTheEyesWhereTheyAreWanted) {
    const FNPos left(30, 40), right(50, 45), target(16, 20);
    const Cmp::SourceRegion region = Cmp::regionToReshape(left, right, 64, 80, target, 1.5f);
    const auto source = [&](FNPos p) {
        return region.origin + region.u * (p.x / 64) + region.v * (p.y / 80);
    };
    expectNear(source(target), left);
    expectNear(source({48, 20}), right);
    EXPECT_NEAR(dot(region.u, region.v), 0, 1e-3f);
    EXPECT_NEAR(length(region.v) / length(region.u), 80.0f / 64 * 1.5f, 1e-4f);

    FNPos pos;
    float angle = 0, distance = 0;
    Cmp::eyesToFacePos(left, right, pos, angle, distance);
    const Cmp::SourceRegion same = Cmp::regionToReshape(pos, distance, angle, 64, 80, target, 1.5f);
    expectNear(same.origin, region.origin);
    expectNear(same.v, region.v);
    EXPECT_EQ(thrownBy([&] { Cmp::regionToReshape(right, left, 64, 80, target, 1); }),
              "FNEBadArg: Right eye is right eye from observer's position!");
}

} // namespace
