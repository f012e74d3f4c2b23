#include "drawn_image.h"
#include "orbek/image_io.h"
#include "orbek/image_operations.h"
#include "orbek/implementation/adapt.h"
#include "orbek/implementation/image_src.h"
#include "orbek/implementation/video_format_body.h"
#include "orbek/video_format.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <sstream>

using namespace Orbek;

namespace {

std::vector<unsigned char> grayOf(const Image& image) {
    const unsigned char* const pixels = image->grayScaleRepresentation();
    return {pixels, pixels + std::size_t{image->width()} * image->height()};
}

std::vector<Rgb> colorOf(const Image& image) {
    const Rgb* const pixels = image->colorRepresentation();
    return {pixels, pixels + std::size_t{image->width()} * image->height()};
}

TEST(Adapt, ApplicationsPixelsAreReadWhereTheyLie) {
    const Image gray = grayPattern(7, 5), color = colorPattern(6, 4);
    EXPECT_EQ(adapt(gray).toMono8().data(), gray->grayScaleRepresentation());
    const FNImageReference reference = adapt(color);
    FNImage<Fn::Bgra32> pixels = reference.toBgra32();
    EXPECT_EQ(static_cast<const void*>(pixels.data()), color->colorRepresentation());
    const Rgb before = *color->colorRepresentation();
    *pixels.getExclusive() = Fn::Bgra32(1, 2, 3);
    EXPECT_EQ(*color->colorRepresentation(), before) << "a writer gets a copy";
    EXPECT_EQ(reference.native(), FNImageReference::BGRA32);
    EXPECT_EQ(adapt(gray).native(), FNImageReference::MONO8);
    EXPECT_EQ(thrownBy([] { adapt(Image()); }), "FNEBadArg: There is no image behind the handle");
}

TEST(Adapt, ConvertsAsTheEnginesDo) {
    for (const Image& image : {grayPattern(7, 5), colorPattern(6, 4)}) {
        const FNImageReference adapted = adapt(image);
        const FNImageReference own = image->isColor() ? FNImageReferenceFactory::create(adapted.toBgra32())
                                                      : FNImageReferenceFactory::create(adapted.toMono8());
        EXPECT_EQ(adapted.toMono8(), own.toMono8());
        EXPECT_EQ(adapted.toMono16(), own.toMono16());
        EXPECT_EQ(adapted.toMonoFloat(), own.toMonoFloat());
        EXPECT_EQ(adapted.toBgra32(), own.toBgra32());
        EXPECT_EQ(adapted.toRgb48(), own.toRgb48());
    }
}

TEST(Adapt, AnEnginesImageIsConvertedOnce) {
    const FNImageReference reference = adapt(colorPattern(1, 4));
    const Image image = adapt(reference, "name");
    EXPECT_EQ(image->name(), "name");
    EXPECT_TRUE(image->isColor());
    EXPECT_EQ(image->grayScaleRepresentation(), image->grayScaleRepresentation());
    EXPECT_EQ(static_cast<const void*>(image->colorRepresentation()), reference.toBgra32().data());
}

TEST(Adapt, ValuesComeThrough) {
    EXPECT_EQ(Box(10, 20, 5, 2), adapt(FNBox{5, 20, 10, 2}));
    EXPECT_EQ(adapt(Box(10, 20, 5, 2)), (FNBox{5, 2, 10, 20}));
    const Eyes::Location eyes{{1, 2}, {3, 4}, 0.5f, 0.25f};
    EXPECT_EQ(rightEye(eyes).pos, (FNPos{3, 4}));
    const Eyes::Location same = adapt(leftEye(eyes), rightEye(eyes));
    EXPECT_EQ(same.first, eyes.first);
    EXPECT_EQ(same.second, eyes.second);
    EXPECT_EQ(same.firstConfidence, 0.5f);
    EXPECT_EQ(same.secondConfidence, 0.25f);
    ImageSrc source([] { return grayPattern(3, 2); });
    EXPECT_EQ(source.get().w(), 3u);
    EXPECT_EQ(source.name(), "ImageSrc");
}

TEST(ImageIO, WhatWasSavedIsLoadedUnderItsName) {
    const ScratchFolder scratch;
    const auto stream = [&](const std::string& name) {
        return std::istringstream(scratch.read(name), std::ios::binary);
    };
    for (const Image& image : {grayPattern(31, 20), colorPattern(30, 21)}) {
        const std::string bmp = scratch.file("a.bmp"), pnm = scratch.file("a.pnm"),
                          png = scratch.file("a.png"), jpeg = scratch.file("a.jpg");
        Bmp::save(image, bmp);
        Pgm::save(image, pnm);
        Png::save(image, png, 6);
        Jpeg::save(image, jpeg, 100);
        auto bmpStream = stream("a.bmp"), pngStream = stream("a.png"), anyStream = stream("a.png"),
             jpegStream = stream("a.jpg");
        const std::string bytes = scratch.read("a.jpg");
        const auto size = static_cast<unsigned int>(bytes.size());
        struct Case {
            Image loaded;
            std::string name;
            bool exact;
        };
        const Case cases[] = {
            {Bmp::load(bmp), bmp, true},
            {Bmp::load(bmpStream), "std::istream", true},
            {Pgm::load(pnm), pnm, true},
            {Png::load(png), png, true},
            {Png::load(pngStream), "", true},
            {ImageIO::load(bmp), bmp, true},
            {ImageIO::load(anyStream), "fromStream", true},
            {Jpeg::load(jpeg), jpeg, false},
            {Jpeg::load(jpegStream), "fromStream", false},
            {Jpeg::load(bytes.data(), size), "fromBuffer", false},
        };
        for (const auto& [loaded, name, exact] : cases) {
            SCOPED_TRACE(name);
            EXPECT_EQ(loaded->name(), name);
            EXPECT_EQ(loaded->isColor(), image->isColor());
            ASSERT_EQ(loaded->width(), image->width());
            ASSERT_EQ(loaded->height(), image->height());
            if (!exact) continue;
            if (image->isColor()) {
                EXPECT_EQ(colorOf(loaded)[5].red, colorOf(image)[5].red);
                EXPECT_EQ(colorOf(loaded).back().green, colorOf(image).back().green);
            } else {
                EXPECT_EQ(grayOf(loaded), grayOf(image));
            }
        }
        std::ostringstream limited;
        const auto [written, quality] = Jpeg::saveWithSizeConstraint(image, limited, 1200);
        EXPECT_EQ(static_cast<std::size_t>(written), limited.str().size());
        EXPECT_LE(written, 1200);
        EXPECT_LT(quality, 100);
    }
    EXPECT_NE(thrownBy([] { Jpeg::load("/no/such.jpg"); }).find("/no/such.jpg"), std::string::npos);
    EXPECT_NE(thrownBy([] { Jpeg2000::load("nonsense", 8); }), "nothing thrown");
}

TEST(ImageIO, FeedbackTellsHowThePixelsAreStored) {
    class Recorder final : public ImageIO::PropertiesFeedbackBody {
    public:
        explicit Recorder(std::string& record) : record_(record) {}
        void compressionMode(const ImageIO::ColorMode& mode) override {
            record_ += "mode " + std::to_string(static_cast<int>(mode)) + " ";
        }
        void pixelDepth(unsigned int bits) override { record_ += "depth " + std::to_string(bits); }

    private:
        std::string& record_;
    };
    std::ostringstream file;
    Png::save(colorPattern(3, 3), file, 1);
    std::istringstream stream(file.str());
    std::string record;
    Png::load(stream, ImageIO::PropertiesFeedback(new Recorder(record)));
    EXPECT_EQ(record, "mode 2 depth 32");
}

TEST(ImageIO, LimitsHoldForTheProcess) {
    const ImageIO::Limits before = ImageIO::limits();
    EXPECT_EQ(before.maxWidth, 65535u);
    EXPECT_EQ(before.maxHeight, 65535u);
    EXPECT_EQ(before.maxPixels, 134217728u);
    EXPECT_EQ(before.maxBytes, 1073741824u);
    const std::string file = "P5 4 3 255\n" + std::string(12, 'x');
    const auto load = [&](const ImageIO::Limits& limits) {
        return thrownBy([&] {
                   ImageIO::setLimits(limits);
                   std::istringstream stream(file);
                   ImageIO::load(stream);
               })
            .substr(0, 12);
    };
    EXPECT_EQ(load({4, 3, 12, 12}), "nothing thro");
    for (const ImageIO::Limits& limits :
         std::vector<ImageIO::Limits>{{3, 3, 12, 12}, {4, 2, 12, 12}, {4, 3, 11, 12}, {4, 3, 12, 11}})
        EXPECT_EQ(load(limits), "FNEBadFormat");
    const ImageIO::Limits largest{0x7FFFFFFF, 0x7FFFFFFF, ~std::uint64_t{0}, ~std::uint64_t{0}};
    EXPECT_EQ(load(largest), "nothing thro");
    for (const ImageIO::Limits& limits : std::vector<ImageIO::Limits>{{0, 3, 12, 12},
                                                                      {4, 0, 12, 12},
                                                                      {4, 3, 0, 12},
                                                                      {4, 3, 12, 0},
                                                                      {0x80000000, 3, 12, 12},
                                                                      {4, 0x80000000, 12, 12}})
        EXPECT_EQ(load(limits), "FNEBadArg: I");
    EXPECT_EQ(ImageIO::limits().maxPixels, ~std::uint64_t{0}) << "wrong ones change nothing";
    ImageIO::setLimits(before);
}

TEST(ImageIO, RareVariantsAreRead) {
    std::istringstream bitmap("P1 2 1 10"), plain("P3 1 1 255 1 2 3");
    const Image black = ImageIO::load(bitmap), color = ImageIO::load(plain);
    EXPECT_FALSE(black->isColor());
    EXPECT_EQ(black->grayScaleRepresentation()[0], 0);
    EXPECT_EQ(black->grayScaleRepresentation()[1], 255);
    EXPECT_TRUE(color->isColor());
    EXPECT_EQ(color->colorRepresentation()[0].green, 2);
}

TEST(RotateImage, TurnsPixelsAndKeepsTheKind) {
    const Image row(new DrawnImage(3, 2, std::vector<unsigned char>{1, 2, 3, 4, 5, 6}));
    using Pixels = std::vector<unsigned char>;
    const std::pair<ImageRotation, Pixels> cases[] = {
        {ImageRotation::QuarterClockwise, {4, 1, 5, 2, 6, 3}},
        {ImageRotation::QuarterCounterClockwise, {3, 6, 2, 5, 1, 4}},
        {ImageRotation::Half, {6, 5, 4, 3, 2, 1}},
    };
    for (const auto& [rotation, pixels] : cases) {
        const Image turned = rotateImage(row, rotation);
        EXPECT_EQ(grayOf(turned), pixels);
        EXPECT_EQ(turned->width(), rotation == ImageRotation::Half ? 3u : 2u);
        EXPECT_EQ(turned->name(), "");
        EXPECT_FALSE(turned->isColor());
        EXPECT_TRUE(rotateImage(colorPattern(2, 1), rotation)->isColor());
    }
    EXPECT_EQ(rotateImage(row, static_cast<ImageRotation>(7)), row);
}

TEST(FaceToEyesPos, TurnsWithTheFace) {
    const Position left = faceToLeftEyePos({50, 40}, 0.5f, 20), right = faceToRightEyePos({50, 40}, 0.5f, 20);
    EXPECT_NEAR(right.x - left.x, 20 * std::cos(0.5), 1e-4);
    EXPECT_NEAR(right.y - left.y, 20 * std::sin(0.5), 1e-4);
    EXPECT_NEAR((left.x + right.x) / 2, 50, 1e-4);
    EXPECT_GT(right.y, 40) << "positive angles turn from x toward y";
}

TEST(VideoFormat, IsKeptAsItIs) {
    const VideoFormat format(CountedPtr<VideoFormat::Body>(new VideoFormat::Body(Fn::Package(12345))));
    std::stringstream stored;
    format.write(stored);
    const VideoFormat read(stored);
    EXPECT_EQ(read.body()->package().toInt32(), 12345);
    std::istringstream truncated(stored.str().substr(0, 7));
    EXPECT_NE(thrownBy([&] { VideoFormat damaged(truncated); }), "nothing thrown");
}

} // namespace
