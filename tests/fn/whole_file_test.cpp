#include "fn/whole_file.h"

#include "fn/imagefile/bmp.h"
#include "fn/imagefile/image_file.h"
#include "fn/imagefile/j2k.h"
#include "fn/imagefile/jpeg.h"
#include "fn/imagefile/pbm.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <csignal>
#include <ostream>

#include <sys/resource.h>
#include <sys/stat.h>

namespace {

namespace fs = std::filesystem;

std::ptrdiff_t filesIn(const ScratchFolder& folder) {
    return std::distance(fs::directory_iterator(folder.path()), fs::directory_iterator());
}

void writeText(const std::string& file, const std::string& text) {
    Fn::writeWholeFile(file, [&](std::ostream& stream) { stream << text; });
}

TEST(WholeFile, ReplacesAFileAndKeepsItsPermissionsAndLinks) {
    const ScratchFolder scratch;
    const std::string file = scratch.file("a");
    const mode_t mask = umask(027);
    writeText(file, "first");
    umask(mask);
    EXPECT_EQ(fs::status(file).permissions(), static_cast<fs::perms>(0640));
    fs::permissions(file, static_cast<fs::perms>(0604));
    fs::create_directory(scratch.path() / "links");
    fs::create_symlink("../a", scratch.path() / "links/b");
    fs::create_symlink("links/b", scratch.path() / "c");
    writeText(scratch.file("c"), "second");
    EXPECT_EQ(scratch.read("a"), "second");
    EXPECT_EQ(fs::status(file).permissions(), static_cast<fs::perms>(0604));
    EXPECT_TRUE(fs::is_symlink(scratch.path() / "c"));
    EXPECT_TRUE(fs::is_symlink(scratch.path() / "links/b"));
    writeText("/dev/null", "written to, not replaced");
    EXPECT_TRUE(fs::is_character_file("/dev/null"));
    EXPECT_EQ(filesIn(scratch), 3);
}

TEST(WholeFile, LeavesTheOldContentAndNothingElseWhenWritingFails) {
    const ScratchFolder scratch;
    const std::string file = scratch.write("a", "old");
    EXPECT_EQ(thrownBy([&] {
                  Fn::writeWholeFile(file, [](std::ostream& stream) {
                      stream << "half";
                      FN_THROW(FNEBadArg, "no image");
                  });
              }),
              "FNEBadArg: no image");
    EXPECT_EQ(scratch.read("a"), "old");

    // A limit on the size of files stands for a full disk.
    rlimit before{};
    getrlimit(RLIMIT_FSIZE, &before);
    const auto handler = std::signal(SIGXFSZ, SIG_IGN);
    const rlimit small{4096, before.rlim_max};
    setrlimit(RLIMIT_FSIZE, &small);
    const std::string full = thrownBy([&] { writeText(file, std::string(100000, 'x')); });
    setrlimit(RLIMIT_FSIZE, &before);
    std::signal(SIGXFSZ, handler);
    EXPECT_EQ(full, "FNEIOError: " + file + ": cannot be written: File too large");
    EXPECT_EQ(thrownBy([&] { writeText("/dev/full", "x"); }),
              "FNEIOError: /dev/full: cannot be written: No space left on device");
    EXPECT_EQ(thrownBy([&] { writeText(scratch.file("none/a"), "x"); }),
              "FNEIOError: " + scratch.file("none/a") + ": cannot be written: No such file or directory");
    EXPECT_EQ(thrownBy([&] { writeText(scratch.path().string(), "x"); }),
              "FNEIOError: " + scratch.path().string() + ": cannot be written: Is a directory");
    EXPECT_EQ(scratch.read("a"), "old");
    EXPECT_EQ(filesIn(scratch), 1);
}

TEST(WholeFile, HoldsForEveryImageThatIsSavedByName) {
    const ScratchFolder scratch;
    FNImage<unsigned char> noise(200, 200);
    for (FNImIter<unsigned char> it(noise, noise.box()); !it.atEnd(); ++it)
        *it = static_cast<unsigned char>(it.x() * it.y() * 7 + it.x());
    const FNImageReference image = FNImageReferenceFactory::create(noise);
    const std::string file = scratch.write("a", "old");
    const std::function<void()> saves[] = {
        [&] { Fn::saveBMP(image, file); },
        [&] { Fn::saveJpeg(image, file, FNImageCompressor::BEST_QUALITY); },
        [&] { Fn::writeImage(image, file, FNImageCompressor::LOSSLESS); },
        [&] { Fn::writeImage(image, file, FNImageCompressor::LOW_QUALITY); },
        [&] { Fn::writePbm(image, file, image.box()); },
        [&] { Fn::writeJ2k(image, "jp2", file); },
    };
    const auto handler = std::signal(SIGXFSZ, SIG_IGN);
    rlimit before{};
    getrlimit(RLIMIT_FSIZE, &before);
    for (const auto& save : saves) {
        const rlimit small{1000, before.rlim_max};
        setrlimit(RLIMIT_FSIZE, &small);
        const std::string failure = thrownBy(save);
        setrlimit(RLIMIT_FSIZE, &before);
        EXPECT_EQ(failure, "FNEIOError: " + file + ": cannot be written: File too large");
        EXPECT_EQ(scratch.read("a"), "old");
    }
    std::signal(SIGXFSZ, handler);
    EXPECT_EQ(filesIn(scratch), 1);
}

} // namespace
