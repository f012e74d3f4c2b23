// Files that other programs write, in the variants that the readers accept or refuse.

#include "fn/imagefile/bmp.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/j2k.h"
#include "fn/imagefile/jpeg.h"
#include "fn/imagefile/png.h"
#include "fn/imagefile/tiff.h"
#include "support/thrown.h"
#include "workshop.h"

#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

namespace {

using Factory = FNImageReferenceFactory;

constexpr int mono8 = 0, mono16 = 1, bgra32 = 3, rgb48 = 4;
constexpr int rgb = 1, rgba = 2, alpha = 3, intensity = 4, palette = 5, yCbCr = 6, yCbCrK = 8, cmyk = 9;

/// A file made by a command line that ends in a program's output file, and what reading it gives.
struct Accepted {
    std::string command;
    std::string file;
    FNImageReference expected;
    int native;
    int mode;
    int depth;
    int tolerance = 0;
};

struct Refused {
    std::string command;
    std::string file;
    std::string failure;
};

/// The pictures as files color.ppm, gray.pgm, gray1.pgm, gray2.pgm, gray4.pgm, wide.pgm and widecolor.ppm.
class ForeignFiles : public testing::Test {
protected:
    void SetUp() override {
        workshop.write("color.ppm", netpbm(colorPicture()));
        workshop.write("gray.pgm", netpbm(grayPicture()));
        for (const unsigned bits : {1u, 2u, 4u})
            workshop.write("gray" + std::to_string(bits) + ".pgm", netpbm(coarsePicture(bits)));
        workshop.write("wide.pgm", netpbm(widePicture()));
        workshop.write("widecolor.ppm", netpbm(wideColorPicture()));
    }

    /// What only readers that take rare variants read.
    void expectRare(const std::vector<Accepted>& files) const {
        for (const Accepted& c : files) {
            SCOPED_TRACE(c.command);
            workshop.run(c.command);
            EXPECT_THROW(Fn::readImage(workshop.path(c.file)), FNException);
        }
        expect(files, Fn::ImageLimits::withRareVariants());
    }

    void expect(const std::vector<Accepted>& files, const Fn::ImageLimits& limits = {}) const {
        for (const Accepted& c : files) {
            SCOPED_TRACE(c.command);
            workshop.run(c.command);
            const RecordedProperties properties;
            FNImageReference read;
            EXPECT_EQ(
                thrownBy([&] { read = Fn::readImage(workshop.path(c.file), properties.feedback, limits); }),
                "nothing thrown");
            EXPECT_EQ(read.native(), c.native);
            EXPECT_EQ(properties.mode(), c.mode);
            EXPECT_EQ(properties.depth(), c.depth);
            EXPECT_LE(largestDifference(read, c.expected), c.tolerance);
            if (c.native == mono16 && c.tolerance == 0) {
                EXPECT_EQ(read.toMono16(), c.expected.toMono16());
            }
            if (c.native == rgb48 && c.tolerance == 0) {
                EXPECT_EQ(read.toRgb48(), c.expected.toRgb48());
            }
        }
    }

    void expect(const std::vector<Refused>& files) const {
        for (const Refused& c : files) {
            SCOPED_TRACE(c.command);
            workshop.run(c.command);
            EXPECT_EQ(thrownBy([&] { Fn::readImage(workshop.path(c.file)); }), c.failure);
        }
    }

