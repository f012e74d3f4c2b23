#pragma once

#include "fn/invertible_function.h"

#include <filesystem>
#include <iosfwd>
#include <vector>

namespace Train {

/// Raw scores of comparisons: of pairs of one person, and of pairs of different people.
struct ComparisonScores {
    std::vector<float> genuine;
    std::vector<float> impostor;

    /// Reads lines of "genuine" or "impostor", white space and the score; empty lines and those that begin
    /// with "#" are skipped. @throws FNEIOError that names the line
    static ComparisonScores read(const std::filesystem::path& file);
};

/// The share of a population beyond a value, from a sample of it: smooth, strictly monotonic, and defined
/// beyond the sample.
///
/// Inside, the sample is smoothed with a Gaussian (bandwidth by Silverman's rule). From the place on where
/// `tailCount` values are left (a tenth of the sample at most), the logarithm of the share is a straight line
/// whose slope is the mean excess over that place, the maximum likelihood fit of an exponential tail.
class TailShare {
public:
    static constexpr std::size_t tailCount = 100;
    static constexpr std::size_t fewest = 20; ///< values in a sample

    enum Side { above, below };
    /// @throws FNEBadArg for less than `fewest` values, values that are not finite, or all the same
    TailShare(const std::vector<float>& values, Side side);

    /// log(share of the population beyond x), 0 far on the other side.
    double logShare(double x) const;
    /// Where the line begins.
    double tailStart() const { return sign_ * tailStart_; }
    double median() const { return sign_ * median_; }
    /// The most extreme value of the sample: beyond it, shares are extrapolated.
    double extreme() const { return sign_ * extreme_; }
    std::size_t count() const { return count_; }
    /// The value whose share is exp(logShare), inside of the line.
    double placeOf(double logShare) const;

private:
    void smooth(const std::vector<double>& sorted, double bandwidth);
    double smoothed(double v) const;

    double sign_; ///< -1 for the share below: all that follows holds for values with their sign changed
    std::size_t count_;
    double median_ = 0, extreme_ = 0;
    double tailStart_ = 0, tailLogShare_ = 0, meanExcess_ = 0;
    double first_ = 0, step_ = 0;
    std::vector<double> shares_; ///< smoothed, at first_ + i * step_, up to the line
};

/// The three mapping tables of a comparison algorithm.
///
/// A score is 1 / (1 + exp(-u / 3)), where u is log(FRR) - log(FAR) at its raw score less the same where the
/// FAR is 0.001, stretched to reach 0 and 1 at the ends of the table: 0.5 stands for a FAR of 0.001, and each
/// step of 0.1 near the middle changes the ratio of the rates threefold. 3 puts a FAR of 1e-6 near 0.99, so
/// that the rates tables, which have equal steps of score, resolve it.
struct Calibration {
    static constexpr int samples = 4001; ///< of each table

    /// @throws FNEBadArg as TailShare does, or if the genuine scores are not the higher ones
    explicit Calibration(const ComparisonScores& scores);

    const Fn::InvertibleFunction<float, float>& scoreTable() const { return scores_; } ///< raw score to score
    Fn::InvertibleFunction<float, float> farTable() const; ///< score to FAR, 1 at score 0, 0 at 1
    Fn::InvertibleFunction<float, float> frrTable() const; ///< score to FRR, 0 at score 0, 1 at 1

    double logFar(double raw) const { return far_.logShare(raw); }
    double logFrr(double raw) const { return frr_.logShare(raw); }

    /// What a model card says of it: numbers of pairs, the equal error rate, raw scores and scores of some
    /// rates, and from where on the tables are extrapolated.
    void report(std::ostream& stream) const;

private:
    Fn::InvertibleFunction<float, float> tabulate() const;
    double logRatio(double raw) const { return logFrr(raw) - logFar(raw); }

    TailShare far_;
    TailShare frr_;
    Fn::InvertibleFunction<float, float> scores_;
};

/// Names of the files of one algorithm.
struct CalibrationFiles {
    std::string similarity, far, frr;
    /// "smap-", "farmap-" and "frrmap-" before `algorithm` and ".dat".
    static CalibrationFiles of(const std::string& algorithm);
};

/// Writes the three tables into a folder, which is made, and the report beside them, "calibration-" and the
/// algorithm and ".md".
void writeCalibration(const Calibration& calibration, const std::string& algorithm,
                      const std::filesystem::path& folder);

/// Reads a file of scores, writes the tables made of it, and prints the report.
void calibrate(const std::filesystem::path& scoresFile, const std::string& algorithm,
               const std::filesystem::path& folder);

} // namespace Train
