#include "fn/sparse_image.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <numeric>
#include <vector>

namespace {

FNImage<int> numbered(std::uint32_t w, std::uint32_t h) {
    FNImage<int> image(w, h);
    std::iota(image.getExclusive(), image.getExclusive() + image.size(), 0);
    return image;
}

TEST(Geometry, RealsBecomeGridPositionsWithoutOverflow) {
    const float big = 3e9f;
    EXPECT_EQ(FNGridPos(FNPos(1.9f, -1.9f)), FNGridPos(1, -1));
    EXPECT_EQ(FNGridPos(FNPos(big, -big)), FNGridPos(2147483647, -2147483647 - 1));
    EXPECT_EQ(FNGridPos(FNPos(2147483648.0f, std::nanf(""))), FNGridPos(2147483647, 0));
}

TEST(Geometry, BoxesIntersect) {
    const FNBox box{0, 0, 10, 20};
    const struct {
        FNBox other, both;
    } cases[] = {{{-5, -5, 5, 5}, {0, 0, 5, 5}},
                 {{9, 19, 30, 30}, {9, 19, 10, 20}},
                 {{10, 0, 12, 20}, {}},
                 {{2, 25, 4, 30}, {}},
                 {{5, 5, 4, 8}, {}}};
    for (const auto& c : cases) {
        EXPECT_EQ(box & c.other, c.both);
        EXPECT_EQ(c.other & box, c.both);
    }
    const FNBox all{-2147483647 - 1, 0, 2147483647, 1};
    EXPECT_EQ(all.width(), 4294967295u);
    EXPECT_FALSE(box.contains({10, 0}));
    EXPECT_TRUE(box.contains({9, 19}));
}

TEST(Raster, PixelsHaveTheirMemoryLayout) {
    static_assert(sizeof(Fn::Bgra32) == 4 && sizeof(Fn::Rgb48) == 6);
    const Fn::Bgra32 opaque(1, 2, 3);
    unsigned char bytes[4];
    std::memcpy(bytes, &opaque, 4);
    EXPECT_EQ(std::vector<int>(bytes, bytes + 4), (std::vector<int>{3, 2, 1, 255}));
    const Fn::Rgb48 wide(1, 2, 3);
    unsigned short words[3];
    std::memcpy(words, &wide, 6);
    EXPECT_EQ(std::vector<int>(words, words + 3), (std::vector<int>{1, 2, 3}));
    EXPECT_NE(opaque, Fn::Bgra32(1, 2, 3, 254));
}

TEST(Raster, NoWidthMeansNoHeight) {
    EXPECT_EQ(FNImage<float>(0, 7).h(), 0u);
    EXPECT_EQ(FNImage<float>(7, 0).w(), 0u);
    EXPECT_EQ(FNImage<float>(FNRMem<float>(4), 3, 0).w(), 0u);
    EXPECT_EQ(FNImage<float>(), FNImage<float>(0, 7));
}

TEST(Raster, AWriterDoesNotChangeCopies) {
    const FNImage<int> image = numbered(3, 2);
    FNImage<int> copy = image;
    EXPECT_EQ(copy.data(), image.data());
    copy.set({2, 1}, 50);
    EXPECT_EQ(image(2, 1), 5);
    EXPECT_EQ(copy.get({2, 1}), 50);
    EXPECT_NE(copy, image);
    copy.set({2, 1}, 5);
    EXPECT_EQ(copy, image);
    EXPECT_NE(numbered(3, 2), numbered(2, 3));
}

TEST(Raster, RefusesWhatLiesOutside) {
    FNImage<int> image = numbered(3, 2);
    for (const FNGridPos pos : {FNGridPos(3, 0), FNGridPos(0, 2), FNGridPos(-1, 1)}) {
        EXPECT_THROW(image.set(pos, 1), FNEOutOfRange);
        EXPECT_THROW(image.get(pos), FNEOutOfRange);
    }
    EXPECT_THROW(FNImage<int>(FNRMem<int>(5), 3, 2), FNEBadArg);
    EXPECT_EQ(FNImage<int>(image.mem(), 2, 2).span().size(), 4u) << "a view of the first pixels";
}

TEST(Raster, IteratorsWalkTheRectangleInside) {
    FNImage<int> image = numbered(4, 3);
    const struct {
        FNBox box;
        std::vector<int> pixels;
    } cases[] = {{{0, 0, 4, 3}, {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11}},
                 {{1, 1, 3, 3}, {5, 6, 9, 10}},
                 {{3, -7, 90, 2}, {3, 7}},
                 {{4, 0, 9, 3}, {}},
                 {{2, 2, 1, 1}, {}}};
    for (const auto& c : cases) {
        std::vector<int> seen, seenByRows;
        for (FNConstImIter<int> it(image, c.box); !it.atEnd(); ++it) {
            seen.push_back(*it);
            EXPECT_EQ(image(std::max(c.box.x0, 0) + it.x(), std::max(c.box.y0, 0) + it.y()), *it);
        }
        for (FNConstImIter<int> it(image, c.box); !it.atEnd(); it.nextRow())
            seenByRows.insert(seenByRows.end(), it.restOfRow().begin(), it.restOfRow().end());
        EXPECT_EQ(seen, c.pixels);
        EXPECT_EQ(seenByRows, c.pixels);
    }
    const FNImage<int> before = image;
    for (FNImIter<int> it(image, {1, 1, 2, 3}); !it.atEnd(); ++it) *it = -1;
    EXPECT_EQ(before, numbered(4, 3));
    EXPECT_EQ(image(1, 2), -1);
    EXPECT_EQ(std::count(image.data(), image.data() + 12, -1), 2);
}

TEST(SparseImages, ExpandWithZerosOutsideTheBlocks) {
    const FNImage<int> full = numbered(5, 4);
    const PixelBlockRanges pixels{0, 2, 4, 5}, lines{1, 2, 0, 0};
    SparseImage<int> sparse(full, pixels, lines);
    FNImage<int> expected(5, 4);
    expected.fill(0);
    for (const int x : {0, 1, 4}) expected.set({x, 1}, full.get({x, 1}));
    EXPECT_EQ(FNImage<int>(sparse), expected);

    std::vector<std::uint32_t> xs;
    for (ConstSparseImageIterator<int> it(sparse); !it.atEnd(); ++it) {
        EXPECT_EQ(*it, full(it.x(), it.y()));
        xs.push_back(it.x());
    }
    EXPECT_EQ(xs, (std::vector<std::uint32_t>{0, 1, 4}));

    const SparseImage<int> before = sparse;
    for (SparseImageIterator<int> it(sparse); !it.atEnd(); ++it) *it = 7;
    EXPECT_EQ(FNImage<int>(before), expected);
    EXPECT_EQ(FNImage<int>(sparse).get({4, 1}), 7);
    EXPECT_EQ(FNImage<int>(SparseImage<int>(FNImage<int>(), {}, lines, 2, 2)).get({1, 1}), 0);
}

TEST(SparseImages, RefuseRangesThatDoNotFit) {
    const FNImage<int> data(2, 2);
    const PixelBlockRanges good{0, 2, 0, 0};
    const std::string wrongLines = "FNEBadArg: Invalid line ranges for SparseImages";
    const std::string wrongPixels = "FNEBadArg: Invalid pixel ranges for SparseImages";
    const struct {
        PixelBlockRanges pixels, lines;
        std::string message;
    } cases[] = {
        {{2, 4, 0, 0}, good, wrongPixels},
        {{3, 1, 0, 0}, good, wrongPixels},
        {{0, 1, 3, 4}, good, wrongPixels},
        {{0, 1, 2, 1}, good, wrongPixels},
        {good, {4, 6, 0, 0}, wrongLines},
        {good, {0, 1, 5, 6}, wrongLines},
        {{0, 3, 0, 0}, good, "FNEBadArg: The data of a SparseImage do not have the size of its ranges"},
        {good, {3, 5, 0, 0}, "nothing thrown"}};
    for (const auto& c : cases)
        EXPECT_EQ(thrownBy([&] { SparseImage<int>(data, c.pixels, c.lines, 3, 5); }), c.message);
}

} // namespace
