#include "kx/cbeff.h"

#include "fn/imagefile/image_compressor.h"
#include "fn/imagefile/j2k.h"
#include "fn/imagefile/png.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <sstream>
#include <vector>

namespace {

/// A picture whose pixels tell where they are.
FNImageReference pattern(std::uint32_t w, std::uint32_t h, bool color, unsigned int seed = 0) {
    FNImage<Fn::Bgra32> image(w, h);
    for (FNImIter<Fn::Bgra32> pixel(image, image.box()); !pixel.atEnd(); ++pixel)
        *pixel = Fn::Bgra32(static_cast<unsigned char>(pixel.x() + seed),
                            static_cast<unsigned char>(pixel.y()), 90);
    const FNImageReference reference = FNImageReferenceFactory::create(image);
    return color ? reference : FNImageReferenceFactory::create(reference.toMono8());
}

Cmp::Face faceOf(const FNImageReference& image) {
    return {image, {{89.5f, 144.5f}, 0, 1}, {{149.5f, 144.5f}, 0, 1}};
}

std::string written(const std::list<Cmp::Face>& faces) {
    std::ostringstream stream;
    Kx::CBEFF::TokenFace::write(stream, faces);
    return stream.str();
}

std::list<Cmp::Face> readBack(const std::string& bytes, const Fn::ImageLimits& limits = {}) {
    std::istringstream stream(bytes);
    return Kx::CBEFF::read(stream, limits);
}

/// What a record says, taken apart by the tables of the standard (clauses 5.3 to 5.8) and the two reserved
/// bytes that follow its record header, each field by its place.
struct Parsed {
    struct Image {
        std::size_t blockLength, points;
        std::vector<unsigned char> person; ///< gender to pose
        unsigned int type, dataType, width, height, colorSpace, sourceType, deviceType, quality;
        std::string file;
    };
    std::string header, identifier, version;
    std::size_t recordLength, count, reserved;
    std::vector<Image> images;
    std::size_t left; ///< bytes behind the last block

