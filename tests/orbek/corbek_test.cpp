#include "drawn_image.h"
#include "orbek/configuration.h"
#include "orbek/corbek.h"
#include "orbek/feature_test.h"
#include "orbek/full_frontal_test.h"
#include "orbek/image_io.h"
#include "orbek/token_face_creator.h"
#include "support/scratch_folder.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <fstream>
#include <limits>
#include <sstream>
#include <thread>

using namespace Orbek;

namespace {

using Bytes = std::vector<unsigned char>;

std::string file(const std::string& path) {
    std::ifstream stream(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(stream), {}};
}

/// A JPEG with eyes.
struct Picture {
    std::string jpeg;
    float x0, y0, x1, y1;

    const char* data() const { return jpeg.data(); }
    unsigned int size() const { return static_cast<unsigned int>(jpeg.size()); }
};

Picture sample(const std::string& name, float x0, float y0, float x1, float y1) {
    return {file(ORBEK_SOURCE_DIR "/examples/images/" + name), x0, y0, x1, y1};
}

std::string jpegOf(const Image& image) {
    std::ostringstream stream;
    Jpeg::save(image, stream, 90);
    return stream.str();
}

/// What a call writes to the standard error stream.
template <class Call> std::string complaintOf(Call call) {
    std::ostringstream text;
    std::streambuf* const before = std::cerr.rdbuf(text.rdbuf());
    call();
    std::cerr.rdbuf(before);
    return text.str();
}

/// Drawn people, as they are installed, before the models of this repository.
class CInterfaceWithModels : public testing::Test {
protected:
    static void SetUpTestSuite() {
        beforeInit_ = complaintOf([] { EXPECT_EQ(orbekCreatePopulation(), nullptr); });
        ASSERT_EQ(orbekInit(ORBEK_BINARY_DIR "/orbek.conf"), 0);
    }

    const Picture alice = sample("alice1.jpg", 114.82f, 187.86f, 196.16f, 183.26f),
                  bob = sample("bob1.jpg", 128.81f, 183.98f, 205.21f, 187.48f);

    static Bytes record(const Picture& p) {
        Bytes fir(1 << 16);
        unsigned int size = 0;
        EXPECT_EQ(orbekGenerateFIR(p.data(), p.size(), p.x0, p.y0, p.x1, p.y1, fir.data(), 1 << 16, &size),
                  0);
        fir.resize(size);
        return fir;
    }