    const Workshop workshop;
    const FNImageReference color = Factory::create(colorPicture()), gray = Factory::create(grayPicture()),
                           wide = Factory::create(widePicture()),
                           wideColor = Factory::create(wideColorPicture());
};

TEST_F(ForeignFiles, Jpeg) {
    if (!Workshop::has("cjpeg")) GTEST_SKIP() << "cjpeg is not installed";
    const std::string best = "-quality 100 -sample 1x1 ";
    expect(std::vector<Accepted>{
        {"cjpeg " + best + "-outfile a.jpg color.ppm", "a.jpg", color, bgra32, yCbCr, 24, 4},
        {"cjpeg " + best + "-progressive -outfile a.jpg color.ppm", "a.jpg", color, bgra32, yCbCr, 24, 4},
        {"cjpeg " + best + "-arithmetic -outfile a.jpg color.ppm", "a.jpg", color, bgra32, yCbCr, 24, 4},
        {"cjpeg " + best + "-restart 1B -outfile a.jpg color.ppm", "a.jpg", color, bgra32, yCbCr, 24, 4},
        {"cjpeg -rgb " + best + "-outfile a.jpg color.ppm", "a.jpg", color, bgra32, rgb, 24, 4},
        {"cjpeg -quality 95 -outfile a.jpg color.ppm", "a.jpg", color, bgra32, yCbCr, 24, 25},
        {"cjpeg " + best + "-outfile a.jpg gray.pgm", "a.jpg", gray, mono8, intensity, 8, 3},
        {"cjpeg " + best + "-progressive -outfile a.jpg gray.pgm", "a.jpg", gray, mono8, intensity, 8, 3},
    });
}

TEST_F(ForeignFiles, JpegOfFourComponents) {
    if (!Workshop::has("convert")) GTEST_SKIP() << "ImageMagick is not installed";
    const std::string flat = "convert -size 13x9 'xc:#20C060' -colorspace CMYK -quality 100 ";
    FNImage<Fn::Bgra32> green(13, 9);
    green.fill({0x20, 0xC0, 0x60});
    expectRare({
        {flat + "a.jpg", "a.jpg", Factory::create(green), bgra32, yCbCrK, 32, 3},
        {"convert color.ppm -colorspace CMYK -quality 100 a.jpg", "a.jpg", color, bgra32, yCbCrK, 32, 6},
    });
}

TEST_F(ForeignFiles, JpegOfFourComponentsIsRefusedAfterItsReport) {
    if (!Workshop::has("convert")) GTEST_SKIP() << "ImageMagick is not installed";
    workshop.run("convert color.ppm -colorspace CMYK a.jpg");
    const RecordedProperties properties;
    EXPECT_EQ(thrownBy([&] { Fn::readImage(workshop.path("a.jpg"), properties.feedback); }),
              "FNEBadArg: JpegRgbDecompressImage(): number of output components not supported");
    EXPECT_TRUE(properties.mode() == cmyk || properties.mode() == yCbCrK) << properties.mode();
    EXPECT_EQ(properties.depth(), 32);
}

TEST_F(ForeignFiles, Png) {
    if (!Workshop::has("convert")) GTEST_SKIP() << "ImageMagick is not installed";
    const auto type = [](const std::string& in, int colorType, int bits, const std::string& more = "") {
        return "convert " + in + " " + more + " -define png:color-type=" + std::to_string(colorType) +
               " -define png:bit-depth=" + std::to_string(bits) + " a.png";
    };
    const std::string half = "-alpha set -channel A -evaluate set 50% +channel";
    const auto coarse = [](unsigned bits) { return Factory::create(coarsePicture(bits)); };
    expect(std::vector<Accepted>{
        {type("gray1.pgm", 0, 1), "a.png", coarse(1), mono8, intensity, 1},
        {type("gray2.pgm", 0, 2), "a.png", coarse(2), mono8, intensity, 2},
        {type("gray4.pgm", 0, 4), "a.png", coarse(4), mono8, intensity, 4},
        {type("gray.pgm", 0, 8), "a.png", gray, mono8, intensity, 8},
        {type("gray.pgm", 0, 8, "-interlace PNG"), "a.png", gray, mono8, intensity, 8},
        {type("wide.pgm", 0, 16), "a.png", wide, mono16, intensity, 16},
        {type("wide.pgm", 0, 16, "-interlace PNG"), "a.png", wide, mono16, intensity, 16},
        {type("color.ppm", 2, 8), "a.png", color, bgra32, rgb, 24},
        {type("color.ppm", 2, 8, "-interlace PNG"), "a.png", color, bgra32, rgb, 24},
        {type("widecolor.ppm", 2, 16), "a.png", wideColor, rgb48, rgb, 48},
        {"convert color.ppm -type Palette PNG8:a.png", "a.png", color, bgra32, palette, 8},
        {type("gray.pgm", 4, 8, half), "a.png", gray, bgra32, alpha, 16},
        {type("wide.pgm", 4, 16, half), "a.png", wide, rgb48, alpha, 32},
        {type("color.ppm", 6, 8, half), "a.png", color, bgra32, rgba, 32},
        {type("widecolor.ppm", 6, 16, half), "a.png", wideColor, rgb48, rgba, 64},
    });
    EXPECT_EQ(Fn::readImage(fixture("png/gray_alpha.png")).toBgra32()(0, 0).a, 128);
    EXPECT_EQ(Fn::readImage(fixture("png/palette_interlaced.png")).toBgra32()(0, 0).a, 255);
}

TEST_F(ForeignFiles, Jpeg2000) {
    if (!Workshop::has("opj_compress")) GTEST_SKIP() << "opj_compress is not installed";
    const std::string few = " -n 3";
    expect(std::vector<Accepted>{
        {"opj_compress -i color.ppm -o a.jp2" + few, "a.jp2", color, bgra32, rgb, 24},
        {"opj_compress -i color.ppm -o a.j2k" + few, "a.j2k", color, bgra32, rgb, 24},
        {"opj_compress -i color.ppm -o a.jp2 -t 5,4 -n 2", "a.jp2", color, bgra32, rgb, 24},
        {"opj_compress -i color.ppm -o a.jp2 -d 3,2" + few, "a.jp2", color, bgra32, rgb, 24},
        {"opj_compress -i color.ppm -o a.jp2 -I -q 60" + few, "a.jp2", color, bgra32, rgb, 24, 3},
        {"opj_compress -i gray.pgm -o a.jp2" + few, "a.jp2", gray, mono8, intensity, 8},
        {"opj_compress -i wide.pgm -o a.jp2" + few, "a.jp2", wide, mono16, intensity, 16},
        {"opj_compress -i widecolor.ppm -o a.j2k" + few, "a.j2k", wideColor, rgb48, rgb, 48},
    });
}

TEST_F(ForeignFiles, Jpeg2000OfOtherDepthsAndColorSpaces) {
    if (!Workshop::has("opj_compress")) GTEST_SKIP() << "opj_compress is not installed";
    const FNImage<unsigned char> picture = grayPicture();
    std::string six, two = "P7\nWIDTH 13\nHEIGHT 9\nDEPTH 2\nMAXVAL 255\nTUPLTYPE GRAYSCALE_ALPHA\nENDHDR\n";
    for (const unsigned char v : picture.span()) {
        six += static_cast<char>(v >> 2);
        two += {static_cast<char>(v), 1};
    }
    workshop.write("six.raw", six);
    workshop.run("opj_compress -i six.raw -F 13,9,1,6,u -o a.j2k -n 2");
    const FNImageReference stretched = Fn::readImage(workshop.path("a.j2k"));
    EXPECT_EQ(stretched.native(), mono8);
    EXPECT_EQ(stretched.toMono8()(5, 3), 101) << "25 of 63";
    workshop.write("two.pam", two);
    expect(std::vector<Accepted>{
        {"opj_compress -i two.pam -o a.j2k -n 2", "a.j2k", gray, mono8, intensity, 16},
        {"opj_compress -i two.pam -o a.jp2 -n 2", "a.jp2", gray, mono8, intensity, 16},
    });

    // Full-range YCbCr, the chroma at half the resolution: gray where the chroma is neutral.
    FNImage<unsigned char> luma(12, 8);
    std::copy_n(picture.data(), luma.size(), luma.getExclusive());
    workshop.write("a.yuv",
                   std::string(luma.data(), luma.data() + luma.size()) + std::string(2 * 6 * 4, '\x80'));
    workshop.run("opj_compress -i a.yuv -F 12,8,3,8,u@1x1:2x2:2x2 -o a.jp2 -n 2 -mct 0");
    const RecordedProperties properties;
    const FNImageReference neutral = Fn::readImage(workshop.path("a.jp2"), properties.feedback);
    EXPECT_EQ(properties.mode(), yCbCr);
    EXPECT_EQ(largestDifference(neutral, Factory::create(luma)), 0);
}

TEST_F(ForeignFiles, Tiff) {
    if (!Workshop::has("convert")) GTEST_SKIP() << "ImageMagick is not installed";
    // This program stores the values of the picture beside a tag that inverts them.
    const auto inverse = [](auto image) {
        using Sample = typename decltype(image)::Pixel;
        for (FNImIter it(image, image.box()); !it.atEnd(); ++it) *it = static_cast<Sample>(~*it);
        return Factory::create(image);
    };
    const FNImageReference negative = inverse(grayPicture()), wideNegative = inverse(widePicture());
    std::vector<Accepted> files{
        {"convert wide.pgm -compress None -endian LSB a.tif", "a.tif", wide, mono16, intensity, 16},
        {"convert wide.pgm -compress Zip -endian MSB a.tif", "a.tif", wide, mono16, intensity, 16},
        {"convert widecolor.ppm -compress LZW a.tif", "a.tif", wideColor, rgb48, rgb, 48},
        {"convert color.ppm -alpha set -compress Zip a.tif", "a.tif", color, bgra32, rgb, 32},
        {"convert gray.pgm -define quantum:polarity=min-is-white a.tif", "a.tif", negative, mono8, intensity,
         8},
        {"convert wide.pgm -define quantum:polarity=min-is-white a.tif", "a.tif", wideNegative, mono16,
         intensity, 16},
    };
    for (const char* compression : {"None", "LZW", "Zip", "RLE"}) {
        const std::string command = std::string(" -compress ") + compression + " a.tif";
        files.push_back({"convert color.ppm" + command, "a.tif", color, bgra32, rgb, 24});
        files.push_back({"convert gray.pgm" + command, "a.tif", gray, mono8, intensity, 8});
    }
    expect(files);
    const std::string reader = "FNEBadFormat: Fn::readTiff: ";
    expect(std::vector<Refused>{
        {"convert gray1.pgm -monochrome -compress Fax a.tif", "a.tif",
         reader + "can only handle 8 bit or 16 bit images"},
        {"convert gray.pgm -depth 32 a.tif", "a.tif", reader + "can only handle 8 bit or 16 bit images"},
        {"convert color.ppm -type Palette a.tif", "a.tif",
         reader + "PHOTOMETRIC_PALETTE is not implemented."},
        {"convert color.ppm -colorspace CMYK a.tif", "a.tif", reader + "unknown photometric: 5"},
        {"convert gray.pgm -alpha set -compress None a.tif", "a.tif",
         reader + "can only handle 1-channel gray scale or 3 or 4-channel color"},
    });
}

TEST_F(ForeignFiles, TiffThatTheLibraryConverts) {
    if (!Workshop::has("convert") || !Workshop::has("tiffcp"))
        GTEST_SKIP() << "ImageMagick or libtiff's tools are not installed";
    workshop.run("convert gray.pgm -compress None gray.tif");
    workshop.run("convert color.ppm -compress None color.tif");
    workshop.run("convert widecolor.ppm -compress None widecolor.tif");
    const auto coarse = [](unsigned bits) { return Factory::create(coarsePicture(bits)); };
    const FNImageReference narrow = Factory::create(Factory::create(wideColorPicture()).toBgra32());
    constexpr int separated = 27;
    expectRare({
        {"convert gray1.pgm -monochrome -compress Fax a.tif", "a.tif", coarse(1), mono8, intensity, 1},
        {"convert gray1.pgm -monochrome -compress Group4 a.tif", "a.tif", coarse(1), mono8, intensity, 1},
        {"convert gray4.pgm -depth 4 -compress LZW a.tif", "a.tif", coarse(4), mono8, intensity, 4},
        {"convert color.ppm -type Palette a.tif", "a.tif", color, bgra32, palette, 8},
        {"convert color.ppm -colorspace CMYK a.tif", "a.tif", color, bgra32, separated, 32, 3},
        {"convert gray.pgm -alpha set -compress None a.tif", "a.tif", gray, mono8, intensity, 16},
        {"tiffcp -t -w 16 -l 16 color.tif a.tif", "a.tif", color, bgra32, rgb, 24},
        {"tiffcp -t -w 16 -l 16 gray.tif a.tif", "a.tif", gray, mono8, intensity, 8},
        {"tiffcp -t -w 16 -l 16 widecolor.tif a.tif", "a.tif", narrow, bgra32, rgb, 48, 1},
        {"tiffcp -p separate color.tif a.tif", "a.tif", color, bgra32, rgb, 24},
        {"tiffcp -c jpeg:100 color.tif a.tif", "a.tif", color, bgra32, yCbCr, 24, 25},
    });
    // The rows stay as they are stored, whatever the file tells of its orientation.
    workshop.run("tiffcp -p separate color.tif a.tif && tiffset -s 274 3 a.tif");
    EXPECT_EQ(largestDifference(
                  Fn::readImage(workshop.path("a.tif"), {}, Fn::ImageLimits::withRareVariants()), color),
              0);
}

TEST_F(ForeignFiles, TiffOfOtherLayouts) {
    if (!Workshop::has("convert") || !Workshop::has("tiffcp"))
        GTEST_SKIP() << "ImageMagick or libtiff's tools are not installed";
    workshop.run("convert gray.pgm -compress None gray.tif");
    workshop.run("convert color.ppm -set comment 'second image' -compress None color.tif");
    expect(std::vector<Accepted>{
        {"tiffcp -B -r 2 -c lzw:2 color.tif a.tif", "a.tif", color, bgra32, rgb, 24},
        {"tiffcp -L -r 4 -c zip gray.tif a.tif", "a.tif", gray, mono8, intensity, 8},
        {"tiffcp -8 color.tif a.tif", "a.tif", color, bgra32, rgb, 24},
    });
    expect(std::vector<Refused>{
        {"tiffcp -t -w 16 -l 16 color.tif a.tif", "a.tif",
         "FNEBadFormat: Fn::readTiff: unable to read tiled images"},
        {"tiffcp -p separate color.tif a.tif", "a.tif",
         "FNEBadFormat: Fn::readTiff: can only handle contiguous tiff files."},
    });
    workshop.run("tiffcp gray.tif color.tif a.tif");
    std::ifstream both(workshop.path("a.tif"), std::ios::binary);
    const FNImageReference second = Fn::readTiff(both, "a.tif", 1);
    EXPECT_EQ(largestDifference(second, color), 0);
    EXPECT_EQ(second.attributes(), (FNImageAttributes{{"TIFF_IMAGEDESCRIPTION", "second image"}}));
    both.clear();
    both.seekg(0);
    EXPECT_EQ(thrownBy([&] { Fn::readTiff(both, "a.tif", 2); }),
              "FNEBadFormat: Fn::readTiff: Cannot set directory to '2'");
}

TEST_F(ForeignFiles, Bmp) {
    if (!Workshop::has("convert")) GTEST_SKIP() << "ImageMagick is not installed";
    const auto coarse = [](unsigned bits) { return Factory::create(coarsePicture(bits)); };
    expect(std::vector<Accepted>{
        {"convert color.ppm BMP3:a.bmp", "a.bmp", color, bgra32, rgb, 24},
        {"convert gray1.pgm -type Bilevel -compress None BMP3:a.bmp", "a.bmp", coarse(1), bgra32, rgb, 1},
        {"convert gray4.pgm -type Palette -compress None BMP3:a.bmp", "a.bmp", coarse(4), bgra32, rgb, 4},
        {"convert color.ppm -type Palette -compress None BMP3:a.bmp", "a.bmp", color, bgra32, rgb, 8},
    });
    expect(std::vector<Refused>{
        {"convert color.ppm BMP2:a.bmp", "a.bmp", "FNESysError: BMP Error: Unknown BMP type or wrong header"},
        {"convert gray.pgm -type Palette -compress RLE BMP3:a.bmp", "a.bmp",
         "FNEBadArg: Unknown biCompression type"},
    });
}

TEST_F(ForeignFiles, BmpOfLaterVersionsAndRunLengths) {
    if (!Workshop::has("convert")) GTEST_SKIP() << "ImageMagick is not installed";
    const auto coarse = [](unsigned bits) { return Factory::create(coarsePicture(bits)); };
    const std::string half = "-alpha set -channel A -evaluate set 50% +channel ";
    constexpr int bitFields = 14, rle8 = 12;
    expectRare({
        {"convert color.ppm a.bmp", "a.bmp", color, bgra32, rgb, 24},
        {"convert color.ppm BMP4:a.bmp", "a.bmp", color, bgra32, rgb, 24},
        {"convert color.ppm " + half + "a.bmp", "a.bmp", color, bgra32, bitFields, 32},
        {"convert gray1.pgm -type Bilevel -compress None a.bmp", "a.bmp", coarse(1), bgra32, rgb, 1},
        {"convert gray4.pgm -type Palette -compress None a.bmp", "a.bmp", coarse(4), bgra32, rgb, 4},
        {"convert gray.pgm -type Palette -compress RLE BMP3:a.bmp", "a.bmp", gray, bgra32, rle8, 8, 4},
        {"convert gray4.pgm -type Palette -compress RLE a.bmp", "a.bmp", coarse(4), bgra32, rle8, 8},
    });
}

TEST_F(ForeignFiles, PlainNetpbmAndBitmaps) {
    if (!Workshop::has("convert")) GTEST_SKIP() << "ImageMagick is not installed";
    const FNImageReference black = Factory::create(coarsePicture(1));
    expectRare({
        {"convert gray1.pgm a.pbm", "a.pbm", black, mono8, intensity, 1},
        {"convert gray1.pgm -compress None a.pbm", "a.pbm", black, mono8, intensity, 1},
        {"convert gray.pgm -compress None a.pgm", "a.pgm", gray, mono8, intensity, 8},
        {"convert wide.pgm -compress None a.pgm", "a.pgm", wide, mono16, intensity, 16},
        {"convert color.ppm -compress None a.ppm", "a.ppm", color, bgra32, rgb, 24},
        {"convert widecolor.ppm -compress None a.ppm", "a.ppm", wideColor, rgb48, rgb, 48},
    });
}

TEST_F(ForeignFiles, Netpbm) {
    if (!Workshop::has("convert")) GTEST_SKIP() << "ImageMagick is not installed";
    expect(std::vector<Accepted>{
        {"convert color.ppm a.ppm", "a.ppm", color, bgra32, rgb, 24},
        {"convert wide.pgm a.pgm", "a.pgm", wide, mono16, intensity, 16},
        {"convert widecolor.ppm a.ppm", "a.ppm", wideColor, rgb48, rgb, 48},
        {"convert gray.pgm -set comment 'a comment' a.pgm", "a.pgm", gray, mono8, intensity, 8},
    });
    expect(std::vector<Refused>{
        {"convert gray.pgm -compress None a.pgm", "a.pgm",
         "FNEBadArg: Fn::readImage: Not a known image format in " + workshop.path("a.pgm")}});
}

/// What the library writes, other programs read.
TEST_F(ForeignFiles, OtherProgramsReadOurFiles) {
    if (!Workshop::has("convert")) GTEST_SKIP() << "ImageMagick is not installed";
    Fn::saveBMP(color, workshop.path("color.bmp"));
    Fn::saveBMP(gray, workshop.path("gray.bmp"));
    for (const std::string name : {"color.bmp", "gray.bmp"}) {
        workshop.run("convert " + name + " back.ppm");
        EXPECT_EQ(largestDifference(Fn::readImage(workshop.path("back.ppm")), name[0] == 'c' ? color : gray),
                  0);
    }
    for (const FNImageReference& image : {color, gray, wide, wideColor}) {
        std::ostringstream png;
        Fn::writePng(image, png, 6);
        workshop.write("a.png", png.str());
        workshop.run("convert a.png back.ppm");
        EXPECT_EQ(Fn::readImage(workshop.path("back.ppm")).toRgb48(), image.toRgb48());
        Fn::saveJpeg(image, workshop.path("a.jpg"), FNImageCompressor::BEST_QUALITY);
        workshop.run("convert a.jpg back.ppm");
        EXPECT_EQ(largestDifference(Fn::readImage(workshop.path("back.ppm")),
                                    Fn::readImage(workshop.path("a.jpg"))),
                  0);
        EXPECT_LE(largestDifference(Fn::readImage(workshop.path("back.ppm")), image),
                  image.isColor() ? 60 : 3);
    }
    if (!Workshop::has("opj_decompress")) GTEST_SKIP() << "opj_decompress is not installed";
    for (const std::string& format : Fn::j2kFormats()) {
        const std::string name = "wide." + (format == "jpc" ? std::string("j2k") : format);
        Fn::writeJ2k(wide, format, workshop.path(name));
        workshop.run("opj_decompress -i " + name + " -o back.pgm");
        EXPECT_EQ(Fn::readImage(workshop.path("back.pgm")).toMono16(), widePicture());
    }
}

} // namespace
