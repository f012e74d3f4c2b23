#include "fn/vertex_image.h"

#include "fn/image_package.h"
#include "support/thrown_text.h"

#include <gtest/gtest.h>

namespace {

using Fn::VertexImage;
using Vertex = VertexImage::Vertex;

/// 3 by 2 positions, of which (1, 0) and (2, 1) hold points.
VertexImage sample() {
    VertexImage image(3, 2);
    image.setVertex({1, 0}, {1, 2, 3});
    image.setVertex({2, 1}, {-4, 0.5, 6});
    image.attributes()["SRCNAME"] = "scanner";
    return image;
}

FNImage<Vertex> normalsOf(const VertexImage& image) {
    FNImage<Vertex> normals(image.w(), image.h());
    normals.fill({9, 9, 9});
    normals.set({1, 0}, {0, 0, 1});
    normals.set({2, 1}, {1, 0, 0});
    return normals;
}

TEST(VertexImage, MovesPointsAndLeavesCopiesAlone) {
    VertexImage image = sample();
    const VertexImage before = image;
    image.setNormals(normalsOf(image));
    const FN3Matrix<double> quarterTurn{{{0, -1, 0}, {1, 0, 0}, {0, 0, 1}}};
    image.translate({1, 0, 0});
    image.rotate(quarterTurn);
    image.scale(2);
    EXPECT_EQ(image.vertex({1, 0}), (Vertex{-4, 4, 6}));
    EXPECT_EQ(image.normals().get({2, 1}), (Vertex{0, 1, 0}));
    EXPECT_EQ(image.rangeImage().get({2, 1}), 12);
    EXPECT_EQ(image.avgNormal(), (Vertex{0, 0.5, 0.5})) << "only of valid positions";
    EXPECT_EQ(before.vertex({1, 0}), (Vertex{1, 2, 3}));

    image.setValidity({2, 1}, false);
    EXPECT_FALSE(image.valid({2, 1}));
    EXPECT_TRUE(before.valid({2, 1}));
    const VertexImage turned = before.transposed();
    EXPECT_EQ(turned.w(), 2u);
    EXPECT_TRUE(turned.valid({1, 2}));
    EXPECT_EQ(turned.vertex({0, 1}), (Vertex{1, 2, 3}));
}

TEST(VertexImage, RefusesWhatDoesNotFit) {
    VertexImage image = sample();
    EXPECT_EQ(image.normals().size(), 1u);
    EXPECT_FALSE(image.hasNormals());
    EXPECT_THROW(image.avgNormal(), FNEBadFunCall);
    EXPECT_THROW(image.setNormals(FNImage<Vertex>(2, 3)), FNEBadArg);
    EXPECT_THROW(VertexImage(FNImage<Vertex>(3, 2), FNImage<bool>(2, 3)), FNEBadArg);
    EXPECT_THROW(image.valid({3, 0}), FNEOutOfRange);
}

TEST(VertexImage, IsPackedAndUnpacked) {
    VertexImage withNormals = sample();
    withNormals.setNormals(normalsOf(withNormals));
    VertexImage one(1, 1);
    for (const VertexImage& image : {sample(), withNormals, one, VertexImage()}) {
        const auto back = Fn::deSerialize<VertexImage>(Fn::serialize(image));
        EXPECT_EQ(back.vertices(), image.vertices());
        EXPECT_EQ(back.validity(), image.validity());
        EXPECT_EQ(back.normals(), image.normals());
        EXPECT_EQ(back.hasNormals(), image.hasNormals());
        EXPECT_EQ(back.attributes(), image.attributes());
    }
    // The first vertex of a 1 by 1 grid, stored as doubles are: less significant word first.
    one.setVertex({0, 0}, {1, 0, 0});
    const Fn::Package package = one.serialize();
    const auto& pixels = *std::next(package.cores().begin(), 3);
    ASSERT_EQ(pixels.size(), 24u);
    EXPECT_EQ(pixels.data()[4], 0x3f);
    EXPECT_EQ(pixels.data()[5], 0xf0);

    // Normals of another size, and a list that goes on.
    const std::list<Fn::Package> elements = withNormals.serialize();
    std::list<Fn::Package> wrong = elements, longer = elements;
    *std::next(wrong.begin()) = Fn::serialize(FNImage<Vertex>(2, 2));
    longer.push_back(Fn::Package(1));
    EXPECT_THROW(VertexImage(Fn::Package(wrong)), FNEBadArg);
    EXPECT_THROW(VertexImage(Fn::Package(longer)), FNEBadArg);
}

} // namespace
