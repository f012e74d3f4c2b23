#include "fn/shapefile/shape_file.h"

#include "fn/imagefile/image_file.h"
#include "fn/shapefile/echo.h"
#include "fn/shapefile/frgc.h"
#include "fn/shapefile/texture_file.h"
#include "fn/shapefile/vialux.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <numbers>
#include <sstream>

namespace {

using Fn::VertexImage;
using Vertex = VertexImage::Vertex;

VertexImage readText(const std::string& text) {
    std::istringstream stream(text);
    return Fn::readShapeImage(stream, "a scan");
}

const std::string frgc =
    "2 rows\n3 columns\npixels (flag X Y Z):\n 1 0 1 1 0 1\n 1.5 0 -2 0.333333333333 0 1e-09\n"
    " 1 0 2 3 0 4\n -1 0 -2 -3 0 -123456.789012\n";

TEST(FrgcFile, KeepsTwelveDigitsOfValidPoints) {
    VertexImage image(3, 2);
    image.setVertex({0, 0}, {1.5, 1, -1});
    image.setVertex({1, 0}, {7, 7, 7});
    image.setValidity({1, 0}, false);
    image.setVertex({2, 0}, {-2, 2, -2});
    image.setVertex({0, 1}, {1.0 / 3, 3, -3});
    image.setVertex({2, 1}, {1e-9, 4, -123456.7890123});
    std::ostringstream written;
    Fn::writeFRGC(image, written);
    EXPECT_EQ(written.str(), frgc);

    const ScratchFolder folder;
    Fn::writeShapeImage(image, folder.file("scan.abs"));
    for (const VertexImage& back : {Fn::readShapeImage(folder.file("scan.abs")),
                                    Fn::readFRGC(folder.file("scan.abs")), readText(frgc)}) {
        ASSERT_EQ(back.w(), 3u);
        EXPECT_EQ(back.validity(), image.validity());
        EXPECT_EQ(back.vertex({2, 1}), (Vertex{1e-9, 4, -123456.789012}));
        EXPECT_EQ(back.vertex({1, 0}), Vertex());
    }
    EXPECT_EQ(thrownBy([&] { Fn::writeShapeImage(image, folder.file("none/scan")); }),
              "FNEIOError: writeShapeImage: can not open " + folder.file("none/scan") + " for writing");
    EXPECT_EQ(thrownBy([&] { Fn::readFRGC("nowhere.abs"); }), "FNEIOError: nowhere.abs is not a valid file");
    EXPECT_EQ(thrownBy([&] { Fn::readFRGC(folder.path().string()); }),
              "FNEIOError: " + folder.path().string() + " is not a valid file");
}

std::string echo(const std::string& lines, const std::string& table) {
    return "Cyberware Digitizer Data\n" + lines + "DATA=\n" + table;
}
const std::string echoLines =
    "NLG=2\r\nNLT = 3\nLGMIN=0\nLGMAX=1\nLGINCR=500\nLTMIN=0\nLTMAX=2\nLTINCR=785398\n"
    "RSHIFT=2\nSPACE=CYLINDRICAL\nNAME=somebody\n";

TEST(EchoFile, HoldsCylindricalCoordinates) {
    // Rows of three values: 25000, none, 25000; 0, 256, -1.
    const std::string table("\x61\xa8\x80\x00\x61\xa8\x00\x00\x01\x00\xff\xff", 12);
    const VertexImage image = readText(echo(echoLines, table));
    ASSERT_EQ(image.w(), 3u);
    ASSERT_EQ(image.h(), 2u);
    const bool expected[] = {true, false, true, false, true, false};
    EXPECT_TRUE(std::equal(expected, expected + 6, image.validity().data()));
    EXPECT_EQ(image.vertex({0, 0}), (Vertex{0, 0, 100}));
    EXPECT_NEAR(image.vertex({2, 0}).x, 100, 1e-3) << "a quarter of a turn";
    EXPECT_NEAR(image.vertex({2, 0}).z, 0, 1e-3);
    EXPECT_NEAR(image.vertex({1, 1}).x, 1.024 * std::numbers::sqrt2 / 2, 1e-6);
    EXPECT_EQ(image.vertex({1, 1}).y, 0.5);
}

TEST(ViaLuxFile, IsATableOfGridPositions) {
    const VertexImage image = readText("i\tj\tz\tx\ty\r\n2\t0\t3.5\t1\t2\n\n0 1 -6 +4 5e0 extra\n");
    ASSERT_EQ(image.w(), 3u);
    ASSERT_EQ(image.h(), 2u);
    EXPECT_EQ(image.vertex({2, 0}), (Vertex{1, 2, 3.5}));
    EXPECT_EQ(image.vertex({0, 1}), (Vertex{4, 5, -6}));
    EXPECT_EQ(std::count(image.validity().span().begin(), image.validity().span().end(), true), 2);
}

TEST(ShapeFile, RefusesDamagedScans) {
    const auto without = [](std::string text, const std::string& part) {
        return text.replace(text.find(part), part.size(), "");
    };
    const std::string eko = "FNEBadArg: Error reading eko file ";
    const struct {
        std::string text, failure;
    } cases[] = {
        {"", "FNEIOError: readShapeImage: premature eof condition"},
        {"solid\n", "FNEBadArg: Unknown vertex image format in a scan"},
        {"#VRML V2.0 utf8\n", "FNEBadArg: Unknown vertex image format in a scan"},
        {without(frgc, " columns"), "FNEBadArg: Format Error reading in FRGC file"},
        {without(frgc, " -123456.789012"), "FNEBadArg: Format Error reading in FRGC file"},
        {without(frgc, "-09"), "FNEBadArg: Format Error reading in FRGC file"},
        {"60000 rows\n60000 columns\npixels (flag X Y Z):\n 1", "FNEBadFormat: *"},
        {"60000 rows\n700 columns\npixels (flag X Y Z):\n 1", "FNEBadArg: Format Error reading in FRGC file"},
        {echo(without(echoLines, "RSHIFT=2\n"), ""), eko + "header; header lines missing"},
        {"Cyberware\n" + echoLines, eko + "header; header lines missing"},
        {echo(without(echoLines, "500"), ""), eko + "header; line too short"},
        {echo("\n" + echoLines, ""), eko + "header; line too short"},
        {echo(std::string(300, 'x'), ""), eko + "header; line too long"},
        {echo(without(echoLines, "CYL"), ""), "FNEBadArg: Unknown cyberware data format"},
        {echo(echoLines, "12345678901"), eko + "table"},
        {echo("NLG=40000\n" + without(echoLines, "NLG=2\r\n"), "1234"), eko + "table"},
        {"i\tj\tz\tx\ty\n1 2 3 4\n", "FNEBadArg: Format Error reading in vialux file"},
        {"i\tj\tz\tx\ty\n-1 2 3 4 5\n", "FNEBadArg: Format Error reading in vialux file"},
        {"i\tj\tz\tx\ty\n1 2 inf 4 5\n", "FNEBadArg: Format Error reading in vialux file"},
        {"i\tj\tz\tx\ty\n3000 3000 1 1 1\n", "FNEBadArg: Format Error reading in vialux file"},
        {"i\tj\tz\tx\ty\n4294967295 4294967295 1 1 1\n", "FNEBadFormat: *"},
    };
    for (const auto& c : cases) {
        const std::string thrown = thrownBy([&] { readText(c.text); });
        if (c.failure.back() == '*')
            EXPECT_EQ(thrown.substr(0, c.failure.size() - 1), c.failure.substr(0, c.failure.size() - 1));
        else
            EXPECT_EQ(thrown, c.failure) << c.text.substr(0, 60);
    }
    std::istringstream tooShort("i\tj");
    EXPECT_EQ(thrownBy([&] { Fn::readViaLuxFile(tooShort); }),
              "FNEBadArg: Error reading vialux file header line; line too short");
    std::istringstream bad("1 rows");
    bad.setstate(std::ios::badbit);
    EXPECT_EQ(thrownBy([&] { Fn::readShapeImage(bad, "x"); }), "FNEIOError: readShapeImage: can not read x");
    EXPECT_EQ(thrownBy([] { Fn::readShapeImage("nowhere"); }),
              "FNEIOError: readShapeImage: can not read nowhere");
}

TEST(ShapeFile, FindsItsTexture) {
    const ScratchFolder folder;
    const std::string scan = folder.write("scan.abs", frgc);
    FNImageReference texture;
    EXPECT_EQ(thrownBy([&] { Fn::readShapeImage(scan, &texture, true); }),
              "FNEBadArg: Cannot find texture file for " + scan);
    Fn::readShapeImage(scan, &texture);
    EXPECT_EQ(texture.w(), 1u) << "untouched";
    folder.write("scan.PPM", "P6 3 2 255\n" + std::string(18, 'x'));
    Fn::readShapeImage(scan, &texture, true);
    EXPECT_EQ(texture.w(), 3u);
    EXPECT_TRUE(texture.isColor());
}

TEST(ShapeFile, FollowsReferencesOnlyBelowItsFolder) {
    const ScratchFolder folder;
    std::filesystem::create_directories(folder.path() / "scans" / "maps");
    const std::string outside = folder.write("face.png", "x"), scan = folder.file("scans/scan.obj"),
                      inside = folder.write("scans/maps/face.png", "x");
    const auto found = [&](const std::string& reference) {
        const auto file = Fn::fileReferredTo(scan, reference);
        return file.isSet() ? *file : "";
    };
    EXPECT_EQ(found("maps/face.png"), inside);
    EXPECT_EQ(found("maps\\face.png"), inside);
    for (const std::string& reference : {std::string("../face.png"), outside, std::string("maps"),
                                         std::string(), std::string("maps/face.png\0", 14)})
        EXPECT_EQ(found(reference), "") << reference;
    const std::string beside = folder.write("scans/face.png", "x");
    for (const std::string& reference : {std::string("../face.png"), outside, std::string("C:\\x\\face.png")})
        EXPECT_EQ(found(reference), beside);
}

} // namespace
