#include "model_build.h"
#include "model_files.h"
#include "model_sums.h"

#include "support/thrown_text.h"

#include <gtest/gtest.h>

#include <fstream>
#include <set>
#include <sstream>

#include <unistd.h>
#include <zlib.h>

namespace {

namespace fs = std::filesystem;
using namespace Orbek::Models;

// Of "trained\n" and of nothing, by sha256sum.
const std::string sumOfText = "d8d882672ffcd6531e030e686eafb85733889641a0fc99e9198fcb606d5994a2";
const std::string sumOfNothing = "e3b0c44298fc1c149afbf4c8996fb92427ae41e4649b934ca495991b7852b855";

class ModelBuild : public testing::Test {
protected:
    ModelBuild() : root_(fs::temp_directory_path() / ("orbek_models_" + std::to_string(getpid()))) {
        fs::create_directories(models() / "cara");
    }
    ~ModelBuild() override { fs::remove_all(root_); }

    fs::path models() const { return root_ / "models"; }
    fs::path etc() const { return root_ / "etc"; }
    void write(const std::string& path, const std::string& bytes) { std::ofstream(models() / path) << bytes; }
    void writeGz(const std::string& path, const std::string& bytes) {
        const gzFile file = gzopen((models() / path).c_str(), "wb");
        gzwrite(file, bytes.data(), static_cast<unsigned>(bytes.size()));
        gzclose(file);
    }
    std::size_t run() {
        std::ostringstream log;
        return build(models(), etc(), log);
    }
    template <class E> std::string failure() {
        return thrownText<E>([&] { run(); });
    }
    std::string built(const std::string& path) const {
        std::ifstream stream(etc() / path, std::ios::binary);
        return {std::istreambuf_iterator<char>(stream), {}};
    }

    fs::path root_;
};

TEST_F(ModelBuild, UnpacksWhatTheListHasSumsOf) {
    writeGz("cara/a.dat.gz", "trained\n");
    write("cara/empty.dat", "");
    write("CARD.md", "about");
    write("SHA256SUMS", sumOfText + "  cara/a.dat\n" + sumOfNothing + "  cara/empty.dat\n");
    EXPECT_EQ(run(), 2u);
    EXPECT_EQ(built("cara/a.dat"), "trained\n");
    EXPECT_TRUE(fs::exists(etc() / "cara/empty.dat"));
    EXPECT_EQ(std::distance(fs::directory_iterator(etc()), {}), 1);
    EXPECT_EQ(run(), 2u); // and again over what is there
}

TEST_F(ModelBuild, NamesTheSourceOfAFileWithAnotherSum) {
    writeGz("cara/a.dat.gz", "trained\n");
    write("SHA256SUMS", sumOfNothing + "  cara/a.dat\n");
    EXPECT_EQ(failure<FNEBadFormat>(), (models() / "cara/a.dat.gz").string() +
                                           ": unpacks to a file with the SHA-256 " + sumOfText +
                                           " instead of " + sumOfNothing);
    EXPECT_FALSE(fs::exists(etc() / "cara/a.dat"));
    EXPECT_TRUE(fs::is_empty(etc() / "cara"));
}

TEST_F(ModelBuild, NamesWhatIsMissing) {
    EXPECT_EQ(failure<FNEIOError>(), (models() / "SHA256SUMS").string() + ": cannot be opened for reading");
    write("SHA256SUMS", sumOfText + "  cara/a.dat\n");
    EXPECT_EQ(failure<FNEBadFormat>(), (models() / "SHA256SUMS").string() +
                                           ": there is no source of cara/a.dat below " + models().string());
    write("cara/b.dat", "x");
    EXPECT_EQ(failure<FNEBadFormat>(), (models() / "cara/b.dat").string() + ": cara/b.dat has no sum in " +
                                           (models() / "SHA256SUMS").string());
    write("SHA256SUMS", "12  cara/a.dat\n");
    EXPECT_EQ(failure<FNEBadFormat>(),
              (models() / "SHA256SUMS").string() + ": not a sum and a path: 12  cara/a.dat");
}

TEST_F(ModelBuild, NamesADamagedSource) {
    writeGz("cara/a.dat.gz", std::string(100000, 'x') + "trained");
    write("SHA256SUMS", sumOfText + "  cara/a.dat\n");
    fs::resize_file(models() / "cara/a.dat.gz", fs::file_size(models() / "cara/a.dat.gz") - 12);
    EXPECT_EQ(failure<FNEIOError>().rfind((models() / "cara/a.dat.gz").string() + ": damaged: ", 0), 0u);
}

TEST(ModelFiles, AreOnePlaceEach) {
    std::set<std::string> paths;
    for (const ModelFile& model : modelFiles())
        EXPECT_TRUE(paths.insert(model.path()).second) << model.path();
    EXPECT_EQ(paths.count("portrait/age-secondary-2-85.dat"), 1u);
    EXPECT_EQ(paths.size(), 86u);
}

TEST(ModelFiles, AreNamedByTheirReadersWhenTheyAreMissingOrDamaged) {
    const fs::path directory = fs::temp_directory_path() / ("orbek_readers_" + std::to_string(getpid()));
    fs::create_directories(directory);
    for (const ModelFile& model : modelFiles()) {
        if (!model.open) continue;
        const std::string path = (directory / model.name).string();
        const std::string missing = thrownBy([&] { model.open(directory.string(), model.name); });
        EXPECT_NE(missing.find(path), std::string::npos) << missing;
        std::ofstream(path) << "not a model";
        EXPECT_NE(thrownBy([&] { model.open(directory.string(), model.name); }).find(path), std::string::npos)
            << path;
    }
    fs::remove_all(directory);
}

} // namespace
