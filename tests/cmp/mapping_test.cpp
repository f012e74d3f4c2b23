#include "cmp/mapping_files.h"

#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

namespace {

using namespace Cmp::Implementation;
using Cmp::Score;
using Table = Fn::InvertibleFunction<float, float>;
using Floats = std::vector<float>;

Table table(const Floats& values, float xMin, float xMax) {
    return {FNVector<float>(values), xMin, xMax};
}

TEST(InvertibleFunction, InterpolatesAndKeepsItsEnds) {
    const Table f = table({1, 2, 6}, -1, 1);
    for (const auto& [x, y] : std::vector<std::pair<float, float>>{
             {-9, 1}, {-1, 1}, {-0.5f, 1.5f}, {0, 2}, {0.25f, 3}, {1, 6}, {9, 6}})
        EXPECT_EQ(f(x), y) << x;
    // 1000 intervals of 0.1: a sample that lies on a place is given as it is, not interpolated to.
    Floats squares(1001);
    for (std::size_t i = 0; i < squares.size(); ++i) squares[i] = std::sqrt(static_cast<float>(i));
    const Table roots = table(squares, 0, 1000);
    EXPECT_EQ(roots(777), std::sqrt(777.0f));
}

TEST(InvertibleFunction, InverseTakesTheFirstPlaceInTableOrder) {
    struct Case {
        Floats values;
        float y, x;
    };
    for (const Case& c : std::vector<Case>{{{0, 1, 1, 1, 2}, 1, 1},
                                           {{0, 1, 1, 1, 2}, 0.5f, 0.5f},
                                           {{0, 1, 1, 1, 2}, 1.5f, 3.5f},
                                           {{0, 1, 1, 1, 2}, -1, 0},
                                           {{0, 1, 1, 1, 2}, 2, 4},
                                           {{2, 1, 1, 1, 0}, 1, 1},
                                           {{2, 1, 1, 1, 0}, 0.5f, 3.5f},
                                           {{2, 1, 1, 1, 0}, 2, 0},
                                           {{2, 1, 1, 1, 0}, 3, 0},
                                           {{2, 1, 1, 1, 0}, -1, 4}})
        EXPECT_EQ(table(c.values, 0, 4).applyInverse(c.y), c.x) << c.y;
    // A table that goes back and forth is no function to invert, but it must not lead out of the table.
    const float x = table({0, 9, 1, 8, 2, 10}, 0, 5).applyInverse(5);
    EXPECT_TRUE(x >= 0 && x <= 5);
}

TEST(InvertibleFunction, ReadsAllFormsOfItsFile) {
    const auto text = [](const char* form) { return Fn::serialize<std::string>(form); };
    const auto floats = [](const Floats& v) { return Fn::serialize(FNVector<float>(v)); };
    const auto list = [](const std::list<Fn::Package>& elements) { return Fn::Package(elements); };
    const Fn::Package values = floats({3, 5}), places = floats({4, 9, 2}), none;
    const Table old(list({text("INVFUNC30"), values, places}));
    const Table older(list({text("INVFUNC20"), values, none, Fn::Package(7), places}));
    for (const Table& f : {old, older, Table(Fn::serialize(old))}) {
        EXPECT_EQ(f.xMin(), 2) << "the places descend";
        EXPECT_EQ(f.xMax(), 4);
        EXPECT_EQ(f(3), 4);
    }
    const float nan = std::nanf(""), big = std::numeric_limits<float>::max();
    const std::string few = "FNEBadArg: InvertibleFunction: Not enough values!";
    const std::string format = "FNEIOError: InvertibleFunction: Wrong data format!";
    const auto current = [&](const Floats& v, float a, float b) {
        return list({text("INVFUNC40"), floats(v), Fn::serialize(a), Fn::serialize(b)});
    };
    const std::vector<std::pair<Fn::Package, std::string>> refused = {
        {current({1}, 0, 1), few},
        {current({}, 0, 1), few},
        {list({text("INVFUNC30"), values, floats({})}), few},
        {current({1, nan}, 0, 1), format},
        {current({1, 2}, nan, 1), format},
        {current({1, 2}, -big, big), format},
        {list({text("INVFUNC50"), values, places}), format},
        {list({text("INVFUNC40"), values}), "FNEBadArg: "},
        {Fn::Package(3.0f), "FNEBadArg: "},
    };
    for (const auto& [package, message] : refused)
        EXPECT_EQ(thrownBy([&p = package] { Table f(p); }).substr(0, message.size()), message);
    EXPECT_EQ(table({1, 2}, 3, 3)(3), 1) << "a range without width";
}

TEST(ScoreMapping, ScoresAreClampedExceptByTheIdentity) {
    EXPECT_EQ(Score(1.5f).value(), 1);
    EXPECT_EQ(Score(-0.1f).value(), 0);
    EXPECT_TRUE(std::isnan(Score(std::nanf("")).value()));
    EXPECT_EQ(IdentityScoreMapping().convert(3.5f).value(), 3.5f);
    const SMap map(table({-1, 3}, 100, 500));
    EXPECT_EQ(map.convert(100.0f).value(), 0);
    EXPECT_EQ(map.convert(500.0f).value(), 1);
    EXPECT_EQ(map.convert(Score(1)), 300);
}

TEST(MappingFiles, AreReadOnceOrMissing) {
    const ScratchFolder scratch;
    const MappingFiles::Paths paths{scratch.file("s.dat"), scratch.file("far.dat"), scratch.file("frr.dat")};
    const MappingFiles files(paths);
    EXPECT_EQ(thrownBy([&] { files.scoreMapping(); }),
              "FNEBadArg: CmpAlgorithm: File `" + paths.similarity + "' could not be opened for reading.");
    writeMappingFile(table({0, 1}, -10, 10), paths.similarity);
    writeMappingFile(table({1, 0.1f, 0}, 0, 1), paths.far);
    writeMappingFile(table({0, 1}, 0, 1), paths.frr);
    const auto rates = files.ratesMapping();
    EXPECT_EQ(rates->requestFAR(1).value(), 0);
    EXPECT_EQ(rates->requestFAR(0.1f).value(), 0.5f);
    EXPECT_EQ(rates->requestFRR(0.25f).value(), 0.25f);
    EXPECT_NEAR(rates->expectedFAR(Score(0.75f)), 0.05f, 1e-7);
    EXPECT_EQ(files.scoreMapping()->convert(0.0f).value(), 0.5f);
    std::filesystem::remove(paths.similarity);
    EXPECT_TRUE(files.scoreMapping() == files.scoreMapping());

    EXPECT_EQ(MappingFiles(MappingFiles::Paths{"", paths.far, ""}).scoreMapping()->convert(3.5f).value(),
              3.5f);
    EXPECT_EQ(thrownBy([&] {
                  MappingFiles(MappingFiles::Paths{"", paths.far, ""}).ratesMapping();
              }),
              "FNEBadArg: Requesting Rates Mapping w/o mapping files");
    const std::string cut = scratch.write("cut.dat", scratch.read("far.dat").substr(0, 40));
    const std::string thrown = thrownBy([&] { readMappingFile(cut, "PCLD"); });
    EXPECT_EQ(thrown.substr(0, 12), "FNEIOError: ");
    EXPECT_NE(thrown.find(cut), std::string::npos) << thrown;
}

} // namespace
