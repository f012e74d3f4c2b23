#include "shapeimg/scanfile/mesh.h"
#include "shapeimg/scanfile/scan_file.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <bit>
#include <sstream>

namespace {

using ShapeImage::TexturedPointSet;
using Vertex = FN3Vector<double>;

// ---- files as they are documented

void append(std::string& bytes, std::uint32_t value, int size = 4) {
    for (int i = 0; i < size; ++i) bytes += static_cast<char>(value >> 8 * i);
}

/// A gray picture of the values 0, 1, ... of 8 or 16 bits.
struct Page {
    std::uint32_t width, height;
    int bits;
    std::string description;
};
/// A TIFF file, least significant byte first, of one strip for each picture.
std::string tiff(const std::vector<Page>& pages) {
    std::string bytes = "II";
    append(bytes, 42, 2);
    for (const Page& page : pages) {
        const auto pixelBytes = static_cast<std::uint32_t>(page.bits / 8);
        const std::uint32_t size = page.width * page.height * pixelBytes;
        const std::uint32_t text = static_cast<std::uint32_t>(page.description.size() + 1);
        const auto strip = static_cast<std::uint32_t>(bytes.size() + 4), words = strip + size,
                   directory = words + text + (size + text) % 2;
        append(bytes, directory);
        for (std::uint32_t i = 0; i < page.width * page.height; ++i) append(bytes, i, page.bits / 8);
        bytes += page.description + std::string(1 + (size + text) % 2, '\0');
        struct Tag {
            std::uint32_t tag, type, count, value;
        };
        std::vector<Tag> tags{{256, 4, 1, page.width},
                              {257, 4, 1, page.height},
                              {258, 3, 1, static_cast<std::uint32_t>(page.bits)},
                              {259, 3, 1, 1},
                              {262, 3, 1, 1},
                              {270, 2, text, words},
                              {273, 4, 1, strip},
                              {277, 3, 1, 1},
                              {278, 4, 1, page.height},
                              {279, 4, 1, size}};
        if (page.description.size() < 4) tags.erase(tags.begin() + 5);
        append(bytes, static_cast<std::uint32_t>(tags.size()), 2);
        for (const Tag& t : tags) {
            append(bytes, t.tag, 2);
            append(bytes, t.type, 2);
            append(bytes, t.count);
            append(bytes, t.value);
        }
    }
    append(bytes, 0);
    return bytes;
}

std::string pgm(int width, int height) {
    std::string text = "P5 " + std::to_string(width) + " " + std::to_string(height) + " 255\n";
    for (int i = 0; i < width * height; ++i) text += static_cast<char>(i);
    return text;
}

std::string siemens(std::uint32_t width, std::uint32_t height, std::uint32_t elements,
                    const std::vector<float>& values) {
    std::string bytes;
    for (const std::uint32_t n : {width, height, elements}) append(bytes, n);
    for (const float v : values) append(bytes, std::bit_cast<std::uint32_t>(v));
    return bytes;
}

/// The point at a pixel; far away where there is none.
Vertex at(const TexturedPointSet& set, int x, int y) {
    const auto vertex = set.mapTexture2Vertex({x, y});
    return vertex.isSet() ? *vertex : Vertex{999, 999, 999};
}
constexpr Vertex none{999, 999, 999};

TexturedPointSet read(const ScratchFolder& folder, const std::string& name, const std::string& content) {
    return ShapeImage::readTexturedPointSet(folder.write(name, content));
}
std::string failure(const ScratchFolder& folder, const std::string& name, const std::string& content) {
    const std::string thrown = thrownBy([&] { read(folder, name, content); });
    return thrown.rfind("FNEBadArg: ", 0) == 0 ? thrown.substr(11) : thrown;
}

// ---- tests

TEST(TexturedPointSet, MapsPixelsOfAGrid) {
    Fn::VertexImage image(2, 2);
    image.setVertex({1, 0}, {1, 2, 3});
    image.setVertex({0, 1}, {4, 5, 6});
    const auto texture = FNImageReferenceFactory::create(FNImage<unsigned char>(2, 2));
    TexturedPointSet set(image, texture);
    EXPECT_EQ(set.points().validSize(), 2u);
    EXPECT_EQ(at(set, 1, 0), (Vertex{1, 2, 3}));
    for (const FNGridPos pos : {FNGridPos(0, 0), FNGridPos(2, 0), FNGridPos(-1, 1), FNGridPos(0, 2)})
        EXPECT_EQ(at(set, pos.x, pos.y), none);
    set.points().affineTransform({10, 0, 0});
    EXPECT_EQ(at(set, 0, 1), (Vertex{14, 5, 6})) << "the mapper follows the points";

    EXPECT_EQ(thrownBy([&] { TexturedPointSet(image, FNImageReference()); }),
              "FNEBadArg: Size of vertex and texture image do not match");
    EXPECT_EQ(thrownBy([&] { set.serialize(); }),
              "FNEBadArg: TexturedPointSet serialization not implemented");
    EXPECT_EQ(thrownBy([&] { TexturedPointSet{Fn::Package()}; }),
              "FNEBadArg: TexturedPointSet deserialization not implemented");
    EXPECT_EQ(at(TexturedPointSet(), 0, 0), none);
}

TEST(ScanFile, TellsFormatsApart) {
    const ScratchFolder folder;
    const std::string frgc = "1 rows\n2 columns\npixels (flag X Y Z):\n 0 1\n 0 1\n 0 2\n 0 3\n";
    const TexturedPointSet scan = read(folder, "scan.abs", frgc);
    EXPECT_EQ(at(scan, 1, 0), (Vertex{1, 2, 3}));
    EXPECT_EQ(scan.texture().toMono8()(1, 0), 0) << "black for want of another";
    folder.write("scan.pgm", pgm(2, 1));
    EXPECT_EQ(read(folder, "scan.abs", frgc).texture().toMono8()(1, 0), 1);
    folder.write("scan.pgm", pgm(3, 1));
    EXPECT_EQ(failure(folder, "scan.abs", frgc), "Size of vertex and texture image do not match");

    EXPECT_EQ(failure(folder, "empty.abs", "1 rows\n1 columns\npixels (flag X Y Z):\n 0\n 0\n 0\n 0\n"),
              "Empty Pointset found in: " + folder.file("empty.abs"));
    EXPECT_EQ(failure(folder, "scan.txt", "rubbish"),
              "Unknown vertex image format in " + folder.file("scan.txt"));
    EXPECT_EQ(failure(folder, "scan.txt", ""), "FNEIOError: readTexturedPointSet: premature eof condition");
    EXPECT_EQ(thrownBy([] { ShapeImage::readTexturedPointSet("nowhere.abs"); }),
              "FNEIOError: readTexturedPointSet: can not read nowhere.abs");
}

TEST(ObjFile, HasTextureCoordinates) {
    const ScratchFolder folder;
    const std::string vertices = "mtllib my face.mtl\nusemtl skin\nv 1 2 3\nv 4 5 6 1.0\n# v\nv 7 8 9\n";
    EXPECT_EQ(failure(folder, "a.obj", vertices), "No texture file available");
    folder.write("skin.pgm", pgm(8, 4));
    folder.write("hair.pgm", pgm(3, 1));
    folder.write(
        "my face.mtl",
        "newmtl hair\nmap_Kd hair.pgm\nnewmtl skin\nKd 1 1 1\nmap_kd -clamp on C:\\scans\\skin.pgm\n");
    EXPECT_EQ(failure(folder, "a.obj", vertices), "Size of vertex and texture image do not match");

    // By number, with y upward; pixels are 8 and 4 to the unit.
    const std::string coordinates = "vt 0.0625 0.875\nvt 0.9375 0.875 0\nvt 0.9375 0.125\n";
    const TexturedPointSet set = read(folder, "a.obj", vertices + coordinates);
    EXPECT_EQ(set.texture().w(), 8u);
    EXPECT_EQ(at(set, 0, 0), (Vertex{1, 2, 3}));
    EXPECT_EQ(at(set, 6, 0), (Vertex{4, 5, 6}));
    EXPECT_EQ(at(set, 7, 3), (Vertex{7, 8, 9}));
    EXPECT_EQ(at(set, 8, 3), none);
    // By faces, the last corner counted backwards.
    const TexturedPointSet faces =
        read(folder, "a.OBJ", vertices + coordinates + "f 1/3/1 2/1 -1/-2\nf 1//1 2 3\n");
    EXPECT_EQ(at(faces, 7, 3), (Vertex{1, 2, 3}));
    EXPECT_EQ(at(faces, 0, 0), (Vertex{4, 5, 6}));
    // Without coordinates, the vertices of a grid.
    folder.write("skin.pgm", pgm(3, 1));
    EXPECT_EQ(at(read(folder, "a.obj", vertices), 2, 0), (Vertex{7, 8, 9}));

    const struct {
        const char *lines, *failure;
    } cases[] = {
        {"vt 0 0\n", "Number of vertices and texture coordinates do not match"},
        {"vt 0 0\nvt 0 0\nvt 0 0\nf 4/1 1/1 1/1\n",
         "Face refers to a vertex or texture coordinates that are not there"},
        {"f 0/1 1/1 1/1\n", "Format error in OBJ file"},
        {"f 1/x 1/1 1/1\n", "Format error in OBJ file"},
        {"v 1 2\n", "Format error in OBJ file"},
    };
    for (const auto& c : cases) EXPECT_EQ(failure(folder, "a.obj", vertices + c.lines), c.failure);
}

std::string vrmlShape(const std::string& picture, double x, const std::string& more) {
    return "Shape { appearance Appearance { texture ImageTexture { url [ \"" + picture +
           "\" ] } }\n geometry IndexedFaceSet {\n coord DEF C Coordinate { point [ " + std::to_string(x) +
           " 0 0, 1 0 0 # a corner\n 1,1,0 0 1 0 ] }\n texCoord TextureCoordinate { point [ 0 0 1 0 1 1 0 1 "
           "] }\n"
           " coordIndex [ 0 1 2 -1, 0, 2, 3 ] " +
           more + " } }\n";
}

TEST(ScanMesh, HasEachPairOfCornersOnce) {
    ShapeImage::Mesh mesh;
    mesh.vertices = {{1, 0, 0}, {2, 0, 0}};
    mesh.textureCoordinates = {{0, 0}, {0.5, 1}};
    mesh.corners = {{1, 0}, {0, 1}, {1, 0}, {0, 0}, {0, 1}};
    std::vector<TexturedPointSet::CoordinateTextureMapper::Coordinate> coordinates;
    ShapeImage::appendCoordinates(mesh, 8, 4, 10, 100, coordinates);
    ASSERT_EQ(coordinates.size(), 3u);
    mesh.corners.push_back({2, 0});
    EXPECT_EQ(thrownBy([&] { ShapeImage::appendCoordinates(mesh, 8, 4, 0, 0, coordinates); }),
              "FNEBadArg: Face refers to a vertex or texture coordinates that are not there");
}

TEST(VrmlFile, HasShapesWithTextures) {
    const ScratchFolder folder;
    folder.write("a.pgm", pgm(4, 4));
    folder.write("b.pgm", pgm(4, 4));
    folder.write("c.pgm", pgm(4, 5));
    const std::string head = "#VRML V2.0 utf8\nWorldInfo { title \"} [ \\\" {\" }\nGroup { children [\n";
    const TexturedPointSet one = read(folder, "s.wrl", head + vrmlShape("a.pgm", 5, "") + "] }");
    EXPECT_EQ(one.points().size(), 4u);
    EXPECT_EQ(at(one, 0, 3), (Vertex{5, 0, 0})) << "y of texture coordinates points up";
    EXPECT_EQ(at(one, 3, 0), (Vertex{1, 1, 0}));

    EXPECT_EQ(read(folder, "s.wrl",
                   head + "Appearance { texture ImageTexture { url \"c.pgm\" } }\n" +
                       vrmlShape("a.pgm", 5, "") + "] }")
                  .texture()
                  .h(),
              4u)
        << "what is outside of shapes is not of the next one";

    // Texture coordinates of their own; a second shape's picture lies below the first.
    const TexturedPointSet two = read(folder, "s.wrl",
                                      head + vrmlShape("a.pgm", 5, "texCoordIndex [ 2 1 0 -1 2 0 3 -1 ]") +
                                          vrmlShape("b.pgm", 6, "") + "] }");
    EXPECT_EQ(two.texture().h(), 8u);
    EXPECT_EQ(at(two, 3, 0), (Vertex{5, 0, 0}));
    EXPECT_EQ(at(two, 0, 7), (Vertex{6, 0, 0}));

    const auto set = [](const std::string& field, const std::string& list) {
        return "#VRML V2.0\nShape { geometry IndexedFaceSet { coord Coordinate { point [ 0 0 0 ] } " + field +
               " [" + list + "] } }";
    };
    const struct {
        std::string text, failure;
    } cases[] = {
        {set("coord Coordinate { point", "1 2 3 4"),
         "String list size not appropriate to read vertex element 1"},
        {set("coord Coordinate { point", "1 2 x"), "Inappropriate vertex list element"},
        {set("texCoord TextureCoordinate { point", "1 2 3"),
         "String list size not appropriate to read vector element 1"},
        {set("coordIndex", "0 0 0 -1 0 0 -1"), "String list size not appropriate to read face element 1"},
        {set("coordIndex", "0 -2 0 0"), "Inappropriate vertex list element"},
        {set("coordIndex", "0 0 0 } "), "Unexpected node end found"},
        {set("children", "} "), "Unexpected node end found"},
        {set("coordIndex", "0 0 0") + "}", "Unexpected node end found"},
        {set("texCoordIndex", "0 0 0"), "Coordinate face list size does not match texture face list size"},
        {set("coordIndex", "0 0 0"), "No texture file available"},
        {set("coordIndex", "0 0 0 #") + "\n", "Inappropriate vertex list element"},
        {head + vrmlShape("a.pgm", 0, "") + vrmlShape("c.pgm", 0, ""), "VRML: premature eof condition"},
        {head + vrmlShape("a.pgm", 0, "") + vrmlShape("c.pgm", 0, "") + "]}",
         "texture images sizes different"},
        {head + vrmlShape("a.pgm", 0, "texCoordIndex [ 0 1 2 -1 0 2 4 ]") + "]}",
         "Face refers to a vertex or texture coordinates that are not there"},
        {"#VRML V2.0\nShape { }", "Empty Pointset found in: " + folder.file("t.wrl")},
    };
    for (const auto& c : cases) EXPECT_EQ(failure(folder, "t.wrl", c.text), c.failure) << c.text;
}

TEST(SiemensFile, IsAGridOfVectors) {
    const ScratchFolder folder;
    const std::vector<float> values{1, 2, 3, 0, 0, 0, std::nanf(""), 0, 1, 4, 5, 6};
    const std::string plain = siemens(2, 2, 3, values), name = folder.file("s.3D");
    EXPECT_EQ(failure(folder, "s.3D", plain), "Cannot find texture file for " + name);
    folder.write("s.bmp", pgm(2, 2)); // the ending does not tell the format
    const TexturedPointSet set = read(folder, "s.3D", plain);
    EXPECT_EQ(set.points().validSize(), 2u);
    EXPECT_EQ(at(set, 0, 0), (Vertex{1, 2, 3}));
    EXPECT_EQ(at(set, 1, 1), (Vertex{4, 5, 6}));

    // With texture coordinates the picture may have any size.
    const std::string textured = siemens(2, 1, 6, {1, 2, 3, 0.9f, 0.9f, 7, 4, 5, 6, 0.1f, 0.1f, 7});
    folder.write("s.bmp", pgm(10, 10));
    EXPECT_EQ(at(read(folder, "s.3D", textured), 9, 1), (Vertex{1, 2, 3}));
    EXPECT_EQ(at(read(folder, "s.3D", textured), 1, 8), (Vertex{4, 5, 6}));
    EXPECT_EQ(failure(folder, "s.3D", plain), "Size of vertex and texture image do not match");
    for (const auto size : {std::size_t{5}, plain.size() - 1})
        EXPECT_EQ(failure(folder, "s.3D", plain.substr(0, size)),
                  "Premature EOF in Siemens 3D data input stream");
    EXPECT_EQ(failure(folder, "s.3D", siemens(2, 2, 2, values)),
              "Number of elements per vector (2) too small (3 expected)");
    EXPECT_EQ(failure(folder, "s.3D", siemens(60000, 60000, 3, values)).substr(0, 12), "FNEBadFormat");
}

TEST(IgdScan, HasRangesAndACamera) {
    const ScratchFolder folder;
    const std::string camera = "Made by hand\nIntCalib = 100 50, 1 1; 0.5 200\nmore";
    const TexturedPointSet set = read(folder, "s.tif", tiff({{3, 2, 8, camera}, {3, 2, 16, ""}}));
    EXPECT_EQ(set.points().validSize(), 5u) << "a range of 0 is none";
    EXPECT_EQ(set.texture().toMono8()(2, 1), 5);
    // Value 5 at (2, 1): 202.5 mm away.
    EXPECT_NEAR(at(set, 2, 1).x, 1.5 * 202.5 / 100, 1e-9);
    EXPECT_NEAR(at(set, 2, 1).y, -0.5 * 202.5 / 50, 1e-9);
    EXPECT_EQ(at(set, 2, 1).z, -202.5);
    EXPECT_EQ(at(set, 0, 0), none);

    const std::string name = folder.file("s.tif");
    const struct {
        std::vector<Page> pages;
        std::string failure;
    } cases[] = {
        {{{3, 2, 8, ""}, {3, 2, 16, ""}}, "No image description found in TIFF image"},
        {{{3, 2, 8, "Calib"}, {3, 2, 16, ""}}, "Cannot find calibration data"},
        {{{3, 2, 8, "IntCalib 1 2 3 4 5"}, {3, 2, 16, ""}}, "Item count mismatch"},
        {{{3, 2, 8, "IntCalib 1 2 3 4 5 6 7"}, {3, 2, 16, ""}}, "Item count mismatch"},
        {{{3, 2, 8, "IntCalib 1 2 3 4 x 6"}, {3, 2, 16, ""}}, "Item count mismatch"},
        {{{3, 2, 8, camera}}, "No range data found in " + name},
        {{{3, 2, 8, camera}, {3, 2, 8, ""}}, "No range data found in " + name},
        {{{3, 2, 8, camera}, {2, 2, 16, ""}}, "Size of vertex and texture image do not match"},
    };
    for (const auto& c : cases) EXPECT_EQ(failure(folder, "s.tif", tiff(c.pages)), c.failure);
}

} // namespace