    static inline std::string beforeInit_;
};

unsigned int sizeOf(const Bytes& bytes) {
    return static_cast<unsigned int>(bytes.size());
}

TEST_F(CInterfaceWithModels, InitTellsWhatIsMissing) {
    EXPECT_EQ(beforeInit_, "corbek.dll:orbekCreatePopulation::error -> orbekInit has not been called\n");
    EXPECT_EQ(complaintOf([] { EXPECT_EQ(orbekInit(nullptr), 1); }),
              "orbek.dll:orbekInit::error -> configurationFile is a null pointer\n");
    EXPECT_TRUE(complaintOf([] {
                    EXPECT_EQ(orbekInit("/no/such.conf"), 1);
                }).starts_with("orbek.dll:orbekInit::error -> "));

    const ScratchFolder scratch;
    const std::string empty = scratch.write("orbek.conf", "ORBEK.Substitutions.INSTALLDIR = /nowhere\n");
    EXPECT_NE(complaintOf([&] { EXPECT_EQ(orbekInit(empty.c_str()), 1); }).find("/nowhere/etc/cara"),
              std::string::npos);

    namespace fs = std::filesystem;
    const fs::path models = fs::path(ORBEK_BINARY_DIR) / "etc", copy = scratch.path() / "etc";
    for (const auto& entry : fs::recursive_directory_iterator(models)) {
        const fs::path place = copy / fs::relative(entry.path(), models);
        if (entry.is_directory())
            fs::create_directories(place);
        else
            fs::create_symlink(entry.path(), place);
    }
    const std::string config =
        scratch.write("all.conf", "ORBEK.Substitutions.INSTALLDIR = " + scratch.path().string() + "\n");
    EXPECT_EQ(orbekInit(config.c_str()), 0);
    for (const std::string file :
         {"boca/mouthdisc.dat", "cara/is1717da.dat", "cmp/farmap-b7.dat", "cmp/trans-b7.dat",
          "ojo/eyedisc.dat", "portrait/age-primary.dat", "portrait/age-secondary-2-above.dat",
          "portrait/chinest.dat", "portrait/fpdisc.dat", "portrait/gldisc.dat", "portrait/ludisc.dat",
          "portrait/sphartr.dat", "raiz/bridgedisc.dat"}) {
        fs::rename(copy / file, copy / "away");
        EXPECT_NE(complaintOf([&] { EXPECT_EQ(orbekInit(config.c_str()), 1) << file; }).find(file),
                  std::string::npos)
            << file;
        fs::rename(copy / "away", copy / file);
    }
    EXPECT_EQ(orbekInit(ORBEK_BINARY_DIR "/orbek.conf"), 0);
}

TEST_F(CInterfaceWithModels, RecordsComeIntoABufferOfTheirSize) {
    unsigned int size = 0;
    EXPECT_EQ(orbekGenerateFIR(alice.data(), alice.size(), alice.x0, alice.y0, alice.x1, alice.y1, nullptr, 0,
                               &size),
              3);
    Bytes fir(size + 4, 0xEE);
    const auto generate = [&](int room) {
        unsigned int needed = 0;
        const int code = orbekGenerateFIR(alice.data(), alice.size(), alice.x0, alice.y0, alice.x1, alice.y1,
                                          fir.data(), room, &needed);
        EXPECT_EQ(needed, size);
        return code;
    };
    for (const int room : {static_cast<int>(size) - 1, -1, std::numeric_limits<int>::min()})
        EXPECT_EQ(generate(room), 3);
    EXPECT_EQ(fir, Bytes(size + 4, 0xEE));
    EXPECT_EQ(generate(static_cast<int>(size)), 0);
    EXPECT_EQ(Bytes(fir.begin() + size, fir.end()), Bytes(4, 0xEE));
    fir.resize(size);

    float same = 0, other = 0;
    const Bytes second = record(bob);
    EXPECT_EQ(orbekCompare(fir.data(), size, fir.data(), size, &same), 0);
    EXPECT_EQ(orbekCompare(fir.data(), size, second.data(), sizeOf(second), &other), 0);
    EXPECT_GT(same, other);
    EXPECT_TRUE(complaintOf([&] {
                    EXPECT_EQ(orbekCompare(fir.data(), size - 1, fir.data(), size, &same), 1);
                }).starts_with("corbek.dll:orbekCompare::error -> "));

    const ScratchFolder scratch;
    const std::string demanding =
        scratch.write("orbek.conf", "ORBEK.Substitutions.INSTALLDIR = " ORBEK_BINARY_DIR
                                    "\nORBEK.SetEnroller.MinNumOfSamples = 2\n");
    EXPECT_EQ(orbekInit(demanding.c_str()), 0);
    EXPECT_EQ(orbekGenerateFIR(bob.data(), bob.size(), bob.x0, bob.y0, bob.x1, bob.y1, fir.data(),
                               static_cast<int>(size), &size),
              2);
    EXPECT_EQ(orbekInit(ORBEK_BINARY_DIR "/orbek.conf"), 0);
}

TEST_F(CInterfaceWithModels, EyesOutsideOfThePictureMakeNoRecord) {
    unsigned int size = 0;
    const auto generate = [&](float dx, float dy) {
        return orbekGenerateFIR(alice.data(), alice.size(), alice.x0 + dx, alice.y0 + dy, alice.x1 + dx,
                                alice.y1 + dy, nullptr, 0, &size);
    };
    EXPECT_EQ(generate(20, 20), 3) << "a record without room for it";
    for (const float away : {400.0f, 1e4f, 1e6f, 1e9f})
        for (const float sign : {-1.0f, 1.0f}) {
            EXPECT_EQ(generate(sign * away, 0), 2) << sign * away;
            EXPECT_EQ(generate(0, sign * (away + 200)), 2) << sign * away;
        }
}

TEST_F(CInterfaceWithModels, EyesAreFoundOrLeftAlone) {
    Picture found{alice.jpeg, -1, -2, -3, -4};
    const auto find = [&](const std::string& jpeg) {
        return orbekFindEyes(jpeg.data(), static_cast<unsigned int>(jpeg.size()), &found.x0, &found.y0,
                             &found.x1, &found.y1);
    };
    EXPECT_EQ(find(jpegOf(grayPattern(200, 150))), 1);
    EXPECT_TRUE(complaintOf([&] {
                    EXPECT_EQ(find("no JPEG at all"), 4);
                }).starts_with("orbek.dll:orbekFindEyes::error -> "));
    EXPECT_EQ(found.x0 + found.y0 + found.x1 + found.y1, -10);
    EXPECT_EQ(find(alice.jpeg), 0);
    EXPECT_NEAR(found.x0, alice.x0, 6);
    EXPECT_NEAR(found.y1, alice.y1, 6);
}

TEST_F(CInterfaceWithModels, APopulationIsSearchedUntilItIsDeleted) {
    void* const people = orbekCreatePopulation();
    ASSERT_NE(people, nullptr);
    const Bytes first = record(alice), second = record(bob);
    const std::string longId(200, 'x');
    EXPECT_EQ(orbekAppendToPopulation(people, second.data(), sizeOf(second), "bob"), 0);
    EXPECT_EQ(orbekAppendToPopulation(people, first.data(), sizeOf(first), longId.c_str()), 0);

    orbekMatch matches[3];
    std::memset(matches, 0x55, sizeof matches);
    unsigned int count = 9;
    const auto search = [&](unsigned int most) {
        return orbekBestMatches(first.data(), sizeOf(first), people, 0, most, matches, &count);
    };
    EXPECT_EQ(search(2), 0);
    ASSERT_EQ(count, 2u);
    EXPECT_EQ(matches[0].id, longId.substr(0, 127));
    EXPECT_STREQ(matches[1].id, "bob");
    EXPECT_GT(matches[0].score, matches[1].score);
    EXPECT_EQ(matches[2].id[0], 0x55);
    EXPECT_EQ(search(1), 0);
    EXPECT_EQ(count, 1u);
    EXPECT_EQ(orbekBestMatches(first.data(), sizeOf(first), people, 0, 0, nullptr, &count), 0);
    EXPECT_EQ(count, 0u);

    EXPECT_EQ(orbekRemoveFromPopulation(people, longId.c_str()), 0);
    EXPECT_EQ(orbekRemoveFromPopulation(people, "nobody"), 0);
    EXPECT_EQ(search(3), 0);
    EXPECT_EQ(count, 1u);

    for (int i = 0; i < 2; ++i) EXPECT_EQ(orbekDeletePopulation(people), 0);
    for (void* const handle : {people, static_cast<void*>(&count), static_cast<void*>(nullptr)}) {
        const char* const reason = "::error -> Invalid population pointer\n";
        EXPECT_EQ(complaintOf([&] { EXPECT_EQ(orbekRemoveFromPopulation(handle, "a"), 1); }),
                  std::string("corbek.dll:orbekRemoveFromPopulation") + reason);
        EXPECT_EQ(complaintOf([&] {
                      EXPECT_EQ(orbekAppendToPopulation(handle, first.data(), sizeOf(first), "a"), 1);
                  }),
                  std::string("corbek.dll:orbekAppendToPopulation") + reason);
        count = 9;
        EXPECT_EQ(complaintOf([&] {
                      EXPECT_EQ(orbekBestMatches(first.data(), sizeOf(first), handle, 0, 3, matches, &count),
                                1);
                  }),
                  std::string("corbek.dll:orbekBestMatches") + reason);
        EXPECT_EQ(count, 0u);
    }
}

TEST_F(CInterfaceWithModels, TokenFacesComeIntoABufferOfTheirSize) {
    const auto expectSameAs = [&](auto* plain, auto* sized, const Image& expected) {
        std::ostringstream stream;
        Jpeg::save(expected, stream, 100);
        const std::string jpeg = stream.str();
        const int whole = static_cast<int>(jpeg.size());
        std::string buffer(jpeg.size() + 4, '?');
        unsigned int size = 0;
        const auto extract = [&](int room) {
            return plain(alice.data(), alice.size(), alice.x0, alice.y0, alice.x1, alice.y1, buffer.data(),
                         room);
        };
        EXPECT_EQ(
            sized(alice.data(), alice.size(), alice.x0, alice.y0, alice.x1, alice.y1, nullptr, 0, &size), 3);
        EXPECT_EQ(size, jpeg.size());
        for (const int room : {whole - 1, 0, -5}) EXPECT_EQ(extract(room), 3);
        EXPECT_EQ(buffer, std::string(jpeg.size() + 4, '?'));
        EXPECT_EQ(extract(whole), 0);
        EXPECT_EQ(buffer, jpeg + "????");
    };
    const Configuration configuration(std::string(ORBEK_BINARY_DIR "/orbek.conf"));
    const ISO_19794_5::TokenFace::Creator creator(configuration);
    const std::pair<Image, Eyes::Location> portrait{Jpeg::load(alice.data(), alice.size()),
                                                    {{alice.x0, alice.y0}, {alice.x1, alice.y1}, 0, 0}};
    expectSameAs(&orbekExtractTokenFaceImage, &orbekExtractTokenFaceImageSized,
                 creator.extract(portrait).first);
    expectSameAs(&orbekExtractMinimalTokenFaceImage, &orbekExtractMinimalTokenFaceImageSized,
                 creator.extractMinimal(portrait).first);
}

TEST_F(CInterfaceWithModels, PortraitsAreJudgedAsTheClassesDo) {
    const Configuration configuration(std::string(ORBEK_BINARY_DIR "/orbek.conf"));
    const Portrait::Analyzer analyzer(configuration);
    const std::pair<Image, Eyes::Location> portrait{Jpeg::load(alice.data(), alice.size()),
                                                    {{alice.x0, alice.y0}, {alice.x1, alice.y1}, 0, 0}};
    const auto expected = analyzer.analyze(portrait);
    orbekPortraitResult result{9, -1};
    EXPECT_EQ(orbekAnalyzePortraitExposure(alice.data(), alice.size(), &result, alice.x0, alice.y0, alice.x1,
                                           alice.y1),
              0);
    EXPECT_EQ(result.value, expected.exposure());
    EXPECT_EQ(result.verdict, ISO_19794_5::FullFrontal::Test(configuration).assess(expected).goodExposure());
    EXPECT_EQ(orbekAnalyzePortraitGlasses(alice.data(), alice.size(), &result, alice.x0, alice.y0, alice.x1,
                                          alice.y1),
              0);
    EXPECT_EQ(result.value, expected.glasses());
    EXPECT_EQ(result.verdict, Portrait::Feature::Test(configuration).assess(expected).wearsGlasses());
}

TEST_F(CInterfaceWithModels, BadArgumentsGiveTheCodeOfAFailure) {
    const Bytes fir = record(alice);
    const unsigned int firSize = sizeOf(fir);
    void* const people = orbekCreatePopulation();
    Bytes buffer(1 << 20);
    char* const chars = reinterpret_cast<char*>(buffer.data());
    float number = 0;
    unsigned int count = 0;
    orbekMatch match;
    orbekPortraitResult result;
    EXPECT_EQ(orbekAppendToPopulation(people, fir.data(), firSize, "a"), 0);

    const auto expectComplaint = [](int expected, const char* what, auto call) {
        EXPECT_NE(complaintOf([&] { EXPECT_EQ(call(), expected) << what; }), "") << what;
    };
    const char* const jpeg = alice.data();
    const unsigned int size = alice.size();
    expectComplaint(4, "no picture",
                    [&] { return orbekGenerateFIR(nullptr, 9, 1, 2, 3, 4, buffer.data(), 1 << 20, &count); });
    expectComplaint(4, "an empty picture",
                    [&] { return orbekGenerateFIR(jpeg, 0, 1, 2, 3, 4, buffer.data(), 1 << 20, &count); });
    expectComplaint(4, "nowhere to tell the size", [&] {
        return orbekGenerateFIR(jpeg, size, 110, 180, 190, 180, buffer.data(), 1 << 20, nullptr);
    });
    expectComplaint(4, "a null buffer of some size", [&] {
        return orbekGenerateFIR(jpeg, size, alice.x0, alice.y0, alice.x1, alice.y1, nullptr, 1 << 20, &count);
    });
    expectComplaint(4, "nowhere to put an eye",
                    [&] { return orbekFindEyes(jpeg, size, &number, &number, nullptr, &number); });
    expectComplaint(1, "no record",
                    [&] { return orbekCompare(nullptr, firSize, fir.data(), firSize, &number); });
    expectComplaint(1, "no score",
                    [&] { return orbekCompare(fir.data(), firSize, fir.data(), firSize, nullptr); });
    expectComplaint(1, "no id",
                    [&] { return orbekAppendToPopulation(people, fir.data(), firSize, nullptr); });
    expectComplaint(1, "no id", [&] { return orbekRemoveFromPopulation(people, nullptr); });
    expectComplaint(1, "no matches",
                    [&] { return orbekBestMatches(fir.data(), firSize, people, 0, 1, nullptr, &count); });
    expectComplaint(1, "no count",
                    [&] { return orbekBestMatches(fir.data(), firSize, people, 0, 1, &match, nullptr); });
    expectComplaint(1, "no result", [&] {
        return orbekAnalyzePortraitExposure(jpeg, size, nullptr, alice.x0, alice.y0, alice.x1, alice.y1);
    });
    expectComplaint(1, "no picture",
                    [&] { return orbekAnalyzePortraitGlasses(nullptr, 5, &result, 1, 2, 3, 4); });
    expectComplaint(1, "no buffer", [&] {
        return orbekExtractTokenFaceImage(jpeg, size, alice.x0, alice.y0, alice.x1, alice.y1, nullptr,
                                          1 << 20);
    });

    const float infinity = std::numeric_limits<float>::infinity();
    for (const float bad : {std::nanf(""), infinity, -infinity, std::numeric_limits<float>::max()}) {
        complaintOf([&] {
            EXPECT_EQ(orbekBestMatches(fir.data(), firSize, people, bad, 1, &match, &count), std::isnan(bad));
            const int code = orbekGenerateFIR(jpeg, size, bad, 187, 196, 183, buffer.data(), 1 << 20, &count);
            EXPECT_TRUE(code == 2 || code == 4) << code << " for " << bad;
            for (auto* analyze : {&orbekAnalyzePortraitExposure, &orbekAnalyzePortraitGlasses})
                EXPECT_EQ(analyze(jpeg, size, &result, 114, 187, 196, bad), 1) << bad;
        });
        for (auto* extract : {&orbekExtractTokenFaceImage, &orbekExtractMinimalTokenFaceImage})
            expectComplaint(1, "eyes nowhere",
                            [&] { return extract(jpeg, size, 1, bad, 3, 4, chars, 1 << 20); });
    }
    EXPECT_EQ(orbekDeletePopulation(people), 0);
}

TEST_F(CInterfaceWithModels, EveryFunctionMayBeCalledBesideEveryOther) {
    const auto results = [&] {
        std::ostringstream text;
        float x0 = 0, y0 = 0, x1 = 0, y1 = 0, score = 0;
        text << orbekFindEyes(alice.data(), alice.size(), &x0, &y0, &x1, &y1) << " " << x0 << " " << y1
             << " ";
        const Bytes fir = record(alice), other = record(bob);
        text << orbekCompare(fir.data(), sizeOf(fir), other.data(), sizeOf(other), &score) << " " << score
             << " ";
        void* const people = orbekCreatePopulation();
        text << orbekAppendToPopulation(people, fir.data(), sizeOf(fir), "a")
             << orbekAppendToPopulation(people, other.data(), sizeOf(other), "b") << " ";
        orbekMatch matches[2];
        unsigned int count = 0, size = 0;
        text << orbekBestMatches(fir.data(), sizeOf(fir), people, 0, 2, matches, &count) << count
             << matches[1].id << matches[1].score << " " << orbekRemoveFromPopulation(people, "a");
        text << orbekDeletePopulation(people) << " ";
        orbekPortraitResult exposure, glasses;
        text << orbekAnalyzePortraitExposure(alice.data(), alice.size(), &exposure, x0, y0, x1, y1)
             << orbekAnalyzePortraitGlasses(alice.data(), alice.size(), &glasses, x0, y0, x1, y1)
             << exposure.value << " " << glasses.value << " ";
        std::string token(1 << 18, '\0');
        text << orbekExtractTokenFaceImageSized(alice.data(), alice.size(), x0, y0, x1, y1, token.data(),
                                                1 << 18, &size)
             << size
             << orbekExtractMinimalTokenFaceImage(alice.data(), alice.size(), x0, y0, x1, y1, token.data(),
                                                  1 << 18);
        return text.str();
    };
    // The first calls of all, so that the engines that are made at first use are made by any of them.
    ASSERT_EQ(orbekInit(ORBEK_BINARY_DIR "/orbek.conf"), 0);
    std::vector<std::string> texts(8);
    std::vector<std::thread> threads;
    for (std::string& text : texts) threads.emplace_back([&] { text = results(); });
    for (std::thread& thread : threads) thread.join();
    for (const std::string& text : texts) EXPECT_EQ(text, results());
}

} // namespace
