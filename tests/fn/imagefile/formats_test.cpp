// What each reader and writer of an image file does with the library's own files, and what it refuses.

#include "fn/imagefile/attribute_text.h"
#include "fn/imagefile/bmp.h"
#include "fn/imagefile/byte_stream.h"
#include "fn/imagefile/gunzip.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/j2k.h"
#include "fn/imagefile/jpeg.h"
#include "fn/imagefile/jpegls.h"
#include "fn/imagefile/pbm.h"
#include "fn/imagefile/png.h"
#include "fn/imagefile/tiff.h"
#include "support/recorded_dialog.h"
#include "support/thrown.h"
#include "workshop.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>
#include <random>
#include <sstream>

namespace {

using Factory = FNImageReferenceFactory;
using Fn::Bgra32;
using testing::StartsWith;

std::vector<FNImageReference> allPixelTypes() {
    return {Factory::create(grayPicture()), Factory::create(widePicture()),
            Factory::create(Factory::create(widePicture()).toMonoFloat()), Factory::create(colorPicture()),
            Factory::create(wideColorPicture())};
}

std::string text(const FNRMem<unsigned char>& bytes) {
    return {bytes.begin(), bytes.end()};
}

// ---- detection

TEST(ReadImage, LeavesTheStreamBehindTheImage) {
    // Formats with an end of their own can follow each other in one stream.
    for (const std::string folder : {"jpeg", "png", "pbm"})
        for (const auto& path : fixtures(folder)) {
            if (isRefused(path)) continue;
            std::istringstream stream("skipped" + bytesOfFile(path) + "rest");
            stream.ignore(7);
            const RecordedDialog dialog;
            Fn::readImage(stream);
            std::string rest;
            stream >> rest;
            EXPECT_EQ(rest, "rest") << path;
        }
}

TEST(ReadImage, NamesWhatItCannotRead) {
    const Workshop workshop;
    workshop.write("empty", "");
    workshop.write("one", "P");
    workshop.write("text", "no image at all");
    const struct {
        std::string path, failure;
    } cases[] = {{workshop.path("absent"), "FNEIOError: Could not open file: " + workshop.path("absent")},
                 {workshop.path("."), "FNEIOError: Could not open file: " + workshop.path(".")},
                 {workshop.path("empty"), "FNEBadArg: Fn::readImage: cannot read " + workshop.path("empty")},
                 {workshop.path("one"),
                  "FNEBadArg: Fn::readImage: Not a known image format in " + workshop.path("one")},
                 {workshop.path("text"),
                  "FNEBadArg: Fn::readImage: Not a known image format in " + workshop.path("text")},
                 {fixture("jpegls/t87_h3.jls"), "FNEBadArg: jpeg lib error:Unsupported marker type 0xf7"}};
    for (const auto& c : cases) EXPECT_EQ(thrownBy([&] { Fn::readImage(c.path); }), c.failure);
    std::istringstream bad("P5 1 1 255\nx");
    bad.setstate(std::ios::failbit);
    const std::function<void()> checks[] = {[&] { Fn::checkIfIsJpeg(bad); }, [&] { Fn::checkIfIsPng(bad); },
                                            [&] { Fn::checkIfIsJ2k(bad); },  [&] { Fn::checkIfIsTiff(bad); },
                                            [&] { Fn::checkIfIsPbm(bad); },  [&] { Fn::readImage(bad); }};
    for (const auto& check : checks) EXPECT_THROW(check(), FNEIOError);
    EXPECT_EQ(thrownBy([&] { Fn::checkIfIsJpegLS(bad); }),
              "FNEBadFormat: checkIfIsJpegLS(): can not read from stream");
}

TEST(ReadImage, LooksIntoGzipOnlyBehindAFileName) {
    const std::string path = fixture("gzip/gray1.png.gz");
    EXPECT_EQ(largestDifference(Fn::readImage(path), Fn::readImage(fixture("png/gray1.png"))), 0);
    const std::string bytes = bytesOfFile(path);
    const std::string refusal = "FNEBadArg: Fn::readImage: Not a known image format in input stream";
    EXPECT_EQ(thrownBy([&] { Fn::readImage(bytes.data(), bytes.size()); }), refusal);
    if (!Workshop::has("gzip")) GTEST_SKIP() << "gzip is not installed";
    const Workshop workshop;
    workshop.run("gzip -c '" + path + "' > twice.gz"); // compressed twice
    EXPECT_EQ(thrownBy([&] { Fn::readImage(workshop.path("twice.gz")); }),
              "FNEBadArg: Fn::readImage: Not a known image format in " + workshop.path("twice.gz"));
    EXPECT_EQ(thrownBy([&] { Fn::gunzip(workshop.path("absent")); }),
              "FNEIOError: gunzip(): cannot open " + workshop.path("absent") + " for reading");
}

TEST(ReadImage, WorksOnAStreamThatCannotSeek) {
    /// Gives its bytes once, in one block.
    class Pipe : public std::streambuf {
    public:
        explicit Pipe(std::string bytes) : bytes_(std::move(bytes)) {
            setg(bytes_.data(), bytes_.data(), bytes_.data() + bytes_.size());
        }

    private:
        std::string bytes_;
    };
    for (const std::string name : {"jpeg/gray_progressive.jpg", "png/gray1.png", "j2k/color.jp2",
                                   "tiff/rgb16_msb.tif", "pbm/gray16.pgm", "bmp/yuy2.bmp"}) {
        Pipe pipe(bytesOfFile(fixture(name)));
        std::istream stream(&pipe);
        EXPECT_EQ(largestDifference(Fn::readImage(stream), Fn::readImage(fixture(name))), 0) << name;
        EXPECT_TRUE(!stream.fail() || stream.eof()) << name;
    }
}

TEST(WriteImage, ChoosesTheFormatByModeAndColor) {
    const Workshop workshop;
    const FNImageAttributes attributes{{"SRCNAME", "camera"}};
    const FNImageReference color = Factory::create(wideColorPicture(), attributes);
    const FNImageReference gray = Factory::create(widePicture(), attributes);
    Fn::writeImage(color, workshop.path("color"), FNImageCompressor::LOSSLESS);
    Fn::writeImage(gray, workshop.path("gray"), FNImageCompressor::LOSSLESS);
    EXPECT_EQ(Fn::readImage(workshop.path("color")).toBgra32(), color.toBgra32());
    EXPECT_EQ(Fn::readImage(workshop.path("color")).attributes(), attributes);
    EXPECT_EQ(Fn::readImage(workshop.path("gray")).toMono8(), gray.toMono8());
    std::size_t size = 1u << 20;
    for (const auto mode : {FNImageCompressor::BEST_QUALITY, FNImageCompressor::MEDIUM_QUALITY,
                            FNImageCompressor::LOW_QUALITY}) {
        Fn::writeImage(color, workshop.path("jpeg"), mode);
        const std::string bytes = bytesOfFile(workshop.path("jpeg"));
        EXPECT_EQ(bytes, text(Fn::writeJpeg(color, FNImageCompressor::jpegQuality(mode))));
        EXPECT_LT(bytes.size(), size);
        size = bytes.size();
    }
}

// ---- JPEG

TEST(Jpeg, WritesWhatItReads) {
    for (const FNImageReference& image : allPixelTypes()) {
        const std::string bytes = text(Fn::writeJpeg(image, 100));
        const FNImageReference read = Fn::readJpeg(bytes.data(), bytes.size());
        EXPECT_EQ(read.native(), image.isColor() ? FNImageReference::BGRA32 : FNImageReference::MONO8);
        EXPECT_LE(largestDifference(read, image), image.isColor() ? 60 : 3)
            << "colours have half the resolution";
    }
    FNImage<Bgra32> flat(40, 40);
    flat.fill({200, 100, 50, 7});
    const Workshop workshop;
    Fn::saveJpeg(Factory::create(flat), workshop.path("flat.jpg"), FNImageCompressor::BEST_QUALITY);
    const FNImageReference read = Fn::loadJpeg(workshop.path("flat.jpg"));
    EXPECT_LE(largestDifference(read, Factory::create(flat)), 1);
    EXPECT_EQ(read.toBgra32()(3, 3).a, 255);
}

TEST(Jpeg, LongFilesAreWhole) {
    FNImage<unsigned char> noise(500, 500);
    std::mt19937 random(5);
    for (FNImIter<unsigned char> it(noise, noise.box()); !it.atEnd(); ++it)
        *it = static_cast<unsigned char>(random());
    const std::string bytes = text(Fn::writeJpeg(Factory::create(noise), 100));
    EXPECT_GT(bytes.size(), 200000u);
    EXPECT_LE(largestDifference(Fn::readJpeg(bytes.data(), bytes.size()), Factory::create(noise)), 3);
}

TEST(Jpeg, TheSizeConstraintLowersTheQualityStepByStep) {
    const FNImageReference image = Factory::create(colorPicture());
    const auto size = [&](int quality) { return static_cast<int>(Fn::writeJpeg(image, quality).size()); };
    EXPECT_EQ(Fn::writeJpegWithSizeConstraint(image, size(100)).quality, 100);
    EXPECT_EQ(Fn::writeJpegWithSizeConstraint(image, size(100) - 1).quality, 95);
    std::ostringstream stream;
    const FNPair<unsigned int, int> result = Fn::writeJpegWithSizeConstraint(image, stream, size(60));
    EXPECT_EQ(stream.str().size(), result.first);
    EXPECT_EQ(result.first, static_cast<unsigned>(size(result.second)));
    EXPECT_EQ(result.second % 5, 0);
    EXPECT_EQ(thrownBy([&] { Fn::writeJpegWithSizeConstraint(image, 10); }),
              "FNEGeneric: Image size " + std::to_string(size(5)) +
                  " exceeded limit of 10 bytes under lowest available jpeg quality 5");
}

TEST(Jpeg, RefusesInItsOwnWords) {
    const auto color = colorPicture();
    const auto gray = grayPicture();
    const FNImageReference image = Factory::create(gray);
    using C = FNImageCompressor;
    std::istringstream noJpeg("P5 1 1 255\nx");
    std::ostringstream broken;
    broken.setstate(std::ios::badbit);
    const std::string quality =
        "FNEBadArg: FNImageCompressor::compressJpeg: quality factor must be between 1 and 100";
    const auto badFormat = static_cast<C::Format>(5);
    const struct {
        std::function<void()> call;
        std::string failure;
    } cases[] = {
        {[&] { C::compressJpeg(gray, 0); }, quality},
        {[&] { C::compressJpeg(color, 101); }, quality},
        {[&] { C::compress(gray, static_cast<C::Mode>(9), C::JPEG); }, quality},
        {[&] { C::compress(gray, C::LOSSLESS, C::JPEG); },
         "FNEBadArg: FNImageCompressor::compress: JPEG lossless not yet supported"},
        {[&] { C::compress(color, C::LOSSLESS, C::GZIP); },
         "FNEBadArg: FNImageCompressor::compress: format not yet supported"},
        {[&] { C::compress(gray, C::LOSSLESS, C::GZIP); },
         "FNEBadArg: FNImageCompressor::compress: the Gzip format is not yet supported"},
        {[&] { C::compress(gray, C::LOSSLESS, badFormat); },
         "FNEBadArg: FNImageCompressor::compress: format not supported"},
        {[&] { C::decompress(C::GZIP, C::compressJpeg(gray, 50)); },
         "FNEBadArg: FNImageCompressor::decompress: format not supported"},
        {[&] { Fn::readJpeg(noJpeg); },
         "FNEBadArg: Fn::readJpeg: got a stream  not containing a jpeg image."},
        {[&] { Fn::writeJpeg(image, broken, 50); },
         "FNEIOError: writeJpeg: Error writing JPEG bytes to stream"},
    };
    for (const auto& c : cases) EXPECT_EQ(thrownBy(c.call), c.failure);
    EXPECT_THAT(thrownBy([&] { C::compressJpeg(FNImage<unsigned char>(), 50); }),
                StartsWith("FNEBadArg: jpeg lib error:"));
    EXPECT_THAT(thrownBy([&] { Fn::readJpeg("\xFF\xD8\xFF\xD9", 4); }),
                StartsWith("FNEBadArg: jpeg lib error:"));
}

TEST(Jpeg, DamageThatCanBeBridgedGivesAWarning) {
    const RecordedDialog dialog;
    const std::string bytes = bytesOfFile(fixture("jpeg/color_420_restart.jpg"));
    EXPECT_EQ(Fn::readImage(bytes.data(), bytes.size() - 10).w(), 13u);
    const Workshop workshop;
    workshop.write("cut.jpg", bytes.substr(0, bytes.size() - 10));
    Fn::loadJpeg(workshop.path("cut.jpg"));
    ASSERT_EQ(dialog.messages().size(), 2u);
    EXPECT_THAT(dialog.messages()[0], StartsWith("warn: jpeg lib warning(s): "));
    EXPECT_THAT(dialog.messages()[1], testing::EndsWith(" in " + workshop.path("cut.jpg")));
}

// ---- PNG

TEST(Png, ReadsBackEveryPixelTypeAtEveryLevel) {
    for (const FNImageReference& image : allPixelTypes())
        for (const int level : {-1, 0, 6, 9, 100}) {
            std::stringstream stream;
            Fn::writePng(image, stream, level);
            const FNImageReference read = Fn::readPng(stream);
            const bool real = image.native() == FNImageReference::MONO_FLOAT;
            EXPECT_EQ(read.native(), real ? FNImageReference::MONO16 : image.native());
            EXPECT_EQ(read.toRgb48(), image.toRgb48());
            if (!real) {
                EXPECT_EQ(read.toBgra32(), image.toBgra32());
            }
        }
    FNImage<Bgra32> transparent(1, 1);
    transparent.fill({1, 2, 3, 4});
    std::stringstream stream;
    Fn::writePng(transparent, stream, 6);
    EXPECT_EQ(Fn::readPng(stream).toBgra32(), transparent);
}

TEST(Png, RefusesInItsOwnWords) {
    const std::string bytes = bytesOfFile(fixture("png/rgba16.png"));
    EXPECT_EQ(thrownBy([&] { Fn::readPng(bytes.data(), bytes.size() - 1); }),
              "FNESysError: libpng error: io_read_fn: unexpected end of input.");
    std::string damaged = bytes;
    damaged[20] ^= 1;
    EXPECT_THAT(thrownBy([&] { Fn::readPng(damaged.data(), damaged.size()); }),
                StartsWith("FNESysError: libpng error: IHDR"));
    std::ostringstream broken;
    broken.setstate(std::ios::badbit);
    EXPECT_THAT(thrownBy([&] { Fn::writePng(grayPicture(), broken, 6); }),
                StartsWith("FNESysError: libpng error: "));
    EXPECT_THAT(thrownBy([&] { Fn::writePng(FNImage<float>(), broken, 6); }),
                StartsWith("FNESysError: libpng error: "));
}

// ---- JPEG 2000 and JPEG-LS

TEST(Jpeg2000, ReadsBackEveryPixelType) {
    const Workshop workshop;
    for (const std::string& format : Fn::j2kFormats())
        for (const FNImageReference& image : allPixelTypes()) {
            std::stringstream stream;
            Fn::writeJ2k(image, format, stream);
            EXPECT_TRUE(Fn::checkIfIsJ2k(stream));
            EXPECT_EQ(Fn::readJ2k(stream).toRgb48(), image.toRgb48());
        }
    FNImage<unsigned char> pixel(1, 1);
    pixel.fill(77);
    Fn::writeJ2k(Factory::create(pixel), "jp2", workshop.path("pixel.jp2"));
    Fn::readWriteJ2k(workshop.path("pixel.jp2"), workshop.path("pixel.jpc"));
    EXPECT_EQ(Fn::loadJ2k(workshop.path("pixel.jpc")).toMono8(), pixel);
    EXPECT_EQ(bytesOfFile(workshop.path("pixel.jpc")).substr(0, 2), "\xFF\x4F");
    EXPECT_THAT(thrownBy([&] { Fn::writeJ2k(Factory::create(pixel), "gif", workshop.path("x")); }),
                testing::AllOf(StartsWith("FNEBadArg: "), testing::HasSubstr("jp2, jpc")));
    EXPECT_FALSE(std::filesystem::exists(workshop.path("x")));
    EXPECT_THROW(Fn::writeJ2k(Factory::create(FNImage<unsigned char>()), "jp2", workshop.path("x")),
                 FNEBadArg);
    std::string noSize = bytesOfFile(workshop.path("pixel.jp2"));
    const std::size_t codeStream = noSize.find("\xFF\x4F\xFF\x51");
    const std::string cut = noSize.substr(0, codeStream + 20);
    noSize[codeStream + 3] = 0x52;
    for (const std::string& damaged : {noSize, cut})
        EXPECT_EQ(thrownBy([&] { Fn::loadJ2k(damaged.data(), damaged.size()); }),
                  "FNEBadFormat: Fn::readJ2k: Failed to decode JPEG2000 image from given stream.");
    EXPECT_EQ(thrownBy([&] { Fn::loadJ2k("P5 1 1 255\nx", 12); }),
              "FNEBadFormat: Fn::readJ2k: stream does not refer to a known JPEG2000 image format.");
}

TEST(JpegLS, ReadsTheExampleOfTheStandard) {
    const RecordedProperties properties;
    const std::string bytes = bytesOfFile(fixture("jpegls/t87_h3.jls"));
    const FNImageReference image = Fn::readJpegLS(bytes.data(), bytes.size(), properties.feedback);
    const std::vector<int> expected{0, 0, 90, 74, 68, 50, 43, 205, 64, 145, 145, 145, 100, 145, 145, 145};
    const FNImage<unsigned char> pixels = image.toMono8();
    EXPECT_EQ(std::vector<int>(pixels.data(), pixels.data() + pixels.size()), expected);
    EXPECT_EQ(properties.mode(), 0);
    EXPECT_EQ(properties.depth(), 8);
}

TEST(JpegLS, ReadsBackEveryPixelType) {
    for (const FNImageReference& image : allPixelTypes()) {
        std::stringstream stream;
        Fn::writeJpegLS(image, stream);
        EXPECT_TRUE(Fn::checkIfIsJpegLS(stream));
        EXPECT_EQ(stream.tellg(), 0);
        const FNImageReference read = Fn::readJpegLS(stream);
        EXPECT_EQ(read.isColor(), image.isColor());
        EXPECT_EQ(read.toRgb48(), image.toRgb48());
    }
    std::istringstream jpeg(text(Fn::writeJpeg(Factory::create(grayPicture()), 50)));
    EXPECT_FALSE(Fn::checkIfIsJpegLS(jpeg));
    const std::string bytes = bytesOfFile(fixture("jpegls/t87_h3.jls"));
    EXPECT_THAT(thrownBy([&] { Fn::readJpegLS(bytes.data(), 30); }),
                StartsWith("FNEBadFormat: readJpegLS(): "));
    EXPECT_EQ(thrownBy([&] { Fn::writeJpegLS(Factory::create(FNImage<float>())); }),
              "FNESysError: writeJpegLS(): Invalid JlsParameters");
}

TEST(JpegLS, RestartIntervalsAreReadAndCutOnesRefused) {
    // Each interval begins anew, so that files of its rows put together make a file with restarts.
    for (const FNImageReference& image : allPixelTypes()) {
        std::string whole;
        constexpr std::uint32_t rowsEach = 4;
        int number = 0;
        std::vector<std::size_t> ends;
        for (std::uint32_t y = 0; y < image.h(); y += rowsEach, ++number) {
            const FNBox box(0, static_cast<int>(y), static_cast<int>(image.w()),
                            static_cast<int>(std::min(y + rowsEach, image.h())));
            std::stringstream part;
            Fn::writePbm(image, part, box);
            const std::string file = text(Fn::writeJpegLS(Fn::readPbm(part)));
            const std::size_t scan = file.find("\xFF\xDA"),
                              data = scan + 2 + static_cast<unsigned char>(file[scan + 3]);
            if (number == 0) {
                whole = file.substr(0, scan) + std::string("\xFF\xDD\0\4\0\4", 6) +
                        file.substr(scan, data - scan);
                const std::size_t frame = whole.find("\xFF\xF7");
                whole[frame + 6] = static_cast<char>(image.h());
            } else {
                ends.push_back(whole.size());
                whole += {'\xFF', static_cast<char>(0xD0 + number - 1)};
            }
            whole += file.substr(data, file.size() - 2 - data);
        }
        ends.push_back(whole.size());
        whole += "\xFF\xD9";
        const FNImageReference read = Fn::readJpegLS(whole.data(), whole.size());
        EXPECT_EQ(read.toRgb48(), image.toRgb48());
        for (const std::size_t end : ends) {
            std::string cut = whole;
            cut.erase(end - 3, 3);
            EXPECT_THROW(Fn::readJpegLS(cut.data(), cut.size()), FNEBadFormat);
        }
        const std::string twice =
            std::string(whole).insert(whole.find("\xFF\xDD"), std::string("\xFF\xDD\0\4\0\4", 6));
        EXPECT_EQ(thrownBy([&] { Fn::readJpegLS(twice.data(), twice.size()); }),
                  "FNEBadFormat: readJpegLS(): restart markers are read in files of one scan and one "
                  "interval only");
    }
}

TEST(JpegLS, NoiseThatGrowsByCompressionIsWritten) {
    FNImage<unsigned short> noise(300, 300);
    std::mt19937 random(5);
    for (FNImIter<unsigned short> it(noise, noise.box()); !it.atEnd(); ++it)
        *it = static_cast<unsigned short>(random());
    const FNRMem<unsigned char> bytes = Fn::writeJpegLS(Factory::create(noise));
    EXPECT_GT(bytes.size(), 2 * noise.size());
    EXPECT_EQ(Fn::readJpegLS(reinterpret_cast<const char*>(bytes.data()), bytes.size()).toMono16(), noise);
}

// ---- TIFF

TEST(Tiff, LoadingNamesTheFile) {
    const Workshop workshop;
    workshop.write("text", "no tiff");
    const std::string text = workshop.path("text");
    EXPECT_EQ(thrownBy([&] { Fn::loadTiff(workshop.path("absent")); }),
              "FNEIOError: TIFF File " + workshop.path("absent") + " does not exist ");
    EXPECT_EQ(thrownBy([&] { Fn::loadTiff(text); }),
              "FNEIOError: TIFF File " + text + " might be not in TIFF format");
    std::string damaged = bytesOfFile(fixture("tiff/rgb_deflate.tif"));
    damaged.replace(8, 4, 4, '\xFF');
    EXPECT_EQ(thrownBy([&] { Fn::readImage(damaged.data(), damaged.size()); }),
              "FNEBadFormat: TIFFReadScanline: bad data read on line 0");
    std::istringstream stream("II no tiff");
    EXPECT_EQ(thrownBy([&] { Fn::readTiff(stream, "some stream", 0); }),
              "FNEBadFormat: Fn::readTiff(): stream might be not in TIFF format (some stream)");
    EXPECT_EQ(Fn::loadTiff(fixture("tiff/gray_miniswhite_lzw.tif")).toMono8()(2, 1),
              255 - grayPicture()(2, 1));
}

// ---- PGM and PPM

std::string written(const FNImageReference& image, const FNBox& box) {
    std::ostringstream stream;
    Fn::writePbm(image, stream, box);
    return stream.str();
}

TEST(Pbm, ReadsBackEveryPixelTypeAndAnyPart) {
    for (const FNImageReference& image : allPixelTypes()) {
        std::istringstream stream(written(image, {-5, -5, 100, 100}));
        EXPECT_EQ(Fn::readPbm(stream).toRgb48(), image.toRgb48());
    }
    std::istringstream part(written(Factory::create(widePicture()), {2, 3, 4, 4}));
    const FNImage<unsigned short> read = Fn::readPgm(part).toMono16();
    EXPECT_EQ(read.w() * 10 + read.h(), 21u);
    EXPECT_EQ(read(1, 0), widePicture()(3, 3));
    EXPECT_EQ(thrownBy([&] {
                  written(Factory::create(widePicture()), {13, 0, 20, 9});
              }),
              "FNEIOError: Fn::writePbm: Error, region in image is empty");
}

TEST(Pbm, AttributesTravelInCommentLines) {
    FNImage<unsigned char> pixel(1, 1);
    pixel.fill('x');
    const auto file = [&](const FNImageAttributes& attributes) {
        return written(Factory::create(pixel, attributes), {0, 0, 1, 1});
    };
    EXPECT_EQ(file({}), "P5\n# Created by Fn::writePbm $Revision: 1.37 $\n1 1\n255\nx");
    // 100 characters of text: k=" and 96 more and "
    const std::string long96(96, 'a');
    EXPECT_EQ(file({{"k", long96}}), "P5\n# Created by Fn::writePbm $Revision: 1.37 $\n# cache:k=\"" +
                                         long96.substr(0, 58) + "\n# cache:" + long96.substr(58) +
                                         "\"\n1 1\n255\nx");
    const FNImageAttributes difficult{
        {"a=b", "1\n2"}, {"k", long96}, {"new\nline", "say \"hello\""}, {"#", " = "}};
    std::istringstream stream(file(difficult));
    EXPECT_EQ(Fn::readImage(stream).attributes(), difficult);
    EXPECT_EQ(Fn::buildAttributeString({{"a=b", "1\n\"2\""}}), "a\\=b=\"1\\x0A\\\"2\\\"\"");
    EXPECT_EQ(Fn::readImage(fixture("pbm/attributes.ppm")).attributes(),
              (FNImageAttributes{{"SRCNAME", "camera"}, {"EYEPOS", "1 2 3 4"}}));
}

TEST(Pbm, DamagedAttributesAreNamed) {
    const struct {
        const char *text, *failure;
    } cases[] = {{"key", "parseAttributes: no key delimiter"},
                 {"a\\=b", "parseAttributes: no key delimiter"},
                 {"key=value", "parseAttributes: no val delimiter after key"},
                 {"key= ", "parseAttributes: no val delimiter after key"},
                 {"key=\"value", "parseAttributes: no val delimiter"},
                 {"key=\"value\\\"", "parseAttributes: no val delimiter"},
                 {"=\"value\"", "parseAttributes: Key with length zero"},
                 {"key=\"\"", "parseAttributes: val with length zero"},
                 {"key=\"\\x0G\"", "::decodeNewLines(): bad character code: \\x0G"},
                 {"key=\"a\\x0\"", "::decodeNewLines(): bad character code: \\x0"}};
    for (const auto& c : cases)
        EXPECT_EQ(thrownBy([&] { Fn::parseAttributes(c.text); }), std::string("FNEIOError: ") + c.failure);
    EXPECT_EQ(Fn::parseAttributes("a= \t\"1\"b=\"2\""), (FNImageAttributes{{"a", "1"}, {"b", "2"}}));
}

TEST(Pbm, SamplesAreStretchedToTheFullRange) {
    const FNImage<unsigned char> read = Fn::readImage(fixture("pbm/gray_maxval100.pgm")).toMono8();
    EXPECT_EQ(std::vector<int>(read.data(), read.data() + 6), (std::vector<int>{0, 128, 255, 64, 191, 252}));
    std::istringstream wide(std::string("P6 1 1 256 \0\0\1\0\2\0", 17));
    EXPECT_EQ(Fn::readPpm(wide).toRgb48()(0, 0), Fn::Rgb48(0, 65535, 65535));
}

TEST(Pbm, PlainFormsAndBitmapsAreRareVariants) {
    const Fn::ImageLimits rare = Fn::ImageLimits::withRareVariants();
    const struct {
        std::string file;
        std::vector<unsigned> samples; ///< of 16 bits for those of more than 8
    } cases[] = {
        {"P1 3 2\n010 1\n#comment\n1 0", {255, 0, 255, 0, 0, 255}},
        {std::string("P4 9 2\n\x80\x80\x7F\0", 11),
         {0, 255, 255, 255, 255, 255, 255, 255, 0, 255, 0, 0, 0, 0, 0, 0, 0, 255}},
        {"P2 3 1 10\n0 5\t#c\n99999999999", {0, 128, 255}},
        {"P2 2 1 1000\n0 500\n", {0, 32768}},
        {"P3 1 1 255\n1 2 3", {1, 2, 3}},
        {"P3 1 1 65535 1 2 65535 ", {1, 2, 65535}},
    };
    for (const auto& c : cases) {
        const FNImageReference image = Fn::readImage(c.file.data(), c.file.size(), {}, rare);
        const FNImage<Fn::Rgb48> wide = image.toRgb48();
        const FNImage<Bgra32> narrow = image.toBgra32();
        std::vector<unsigned> samples;
        for (std::uint64_t i = 0; i < wide.size(); ++i) {
            const bool deep =
                image.native() == FNImageReference::MONO16 || image.native() == FNImageReference::RGB48;
            const Fn::Rgb48& w = wide.data()[i];
            const Bgra32& n = narrow.data()[i];
            for (const unsigned s : {deep ? w.r : n.r, deep ? w.g : n.g, deep ? w.b : n.b}) {
                samples.push_back(s);
                if (!image.isColor()) break;
            }
        }
        EXPECT_EQ(samples, c.samples) << c.file;
        EXPECT_THROW(Fn::readImage(c.file.data(), c.file.size()), FNEBadArg);
    }
    for (const std::string file : {"P1 2 1\n1", "P1 1 1\n2", "P2 1 1 255\n", "P2 1 1 255\nx",
                                   "P2 1 1 255\n1x", "P2 1 1 255\n-1", "P4 9 1\n1", "P3 1 1 255\n1 2"})
        EXPECT_THROW(Fn::readImage(file.data(), file.size(), {}, rare), FNEIOError) << file;
}

TEST(Pbm, RefusesInItsOwnWords) {
    const std::string body = "FNEIOError: Reading PBM: error reading ";
    const struct {
        std::string file, failure;
    } cases[] = {{"P", "FNEIOError: Reading PBM: can't read magic numbers"},
                 {"P4 1 1 1", "FNEBadFormat: Invalid PBM: wrong magic number"},
                 {"P5 " + std::string(128, '1'),
                  "FNEIOError: Reading PBM: Sorry, line too long (larger lines not implemented)"},
                 {"P5 #" + std::string(1025, 'c') + "\n1 1 255\nx",
                  "FNEBadFormat: Invalid PGM: comment longer than FN_MAX_PATH"},
                 {"P5 1 1 255", "FNEBadFormat: Invalid PGM: no whitespace after maxval"},
                 {"P5 1 1 255\n", body + "mono8 body"},
                 {"P5 2 1 256\nabc", body + "mono16 body"},
                 {"P6 1 1 1\nab", body + "bgra32 body"},
                 {"P6 1 1 65535\nabcde", body + "rgb48 body"}};
    for (const auto& c : cases) {
        std::istringstream stream(c.file);
        EXPECT_EQ(thrownBy([&] { Fn::readPbm(stream); }), c.failure) << c.file;
    }
    for (const char* header :
         {"P5 0 1 255\nx", "P5 1 -1 255\nx", "P5 1 1 65536\nxx", "P5 1 1 0\nx", "P5 x 1 255\nx"}) {
        std::istringstream stream(header);
        EXPECT_THROW(Fn::readPbm(stream), FNEBadFormat) << header;
    }
    std::istringstream color("P6 1 1 255\nabc");
    EXPECT_THROW(Fn::readPgm(color), FNEBadFormat);
}

// ---- BMP

/// A file of one bitmap; `coding` as a number or four characters.
std::string bmpFile(int w, int h, int bits, const std::string& coding, const std::string& table,
                    const std::string& pixels, std::uint32_t colorsUsed = 0, int sizeImage = -1) {
    const auto word = [](std::uint32_t v) {
        return std::string{static_cast<char>(v), static_cast<char>(v >> 8), static_cast<char>(v >> 16),
                           static_cast<char>(v >> 24)};
    };
    return "BM" + std::string(12, '\0') + word(40) + word(static_cast<std::uint32_t>(w)) +
           word(static_cast<std::uint32_t>(h)) + std::string("\1\0", 2) +
           word(static_cast<std::uint32_t>(bits)).substr(0, 2) +
           (coding.size() == 4 ? coding : word(static_cast<std::uint32_t>(std::stoi(coding)))) +
           word(sizeImage < 0 ? static_cast<std::uint32_t>(pixels.size())
                              : static_cast<std::uint32_t>(sizeImage)) +
           word(0) + word(0) + word(colorsUsed) + word(0) + table + pixels;
}

FNImageReference readBmp(const std::string& file) {
    return Fn::readImage(file.data(), file.size());
}

TEST(Bmp, ReadsBackColorAndGray) {
    const Workshop workshop;
    for (const FNImageReference& image : allPixelTypes()) {
        Fn::saveBMP(image, workshop.path("a.bmp"));
        const FNImageReference read = Fn::loadBMP(workshop.path("a.bmp"));
        EXPECT_EQ(read.native(), image.isColor() ? FNImageReference::BGRA32 : FNImageReference::MONO8);
        EXPECT_EQ(largestDifference(read, image), 0);
    }
    EXPECT_EQ(thrownBy([&] { Fn::loadBMP(workshop.path("absent")); }),
              "FNEIOError: Unable to open BMP file " + workshop.path("absent"));
    EXPECT_THROW(Fn::saveBMP(Factory::create(FNImage<float>()), workshop.path("a.bmp")), FNEBadArg);
}

TEST(Bmp, ANegativeHeightMeansTopToBottom) {
    const std::string first = std::string("\1\2\3\4\5\6", 6) + "--", second = std::string("abcdef--");
    const FNImageReference up = readBmp(bmpFile(2, 2, 24, "0", "", second + first));
    const FNImageReference down = readBmp(bmpFile(2, -2, 24, "0", "", first + second));
    EXPECT_EQ(up.toBgra32(), down.toBgra32());
    EXPECT_EQ(up.toBgra32()(1, 0), Bgra32(6, 5, 4));
    EXPECT_NO_THROW(readBmp(bmpFile(2, -2, 24, "0", "", first + second.substr(0, 6), 0, 0)))
        << "no last padding";
}

TEST(Bmp, EveryDepthAndCodingGivesItsPixels) {
    const std::string blackAndRed("\0\0\0\0\0\0\xFF\0", 8);
    std::string table; // index i is blue i, green 0, red 255 - i
    for (int i = 0; i < 256; ++i) table += {static_cast<char>(i), 0, static_cast<char>(255 - i), 0};
    const Bgra32 black(0, 0, 0), red(255, 0, 0);
    const std::string masks565("\0\xF8\0\0\xE0\7\0\0\x1F\0\0\0", 12),
        masks888("\xFF\0\0\0\0\xFF\0\0\0\0\xFF\0", 12);
    const struct {
        const char* name;
        std::string file;
        std::vector<Bgra32> pixels;
    } cases[] = {
        {"1 bit", bmpFile(3, 1, 1, "0", blackAndRed, std::string("\x40\0\0\0", 4)), {black, red, black}},
        {"4 bits", bmpFile(3, 1, 4, "0", blackAndRed, std::string("\x10\x1F\0\0", 4), 2), {red, black, red}},
        {"8 bits with a table",
         bmpFile(2, 1, 8, "0", table, std::string("\3\xFF\0\0", 4), 256),
         {{252, 0, 3}, {0, 0, 255}}},
        {"5 5 5", bmpFile(2, 1, 16, "0", "", std::string("\0\x7C\x1F\0", 4)), {red, {0, 0, 255}}},
        {"RGB5", bmpFile(2, 1, 16, "RGB5", "", std::string("\xE0\3\0\0", 4)), {{0, 255, 0}, black}},
        {"5 6 5", bmpFile(2, 1, 16, "3", masks565, std::string("\0\xF8\xE0\7", 4)), {red, {0, 255, 0}}},
        {"32 bits", bmpFile(1, 1, 32, "0", "", "abcd"), {{'c', 'b', 'a', 255}}},
        {"32 bits with masks", bmpFile(1, 1, 32, "3", masks888, "abcd"), {{'a', 'b', 'c', 255}}},
        {"high bits of the word",
         bmpFile(1, 1, 16,
                 "R\xC7"
                 "B5",
                 "", std::string("\0\x7C\0\0", 4)),
         {red}},
    };
    for (const auto& c : cases) {
        const FNImageReference image = readBmp(c.file);
        EXPECT_EQ(image.native(), FNImageReference::BGRA32);
        const FNImage<Bgra32> pixels = image.toBgra32();
        EXPECT_EQ(std::vector<Bgra32>(pixels.data(), pixels.data() + pixels.size()), c.pixels) << c.name;
    }
}

TEST(Bmp, ThePixelsBeginWhereTheHeaderTells) {
    const auto at = [](std::string file, unsigned char offset) {
        file[10] = static_cast<char>(offset);
        return file;
    };
    const std::string pixels = "abc-", gap = "gap!!", table(8, '\0');
    const Bgra32 expected('c', 'b', 'a');
    // Behind the headers, and within them or the colour table, where it cannot be right.
    EXPECT_EQ(readBmp(at(bmpFile(1, 1, 24, "0", gap, pixels), 59)).toBgra32()(0, 0), expected);
    EXPECT_EQ(readBmp(at(bmpFile(1, 1, 24, "0", table + gap, pixels, 2), 67)).toBgra32()(0, 0), expected);
    for (const unsigned char offset : {0, 20, 54, 61})
        EXPECT_EQ(readBmp(at(bmpFile(1, 1, 24, "0", table, pixels, 2), offset)).toBgra32()(0, 0), expected);
    EXPECT_EQ(thrownBy([&] { readBmp(at(bmpFile(1, 1, 24, "0", "", pixels), 200)); }),
              "FNEIOError: BMP Error: reading BMP pixels");
}

/// Indices of what a reader of rare variants finds, row by row from the top; the colour table tells them.
std::string runLengthIndices(const std::string& coding, int w, int h, const std::string& runs) {
    const bool nibbles = coding == "2";
    std::string table;
    for (int i = 0; i < (nibbles ? 16 : 256); ++i) table += {static_cast<char>(i), 0, 0, 0};
    const std::string file = bmpFile(w, h, nibbles ? 4 : 8, coding, table, runs);
    const FNImage<Bgra32> read =
        Fn::readImage(file.data(), file.size(), {}, Fn::ImageLimits::withRareVariants()).toBgra32();
    std::string indices;
    for (const Bgra32& p : read.span()) indices += static_cast<char>('0' + p.b);
    return indices;
}

TEST(Bmp, RunLengthsGiveTheirPixels) {
    const std::string end("\0\1", 2), row("\0\0", 2);
    const struct {
        const char *name, *coding;
        int w, h;
        std::string runs, indices;
    } cases[] = {
        {"rows from the bottom", "1", 3, 2, "\3\1" + row + "\1\2\2\3" + end, "233111"},
        {"top to bottom", "1", 3, -2, "\3\1" + row + "\1\2\2\3" + end, "111233"},
        {"stored pixels, padded", "1", 4, 1, std::string("\0\3\1\2\3\0\1\4", 8) + end, "1234"},
        {"a jump", "1", 4, 2, std::string("\1\5\0\2\2\1\1\6", 8) + end, "00065000"},
        {"runs beyond the row", "1", 2, 2, "\7\1" + row + "\7\2\7\3" + end, "2211"},
        {"rows beyond the picture", "1", 2, 1, "\2\1" + row + "\2\2" + end, "11"},
        {"an early end", "1", 2, 2, "\2\1" + end, "0011"},
        {"no end mark", "1", 2, 1, "\2\1", "11"},
        {"halves of bytes in turn", "2", 5, 1, "\5\x1F" + end, "1?1?1"},
        {"stored halves", "2", 5, 1, std::string("\0\5\x12\x34\x50\0", 6) + end, "12345"},
        {"stored halves of whole words", "2", 6, 1, std::string("\0\4\x12\x34\2\x56", 6) + end, "123456"},
    };
    for (const auto& c : cases) EXPECT_EQ(runLengthIndices(c.coding, c.w, c.h, c.runs), c.indices) << c.name;
    for (const std::string& cut : {std::string("\1"), std::string("\1\2"), std::string("\0\2\1", 3),
                                   std::string("\0\4\1\2", 4), std::string("\0\3\1\2\3", 5)})
        EXPECT_EQ(thrownBy([&] { runLengthIndices("1", 4, 1, cut); }),
                  "FNEIOError: BMP Error: reading BMP pixels");
    EXPECT_EQ(thrownBy([&] { readBmp(bmpFile(2, 1, 8, "1", std::string(1024, '\0'), "\2\1" + end)); }),
              "FNEBadArg: Unknown biCompression type");
    const std::string wrong = bmpFile(2, 1, 4, "1", std::string(64, '\0'), "\2\1" + end);
    EXPECT_EQ(
        thrownBy([&] { Fn::readImage(wrong.data(), wrong.size(), {}, Fn::ImageLimits::withRareVariants()); }),
        "FNEBadArg: BMP Error: biBitCount 4 not supported with run lengths");
}

TEST(Bmp, LaterHeadersBringTheirMasks) {
    // Masks of red, green, blue and alpha, in the bytes of "abcd" from the last to the first.
    const std::string masks("\0\0\0\xFF\0\0\xFF\0\0\xFF\0\0\xFF\0\0\0", 16);
    for (const int size : {52, 56, 108, 124}) {
        std::string file = bmpFile(1, 1, 32, "3", masks.substr(0, size == 52 ? 12 : 16), "");
        file.resize(static_cast<std::size_t>(14 + size), '\0');
        file[14] = static_cast<char>(size);
        file += "abcd";
        const FNImageReference image =
            Fn::readImage(file.data(), file.size(), {}, Fn::ImageLimits::withRareVariants());
        EXPECT_EQ(image.toBgra32()(0, 0), Bgra32('d', 'c', 'b', size == 52 ? 255 : 'a')) << size;
        EXPECT_EQ(thrownBy([&] { readBmp(file); }),
                  "FNESysError: BMP Error: Unknown BMP type or wrong header");
    }
}

TEST(Bmp, YCbCrCodingsGiveColors) {
    // Black, white and pure red in studio range (ITU-R BT.601): Y 16, 235, 81; red has Cb 90, Cr 240.
    const std::string gray8(8, '\x80');
    const FNImageReference yuy2 = Fn::readImage(fixture("bmp/yuy2.bmp"));
    EXPECT_EQ(yuy2.toBgra32()(0, 0), Bgra32(0, 0, 0));
    EXPECT_EQ(yuy2.toBgra32()(1, 0), Bgra32(254, 254, 254)) << "1.164 * 219, cut";
    const FNImage<Bgra32> read = yuy2.toBgra32();
    EXPECT_GT(read(2, 0).r, 250);
    EXPECT_LT(read(2, 0).g + read(2, 0).b, 10);
    const std::string luma("\x10\xEB\x10\xEB\x51\x51", 6); // 3 x 2: two colour samples in one row
    const std::string blue("\x80\x5A", 2), redness("\x80\xF0", 2);
    const FNImage<Bgra32> i420 = readBmp(bmpFile(3, 2, 12, "I420", "", luma + blue + redness)).toBgra32();
    const FNImage<Bgra32> yv12 = readBmp(bmpFile(3, -2, 12, "YV12", "", luma + redness + blue)).toBgra32();
    EXPECT_EQ(i420, yv12);
    EXPECT_EQ(i420, readBmp(bmpFile(3, 2, 12, "IYUV", "", luma + blue + redness)).toBgra32());
    EXPECT_EQ(i420(1, 0), Bgra32(254, 254, 254));
    EXPECT_EQ(i420(0, 0), Bgra32(0, 0, 0));
    EXPECT_GT(i420(2, 1).r, 250);
}

TEST(Bmp, GrayPathKeepsGrayValues) {
    for (const char* coding : {"Y800", "Y8  "}) {
        const FNImageReference y = readBmp(bmpFile(3, 2, 8, coding, std::string(1024, '\0'), "abcdef"));
        EXPECT_EQ(y.native(), FNImageReference::MONO8);
        EXPECT_EQ(y.toMono8()(2, 1), 'f') << "top to bottom, without padding";
    }
    Fn::Bitmap bitmap{{2, 1, 1, 12, 0x30323449, 0, 0, 0, 0, 0}, {}, {7, 8, 128, 128}};
    EXPECT_EQ(Fn::bmp2ByteImg(bitmap)(1, 0), 8);
    bitmap.info.compression = 1;
    EXPECT_EQ(thrownBy([&] { Fn::bmp2ByteImg(bitmap); }).substr(0, 40),
              "FNEBadArg: biCompression type 1(FourCC: ");
    bitmap.info.compression = 0x32595559;
    EXPECT_EQ(thrownBy([&] { Fn::bmp2ByteImg(bitmap); }),
              "FNEBadArg: biCompression type 844715353(FourCC: YUY2) not supported");
    for (const std::uint32_t coding : {0u, 0x30303859u, 0x32595559u, 0x30323449u}) {
        const Fn::Bitmap few{{2, 2, 1, 8, coding, 0, 0, 0, 0, 0}, {}, {1, 2, 3}};
        EXPECT_EQ(thrownBy([&] {
                      if (coding == 0x30303859)
                          Fn::bmp2ByteImg(few);
                      else
                          Fn::bmp2ColorImg(few);
                  }),
                  "FNEBadArg: BMP Error: too few pixels");
    }
    const Fn::Bitmap white{{1, 1, 1, 24, 0, 0, 0, 0, 0, 0}, {}, {255, 255, 255}};
    EXPECT_EQ(Fn::bmp2ByteImg(white)(0, 0), 254);
}

TEST(Bmp, RefusesInItsOwnWords) {
    const std::string whole = bmpFile(1, 1, 8, "0", std::string(1024, '\0'), "abcd");
    const struct {
        std::string file, failure;
    } cases[] = {
        {whole.substr(0, 10), "FNEIOError: BMP Error: reading bitmap file header"},
        {whole.substr(0, 16), "FNEIOError: BMP Error: reading bitmap info header size"},
        {whole.substr(0, 50), "FNEIOError: BMP Error: reading bitmap info"},
        {whole.substr(0, 80), "FNEIOError: BMP Error: reading BMP color map"},
        {whole.substr(0, 54 + 1024), "FNEIOError: BMP Error: reading BMP pixels"},
        {whole.substr(0, 54 + 1025), "FNEIOError: BMP Error: reading BMP pixels"},
        {bmpFile(0, 5, 24, "0", "", ""), "FNEIOError: BMP Error: got image with size 0"},
        {bmpFile(1, 1, 0, "0", std::string(4, '\0'), ""), "FNEIOError: BMP Error: got image with size 0"},
        {bmpFile(2, 0, 24, "0", "", "abcd"), "FNEIOError: BMP Error: got image with size 0"},
        {bmpFile(-2, 1, 24, "0", "", "abcd"), "FNEIOError: BMP Error: got image with size 0"},
        {bmpFile(1, 1, 32, "RGB5", "", "abcd"), "FNESysError: Wrong biCompression hint with biBitCount 32"},
        {bmpFile(1, 1, 16, "UYVY", "", "abcd"), "FNEBadArg: Unknown biCompression type"},
        {bmpFile(1, 1, 17, "0", "", "abcd"), "FNEBadArg: BMP Error: biBitCount 17 not supported"}};
    for (const auto& c : cases) EXPECT_EQ(thrownBy([&] { readBmp(c.file); }), c.failure);
    for (const std::size_t at : {14u, 15u, 16u, 17u}) { // the size of the header
        std::string wrong = whole;
        ++wrong[at];
        EXPECT_EQ(thrownBy([&] { readBmp(wrong); }),
                  "FNESysError: BMP Error: Unknown BMP type or wrong header");
    }
}

TEST(Bmp, ModesAreToldBeforeTheRefusal) {
    const std::pair<const char*, int> modes[] = {{"0", 1},     {"RGB5", 1},  {"1", 12},    {"2", 13},
                                                 {"YUY2", 7},  {"YVYU", 10}, {"UYVY", 11}, {"YVU9", 15},
                                                 {"I420", 17}, {"Y800", 19}, {"Y8  ", 20}, {"ABCD", 0}};
    for (const auto& [coding, mode] : modes) {
        const RecordedProperties properties;
        const std::string file = bmpFile(1, 1, 9, coding, "", "");
        EXPECT_THROW(Fn::readImage(file.data(), file.size(), properties.feedback), FNException);
        EXPECT_EQ(properties.mode(), mode) << coding;
        EXPECT_EQ(properties.depth(), 9);
    }
    EXPECT_EQ(Fn::compressionModeToString(Fn::FNImageDataCompressionMode::Mask),
              "MASK  (TIFF COLOR: holdout mask)");
    EXPECT_EQ(Fn::compressionModeToString(static_cast<Fn::FNImageDataCompressionMode>(99)), "Unknown");
}

} // namespace
