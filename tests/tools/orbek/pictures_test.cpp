#include "drawing.h"
#include "pictures.h"

#include "fn/imagefile/jpeg.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <sstream>

#include <sys/stat.h>

using namespace Orbek;
using namespace Orbek::Tool;

namespace {

/// A TIFF structure with one entry, behind one that it has to step over.
std::string tiff(bool littleEndian, unsigned int tag, unsigned int type, unsigned int value) {
    std::string bytes = littleEndian ? "II" : "MM";
    const auto number = [&](unsigned int v, int size) {
        for (int i = 0; i < size; ++i)
            bytes += static_cast<char>(v >> 8 * (littleEndian ? i : size - 1 - i) & 0xFF);
    };
    number(42, 2), number(8, 4), number(2, 2);
    number(271, 2), number(2, 2), number(1, 4), number(0, 4);
    number(tag, 2), number(type, 2), number(1, 4), number(value, 2), number(0, 2);
    return bytes;
}

Orientation orientationOf(const std::string& bytes) {
    std::istringstream stream(bytes);
    return orientationIn(stream);
}

/// A JPEG file whose Exif block tells an orientation, behind a comment.
std::string withExif(const std::string& jpeg, unsigned int orientation) {
    const std::string block = std::string("Exif\0\0", 6) + tiff(orientation % 2, 274, 3, orientation);
    const std::size_t size = block.size() + 2;
    return jpeg.substr(0, 2) + "\xFF\xFE" + std::string("\0\4hi", 4) + "\xFF\xFF\xE1" +
           static_cast<char>(size >> 8) + static_cast<char>(size & 0xFF) + block + jpeg.substr(2);
}

TEST(Exif, TellsTheOrientationInBothByteOrders) {
    for (const bool littleEndian : {false, true}) {
        EXPECT_EQ(orientationOf(tiff(littleEndian, 274, 3, 6)), Orientation::TurnClockwise);
        for (const auto& [tag, type, value] : {std::array{274u, 3u, 0u}, std::array{274u, 3u, 9u},
                                               std::array{274u, 4u, 6u}, std::array{275u, 3u, 6u}})
            EXPECT_EQ(orientationOf(tiff(littleEndian, tag, type, value)), Orientation::Upright);
    }
    const std::string whole = tiff(true, 274, 3, 6);
    for (std::size_t size = 0; size < whole.size() - 2; ++size)
        EXPECT_EQ(orientationOf(whole.substr(0, size)), Orientation::Upright) << size;
    // A BigTIFF file with an entry to step over.
    const std::string big("MM\0\x2B\0\x08\0\0\0\0\0\0\0\0\0\x10\0\0\0\0\0\0\0\2"
                          "\1\1\0\3\0\0\0\0\0\0\0\1\0\1\0\0\0\0\0\0"
                          "\1\x12\0\3\0\0\0\0\0\0\0\1\0\3\0\0\0\0\0\0",
                          64);
    EXPECT_EQ(orientationOf(big), Orientation::HalfTurned);
}

TEST(Exif, IsFoundInPngFiles) {
    const auto chunk = [](const std::string& kind, const std::string& content) {
        const auto size = static_cast<char>(content.size());
        return std::string(3, '\0') + size + kind + content + "crc.";
    };
    const std::string start = "\x89PNG\r\n\x1A\n" + chunk("IHDR", std::string(13, 'x')),
                      block = tiff(true, 274, 3, 8), end = chunk("IEND", "");
    EXPECT_EQ(orientationOf(start + chunk("eXIf", block) + end), Orientation::TurnCounterClockwise);
    EXPECT_EQ(orientationOf(start + chunk("IDAT", "data") + chunk("eXIf", block)),
              Orientation::TurnCounterClockwise);
    for (const std::string& bytes :
         {start, start + end + chunk("eXIf", block), start + "\xFF\xFF\xFF\xFFIDAT",
          start +
              "\x7F\xFF\xFF\xFF"
              "eXIf" +
              block,
          start + chunk("eXIf", "II")})
        EXPECT_EQ(orientationOf(bytes), Orientation::Upright);
}

TEST(Pictures, AreReadUpright) {
    // Quadrants in the scene: 20 40 / 160 240, twice as wide as high.
    const auto value = [](std::uint32_t x, std::uint32_t y) {
        return (y == 0 ? 20 : 160) + (x == 0 ? 0 : 20 + 60 * y);
    };
    const ScratchFolder scratch;
    for (unsigned int orientation = 1; orientation <= 8; ++orientation) {
        // As a camera with that orientation stores the scene: rows and columns lie as the tag says.
        const bool exchanged = orientation >= 5;
        const std::uint32_t w = exchanged ? 16 : 32, h = exchanged ? 32 : 16;
        FNImage<unsigned char> stored(w, h);
        for (FNImIter<unsigned char> pixel(stored, stored.box()); !pixel.atEnd(); ++pixel) {
            const std::uint32_t column = pixel.x() >= w / 2, row = pixel.y() >= h / 2;
            const bool right = orientation == 2 || orientation == 3 || orientation == 6 || orientation == 7,
                       bottom = orientation == 3 || orientation == 4 || orientation == 7 || orientation == 8;
            // Row 0 lies at the scene's top, bottom, left or right; column 0 likewise.
            const std::uint32_t x = (exchanged ? row : column) ^ right,
                                y = (exchanged ? column : row) ^ bottom;
            *pixel = static_cast<unsigned char>(value(x, y));
        }
        std::ostringstream jpeg;
        Fn::writeJpeg(FNImageReferenceFactory::create(stored), jpeg, 100);
        const FNImage<unsigned char> upright =
            readUpright(scratch.write("a.jpg", withExif(jpeg.str(), orientation))).toMono8();
        ASSERT_EQ(upright.w(), 32u) << orientation;
        ASSERT_EQ(upright.h(), 16u) << orientation;
        for (const std::uint32_t x : {0u, 1u})
            for (const std::uint32_t y : {0u, 1u})
                EXPECT_NEAR(upright(8 + 16 * x, 4 + 8 * y), value(x, y), 3) << orientation << ": " << x << y;
    }
}

TEST(Pictures, TiffFilesAndGzipContentAreTurnedToo) {
    if (std::system("tiffset >/dev/null 2>&1; test $? -ne 127 && command -v convert >/dev/null") != 0)
        GTEST_SKIP() << "ImageMagick or libtiff's tools are not installed";
    const ScratchFolder scratch;
    const std::string in = "cd '" + scratch.path().string() + "' && ";
    scratch.write("a.pgm", "P5 2 1 255\nAB");
    ASSERT_EQ(std::system((in + "convert a.pgm a.tif && tiffset -s 274 6 a.tif").c_str()), 0);
    const FNImage<unsigned char> turnedImage = readUpright(scratch.file("a.tif")).toMono8();
    EXPECT_EQ(turnedImage.w(), 1u);
    EXPECT_EQ(turnedImage(0, 0), 'A') << "left is up after a turn clockwise";
    std::ostringstream jpeg;
    FNImage<unsigned char> wide(32, 16);
    wide.fill(9);
    Fn::writeJpeg(FNImageReferenceFactory::create(wide), jpeg, 100);
    scratch.write("a.jpg", withExif(jpeg.str(), 6));
    ASSERT_EQ(std::system((in + "gzip a.jpg").c_str()), 0);
    EXPECT_EQ(readUpright(scratch.file("a.jpg.gz")).w(), 16u);
}

TEST(Pictures, FilesThatAreInputsAreNotWrittenOver) {
    const ScratchFolder scratch;
    const std::string a = scratch.write("a.jpg", "photo"), folder = scratch.path().string();
    EXPECT_THROW(PictureFolder(folder, {a}), std::runtime_error);
    // The file by another name, and a link to it that has the name of the result.
    std::filesystem::create_directory_symlink(folder, scratch.file("again"));
    EXPECT_THROW(PictureFolder(scratch.file("again"), {a}), std::runtime_error);
    std::filesystem::create_directory(scratch.file("out"));
    std::filesystem::create_symlink("../a.jpg", scratch.file("out/a.jpg"));
    EXPECT_EQ(thrownBy([&] { PictureFolder(scratch.file("out"), {a}); }),
              "std::exception: " + scratch.file("out/a.jpg") + ": is an input too, and is not written over");
    EXPECT_NO_THROW(PictureFolder(scratch.file("other"), {a}));
    EXPECT_NO_THROW(PictureFolder(folder, {scratch.write("b.png", "photo")}));
}

TEST(Pictures, FoldersAreReplacedByTheirImagesInOrder) {
    const ScratchFolder scratch;
    for (const char* name :
         {"f10.png", "f9.PNG", "f9b.jpg", "f11.pbm", "f12.tif", "notes.txt", ".hidden.jpg"})
        scratch.write(name, "");
    ASSERT_EQ(mkfifo(scratch.file("pipe.jpg").c_str(), 0600), 0);
    std::filesystem::create_directory(scratch.file("folder.jpg"));
    const auto files = pictureFiles({"a.txt", scratch.path().string()});
    ASSERT_EQ(files.size(), 6u);
    EXPECT_EQ(files[0], "a.txt");
    EXPECT_EQ(files[1].filename(), "f9.PNG");
    EXPECT_EQ(files[2].filename(), "f9b.jpg");
    EXPECT_EQ(files[3].filename(), "f10.png");
    EXPECT_EQ(files[4].filename(), "f11.pbm");
    EXPECT_EQ(files[5].filename(), "f12.tif");
    const ScratchFolder empty;
    EXPECT_EQ(thrownBy([&] { pictureFiles({empty.path().string()}); }),
              "std::exception: " + empty.path().string() + ": has no image files");
}

TEST(Drawing, MarksFacesAndNumbers) {
    FNImage<unsigned char> black(200, 200);
    black.fill(0);
    Drawing drawing(FNImageReferenceFactory::create(black));
    drawing.face({{100, 100}, 40, 1, 0}, 7);
    drawing.eyes({{80, 100}, {120, 100}, 1, 1});
    const FNImage<unsigned char> drawn = drawing.picture().toMono8();
    EXPECT_GT(drawn(60, 120), 100) << "left side of the box";
    EXPECT_GT(drawn(100, 168), 100) << "its lower side";
    EXPECT_GT(drawn(80, 100), 100) << "an eye";
    EXPECT_EQ(drawn(100, 120), 0) << "the inside is left alone";

    // Each digit has its own form.
    std::set<std::vector<unsigned char>> forms;
    for (unsigned int digit = 0; digit < 10; ++digit) {
        Drawing plate(FNImageReferenceFactory::create(FNImage<unsigned char>(black)));
        plate.number({1, 1}, digit, 14, Fn::Bgra32(255, 255, 255));
        const FNImage<unsigned char> form = plate.picture().toMono8();
        forms.insert({form.data(), form.data() + form.size()});
    }
    EXPECT_EQ(forms.size(), 10u);

    // Nothing is drawn beyond the image, and nothing fails there.
    for (const float far : {-1e9f, -30.0f, 230.0f, 1e9f}) {
        drawing.face({{far, far}, 50, 1, 0.2f}, 4294967295u);
        drawing.face({{100, 100}, std::abs(far), 1, -0.2f}, 12);
    }
}

} // namespace
