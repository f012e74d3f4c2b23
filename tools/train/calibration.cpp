#include "train/calibration.h"

#include "cmp/mapping_files.h"

#include <algorithm>
#include <cmath>
#include <fstream>
#include <iostream>
#include <numeric>
#include <sstream>

namespace Train {

namespace {

constexpr double scoreSlope = 3;
/// The FAR at a score of 0.5.
constexpr double farOfMiddle = 1e-3;
/// How far the table of scores reaches: to rates of 1e-10 on either side.
constexpr double logSmallestRate = -23.0;

double logistic(double u) {
    return 1 / (1 + std::exp(-u / scoreSlope));
}

/// Where an ascending function has a value, between two places.
template <class F> double placeWhere(F f, double y, double low, double high) {
    for (int i = 0; i < 60; ++i) {
        const double middle = low + (high - low) / 2;
        (f(middle) < y ? low : high) = middle;
    }
    return low + (high - low) / 2;
}

/// Share of a normal distribution above z standard deviations.
double normalAbove(double z) {
    return 0.5 * std::erfc(z / std::sqrt(2.0));
}

} // namespace

ComparisonScores ComparisonScores::read(const std::filesystem::path& file) {
    std::ifstream stream(file);
    if (!stream) FN_THROW(FNEIOError, "Cannot read scores from " + file.string());
    ComparisonScores scores;
    std::string line;
    for (int number = 1; std::getline(stream, line); ++number) {
        std::istringstream fields(line);
        std::string kind, text;
        if (!(fields >> kind) || kind.front() == '#') continue;
        fields >> text;
        char* end = nullptr;
        const float score = std::strtof(text.c_str(), &end);
        const bool good = !text.empty() && *end == 0 && std::isfinite(score) && !(fields >> text) &&
                          (kind == "genuine" || kind == "impostor");
        if (!good)
            FN_THROW(FNEIOError, file.string() + ", line " + std::to_string(number) +
                                     ": expected \"genuine\" or \"impostor\" and a score");
        (kind == "genuine" ? scores.genuine : scores.impostor).push_back(score);
    }
    return scores;
}

TailShare::TailShare(const std::vector<float>& values, Side side)
    : sign_(side == above ? 1 : -1), count_(values.size()) {
    if (count_ < fewest)
        FN_THROW(FNEBadArg, "Calibration needs " + std::to_string(fewest) + " scores of each kind, got " +
                                std::to_string(count_));
    std::vector<double> sorted(values.begin(), values.end()); // toward the tail
    for (double& v : sorted) {
        if (!std::isfinite(v)) FN_THROW(FNEBadArg, "Calibration: a score is not finite");
        v *= sign_;
    }
    std::ranges::sort(sorted);
    if (sorted.front() == sorted.back()) FN_THROW(FNEBadArg, "Calibration: all scores are the same");
    median_ = sorted[count_ / 2];
    extreme_ = sorted.back();

    const auto n = static_cast<double>(count_);
    const double mean = std::accumulate(sorted.begin(), sorted.end(), 0.0) / n;
    double squares = 0;
    for (const double v : sorted) squares += (v - mean) * (v - mean);
    const double deviation = std::sqrt(squares / (n - 1));
    const double quartiles = (sorted[count_ * 3 / 4] - sorted[count_ / 4]) / 1.349;
    const double bandwidth =
        0.9 * (quartiles > 0 ? std::min(deviation, quartiles) : deviation) * std::pow(n, -0.2);

    const std::size_t tail = std::min(tailCount, count_ / 10);
    tailStart_ = sorted[count_ - 1 - tail];
    double excess = 0;
    for (std::size_t i = count_ - tail; i < count_; ++i) excess += sorted[i] - tailStart_;
    meanExcess_ = std::max(excess / static_cast<double>(tail), bandwidth);
    smooth(sorted, bandwidth);
    tailLogShare_ = std::log(smoothed(tailStart_));
}

/// Counts in bins of an eighth of the bandwidth, each of them spread out; values farther than 8 bandwidths
/// count whole or not at all.
void TailShare::smooth(const std::vector<double>& sorted, double bandwidth) {
    constexpr double reach = 8, mostBins = 1 << 16;
    first_ = sorted.front() - reach * bandwidth;
    const double end = sorted.back() + reach * bandwidth;
    step_ = std::max(bandwidth / 8, (end - first_) / mostBins);
    const auto bin = [&](double v) { return static_cast<std::size_t>((v - first_) / step_); };
    std::vector<double> counts(bin(end) + 1);
    for (const double v : sorted) ++counts[bin(v)];

    const std::size_t near = static_cast<std::size_t>(reach * bandwidth / step_) + 1;
    shares_.resize(std::min(bin(tailStart_) + 2, counts.size()));
    std::vector<double> countsFrom(counts.size() + 1);
    for (std::size_t i = counts.size(); i-- > 0;) countsFrom[i] = countsFrom[i + 1] + counts[i];
    for (std::size_t i = 0; i < shares_.size(); ++i) {
        const std::size_t last = std::min(i + near, counts.size());
        double count = countsFrom[last];
        for (std::size_t j = i > near ? i - near : 0; j < last; ++j)
            if (counts[j] > 0)
                count += counts[j] * normalAbove((static_cast<double>(i) - static_cast<double>(j) - 0.5) *
                                                 step_ / bandwidth);
        shares_[i] = count / static_cast<double>(sorted.size());
    }
}

double TailShare::smoothed(double v) const {
    const double t = std::max(0.0, (v - first_) / step_);
    const std::size_t i = std::min(static_cast<std::size_t>(t), shares_.size() - 2);
    return shares_[i] + (shares_[i + 1] - shares_[i]) * (t - static_cast<double>(i));
}

double TailShare::logShare(double x) const {
    const double v = sign_ * x;
    if (v >= tailStart_) return tailLogShare_ - (v - tailStart_) / meanExcess_;
    return std::log(smoothed(v));
}

double TailShare::placeOf(double logShare) const {
    return sign_ * (tailStart_ + std::max(0.0, tailLogShare_ - logShare) * meanExcess_);
}

Calibration::Calibration(const ComparisonScores& scores)
    : far_(scores.impostor, TailShare::above), frr_(scores.genuine, TailShare::below), scores_(tabulate()) {}

Fn::InvertibleFunction<float, float> Calibration::tabulate() const {
    if (!(frr_.median() > far_.median()))
        FN_THROW(FNEBadArg, "Calibration: genuine scores are not higher than impostor scores");
    // Where the scores are far apart, the places change their order; then the table lies between them.
    const auto [low, high] = std::minmax({frr_.placeOf(logSmallestRate), far_.placeOf(logSmallestRate)});
    const double middle =
        logRatio(placeWhere([&](double raw) { return -logFar(raw); }, -std::log(farOfMiddle), low, high));
    // The ends move a little with the anchor, and the stretched middle with them.
    double anchor = middle, first = 0, last = 1;
    const auto scoreOf = [&](double raw) { return logistic(logRatio(raw) - anchor); };
    for (int i = 0; i < 20; ++i) {
        anchor = middle - scoreSlope * std::log((first + last) / (2 - first - last));
        first = scoreOf(low);
        last = scoreOf(high);
    }
    std::vector<float> values(samples);
    for (int i = 0; i < samples; ++i) {
        const double score = scoreOf(low + (high - low) * i / (samples - 1));
        values[static_cast<std::size_t>(i)] = static_cast<float>((score - first) / (last - first));
    }
    return {FNVector<float>(values), static_cast<float>(low), static_cast<float>(high)};
}

namespace {

/// A rate at each score of a table, with the given values at scores 0 and 1.
template <class LogRate>
Fn::InvertibleFunction<float, float> rateTable(const Calibration& calibration, LogRate logRate, float first,
                                               float last) {
    std::vector<float> values(Calibration::samples);
    const auto samples = values.size();
    for (std::size_t i = 1; i + 1 < samples; ++i) {
        const double score = static_cast<double>(i) / static_cast<double>(samples - 1);
        values[i] = static_cast<float>(
            std::exp(logRate(calibration.scoreTable().applyInverse(static_cast<float>(score)))));
    }
    values.front() = first;
    values.back() = last;
    return {FNVector<float>(values), 0, 1};
}

} // namespace

Fn::InvertibleFunction<float, float> Calibration::farTable() const {
    return rateTable(
        *this, [&](double raw) { return logFar(raw); }, 1, 0);
}

Fn::InvertibleFunction<float, float> Calibration::frrTable() const {
    return rateTable(
        *this, [&](double raw) { return logFrr(raw); }, 0, 1);
}

namespace {

/// One sentence on where a rate stops being a count of pairs.
void reportTail(std::ostream& stream, const char* name, const char* side, const TailShare& share,
                const Fn::InvertibleFunction<float, float>& scores) {
    const auto place = [&](double raw) {
        stream << raw << " (" << name << " " << std::exp(share.logShare(raw)) << ", score "
               << scores(static_cast<float>(raw)) << ")";
    };
    stream << name << " is fitted by an exponential tail " << side << " raw score ";
    place(share.tailStart());
    stream << ", and extrapolated " << side << " ";
    place(share.extreme());
    stream << ".\n";
}

} // namespace

void Calibration::report(std::ostream& stream) const {
    const auto solve = [&](auto f, double y) { return placeWhere(f, y, scores_.xMin(), scores_.xMax()); };
    const double equal = solve([&](double raw) { return logRatio(raw); }, 0);
    stream << frr_.count() << " genuine and " << far_.count() << " impostor pairs. Equal error rate "
           << std::exp(logFar(equal)) * 100 << " % at raw score " << equal << ", score "
           << scores_(static_cast<float>(equal)) << ".\n\n";
    reportTail(stream, "FAR", "above", far_, scores_);
    reportTail(stream, "FRR", "below", frr_, scores_);
    stream << "\n| FAR | raw score | score | FRR | impostor pairs above |\n"
              "| ---: | ---: | ---: | ---: | ---: |\n";
    for (int exponent = 1; exponent <= 6; ++exponent) {
        const double rate = std::pow(10.0, -exponent);
        const double raw = solve([&](double x) { return -logFar(x); }, -std::log(rate));
        stream << "| " << rate << " | " << raw << " | " << scores_(static_cast<float>(raw)) << " | "
               << std::exp(logFrr(raw)) << " | " << rate * static_cast<double>(far_.count())
               << (raw > far_.extreme() ? " (extrapolated)" : "") << " |\n";
    }
}

CalibrationFiles CalibrationFiles::of(const std::string& algorithm) {
    const std::string end = "-" + algorithm + ".dat";
    return {"smap" + end, "farmap" + end, "frrmap" + end};
}

void calibrate(const std::filesystem::path& scoresFile, const std::string& algorithm,
               const std::filesystem::path& folder) {
    const Calibration calibration(ComparisonScores::read(scoresFile));
    writeCalibration(calibration, algorithm, folder);
    calibration.report(std::cout);
}

void writeCalibration(const Calibration& calibration, const std::string& algorithm,
                      const std::filesystem::path& folder) {
    using Cmp::Implementation::writeMappingFile;
    std::filesystem::create_directories(folder);
    const CalibrationFiles files = CalibrationFiles::of(algorithm);
    writeMappingFile(calibration.scoreTable(), folder / files.similarity);
    writeMappingFile(calibration.farTable(), folder / files.far);
    writeMappingFile(calibration.frrTable(), folder / files.frr);
    std::ofstream report(folder / ("calibration-" + algorithm + ".md"));
    calibration.report(report);
    if (!report.flush()) FN_THROW(FNEIOError, "Cannot write the report of the calibration");
}

} // namespace Train
