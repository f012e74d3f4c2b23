// Bytes and values that stay as they are, worked out by hand or by another program.

#include "fn/imagefile/bmp.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/jpegls.h"
#include "fn/imagefile/sample_scale.h"
#include "support/thrown.h"
#include "workshop.h"

#include <gtest/gtest.h>

#include <sstream>

namespace {

using Factory = FNImageReferenceFactory;
using Fn::Bgra32;

/// Bytes as two digits each; blanks are passed over.
std::string bytesOf(const std::string& digits) {
    std::string bytes, pair;
    for (const char c : digits) {
        if (c == ' ') continue;
        if ((pair += c).size() < 2) continue;
        bytes += static_cast<char>(std::stoi(pair, nullptr, 16));
        pair.clear();
    }
    return bytes;
}

std::string bmpOf(const FNImageReference& image) {
    std::ostringstream stream;
    Fn::dumpBMP(image, stream);
    return stream.str();
}

TEST(ImageGoldens, BmpFilesAreWrittenByteForByte) {
    FNImage<Bgra32> color(2, 2);
    color.set({0, 0}, {1, 2, 3});
    color.set({1, 0}, {255, 0, 16, 9});
    color.set({0, 1}, {4, 5, 6});
    color.set({1, 1}, {0, 254, 0});
    EXPECT_EQ(
        bmpOf(Factory::create(color)),
        bytesOf("424D 46000000 00000000 36000000 28000000 02000000 FEFFFFFF 0100 1800 00000000 10000000 "
                "00000000 00000000 00000000 00000000 "
                "030201 1000FF 0000 060504 00FE00 0000"));
    FNImage<unsigned char> gray(3, 1);
    for (int x = 0; x < 3; ++x) gray.set({x, 0}, static_cast<unsigned char>(7 * x + 1));
    std::string table;
    for (int i = 0; i < 256; ++i)
        table += {static_cast<char>(i), static_cast<char>(i), static_cast<char>(i), 0};
    EXPECT_EQ(
        bmpOf(Factory::create(gray)),
        bytesOf("424D 3A040000 00000000 36040000 28000000 03000000 FFFFFFFF 0100 0800 00000000 04000000 "
                "00000000 00000000 00000000 00000000") +
            table + bytesOf("01080F00"));
}

/// A BMP file of 4:2:0 planes, 5 x 3 pixels: Y as given, then 3 x 2 samples of Cb and of Cr.
FNImage<Bgra32> planar(const std::string& luma, const std::string& cb, const std::string& cr) {
    const std::string pixels = luma + cb + cr;
    const std::string file = bytesOf("424D 00000000 00000000 00000000 28000000 05000000 FDFFFFFF 0100 0C00") +
                             "I420" + std::string(1, static_cast<char>(pixels.size())) +
                             std::string(19, '\0') + pixels;
    return Fn::readImage(file.data(), file.size()).toBgra32();
}

TEST(ImageGoldens, StudioColorsOfBmpFiles) {
    // ITU-R BT.601 with the factors 1.164, 1.596, 0.392, 0.813 and 2.017, cut to whole numbers.
    const struct {
        int y, cb, cr;
        Bgra32 color;
    } cases[] = {
        {16, 128, 128, {0, 0, 0}},       {235, 128, 128, {254, 254, 254}}, {100, 90, 160, {148, 86, 21}},
        {200, 170, 60, {105, 252, 255}}, {50, 128, 200, {154, 0, 39}},     {50, 200, 128, {39, 11, 184}},
        {180, 40, 128, {190, 225, 13}},  {180, 128, 40, {50, 255, 190}},   {120, 100, 150, {156, 114, 64}},
    };
    for (const auto& c : cases) {
        const auto filled = [](std::size_t n, int v) { return std::string(n, static_cast<char>(v)); };
        const FNImage<Bgra32> image = planar(filled(15, c.y), filled(6, c.cb), filled(6, c.cr));
        for (const Bgra32& p : image.span()) EXPECT_EQ(p, c.color) << c.y << " " << c.cb << " " << c.cr;
    }
    // Each chroma sample belongs to two columns and two rows.
    std::string cb(6, '\x80');
    cb[4] = 40;
    const FNImage<Bgra32> image = planar(std::string(15, '\xB4'), cb, std::string(6, '\x80'));
    for (int y = 0; y < 3; ++y)
        for (int x = 0; x < 5; ++x)
            EXPECT_EQ(image(static_cast<unsigned>(x), static_cast<unsigned>(y)),
                      y == 2 && (x == 2 || x == 3) ? Bgra32(190, 225, 13) : Bgra32(190, 190, 190))
                << x << " " << y;
}

TEST(ImageGoldens, FullRangeColorsOfJpeg2000) {
    if (!Workshop::has("opj_compress")) GTEST_SKIP() << "opj_compress is not installed";
    const Workshop workshop;
    // Y 100, Cb 90, Cr 160, but for the last column and row, which have chroma of their own: Cb 128, Cr 128.
    std::string cb(4 * 3, '\x5A'), cr(4 * 3, '\xA0');
    for (std::size_t i = 0; i < cb.size(); ++i)
        if (i % 4 == 3 || i >= 8) cb[i] = cr[i] = '\x80';
    workshop.write("a.yuv", std::string(8 * 6, '\x64') + cb + cr);
    workshop.run("opj_compress -i a.yuv -F 8,6,3,8,u@1x1:2x2:2x2 -o a.jp2 -n 1 -mct 0");
    const FNImage<Bgra32> image = Fn::readImage(workshop.path("a.jp2")).toBgra32();
    for (unsigned y = 0; y < 6; ++y)
        for (unsigned x = 0; x < 8; ++x)
            EXPECT_EQ(image(x, y), x >= 6 || y >= 4 ? Bgra32(100, 100, 100) : Bgra32(145, 90, 33))
                << x << " " << y;
}

TEST(ImageGoldens, InksBecomeColors) {
    if (!Workshop::has("convert")) GTEST_SKIP() << "ImageMagick is not installed";
    const Workshop workshop;
    workshop.run("convert -size 16x16 'xc:#20C060' -colorspace CMYK -quality 100 a.jpg");
    std::string file = bytesOfFile(workshop.path("a.jpg"));
    const std::size_t marker = file.find("\xFF\xEE");
    ASSERT_NE(marker, std::string::npos);
    const auto color = [](const std::string& bytes) {
        return Fn::readImage(bytes.data(), bytes.size(), {}, Fn::ImageLimits::withRareVariants())
            .toBgra32()(0, 0);
    };
    // Samples that are no YCC: how much of each ink is missing, and with no marker of Adobe's, how much is
    // there.
    file[marker + 15] = 0;
    const Bgra32 missing = color(file);
    file.erase(marker, 16);
    const Bgra32 there = color(file);
    constexpr int black = 255 - 0xC0; // ImageMagick takes the brightest sample for it
    for (const auto sample : {&Bgra32::r, &Bgra32::g, &Bgra32::b}) {
        const double ink = 255 - missing.*sample * 255.0 / (255 - black);
        EXPECT_NEAR(there.*sample, ink * black / 255, 1.5);
    }
}

TEST(ImageGoldens, SamplesAreStretchedToTheNearest) {
    for (const auto& [sample, from, to, expected] : {std::array{0u, 1u, 255u, 0u},
                                                     {1u, 1u, 255u, 255u},
                                                     {1u, 3u, 255u, 85u},
                                                     {16u, 31u, 255u, 132u},
                                                     {32u, 63u, 255u, 130u},
                                                     {100u, 255u, 255u, 100u},
                                                     {300u, 255u, 255u, 255u},
                                                     {2u, 4u, 255u, 128u},
                                                     {1u, 1000u, 65535u, 66u},
                                                     {5u, 4u, 65535u, 65535u},
                                                     {0xFFFFFFFFu, 0xFFFFFFFFu, 255u, 255u}})
        EXPECT_EQ(Fn::scaleSample(sample, from, to), expected) << sample << " of " << from;
    for (const auto& [bits, greatest] : {std::pair{1u, 1u}, {8u, 255u}, {12u, 4095u}, {32u, 0xFFFFFFFFu}})
        EXPECT_EQ(Fn::greatestSample(bits), greatest);
}

TEST(ImageGoldens, TextsOfModes) {
    const char* const texts[] = {"Unknown",
                                 "RGB",
                                 "RGBA",
                                 "Alpha",
                                 "Intensity",
                                 "Palette",
                                 "Y/Cb/Cr (YUV)",
                                 "YUY2 ( YUV422, YCbCr422)",
                                 "Y/Cb/Cr/K (K is black)",
                                 "C/M/Y/K",
                                 "YVYU (subclass of YUV coding, YUV422",
                                 "UYVY (subclass of YUV coding, YUV422",
                                 "RLE8 (BMP)",
                                 "RLE4 (BMP)",
                                 "BITFIELDS (BMP)",
                                 "YVU9 (BMP)",
                                 "YV12 (BMP)",
                                 "I420 (BMP)",
                                 "IYUV (BMP)",
                                 "Y800 (single Y plane for monochrome images)",
                                 "Y8 (single Y plane for monochrome images)",
                                 "CIELAB (CIE L*a*b*)",
                                 "ICCLAB (ICC L*a*b* Adobe TIFF Technote 4",
                                 "ITULAB (ITU L*a*b*)",
                                 "LOGL (CIE Log2(L))",
                                 "LOGLUV (CIE Log2(L) (u',v'))",
                                 "MASK  (TIFF COLOR: holdout mask)",
                                 "SEPARATED (tiff color: color separations)"};
    using enum Fn::FNImageDataCompressionMode;
    int number = 0;
    for (const auto mode :
         {Unknown, Rgb,    Rgba,   Alpha,  Intensity, Palette, YCbCr, Yuy2,     YCbCrK, Cmyk,
          Yvyu,    Uyvy,   Rle8,   Rle4,   BitFields, Yvu9,    Yv12,  I420,     Iyuv,   Y800,
          Y8,      CieLab, IccLab, ItuLab, LogL,      LogLuv,  Mask,  Separated})
        EXPECT_EQ(static_cast<int>(mode), number++);
    for (int mode = 0; mode < 28; ++mode)
        EXPECT_EQ(Fn::compressionModeToString(static_cast<Fn::FNImageDataCompressionMode>(mode)),
                  texts[mode]);
}

TEST(ImageGoldens, InformationOnABitmapIsText) {
    std::ostringstream stream;
    Fn::dumpBMPInfo({1, -2, 3, 4, 5, 6, 7, 8, 9, 10}, stream);
    EXPECT_EQ(stream.str(),
              "biWidth 1\nbiHeight -2\nbiPlanes 3\nbiBitCount 4\nbiCompression 5\nbiSizeImage 6\n"
              "biXPelsPerMeter 7\nbiYPelsPerMeter 8\nbiClrUsed 9\nbiClrImportant 10\n");
}

} // namespace
