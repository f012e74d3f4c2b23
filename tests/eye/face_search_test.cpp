#include "eye/cara/face_pyramid.h"
#include "eye/cara/frame_scale_sequencer.h"
#include "eye/cara/overlap_removal.h"
#include "eye/neighbour_clustering.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <set>

namespace {

using namespace Eye;
using Implementation::FrameScaleSequencer;
using Implementation::SamplingScheme;
using Locations = std::multiset<FaceFinder::Location, MoreConfident>;
using FaceClustering = NeighbourClustering<FaceFinderClusteringItem, FaceFinder::Location>;
using FeatureClustering = NeighbourClustering<FacialFeatureLocation, FacialFeatureLocation>;

TEST(NeighbourClustering, JoinsNeighboursOfNeighboursAtSimilarScales) {
    FaceClustering clustering(7);
    FaceClustering::Results results;
    EXPECT_FALSE(clustering.computeClusterRepresentations(results));
    clustering.add({{100, 100}, 20, {{0.0f, 1.0f}}});
    clustering.add({{108, 100}, 20, {{0.2f, 2.0f}}}); // further than 4.04 from the first
    clustering.add({{104, 100}, 20, {{0.0f, 0.0f}}}); // but within it of this one
    clustering.add({{104, 100}, 29, {{0.0f, 5.0f}}}); // more than 1.4 times as large
    EXPECT_TRUE(clustering.computeClusterRepresentations(results));
    ASSERT_EQ(results.size(), 2u);
    EXPECT_EQ(results.begin()->confidence, 5);
    const FaceFinder::Location& joined = *std::next(results.begin());
    const double g1 = std::exp(1.0), g2 = std::exp(2.0), g3 = 1;
    EXPECT_EQ(joined.confidence, 2);
    EXPECT_NEAR(joined.pos.x, (100 * g1 + 108 * g2 + 104 * g3) / (g1 + g2 + g3), 1e-3);
    EXPECT_NEAR(joined.rotationAngle, 0.2 * g2 / (g1 + g2 + g3), 1e-6);
    EXPECT_NEAR(joined.width, 20, 1e-5);
}

TEST(NeighbourClustering, TheReachIsADiagonalStepOfTheTrainedSize) {
    for (const auto& [step, clusters] : {std::pair{1.0f, 1u}, std::pair{1.001f, 2u}}) {
        FeatureClustering clustering(16, 10);
        clustering.add({{50, 50}, 16, 0});
        clustering.add({{50 + step, 50 - step}, 16, 0});
        FeatureClustering::Results results;
        clustering.computeClusterRepresentations(results);
        EXPECT_EQ(results.size(), clusters) << step;
    }
}

TEST(NeighbourClustering, KeepsTheMostConfident) {
    FeatureClustering clustering(16, 3);
    for (const float confidence : {1.0f, 4.0f, 2.0f, 3.0f, 0.0f})
        clustering.add({{confidence * 50, 0}, 16, confidence});
    FeatureClustering::Results results;
    clustering.computeClusterRepresentations(results);
    ASSERT_EQ(results.size(), 3u);
    EXPECT_EQ(results.begin()->confidence, 4);
    EXPECT_EQ(results.rbegin()->confidence, 2);
    EXPECT_EQ(
        thrownBy([] { FaceClustering(7, 5); }),
        "FNEBadArg: Eye::NeighbourClustering : Do not use input type 'FaceFinderClusteringItem' when you set "
        "maxNofElements!=0");
}

TEST(OverlapRemoval, TheMoreConfidentOfTwoCloseFacesStays) {
    const auto kept = [](FNPos step, float angle) {
        Locations candidates;
        candidates.insert({{100, 100}, 20, 1, 0});
        candidates.insert({FNPos{100, 100} + step, 20, 2, angle});
        return Cara::T8::removeOverlaps(candidates).size();
    };
    EXPECT_EQ(kept({0.5f, 0}, 0), 1u);
    EXPECT_EQ(kept({29.9f, 0}, 0), 1u) << "1.5 eye distances across";
    EXPECT_EQ(kept({30.1f, 0}, 0), 2u);
    EXPECT_EQ(kept({0, 35.9f}, 0), 1u) << "1.8 along the face";
    EXPECT_EQ(kept({0, 36.1f}, 0), 2u);
    EXPECT_EQ(kept({31.9f, 0}, 1.5707963f), 1u) << "a lying face reaches further to the side";
    EXPECT_EQ(kept({26.4f, 19.8f}, 0.5f), 1u) << "a turned one in the direction that is its height";
    EXPECT_EQ(kept({-26.4f, 19.8f}, 0.5f), 2u);
    Locations equal;
    equal.insert({{10, 0}, 20, 1, 0});
    equal.insert({{11, 0}, 20, 1, 0});
    EXPECT_EQ(Cara::T8::removeOverlaps(equal).front().pos.x, 10) << "the first of equals";
}

TEST(SamplingScheme, SeesEveryPlaceOnceInACycle) {
    for (const std::uint32_t n : {2u, 3u, 4u, 5u, 7u}) {
        SamplingScheme scheme(n);
        std::set<std::pair<int, int>> seen;
        for (std::uint32_t i = 0; i < n * n; ++i, scheme.nextFrame()) {
            seen.emplace(scheme.offset().x, scheme.offset().y);
            EXPECT_LT(std::max(scheme.offset().x, scheme.offset().y), static_cast<int>(n));
        }
        EXPECT_EQ(seen.size(), n * n);
    }
    EXPECT_EQ(SamplingScheme(1).width(), 0u);
    EXPECT_EQ(SamplingScheme(7).offset(), (FNGridPos{5, 3}));
}

std::set<std::pair<unsigned, unsigned>> visited(const FrameScaleSequencer& sequencer) {
    std::set<std::pair<unsigned, unsigned>> positions;
    sequencer.forEachPosition([&](std::uint32_t x, std::uint32_t y) { positions.emplace(x, y); });
    return positions;
}

TEST(FrameScaleSequencer, LooksSparselyAndDenselyWhereSomethingWas) {
    FrameScaleSequencer sequencer(7, 20);
    sequencer.prepare({}, 60, 55);
    EXPECT_TRUE(sequencer.active());
    EXPECT_EQ(visited(sequencer).size(), 8u * 8u);
    sequencer.setStatus(10, 10, FrameScaleSequencer::nothing);
    sequencer.setStatus(0, 30, FrameScaleSequencer::candidate);
    sequencer.markFace({40.7f, 20.9f}, 20); // less the centre of the window: (32, 12)
    sequencer.setStatus(50, 0, FrameScaleSequencer::candidate);
    sequencer.markFace({28, 28}, 13.9f); // too small a face for this level
    sequencer.markFace({28, 28}, 28.1f); // too large
    sequencer.markFace({55.5f, 55.5f}, 27.9f);
    sequencer.finalizeFrame();
    sequencer.prepare({}, 60, 55);
    for (const auto& [x, y, dense] :
         {std::tuple{10u, 10u, false}, std::tuple{0u, 30u, true}, std::tuple{2u, 32u, true},
          std::tuple{3u, 30u, false}, std::tuple{30u, 10u, true}, std::tuple{34u, 14u, true},
          std::tuple{35u, 14u, false}, std::tuple{19u, 19u, false}, std::tuple{52u, 2u, true},
          std::tuple{53u, 2u, false}, std::tuple{47u, 47u, true}}) {
        EXPECT_EQ(sequencer.isDense(x, y), dense) << x << "," << y;
        if (dense) {
            EXPECT_TRUE(visited(sequencer).contains({x, y}));
        }
    }
    sequencer.finalizeFrame();
    EXPECT_FALSE(sequencer.isDense(32, 12)) << "attention lasts one frame";
}

TEST(FrameScaleSequencer, SmallLevelsGetAFinerLatticeAndStillImagesAll) {
    FrameScaleSequencer small(7, 20);
    small.prepare({}, 40, 60);
    EXPECT_EQ(visited(small).size(), 14u * 20u);
    FrameScaleSequencer off(0, 20);
    off.prepare({}, 5, 4);
    EXPECT_FALSE(off.active());
    EXPECT_EQ(visited(off).size(), 20u);
    FrameScaleSequencer empty(7, 20);
    empty.prepare({}, 0, 10);
    EXPECT_TRUE(visited(empty).empty());
}

TEST(FacePyramid, StepsDownByFourToThreeAndMapsBack) {
    FNImage<unsigned short> image(200, 160);
    image.fill(1000);
    const Cara::T8::Pyramid pyramid(image, 1.25f, 3);
    ASSERT_EQ(pyramid.size(), 3u);
    EXPECT_EQ(pyramid[0].image.w(), 160u);
    EXPECT_EQ(pyramid[1].image.w(), 120u);
    EXPECT_EQ(pyramid[2].image.h(), 72u);
    EXPECT_NEAR(averageEffectiveFactor(pyramid[2]), 1.25 * 16 / 9, 1e-4);
    EXPECT_TRUE(Cara::T8::Pyramid(image, 500, 3).empty()) << "nothing is left of the first level";
}

TEST(FacePyramid, TheBorderedLevelHoldsWhatTheSearchBoxNeeds) {
    FNImage<unsigned short> image(100, 80);
    image.fill(7);
    const Img::ScaledImage<unsigned short> level{image, Img::Affine::Mapping::scaling(2, 2)};
    const auto all = Cara::T8::addBorder(level, FaceFinder::everywhere);
    EXPECT_EQ(all.image.w(), 116u);
    EXPECT_EQ(all.image.h(), 96u);
    EXPECT_EQ(all.image(7, 8), 0);
    EXPECT_EQ(all.image(8, 8), 7);
    EXPECT_EQ(all.mapping({8, 8}), (FNPos{0, 0}));
    const auto part = Cara::T8::addBorder(level, {100, 60, 120, 80});
    EXPECT_EQ(part.mapping({0, 0}), (FNPos{82, 48}))
        << "(100.5 / 2 - 8.5, 60.5 / 2 - 5.99) is (41.75, 24.26)";
    EXPECT_EQ(part.image.w(), 27u);
    EXPECT_TRUE(Cara::T8::addBorder(level, {1000, 0, 1100, 50}).image.empty());
}

} // namespace
