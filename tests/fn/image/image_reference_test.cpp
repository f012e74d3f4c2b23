#include "fn/image_blit.h"
#include "fn/image_package.h"
#include "fn/image_reference.h"
#include "fn/imagefile/image_compressor.h"
#include "fn/imagefile/image_limits.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <future>
#include <numeric>

namespace {

using Fn::Bgra32;
using Fn::Package;
using Fn::Rgb48;
using Factory = FNImageReferenceFactory;
using Byte = unsigned char;
using Word = unsigned short;

/// An image with `make(i)` in its i-th pixel.
template <class T, class Make> FNImage<T> filled(std::uint32_t w, std::uint32_t h, Make make) {
    FNImage<T> image(w, h);
    T* out = image.getExclusive();
    for (std::uint32_t i = 0; i < w * h; ++i) out[i] = make(i);
    return image;
}

const FNImage<Byte> bytes = filled<Byte>(7, 5, [](unsigned i) { return static_cast<Byte>(i * 37); });
const FNImage<Word> words = filled<Word>(7, 5, [](unsigned i) { return static_cast<Word>(i * 5003); });
/// Each one is what a 16-bit sample stands for, so that 16 bits hold them.
const FNImage<float> reals = filled<float>(7, 5, [](unsigned i) { return (float(i * 1801) + 0.5f) / 65536; });
const FNImage<Bgra32> colors =
    filled<Bgra32>(7, 5, [](unsigned i) { return Bgra32(Byte(i * 31), Byte(i * 57), Byte(255 - i)); });
const FNImage<Rgb48> wideColors =
    filled<Rgb48>(7, 5, [](unsigned i) { return Rgb48(Word(i * 3001), Word(i * 777), Word(65535 - i)); });

std::vector<int> bytesOf(const Package& package) {
    std::vector<Byte> result(package.size());
    package.write(result.data());
    return {result.begin(), result.end()};
}

/// The packed form with one element replaced.
Package withElement(const FNImageReference& image, unsigned index, const Package& replacement) {
    std::list<Package> elements = image.serialize();
    *std::next(elements.begin(), index) = replacement;
    return Package(elements);
}

std::string elementText(const Package& package, unsigned index) {
    const std::list<Package> elements = package;
    return Fn::deSerialize<std::string>(*std::next(elements.begin(), index));
}

FNRMem<Byte> block(std::initializer_list<int> values) {
    FNRMem<Byte> result(values.size());
    std::copy(values.begin(), values.end(), result.getExclusive());
    return result;
}

TEST(ImageReference, SharesThePixelsOfTheStoredType) {
    EXPECT_EQ(Factory::create(words).toMono16().data(), words.data());
    EXPECT_EQ(Factory::create(colors).toBgra32().data(), colors.data());
    const FNImageReference gray = Factory::create(bytes);
    EXPECT_EQ(gray.to<Byte>().data(), bytes.data());
    EXPECT_EQ(gray.toMono16()(1, 0), (37 << 8) + 128);
    EXPECT_EQ(gray.box(), (FNBox{0, 0, 7, 5}));
}

TEST(ImageReference, KnowsItsStoredType) {
    const struct {
        FNImageReference image;
        int native;
        bool color;
        const char* name;
    } cases[] = {{Factory::create(bytes), 0, false, "mono8"},
                 {Factory::create(words), 1, false, "mono16"},
                 {Factory::create(reals), 2, false, "monoFloat"},
                 {Factory::create(colors), 3, true, "bgra32"},
                 {Factory::create(wideColors), 4, true, "rgb48"}};
    for (const auto& c : cases) {
        EXPECT_EQ(c.image.native(), c.native);
        EXPECT_EQ(c.image.isColor(), c.color);
        EXPECT_EQ(elementText(c.image.serialize(), 0), c.name);
    }
    const FNImageReference none;
    EXPECT_EQ(none.w() * 10 + none.h(), 11u);
    EXPECT_EQ(none.native(), FNImageReference::MONO8);
}

TEST(ImageReference, ReadsBackWhatItWritesInEveryStrategy) {
    const FNImageAttributes attributes{{"", "empty key"}, {"a", ""}, {"key", "line\nline \"quoted\""}};
    const FNImageReference images[] = {Factory::create(bytes, attributes), Factory::create(words, attributes),
                                       Factory::create(reals, attributes),
                                       Factory::create(colors, attributes),
                                       Factory::create(wideColors, attributes)};
    for (const FNImageReference& image : images)
        for (int strategy = 0; strategy < 3; ++strategy) {
            image.setSerializationStrategy(static_cast<FNImageReference::SerializationStrategy>(strategy));
            const FNImageReference read(image.serialize());
            EXPECT_EQ(read.native(), image.native());
            EXPECT_EQ(read.getSerializationStrategy(), strategy);
            EXPECT_EQ(read.attributes(), attributes);
            EXPECT_EQ(read.toMonoFloat(), image.toMonoFloat()) << strategy << ' ' << image.native();
            EXPECT_EQ(read.toRgb48(), image.toRgb48());
            EXPECT_EQ(read.serialize(), image.serialize());
        }
}

TEST(ImageReference, RawPixelsAreStoredMostSignificantByteFirst) {
    FNImage<Rgb48> rgb(1, 1);
    rgb.fill({0x0102, 0x0304, 0x0506});
    FNImage<float> real(1, 1);
    real.fill(1.0f);
    FNImage<Bgra32> bgra(1, 1);
    bgra.fill({3, 2, 1, 4});
    const std::vector<int> head{0, 0, 0, 2, 0, 0, 0, 8};
    const auto expected = [&](std::vector<int> pixels) {
        std::vector<int> all = head;
        all.insert(all.end(), {0, 0, 0, static_cast<int>(pixels.size()), 0, 0, 0, 1, 0, 0, 0, 1});
        all.insert(all.end(), pixels.begin(), pixels.end());
        return all;
    };
    EXPECT_EQ(bytesOf(Fn::serialize(rgb)), expected({1, 2, 3, 4, 5, 6}));
    EXPECT_EQ(bytesOf(Fn::serialize(real)), expected({0x3F, 0x80, 0, 0}));
    EXPECT_EQ(bytesOf(Fn::serialize(bgra)), expected({1, 2, 3, 4}));
    EXPECT_EQ(Fn::deSerialize<FNImage<Rgb48>>(Fn::serialize(rgb)), rgb);
    EXPECT_TRUE(Fn::deSerialize<FNImage<float>>(Fn::serialize(FNImage<float>())).empty());
}

TEST(ImageReference, RawPackagesOfAnotherShapeAreRefused) {
    const FNRMem<Byte> head = block({0, 0, 0, 2, 0, 0, 0, 3});
    const std::list<Package> wrong{
        Package(),
        Package(std::list{head}),
        Package(std::list{head, FNRMem<Byte>(5)}),
        Package(std::list{head, FNRMem<Byte>(7)}),
        Package(std::list{head, FNRMem<Byte>(6), FNRMem<Byte>(6)}),
        Package(std::list{block({0, 2, 0, 3}), FNRMem<Byte>(6)}),
        Package(std::list{block({255, 255, 255, 255, 255, 255, 255, 255}), FNRMem<Byte>(1)})};
    for (const Package& package : wrong)
        EXPECT_EQ(thrownBy([&] { Fn::deSerialize<FNImage<Byte>>(package); }),
                  "FNEBadArg: converting to FNImage<T> from an invalid package");
    EXPECT_EQ(Fn::deSerialize<FNImage<Byte>>(Package(std::list{head, FNRMem<Byte>(6)})).h(), 3u);
}

TEST(ImageReference, OlderMarkersAreReadAndWrittenAsThePresentOnes) {
    const FNImageReference raw = Factory::create(words);
    const FNImageReference native(withElement(raw, 4, Fn::serialize<std::string>("NATIVE")));
    EXPECT_EQ(native.toMono16(), words);
    EXPECT_EQ(elementText(native.serialize(), 4), "UNCOMPRESSED_RAW");
    const FNImageReference png = Factory::create(words, {}, FNImageReference::COMPRESSED_PNG);
    const FNImageReference lossless(withElement(png, 4, Fn::serialize<std::string>("LOSSLESS_COMPRESSED")));
    EXPECT_EQ(lossless.toMono16(), words);
    EXPECT_EQ(elementText(lossless.serialize(), 4), "COMPRESSED_PNG");
}

TEST(ImageReference, ReservedElementsAreAcceptedAndKept) {
    const FNImageReference image = Factory::create(bytes);
    const Fn::TimeStamp time(Fn::TimeStamp::Duration(1234567));
    Package package = withElement(image, 1, Fn::serialize(Fn::Optional<unsigned int>(9u)));
    package = withElement(FNImageReference(package), 2, Fn::serialize(Fn::Optional<Fn::TimeStamp>(time)));
    EXPECT_EQ(FNImageReference(package).serialize(), package);
}

TEST(ImageReference, WrongPackagesAreRefused) {
    const FNImageReference raw = Factory::create(bytes);
    const FNImageReference png = Factory::create(bytes, {}, FNImageReference::COMPRESSED_PNG);
    const FNImageReference jpegLs = Factory::create(bytes, {}, FNImageReference::COMPRESSED_JPEGLS);
    const FNImageReference file = Factory::createCompressed(FNRMem<Byte>(3));
    const Package twoBlocks(std::list{FNRMem<Byte>(1), FNRMem<Byte>(1)});
    const auto text = [](const char* t) { return Fn::serialize<std::string>(t); };
    const struct {
        Package package;
        const char* failure;
    } cases[] = {
        {withElement(raw, 0, text("mono9")), "FNEBadFormat: Unknown image type!"},
        {withElement(raw, 4, text("ZIPPED")),
         "FNEBadFormat: FNImageReference: de-serialized invalid image serialization format marker"},
        {withElement(png, 5, twoBlocks), "FNEBadArg: FNImageReference: error de-serializing COMPRESSED_PNG"},
        {withElement(jpegLs, 5, twoBlocks),
         "FNEBadArg: FNImageReference: error de-serializing COMPRESSED_JPEGLS"},
        {withElement(file, 5, twoBlocks), "FNEGeneric: CompressedImgRepresentation: Illegal package format"}};
    for (const auto& c : cases) EXPECT_EQ(thrownBy([&] { FNImageReference{c.package}; }), c.failure);
    raw.setSerializationStrategy(static_cast<FNImageReference::SerializationStrategy>(7));
    EXPECT_EQ(thrownBy([&] { raw.serialize(); }),
              "FNEBadArg: FNImageReference: Cannot serialize -- unknown image serialization format (7)");
}

TEST(CompressedImage, IsDecodedWhenPixelsAreNeededAndWrittenAsItIs) {
    const FNRMem<Byte> file = FNImageCompressor::compressJpeg(colors, 100);
    const FNImageReference image = Factory::createCompressed(file, {{"k", "v"}});
    EXPECT_EQ(image.getSerializationStrategy(), FNImageReference::UNCOMPRESSED_RAW);
    const Package package = image.serialize();
    EXPECT_EQ(elementText(package, 0), "compresssed");
    EXPECT_EQ(package.cores().back(), file);
    const FNImageReference read(package);
    EXPECT_EQ(read.attributes(), image.attributes());
    EXPECT_EQ(read.w(), 7u);
    EXPECT_TRUE(read.isColor());

    // Threads that ask at once get the same decoded pixels.
    std::vector<std::future<const Bgra32*>> askers;
    for (int i = 0; i < 4; ++i)
        askers.push_back(std::async(std::launch::async, [&] { return image.toBgra32().data(); }));
    for (auto& asker : askers) EXPECT_EQ(asker.get(), image.toBgra32().data());
}

TEST(CompressedImage, PassesOnTheFailureOfTheReader) {
    const FNImageReference garbage = Factory::createCompressed(block({1, 2, 3}));
    for (int attempt = 0; attempt < 2; ++attempt)
        EXPECT_EQ(thrownBy([&] { garbage.w(); }),
                  "FNEBadArg: Fn::readImage: Not a known image format in input stream");
    Fn::ImageLimits small;
    small.maxWidth = 6;
    const FNImageReference wide =
        Factory::createCompressed(FNImageCompressor::compressJpeg(bytes, 100), {}, small);
    EXPECT_THROW(wide.toMono8(), FNEBadFormat);
}

TEST(ImageAttributes, HelpersReadWhatTheyWrite) {
    FNImageAttributes attributes;
    EXPECT_FALSE(Fn::getImageSrcNameAttribute(attributes).isSet());
    Fn::addImageSrcNameAttribute(attributes, "old");
    Fn::addImageSrcNameAttribute(attributes, "camera 1");
    Fn::addEyePosAttributes(attributes, {1.5f, -2}, {1e-6f, 123456.7f});
    const auto time = Fn::TimeStamp::fromString("2024-02-29T12:00:00.5Z");
    Fn::addImageCaptureTime(attributes, time);
    EXPECT_EQ(*Fn::getImageSrcNameAttribute(attributes), "camera 1");
    EXPECT_EQ(attributes["EYEPOS"], "1.5 -2 0.000001 123456.7");
    EXPECT_EQ(Fn::getEyePosAttributes(attributes)->right, FNPos(1e-6f, 123456.7f));
    EXPECT_EQ(*Fn::getImageCaptureTime(attributes), time);
    for (const char* wrong : {"", "1 2 3", "1 2 3 four", "1 2 3 4 5"}) {
        attributes["EYEPOS"] = wrong;
        EXPECT_THROW(Fn::getEyePosAttributes(attributes), FNEBadFormat) << wrong;
    }
}

TEST(TimeStamp, TextsReadBack) {
    using Fn::TimeStamp;
    const TimeStamp time(TimeStamp::Duration(951782399000042)); // 2000-02-28 23:59:59.000042
    EXPECT_EQ(time.asString(), "2000-02-28T23:59:59.000042Z");
    EXPECT_EQ(TimeStamp::fromString(time.asString()), time);
    EXPECT_EQ(TimeStamp::fromString("2000-02-28T23:59:59Z"), time - TimeStamp::Duration(42));
    const TimeStamp before(TimeStamp::Duration(-1));
    EXPECT_EQ(before.asString(), "1969-12-31T23:59:59.999999Z");
    EXPECT_EQ(Fn::deSerialize<TimeStamp>(Fn::serialize(before)), before);
    EXPECT_LT(before, time);
    for (const char* wrong :
         {"", "2001-02-29T00:00:00Z", "2000-02-28 23:59:59Z", "2000-02-28T24:00:00Z", "2000-02-28T23:59:59.Z",
          "2000-02-28T23:59:59.0000001Z", "2000-02-28T23:59:59Zx"})
        EXPECT_THROW(TimeStamp::fromString(wrong), FNEBadFormat) << wrong;
}

TEST(TimeStamp, LocalTextIsDateAndTimeOfDay) {
    setenv("TZ", "XYZ-2", 1); // two hours ahead of universal time
    tzset();
    EXPECT_EQ(Fn::TimeStamp::fromString("2024-12-31T22:30:05.9Z").localAsString(), "2025-01-01 00:30:05");
    unsetenv("TZ");
    tzset();
}

TEST(Blit, PastesWhatFitsWhole) {
    FNImage<Byte> source(2, 2);
    source.fill(9);
    FNImage<Word> target(4, 3);
    target.fill(0);
    Fn::blitIntoImage(Factory::create(source), target, {2, 1});
    EXPECT_EQ(target(2, 1), (9 << 8) + 128);
    EXPECT_EQ(target(1, 1) + target(3, 0), 0);
    EXPECT_EQ(std::accumulate(target.data(), target.data() + 12, 0), 4 * ((9 << 8) + 128));
    FNImage<Byte> same(2, 3);
    same.fill(0);
    Fn::blitIntoImage(Factory::create(source), same, {0, 1});
    EXPECT_EQ(same(1, 0), 0);
    EXPECT_EQ(same(1, 2), 9);
    for (const FNGridPos offset :
         {FNGridPos(3, 0), FNGridPos(0, 2), FNGridPos(-1, 0), FNGridPos(2147483647, 0)})
        EXPECT_EQ(thrownBy([&] { Fn::blitIntoImage(Factory::create(source), target, offset); }),
                  "FNEBadArg: Fn::blitIntoImage(): Invalid source size or offset");
}

} // namespace