    explicit Parsed(const std::string& bytes) {
        std::size_t at = 0;
        const auto text = [&](std::size_t n) {
            at += n;
            return bytes.substr(at - n, n);
        };
        const auto number = [&](int n) {
            std::size_t value = 0;
            for (; n > 0; --n) value = value * 256 + static_cast<unsigned char>(bytes.at(at++));
            return value;
        };
        header = text(4), identifier = text(4), version = text(4);
        recordLength = number(4), count = number(2), reserved = number(2);
        for (std::size_t i = 0; i < count; ++i) {
            Image image;
            const std::size_t begin = at;
            image.blockLength = number(4), image.points = number(2);
            while (at < begin + 20) image.person.push_back(static_cast<unsigned char>(number(1)));
            const auto field = [&](int n) { return static_cast<unsigned int>(number(n)); };
            image.type = field(1), image.dataType = field(1), image.width = field(2), image.height = field(2);
            image.colorSpace = field(1), image.sourceType = field(1), image.deviceType = field(2);
            image.quality = field(2);
            image.file = text(begin + image.blockLength - at);
            images.push_back(image);
        }
        left = bytes.size() - at;
    }
};

TEST(CBEFF, WrittenRecordsAreLaidOutByTheStandard) {
    const std::string bytes = written({faceOf(pattern(240, 320, true)), faceOf(pattern(301, 7, false))});
    const Parsed record(bytes);
    EXPECT_EQ(record.header, std::string("\1\1\5\1"));
    EXPECT_EQ(record.identifier, std::string("FAC\0", 4));
    EXPECT_EQ(record.version, std::string("010\0", 4));
    EXPECT_EQ(record.recordLength, bytes.size() - 4);
    EXPECT_EQ(record.count, 2u);
    EXPECT_EQ(record.reserved, 0u);
    EXPECT_EQ(record.left, 0u);
    for (const auto& [image, w, h, components] :
         {std::tuple{record.images[0], 240u, 320u, 3}, std::tuple{record.images[1], 301u, 7u, 1}}) {
        EXPECT_EQ(image.points, 0u);
        EXPECT_EQ(image.person, std::vector<unsigned char>(14, 0));
        EXPECT_EQ(image.type, 3u);
        EXPECT_EQ(image.width, w);
        EXPECT_EQ(image.height, h);
        EXPECT_EQ(image.dataType + image.colorSpace + image.sourceType + image.deviceType + image.quality,
                  0u);
        EXPECT_EQ(image.file.substr(0, 3), "\xFF\xD8\xFF");
        EXPECT_EQ(image.file.substr(image.file.size() - 2), "\xFF\xD9");
        // Nothing is lost but by rounding: the first table divides by 1.
        EXPECT_EQ(image.file.substr(image.file.find("\xFF\xDB") + 5, 64), std::string(64, '\1'));
        // The frame header of the JPEG file tells the same.
        const std::size_t frame = image.file.find("\xFF\xC0") + 5;
        const auto byte = [&, &file = image.file](std::size_t i) {
            return static_cast<unsigned char>(file[frame + i]);
        };
        EXPECT_EQ(byte(0) * 256u + byte(1), h);
        EXPECT_EQ(byte(2) * 256u + byte(3), w);
        EXPECT_EQ(byte(4), components);
    }
}

TEST(CBEFF, WrittenFacesAreReadBack) {
    EXPECT_EQ(written({}).size(), 20u);
    EXPECT_EQ(Parsed(written({})).recordLength, 16u);
    EXPECT_TRUE(readBack(written({})).empty());

    const FNImageReference gray = pattern(120, 160, false);
    std::istringstream stream("before" + written({faceOf(pattern(240, 320, true)), faceOf(gray)}) + "after");
    stream.seekg(6);
    const std::list<Cmp::Face> faces = Kx::CBEFF::read(stream);
    std::string rest;
    EXPECT_EQ(stream >> rest ? rest : "", "after");
    ASSERT_EQ(faces.size(), 2u);
    const Cmp::Face& face = faces.front();
    EXPECT_EQ(face.leftEye(), FNPos(89.5f, 144.5f));
    EXPECT_EQ(face.rightEye(), FNPos(149.5f, 144.5f));
    EXPECT_TRUE(face.image().isColor());
    EXPECT_FALSE(face.hasEyeFinderLeftEyeInfo() || face.hasEyeFinderRightEyeInfo());
    EXPECT_EQ(face.faceFinderLocation().confidence, 0);
    EXPECT_EQ(face.faceFinderLocation().width, 60);
    EXPECT_FALSE(faces.back().image().isColor());
    const FNImage<unsigned char> expected = gray.toMono8(), read = faces.back().image().toMono8();
    ASSERT_EQ(read.size(), expected.size());
    for (std::size_t i = 0; i < read.size(); ++i) EXPECT_NEAR(read.data()[i], expected.data()[i], 2);
}

/// A record made by hand.
struct Record {
    struct Point {
        unsigned int type, code, x, y;
    };
    static std::string number(std::size_t value, int n) {
        std::string bytes;
        while (n-- > 0) bytes += static_cast<char>(value >> 8 * n);
        return bytes;
    }
    static std::string block(unsigned int type, const std::vector<Point>& points, unsigned int width,
                             const std::string& file, int lengthError = 0) {
        const std::size_t length = 32 + 8 * points.size() + file.size();
        std::string bytes = number(length + static_cast<std::size_t>(lengthError), 4) +
                            number(points.size(), 2) + std::string(14, '\7');
        for (const Point& p : points)
            bytes += number(p.type, 1) + number(p.code, 1) + number(p.x, 2) + number(p.y, 2) + number(0, 2);
        return bytes + number(type, 1) + number(1, 1) + number(width, 2) + number(9, 2) +
               std::string(6, '\1') + file;
    }
    static std::string of(const std::vector<std::string>& blocks) {
        std::string all;
        for (const std::string& block : blocks) all += block;
        return number(0x01020304, 4) + "any id!!" + number(16 + all.size(), 4) + number(blocks.size(), 2) +
               number(0, 2) + all;
    }
};

std::string pngFile(unsigned int seed = 0) {
    std::ostringstream stream;
    Fn::writePng(pattern(20, 10, true, seed), stream, 6);
    return stream.str();
}

TEST(CBEFF, EveryImageTypeHasItsEyes) {
    const std::string png = pngFile();
    const std::vector<Record::Point> eyes{
        {2, 0xC1, 9, 9}, {1, 0xC2, 30, 12}, {1, 0x21, 7, 7}, {1, 0xC1, 10, 12}, {0, 0xC2, 1, 1}};
    for (const unsigned int type : {0u, 1u, 2u, 4u}) {
        const auto faces = readBack(Record::of({Record::block(type, eyes, 20, png)}));
        ASSERT_EQ(faces.size(), 1u) << type;
        EXPECT_EQ(faces.front().leftEye(), FNPos(10.5f, 12.5f)) << type;
        EXPECT_EQ(faces.front().rightEye(), FNPos(30.5f, 12.5f)) << type;
        EXPECT_EQ(faces.front().image().w(), 20u) << "as the file says, whatever the record says";
    }
    const auto token = readBack(Record::of({Record::block(3, eyes, 100, png)}));
    EXPECT_EQ(token.front().leftEye(), FNPos(36.5f, 60.5f));
    EXPECT_EQ(token.front().rightEye(), FNPos(61.5f, 60.5f));
    const std::vector<Record::Point> exchanged{{1, 0xC1, 30, 12}, {1, 0xC2, 10, 12}}, one{{1, 0xC2, 30, 40}};
    EXPECT_EQ(readBack(Record::of({Record::block(1, exchanged, 20, png)})).front().leftEye(),
              FNPos(10.5f, 12.5f));
    const Cmp::Face half = readBack(Record::of({Record::block(1, one, 20, png)})).front();
    EXPECT_NEAR(half.leftEye().x, 0, 1e-4) << "the eye without a point is in the corner";
    EXPECT_EQ(thrownBy([&] { readBack(Record::of({Record::block(1, {}, 20, png)})); }).substr(0, 14),
              "std::exception");
    for (const unsigned int type : {5u, 255u})
        EXPECT_EQ(thrownBy([&] { readBack(Record::of({Record::block(type, eyes, 20, png)})); }),
                  "FNEBadArg: CBEFF read image with unknown type.");
}

TEST(CBEFF, ImagesOfAnyFormatFollowOneAnother) {
    std::ostringstream jpeg2000;
    Fn::writeJ2k(pattern(24, 16, false), "jpc", jpeg2000);
    const std::vector<std::string> files{jpeg2000.str(), pngFile(50), jpeg2000.str()};
    // The reader of JPEG 2000 takes all that there is; the block's length keeps it from the next image. One
    // that cannot be right is not regarded.
    std::vector<std::string> blocks;
    for (const std::string& file : files) blocks.push_back(Record::block(3, {}, 24, file));
    const auto faces = readBack(Record::of(blocks));
    ASSERT_EQ(faces.size(), 3u);
    EXPECT_EQ(std::next(faces.begin())->image().toBgra32()(0, 0).r, 50);
    EXPECT_EQ(faces.back().image().w(), 24u);
    for (const int error :
         {-static_cast<int>(pngFile().size()), -32 - static_cast<int>(pngFile().size()), 1000})
        EXPECT_EQ(readBack(Record::of({Record::block(3, {}, 24, pngFile(), error)})).size(), 1u) << error;
}

TEST(CBEFF, ARecordThatEndsTooEarlyNamesWhatIsMissing) {
    const std::string png = pngFile();
    const std::string bytes = Record::of({Record::block(1, {{1, 0xC1, 1, 1}, {1, 0xC2, 9, 1}}, 20, png)});
    for (std::size_t size = 0; size < 4 + 16 + 20 + 16 + 12; ++size) {
        const char* const part = size < 4    ? "CBEFFHeader"
                                 : size < 20 ? "CBEFF FacialRecordHeader"
                                 : size < 40 ? "CBEFF FacialInformation"
                                 : size < 56 ? "CBEFF FeaturePoint"
                                             : "CBEFF ImageInformation";
        EXPECT_EQ(thrownBy([&] { readBack(bytes.substr(0, size)); }),
                  std::string("FNEOutOfRange: ") + part + " with wrong size.");
    }
    EXPECT_NE(thrownBy([&] { readBack(bytes.substr(0, 68)); }), "nothing thrown");
    EXPECT_NE(thrownBy([&] { readBack(bytes.substr(0, bytes.size() - 30)); }), "nothing thrown");
}

TEST(CBEFF, TheLimitOfPixelsIsForOneImage) {
    const std::string record = written(std::list<Cmp::Face>(12, faceOf(pattern(64, 48, true))));
    Fn::ImageLimits limits;
    limits.maxPixels = 64 * 48;
    EXPECT_EQ(readBack(record, limits).size(), 12u);
    --limits.maxPixels;
    EXPECT_THROW(readBack(record, limits), FNEBadFormat);
}

TEST(CBEFF, ManyLargeImagesOfFewBytesAreRefused) {
    std::ostringstream file;
    FNImage<unsigned char> blank(400, 300);
    blank.fill(255);
    Fn::writePng(blank, file, 9);
    const std::string block = Record::block(3, {}, 24, file.str());
    Fn::ImageLimits limits;
    limits.maxPixels = blank.size();
    EXPECT_EQ(readBack(Record::of({block}), limits).size(), 1u);
    EXPECT_EQ(thrownBy([&] { readBack(Record::of({block, block}), limits); }).substr(0, 12), "FNEBadFormat");
}

TEST(CBEFF, AStreamThatTakesNothingIsAnError) {
    std::ostringstream stream;
    stream.setstate(std::ios::badbit);
    EXPECT_EQ(thrownBy([&] { Kx::CBEFF::TokenFace::write(stream, {}); }),
              "FNEIOError: CBEFF: error writing CBEFF Header");
    /// Takes so many bytes.
    struct Full : std::stringbuf {
        explicit Full(std::streamsize n) : room(n) {}
        std::streamsize xsputn(const char*, std::streamsize n) override {
            return n > room ? 0 : (room -= n, n);
        }
        std::streamsize room;
    };
    for (const auto& [room, part] : {std::pair{4, "Facial Header"}, std::pair{20, "Facial Information"},
                                     std::pair{40, "ImageInformation"}, std::pair{52, "ImageData"}}) {
        Full full(room);
        std::ostream cut(&full);
        EXPECT_EQ(thrownBy([&] { Kx::CBEFF::TokenFace::write(cut, {faceOf(pattern(9, 9, false))}); }),
                  std::string("FNEIOError: CBEFF: error writing ") + part);
    }
}

} // namespace
