// Damaged and hostile files.

#include "fn/imagefile/gunzip.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/jpegls.h"
#include "support/recorded_dialog.h"
#include "support/thrown.h"
#include "workshop.h"

#include <gtest/gtest.h>

#include <sys/resource.h>

namespace {

/// Through the reader that accepts the file: readImage() does not look for JPEG-LS, and for gzip only in
/// files.
FNImageReference readFixture(const std::filesystem::path& path, const std::string& bytes,
                             const Fn::ImageLimits& limits = {}) {
    if (path.extension() == ".jls") return Fn::readJpegLS(bytes.data(), bytes.size(), {}, limits);
    if (path.extension() != ".gz") return Fn::readImage(bytes.data(), bytes.size(), {}, limits);
    const Workshop workshop;
    workshop.write("a.gz", bytes);
    return Fn::readImage(workshop.path("a.gz"), {}, limits);
}

TEST(HostileFiles, EveryTruncatedFixtureDecodesOrThrows) {
    const RecordedDialog dialog; // truncated JPEG files give warnings
    for (const Fn::ImageLimits& limits : {Fn::ImageLimits(), Fn::ImageLimits::withRareVariants()})
        for (const auto& path : fixtures()) {
            const std::string whole = bytesOfFile(path);
            int decoded = 0;
            for (std::size_t size = 0; size < whole.size(); ++size) {
                try {
                    decoded += readFixture(path, whole.substr(0, size), limits).w() != 0;
                } catch (const FNException&) {
                }
            }
            // Without its last byte, only JPEG and what has no end mark can still be an image.
            EXPECT_LT(decoded, static_cast<int>(whole.size())) << path;
            if (isRefused(path, limits)) {
                EXPECT_THROW(readFixture(path, whole, limits), FNException) << path;
            } else {
                EXPECT_NO_THROW(readFixture(path, whole, limits)) << path;
            }
        }
}

TEST(HostileFiles, NewLimitsAreTheDefaultsOfTheProcess) {
    const Fn::ImageLimits before;
    EXPECT_EQ(before.maxWidth, 65535u);
    EXPECT_EQ(before.maxHeight, 65535u);
    EXPECT_EQ(before.maxPixels, 134217728u);
    EXPECT_EQ(before.maxBytes, 1073741824u);
    const std::string row = "P5 70000 1 255\n" + std::string(70000, 'x');
    EXPECT_EQ(thrownBy([&] { Fn::readImage(row.data(), row.size()); }),
              "FNEBadFormat: Fn::readPbm: image of 70000 x 1 pixels exceeds the limit of 65535 columns");
    Fn::ImageLimits wide = Fn::ImageLimits::withRareVariants();
    wide.maxWidth = 70000;
    Fn::ImageLimits::setDefaults(wide);
    EXPECT_EQ(Fn::readImage(row.data(), row.size()).w(), 70000u);
    EXPECT_FALSE(Fn::ImageLimits().rareVariants) << "is asked for where it is wanted";
    Fn::ImageLimits::setDefaults(before);
}

TEST(HostileFiles, LimitsHoldForEveryFormat) {
    for (const auto& path : fixtures()) {
        Fn::ImageLimits exact = Fn::ImageLimits::withRareVariants();
        if (isRefused(path, exact)) continue;
        const std::string bytes = bytesOfFile(path);
        const FNImageReference image = readFixture(path, bytes, exact);
        exact.maxWidth = image.w();
        exact.maxHeight = image.h();
        exact.maxPixels = std::uint64_t{image.w()} * image.h();
        EXPECT_NO_THROW(readFixture(path, bytes, exact)) << path;
        Fn::ImageLimits none = exact;
        none.maxWidth = none.maxHeight = 0x7FFFFFFF;
        none.maxPixels = none.maxBytes = ~std::uint64_t{0};
        EXPECT_NO_THROW(readFixture(path, bytes, none)) << path;
        Fn::ImageLimits narrow = exact, low = exact, few = exact, small = exact;
        --narrow.maxWidth;
        --low.maxHeight;
        --few.maxPixels;
        small.maxBytes = exact.maxPixels - 1;
        for (const Fn::ImageLimits& limits : {narrow, low, few, small})
            EXPECT_THROW(readFixture(path, bytes, limits), FNERuntime) << path;
    }
}

std::string big(std::uint32_t v, int bytes) {
    std::string text;
    while (bytes-- > 0) text += static_cast<char>(v >> 8 * bytes);
    return text;
}
std::string little(std::uint32_t v, int bytes) {
    const std::string text = big(v, bytes);
    return {text.rbegin(), text.rend()};
}

/// Replaces what stands at the first occurrence of `mark`, `offset` bytes behind its start.
std::string patched(std::string bytes, const std::string& mark, std::size_t offset, const std::string& with) {
    const std::size_t at = bytes.find(mark);
    if (at == std::string::npos) throw std::runtime_error("no mark");
    return bytes.replace(at + offset, with.size(), with);
}

TEST(HostileFiles, HugeAnnouncementsCostNoMemory) {
    const auto load = [](const char* name) { return bytesOfFile(fixture(name)); };
    const std::string widest = big(60000, 4) + big(60000, 4), widestShort = big(60000, 2) + big(60000, 2);
    const std::vector<std::pair<const char*, std::string>> files{
        {"sequential JPEG", patched(load("jpeg/color_420_restart.jpg"), "\xFF\xC0", 5, widestShort)},
        {"progressive JPEG", patched(load("jpeg/gray_progressive.jpg"), "\xFF\xC2", 5, widestShort)},
        {"BMP", patched(load("bmp/rgb24_topdown.bmp"), "BM", 18, little(60000, 4) + little(60000, 4))},
        {"BMP colour table", patched(load("bmp/palette4.bmp"), "BM", 46, little(0xFFFFFFFF, 4))},
        {"BMP of least height", patched(load("bmp/rgb24_topdown.bmp"), "BM", 22, little(0x80000000, 4))},
        {"PGM", "P5 60000 60000 255\n"},
        {"PPM in one row", "P6 4294967295 1 65535\n"},
        {"JPEG 2000", patched(load("j2k/gray16.j2k"), "\xFF\x51", 6, widest)},
        {"JPEG 2000 of tiny tiles",
         patched(load("j2k/gray16.j2k"), "\xFF\x51", 6,
                 big(8192, 4) + big(8192, 4) + big(0, 4) + big(0, 4) + big(1, 4) + big(1, 4))},
        {"JPEG-LS", patched(load("jpegls/t87_h3.jls"), "\xFF\xF7", 5, widestShort)},
        {"PNG", patched(load("png/gray1.png"), "IHDR", 4, widest)},
        {"PNG text", load("png/gray1.png").substr(0, 33) + big(1u << 30, 4) + "tEXt" + "key"},
        {"PNG of unknown chunks", load("png/gray1.png").substr(0, 33) + big(1u << 30, 4) + "abCd" + "key"},
    };
    rusage before{}, after{};
    getrusage(RUSAGE_SELF, &before);
    for (const auto& [name, bytes] : files) {
        const std::filesystem::path kind = std::string(name) == "JPEG-LS" ? "a.jls" : "a.bin";
        EXPECT_THROW(readFixture(kind, bytes), FNException) << name;
    }
    getrusage(RUSAGE_SELF, &after);
    EXPECT_LT(after.ru_maxrss - before.ru_maxrss, 64 * 1024) << "KB";
}

TEST(HostileFiles, AManyScanJpegIsCutShort) {
    // A progressive file whose last scan is repeated: each one makes the decoder pass over the whole image.
    const std::string file = bytesOfFile(fixture("jpeg/gray_progressive.jpg"));
    const std::size_t lastScan = file.rfind("\xFF\xDA");
    const std::string scan = file.substr(lastScan, file.size() - 2 - lastScan);
    std::string many = file.substr(0, lastScan);
    for (int i = 0; i < 600; ++i) many += scan;
    many += "\xFF\xD9";
    const RecordedDialog dialog;
    EXPECT_EQ(thrownBy([&] { Fn::readImage(many.data(), many.size()); }).substr(0, 40),
              "FNEBadArg: jpeg lib error:Too many scans");
}

TEST(HostileFiles, AGzipFileCostsTheMemoryOfItsPicture) {
    if (!Workshop::has("gzip")) GTEST_SKIP() << "gzip is not installed";
    const Workshop workshop;
    workshop.write("a.pgm", "P5 1 1 255\nx");
    workshop.run("{ cat a.pgm; head -c 200000000 /dev/zero; } | gzip -1 > a.gz");
    rusage before{}, after{};
    getrusage(RUSAGE_SELF, &before);
    EXPECT_EQ(Fn::readImage(workshop.path("a.gz")).toMono8()(0, 0), 'x');
    getrusage(RUSAGE_SELF, &after);
    EXPECT_LT(after.ru_maxrss - before.ru_maxrss, 32 * 1024) << "KB";

    // One that is held as a whole is held in proportion to the file.
    workshop.write("a.tif", "II*");
    workshop.run("{ cat a.tif; head -c 200000000 /dev/zero; } | gzip -9 > tiff.gz");
    EXPECT_EQ(thrownBy([&] { Fn::readImage(workshop.path("tiff.gz")); }),
              "FNEBadFormat: gunzip: " + workshop.path("tiff.gz") + " exceeds the limit of " +
                  std::to_string((1u << 26) + 64 * std::filesystem::file_size(workshop.path("tiff.gz"))) +
                  " bytes for decoding");

    // What is wrong with the gzip file tells more than what a reader makes of it.
    const std::string whole = bytesOfFile(fixture("gzip/gray1.png.gz"));
    workshop.write("cut.gz", whole.substr(0, whole.size() - 40));
    EXPECT_EQ(thrownBy([&] { Fn::readImage(workshop.path("cut.gz")); }),
              "FNEIOError: gunzip: error in gzread() with " + workshop.path("cut.gz"));
    Fn::ImageLimits few;
    few.maxBytes = 10;
    EXPECT_EQ(thrownBy([&] { Fn::readImage(fixture("gzip/gray1.png.gz"), {}, few); }),
              "FNEBadFormat: gunzip: " + fixture("gzip/gray1.png.gz") +
                  " exceeds the limit of 10 bytes for decoding");
}

TEST(HostileFiles, AGzipBombStopsAtTheLimit) {
    if (!Workshop::has("gzip")) GTEST_SKIP() << "gzip is not installed";
    const Workshop workshop;
    workshop.run("head -c 30000000 /dev/zero | gzip -9 > a.gz");
    Fn::ImageLimits limits;
    limits.maxBytes = 1 << 20;
    EXPECT_THROW(Fn::gunzip(workshop.path("a.gz"), limits), FNEBadFormat);
    EXPECT_EQ(Fn::gunzip(workshop.path("a.gz")).size(), 30000000u);
}

} // namespace
