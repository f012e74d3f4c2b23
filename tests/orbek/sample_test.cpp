#include "drawn_image.h"
#include "fn/shapefile/shape_file.h"
#include "orbek/implementation/adapt_shape.h"
#include "orbek/sample.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <fstream>
#include <memory>

namespace Orbek {
namespace {

/// A grid of 3 by 2 points, one of which is missing.
constexpr unsigned int scanWidth = 3, scanHeight = 2;
const std::vector<Vertex> scanVertices{{0, 1, 2}, {1, 1, 2}, {2, 1, 3}, {0, 0, 2}, {1, 0, 4}, {2, 0, 2}};
constexpr bool scanMask[] = {true, true, false, true, true, true};

/// An application's own scan.
class OwnScan final : public ShapeImageBody {
public:
    unsigned int width() const override { return scanWidth; }
    unsigned int height() const override { return scanHeight; }
    const Vertex* vertices() const override { return scanVertices.data(); }
    const bool* mask() const override { return scanMask; }
};

TEST(Sample, ItemsAreThereOnceTheyAreSet) {
    Sample sample(grayPattern(4, 3));
    const Sample before = sample;
    EXPECT_FALSE(sample.eyes.isSet());
    EXPECT_EQ(thrownBy([&] { sample.eyes.value(); }),
              "std::exception: Attempt to retrieve Sample item Eyes which is not set");
    EXPECT_EQ(thrownBy([&] { sample.secondEye3D.value(); }),
              "std::exception: Attempt to retrieve Sample item Eye13D which is not set");
    sample.eyes.set({{1, 2}, {3, 4}, 0, 0});
    EXPECT_EQ(sample.eyes.value().second, (Position{3, 4}));
    EXPECT_FALSE(before.eyes.isSet()) << "a copy does not see what is set later";
    EXPECT_EQ(before.image, sample.image);
    EXPECT_TRUE(Sample(std::pair(sample.image, sample.eyes.value())).eyes.isSet());
    EXPECT_TRUE(Sample(sample.image, ShapeImage(new OwnScan)).vertexImage.isSet());
    EXPECT_EQ(before.vertexImage.name(), "Vertex Image");
    EXPECT_EQ(before.pointSet.name(), "Point Set");
}

TEST(AdaptFace, CarriesImageAndEyesInBothDirections) {
    const std::vector<std::pair<Image, Eyes::Location>> pairs{{grayPattern(4, 3), {{1, 2}, {3, 4}, 0.5f, 1}},
                                                              {colorPattern(2, 2), {}}};
    std::vector<Image> visited;
    const std::list<Cmp::Face> faces =
        adapt(pairs.begin(), pairs.end(), [&](const Image& image) { visited.push_back(image); });
    ASSERT_EQ(faces.size(), 2u);
    EXPECT_EQ(visited[1], pairs[1].first);
    EXPECT_EQ(faces.front().rightEyeLocation().pos, (FNPos{3, 4}));
    EXPECT_FALSE(faces.front().hasFaceFinderInfo());
    const auto [image, eyes] = adapt(faces.front());
    EXPECT_EQ(image->width(), 4u);
    EXPECT_EQ(image->name(), "");
    EXPECT_EQ(eyes.first, (Position{1, 2}));
    EXPECT_EQ(eyes.firstConfidence, 0.5f);
    EXPECT_EQ(thrownBy([] { adapt(Cmp::Face()); }),
              "FNEBadFunCall: There is no left eye EyeFinder information for this face!");
}

TEST(AdaptShape, ScansComeThroughInBothDirections) {
    for (const ShapeImage& scan : {ShapeImage(new OwnScan), createImageBody(scanVertices.data(), scanMask,
                                                                            scanWidth, scanHeight, false)}) {
        const Fn::VertexImage inner = adapt(scan);
        EXPECT_FALSE(inner.valid({2, 0}));
        EXPECT_EQ(inner.vertex({1, 1}).z, 4);
        const ShapeImage back = adapt(inner);
        ASSERT_EQ(back->width(), scanWidth);
        ASSERT_EQ(back->height(), scanHeight);
        EXPECT_TRUE(std::equal(scanVertices.begin(), scanVertices.end(), back->vertices()));
        EXPECT_TRUE(std::equal(std::begin(scanMask), std::end(scanMask), back->mask()));
    }
    const ShapeImage turned = createImageBody(scanVertices.data(), scanMask, scanWidth, scanHeight, true);
    EXPECT_EQ(turned->width(), scanHeight);
    EXPECT_EQ(turned->vertices()[3], scanVertices[4]);
    EXPECT_FALSE(turned->mask()[4]);
    EXPECT_NE(thrownBy([] { createImageBody(nullptr, nullptr, 2, 2, false); }), "nothing thrown");
    EXPECT_NE(thrownBy([] { adapt(ShapeImage()); }), "nothing thrown");
    EXPECT_NE(thrownBy([] { adapt(PointSet()); }), "nothing thrown");
}

TEST(AdaptShape, ScanFilesBecomeShapesAndSamples) {
    const ScratchFolder scratch;
    Fn::writeShapeImage(adapt(ShapeImage(new OwnScan)), scratch.file("face.abs"));
    std::ifstream stream(scratch.file("face.abs"));
    for (const ShapeImage& scan : {loadShapeImage(scratch.file("face.abs")), loadShapeImage(stream)}) {
        EXPECT_EQ(scan->width(), scanWidth);
        EXPECT_EQ(scan->vertices()[4], scanVertices[4]);
    }
    const Sample sample = loadShapeSample(scratch.file("face.abs"));
    EXPECT_EQ(sample.image->width(), scanWidth);
    const ::ShapeImage::TexturedPointSet points = adapt(sample.pointSet.value());
    EXPECT_EQ(points.mapTexture2Vertex({1, 1})->z, 4);
    EXPECT_EQ(adapt(adapt(points)).texture().w(), scanWidth);
    EXPECT_NE(thrownBy([] { loadShapeImage("/no/such.abs"); }).find("/no/such.abs"), std::string::npos);
}

} // namespace
} // namespace Orbek
