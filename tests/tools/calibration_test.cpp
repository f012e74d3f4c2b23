#include "train/calibration.h"

#include "cmp/mapping_files.h"
#include "support/scratch_folder.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <cmath>
#include <numbers>
#include <random>

namespace {

using namespace Train;

std::vector<float> normal(std::size_t n, double mean, double deviation, unsigned seed) {
    std::mt19937 random(seed);
    std::vector<float> values(n);
    const auto uniform = [&] { return (static_cast<double>(random()) + 0.5) / 4294967296.0; };
    for (float& v : values) { // by Box and Muller
        const double length = std::sqrt(-2 * std::log(uniform()));
        v = static_cast<float>(mean + deviation * length * std::cos(2 * std::numbers::pi * uniform()));
    }
    return values;
}

ComparisonScores overlapping() {
    return {normal(3000, 4, 1, 1), normal(60000, 0, 1, 2)};
}

double above(double z) {
    return 0.5 * std::erfc(z / std::sqrt(2.0));
}

TEST(Calibration, RatesAreThoseOfTheScores) {
    const Calibration calibration(overlapping());
    const auto scores = calibration.scoreTable(), far = calibration.farTable(), frr = calibration.frrTable();
    for (const float raw : {0.0f, 1.0f, 2.0f, 3.0f}) { // within the data; counts are known to about 1/sqrt(n)
        EXPECT_NEAR(far(scores(raw)) / above(raw), 1, 0.15) << raw;
        if (raw >= 2) {
            EXPECT_NEAR(frr(scores(raw)) / above(4.0 - raw), 1, 0.15) << raw;
        }
    }
    EXPECT_NEAR(far(0.5f), 0.001, 1e-5);
    // A thousandth of the pairs: what a user asks for by its rate is what the counts say.
    ComparisonScores fresh{normal(3000, 4, 1, 11), normal(100000, 0, 1, 12)};
    const float threshold = scores.applyInverse(far.applyInverse(0.001f));
    const auto accepted = std::ranges::count_if(fresh.impostor, [&](float v) { return v > threshold; });
    EXPECT_NEAR(static_cast<double>(accepted), 100, 50);
}

TEST(Calibration, TablesAreStrictlyMonotonicAlsoBeyondTheScores) {
    ComparisonScores apart{normal(30, 50, 1, 3), normal(40, 0, 1, 4)};
    ComparisonScores coarse = overlapping(); // many equal scores
    for (auto* kind : {&coarse.genuine, &coarse.impostor})
        for (float& v : *kind) v = std::round(v * 4) / 4;
    ComparisonScores outlier = overlapping();
    outlier.genuine.push_back(-300);
    for (const ComparisonScores& scores : {overlapping(), apart, coarse, outlier}) {
        const Calibration calibration(scores);
        for (const auto& [table, sign] : {std::pair{calibration.scoreTable(), 1},
                                          {calibration.farTable(), -1},
                                          {calibration.frrTable(), 1}}) {
            const auto values = table.values().span();
            EXPECT_EQ(std::min(values.front(), values.back()), 0);
            EXPECT_EQ(std::max(values.front(), values.back()), 1);
            int falls = 0;
            for (std::size_t i = 1; i < values.size(); ++i)
                falls += static_cast<float>(sign) * (values[i] - values[i - 1]) < 0;
            EXPECT_EQ(falls, 0);
        }
        const auto far = calibration.farTable();
        EXPECT_GT(far.values().get()[far.values().size() - 2], 0) << "extrapolated, not cut off";
        // A threshold above the best impostor, or where the table begins if that is higher still.
        const float best =
            std::max(*std::ranges::max_element(scores.impostor), calibration.scoreTable().xMin());
        EXPECT_LT(far(calibration.scoreTable()(best + 1)), far(calibration.scoreTable()(best)));
    }
}

TEST(Calibration, FilesAreWrittenAndTheReportNamesTheExtrapolation) {
    const ScratchFolder scratch;
    std::string text = "# scores\n\n";
    for (const float v : normal(200, 4, 1, 5)) text += "genuine\t" + std::to_string(v) + "\n";
    for (const float v : normal(500, 0, 1, 6)) text += "impostor\t" + std::to_string(v) + "\n";
    const Calibration calibration(ComparisonScores::read(scratch.write("scores.tsv", text)));
    writeCalibration(calibration, "x1", scratch.path() / "out");
    const auto file = [&](const char* name) { return (scratch.path() / "out" / name).string(); };
    const Cmp::Implementation::MappingFiles files(Cmp::Implementation::MappingFiles::Paths{
        file("smap-x1.dat"), file("farmap-x1.dat"), file("frrmap-x1.dat")});
    EXPECT_LT(files.ratesMapping()->expectedFAR(files.scoreMapping()->convert(4.0f)), 0.01f);
    const std::string report = scratch.read("out/calibration-x1.md");
    EXPECT_EQ(report.substr(0, 46), "200 genuine and 500 impostor pairs. Equal erro");
    EXPECT_NE(report.find("extrapolated above"), std::string::npos);
    EXPECT_NE(report.find("(extrapolated) |"), std::string::npos);
}

TEST(Calibration, RefusesScoresThatTellNothing) {
    const ScratchFolder scratch;
    const std::string wrong = scratch.write("wrong.tsv", "genuine 1\nimpostor nan\n");
    EXPECT_EQ(thrownBy([&] { ComparisonScores::read(wrong); }),
              "FNEIOError: " + wrong + ", line 2: expected \"genuine\" or \"impostor\" and a score");
    const auto good = normal(100, 0, 1, 7);
    for (const auto& [genuine, impostor] :
         std::vector<std::pair<std::vector<float>, std::vector<float>>>{{good, normal(19, -4, 1, 8)},
                                                                        {std::vector<float>(50, 1.0f), good},
                                                                        {normal(100, -9, 1, 9), good}})
        EXPECT_EQ(thrownBy([&, &g = genuine, &i = impostor] {
                      Calibration c({g, i});
                  }).substr(0, 22),
                  "FNEBadArg: Calibration");
}

} // namespace
