#include "train/portrait_training.h"

#include "cmp/portrait/age_cascade.h"
#include "eye/discriminator/svm_fp_discriminator.h"
#include "labelled/portrait_truth.h"
#include "train/portrait_lighting.h"
#include "train/quadratic_training.h"

#include <algorithm>
#include <cmath>
#include <fstream>
#include <functional>
#include <iostream>
#include <numeric>
#include <random>
#include <set>

namespace Train {
namespace {

using Labelled::Split;
using K = PortraitKind;
using Span = std::span<const float>;

/// Samples of the train part, then those of the dev part.
struct Learning {
    FloatSamples samples;
    std::size_t train = 0; ///< number of the first ones

    std::vector<std::size_t> trainIndices() const {
        std::vector<std::size_t> indices(train);
        std::iota(indices.begin(), indices.end(), std::size_t{0});
        return indices;
    }
    std::vector<float> head(const std::vector<float>& values) const {
        return {values.begin(), values.begin() + static_cast<std::ptrdiff_t>(train)};
    }
};

/// Of more samples than there may be, a random choice.
void thinOut(FloatSamples& samples, std::size_t most, std::mt19937_64& random) {
    if (samples.size() <= most) return;
    std::vector<std::size_t> order(samples.size());
    std::iota(order.begin(), order.end(), std::size_t{0});
    std::shuffle(order.begin(), order.end(), random);
    FloatSamples kept;
    for (std::size_t i = 0; i < most; ++i)
        kept.add(samples.features[order[i]], samples.targets[order[i]], samples.weights[order[i]]);
    samples = std::move(kept);
}

Learning learningOf(FloatSamples train, const FloatSamples& dev, std::size_t mostTrain,
                    std::mt19937_64& random) {
    thinOut(train, mostTrain, random);
    Learning learning{std::move(train), 0};
    learning.train = learning.samples.size();
    for (std::size_t i = 0; i < dev.size(); ++i)
        learning.samples.add(dev.features[i], dev.targets[i], dev.weights[i]);
    return learning;
}

/// The value that this share of the values stays below.
double quantile(std::vector<double> values, double share) {
    std::sort(values.begin(), values.end());
    const auto i = static_cast<std::size_t>(share * static_cast<double>(values.size()));
    return values.empty() ? 0 : values[std::min(i, values.size() - 1)];
}

/// The greatest mean of the shares of both classes that a threshold can separate, and that threshold.
std::pair<double, double> bestBalance(const std::vector<double>& values, const std::vector<float>& targets) {
    std::vector<double> positive, negative;
    for (std::size_t i = 0; i < values.size(); ++i)
        (targets[i] > 0 ? positive : negative).push_back(values[i]);
    std::pair<double, double> best{0, 0};
    for (double share = 0.005; share < 1; share += 0.005) {
        const double t = quantile(values, share);
        const auto above = [&](const std::vector<double>& v) {
            return static_cast<double>(std::count_if(v.begin(), v.end(), [&](double x) { return x > t; })) /
                   static_cast<double>(std::max<std::size_t>(v.size(), 1));
        };
        const double balance = (above(positive) + 1 - above(negative)) / 2;
        if (balance > best.first) best = {balance, t};
    }
    return best;
}

double meanError(const std::vector<double>& values, const std::vector<float>& targets) {
    double sum = 0;
    for (std::size_t i = 0; i < values.size(); ++i)
        sum += std::abs(values[i] - static_cast<double>(targets[i]));
    return sum / static_cast<double>(std::max<std::size_t>(values.size(), 1));
}

void save(const Eye::FullPolynomialSvm& svm, const std::filesystem::path& file) {
    std::ofstream stream(file, std::ios::binary);
    svm.write(stream);
    if (!stream.flush()) FN_THROW(FNEIOError, file.string() + ": cannot be written");
}

/// What a penalty is chosen by, greater being better.
double classification(const std::vector<double>& values, const std::vector<float>& targets) {
    return bestBalance(values, targets).first;
}
double estimation(const std::vector<double>& values, const std::vector<float>& targets) {
    return -meanError(values, targets);
}

/// How a classifier's scores are laid: this share of the good portraits passes at the threshold, and the
/// median of the others lies at a place of its own.
struct WorkingPoint {
    double threshold, passShare;
    bool goodIsBelow;
    double others;
};

class PortraitTraining {
public:
    PortraitTraining(const TrainingSources& sources, const std::filesystem::path& folder)
        : sources_(sources), folder_(folder), random_(sources.seed) {}

    void run(const std::string& only) {
        struct Step {
            std::string name;
            std::vector<K> kinds;
            void (PortraitTraining::*run)();
        };
        const Step steps[] = {
            {"glasses", {K::glasses}, &PortraitTraining::glasses},
            {"lighting", {K::lighting}, &PortraitTraining::lighting},
            {"eyes", {K::closedEyes}, &PortraitTraining::closedEyes},
            {"gaze", {K::gazeAway, K::iris}, &PortraitTraining::gaze},
            {"head", {K::head}, &PortraitTraining::head},
            {"mouth", {K::mouth}, &PortraitTraining::mouth},
            {"pose", {K::pose}, &PortraitTraining::pose},
            {"ethnicity", {K::ethnicity}, &PortraitTraining::ethnicity},
            {"age", {K::age}, &PortraitTraining::age},
            {"gender", {K::gender}, &PortraitTraining::gender},
        };
        for (const Step& step : steps) {
            if (!only.empty() && only != step.name) continue;
            wanted_ = step.kinds;
            random_.seed(sources_.seed); // so that a step gives the same alone as among all
            (this->*step.run)();
            sets_.clear();
        }
    }

private:
    const PortraitSet& set(const std::string& folder, PortraitViews views = PortraitViews::first) {
        const std::pair key(folder, views);
        const auto found = sets_.find(key);
        if (found != sets_.end()) return found->second;
        return sets_
            .emplace(key, folder == "portraits/eyes"      ? loadEyePictures(sources_, folder)
                          : views == PortraitViews::first ? firstViews(folder)
                                                          : furtherViews(folder))
            .first->second;
    }

    PortraitSet firstViews(const std::string& folder) const {
        static const std::map<std::string, std::vector<K>> kinds{
            {"portraits/light", {K::lighting}},
            {"video/webcam", {K::glasses}},
            {"portraits/mtfl",
             {K::glasses, K::pose, K::mouth, K::head, K::closedEyes, K::gazeAway, K::gender, K::iris,
              K::lighting}},
            {"portraits/utkface", {K::gender, K::age, K::ethnicity}},
            {"portraits/fairface", {K::gender, K::age, K::ethnicity, K::lighting}},
            {"scenes/faces", {K::pose, K::mouth, K::head, K::closedEyes, K::gazeAway, K::iris}},
            {"people/celeba", {K::pose, K::mouth, K::head, K::closedEyes, K::gazeAway, K::iris, K::gender}},
            {"people/lfw", {K::pose, K::mouth, K::head, K::closedEyes, K::gazeAway, K::iris, K::gender}},
        };
        constexpr std::size_t all = 1000000, ofLfw = 4000;
        return loadPortraits(sources_, folder, kinds.at(folder), wanted_, PortraitViews::first,
                             folder == "people/lfw" ? ofLfw : all);
    }

    /// Of what the step wants only, and of all pictures.
    PortraitSet furtherViews(const std::string& folder) const {
        return loadPortraits(sources_, folder, wanted_, wanted_, PortraitViews::further);
    }

    /// Collects what `use(set, i, samples of the split)` adds.
    template <class Use>
    Learning collect(const std::vector<std::string>& folders, std::size_t mostTrain, Use use,
                     bool withFurtherViews = false) {
        FloatSamples train, dev;
        const auto useAll = [&](const PortraitSet& portraits) {
            for (std::size_t i = 0; i < portraits.samples.size(); ++i) {
                const Split split = portraits.samples[i].split;
                if (split != Split::test) use(portraits, i, split == Split::train ? train : dev);
            }
        };
        for (const std::string& folder : folders) {
            useAll(set(folder));
            if (withFurtherViews) useAll(set(folder, PortraitViews::further));
        }
        return learningOf(std::move(train), dev, mostTrain, random_);
    }

    std::vector<double> devValues(const QuadraticFunction& function, const Learning& learning) const {
        const auto& features = learning.samples.features;
        return valuesOf(function,
                        {features.begin() + static_cast<std::ptrdiff_t>(learning.train), features.end()});
    }
    std::vector<float> devTargets(const Learning& learning) const {
        const auto& targets = learning.samples.targets;
        return {targets.begin() + static_cast<std::ptrdiff_t>(learning.train), targets.end()};
    }

    /// The solution with the penalty that does best on dev by `quality(values, targets)`.
    template <class Quality>
    std::vector<float> bestSolution(const QuadraticRegression& regression, const Learning& learning,
                                    const std::vector<double>& penalties, Quality quality) {
        const std::vector<std::size_t> chosen = learning.trainIndices();
        std::vector<float> best;
        double bestQuality = 0;
        for (const double penalty : penalties) {
            std::vector<float> solution = regression.solve(chosen, learning.head(learning.samples.targets),
                                                           learning.head(learning.samples.weights), penalty);
            std::vector<double> values;
            for (std::size_t i = learning.train; i < learning.samples.size(); ++i)
                values.push_back(regression.predict(chosen, solution, i));
            const double q = quality(values, devTargets(learning));
            std::cout << "  penalty " << penalty << ": " << q << " on dev\n" << std::flush;
            if (!best.empty() && q <= bestQuality) continue;
            best = std::move(solution);
            bestQuality = q;
        }
        return best;
    }

    void classifier(const std::string& file, const Learning& learning, std::size_t directions,
                    const std::vector<double>& penalties, const WorkingPoint& point) {
        std::cout << file << ": " << learning.train << " samples\n" << std::flush;
        const QuadraticRegression regression(learning.samples.features);
        const QuadraticFunction function =
            regression.reduced(learning.trainIndices(),
                               bestSolution(regression, learning, penalties, classification), directions);
        lay(file, function, devValues(function, learning), devTargets(learning), point);
    }

    /// Scales the function to its working point and saves it.
    void lay(const std::string& file, const QuadraticFunction& function, const std::vector<double>& values,
             const std::vector<float>& targets, const WorkingPoint& point) {
        std::vector<double> good, others;
        for (std::size_t i = 0; i < values.size(); ++i)
            ((targets[i] < 0) == point.goodIsBelow ? good : others).push_back(values[i]);
        const double limit = quantile(good, point.goodIsBelow ? point.passShare : 1 - point.passShare);
        const double gain = (point.others - point.threshold) / (quantile(others, 0.5) - limit);
        const double shift = point.threshold - gain * limit;
        std::cout << "  reduced: " << bestBalance(values, targets).first << " on dev\n" << std::flush;
        save(machineOf(function, gain, shift, file), folder_ / file);
    }

    void glasses() {
        const auto use = [](const PortraitSet& set, std::size_t i, FloatSamples& out) {
            out.add(set.features(K::glasses, i), set.rowOf(i).text("glasses") == "1" ? 1.0f : -1.0f);
        };
        Learning learning = collect({"portraits/mtfl", "video/webcam"}, mostSamples, use);
        balance(learning.samples);
        classifier("gldisc.dat", learning, 10, {1, 3}, {-0.8, 0.95, true, 1});
    }

    void pose() {
        const auto use = [](const PortraitSet& set, std::size_t i, FloatSamples& out) {
            constexpr float frontal = 12, turned = 24;
            const Labelled::Row& row = set.rowOf(i);
            if (const auto pose = row.number("pose")) {
                out.add(set.features(K::pose, i), *pose == 0 ? 1.0f : -1.0f);
            } else if (const auto points = Labelled::Points68::of(row)) {
                const float yaw = std::abs(points->yaw());
                if (yaw < frontal || yaw > turned)
                    out.add(set.features(K::pose, i), yaw < frontal ? 1.0f : -1.0f);
            }
        };
        Learning learning =
            collect({"portraits/mtfl", "scenes/faces", "people/celeba", "people/lfw"}, mostSamples, use);
        balance(learning.samples);
        classifier("fpdisc.dat", learning, 16, {3}, {-0.42, 0.95, false, -1.5});
    }

    void mouth() {
        const auto use = [](const PortraitSet& set, std::size_t i, FloatSamples& out) {
            // Labels err by as much as the smallest gaps, so these count for little.
            constexpr float open = 0.1f, clear = 0.05f;
            const auto points = Labelled::Points68::of(set.rowOf(i));
            if (!points) return;
            out.add(set.features(K::mouth, i), std::clamp((points->lipGap() - open) / clear, -1.0f, 1.0f));
        };
        Learning learning =
            collect({"portraits/mtfl", "scenes/faces", "people/celeba", "people/lfw"}, 24000, use, true);
        balance(learning.samples);
        classifier("cmdisc.dat", learning, 96, {1}, {-0.5, 0.95, true, 1});
    }

    void closedEyes() {
        const std::size_t d = set("portraits/eyes").dimension(K::closedEyes);
        const auto use = [&](const PortraitSet& set, std::size_t i, FloatSamples& out) {
            constexpr float closed = 0.13f, open = 0.26f;
            const Span both = set.features(K::closedEyes, i);
            if (both.size() == d) {
                out.add(both, set.rowOf(i).text("eyes_open") == "0" ? 1.0f : -1.0f);
                return;
            }
            const auto points = Labelled::Points68::of(set.rowOf(i));
            if (!points || set.rowOf(i).text("glasses") == "1") return;
            for (const int eye : {0, 1}) {
                // The first eye of features is the one on the right of the picture that they are taken from.
                const bool right = (eye == 0) != set.samples[i].mirrored;
                const float opening =
                    points->eyeOpening(right ? Labelled::Side::right : Labelled::Side::left);
                if (opening < closed || opening > open)
                    out.add(both.subspan(static_cast<std::size_t>(eye) * d, d),
                            opening < closed ? 1.0f : -1.0f);
            }
        };
        FloatSamples train, dev;
        const Learning eyes = collect({"portraits/eyes"}, mostSamples, use);
        const Learning faces =
            collect({"portraits/mtfl", "scenes/faces", "people/celeba", "people/lfw"}, 4000, use);
        for (const Learning* learning : {&eyes, &faces})
            for (std::size_t i = 0; i < learning->samples.size(); ++i)
                (i < learning->train ? train : dev)
                    .add(learning->samples.features[i], learning->samples.targets[i]);
        Learning learning = learningOf(std::move(train), dev, mostSamples, random_);
        balance(learning.samples);
        // Both eyes of a portrait have to pass.
        classifier("cedisc.dat", learning, 16, {1}, {0.67, 0.975, true, 1.5});
    }

    void gaze() {
        const auto use = [](const PortraitSet& set, std::size_t i, FloatSamples& out) {
            constexpr float frontal = 0.08f, away = 0.16f, seen = 1;
            const Span both = set.features(K::gazeAway, i), iris = set.features(K::iris, i);
            const std::size_t d = both.size() / 2;
            for (const std::size_t eye : {std::size_t{0}, std::size_t{1}}) {
                const float offset = std::abs(iris[1 - eye]);
                if (offset < frontal || (offset > away && offset < seen))
                    out.add(both.subspan(eye * d, d), offset > away ? 1.0f : -1.0f);
            }
        };
        Learning learning =
            collect({"portraits/mtfl", "scenes/faces", "people/celeba", "people/lfw"}, mostSamples, use);
        balance(learning.samples);
        classifier("gadisc.dat", learning, 24, {1}, {-0.5, 0.975, true, 1});
    }

    void head() {
        struct Target {
            const char* file;
            float (*value)(const Labelled::Points68::Extent&);
        };
        // From the middle of the eyes to the vertex and to the chin: 121 and 112 mm on average (Farkas,
        // "Anthropometry of the Head and Face", 1994), and half of what one differs the other does, too.
        constexpr float vertexByChin = 1.08f, meanChin = 1.8f;
        constexpr Target targets[] = {
            {"chinest.dat", [](const auto& e) { return e.chin; }},
            {"crownest.dat",
             [](const auto& e) { return vertexByChin * (meanChin + 0.5f * (e.chin - meanChin)); }},
            {"learest.dat", [](const auto& e) { return e.left - 0.5f; }},
            {"rearest.dat", [](const auto& e) { return e.right + 0.5f; }},
        };
        const auto extentOf = [](const PortraitSet& set, std::size_t i) {
            const PortraitSample& sample = set.samples[i];
            auto extent = Labelled::Points68::of(set.rowOf(i))->extent(sample.leftEye, sample.rightEye);
            if (sample.mirrored) std::swap(extent.left, extent.right);
            return extent;
        };
        std::map<const float*, Labelled::Points68::Extent> byFeatures;
        const auto use = [&](const PortraitSet& set, std::size_t i, FloatSamples& out) {
            if (!Labelled::Points68::of(set.rowOf(i))) return;
            const Span x = set.features(K::head, i);
            byFeatures[x.data()] = extentOf(set, i);
            out.add(x, 0);
        };
        Learning learning =
            collect({"portraits/mtfl", "scenes/faces", "people/celeba", "people/lfw"}, 5000, use);
        const QuadraticRegression regression(learning.samples.features);
        for (const Target& target : targets) {
            double mean = 0;
            for (std::size_t i = 0; i < learning.samples.size(); ++i)
                mean += static_cast<double>(learning.samples.targets[i] = target.value(
                                                byFeatures[learning.samples.features[i].data()]));
            mean /= static_cast<double>(learning.samples.size());
            for (float& value : learning.samples.targets) value -= static_cast<float>(mean);
            std::cout << target.file << ": " << learning.train << " samples, mean " << mean << "\n";
            estimator(target.file, regression, learning, 8, {1}, mean);
        }
    }

    /// A machine for the targets plus `mean`.
    void estimator(const std::string& file, const QuadraticRegression& regression, const Learning& learning,
                   std::size_t directions, const std::vector<double>& penalties, double mean) {
        const QuadraticFunction function = regression.reduced(
            learning.trainIndices(), bestSolution(regression, learning, penalties, estimation), directions);
        std::cout << "  reduced: " << meanError(devValues(function, learning), devTargets(learning))
                  << " on dev\n"
                  << std::flush;
        save(machineOf(function, 1, mean, file), folder_ / file);
    }

    void ethnicity() {
        using Labelled::Ethnicity;
        std::map<const float*, Ethnicity> byFeatures;
        const auto use = [&](const PortraitSet& set, std::size_t i, FloatSamples& out) {
            const auto label = Labelled::ethnicityOf(set.rowOf(i));
            if (!label || *label == Ethnicity::other) return;
            byFeatures[set.features(K::ethnicity, i).data()] = *label;
            out.add(set.features(K::ethnicity, i), 0);
        };
        Learning learning = collect({"portraits/utkface", "portraits/fairface"}, mostSamples, use);
        const QuadraticRegression regression(learning.samples.features);
        for (const auto& [file, group] :
             {std::pair("ethwdisc.dat", Ethnicity::white), std::pair("ethbdisc.dat", Ethnicity::black),
              std::pair("ethadisc.dat", Ethnicity::asian)}) {
            for (std::size_t i = 0; i < learning.samples.size(); ++i)
                learning.samples.targets[i] =
                    byFeatures[learning.samples.features[i].data()] == group ? 1.0f : -1.0f;
            std::cout << file << ": " << learning.train << " samples\n";
            const QuadraticFunction function = regression.reduced(
                learning.trainIndices(), bestSolution(regression, learning, {0.5}, classification), 20);
            std::cout << "  reduced: "
                      << bestBalance(devValues(function, learning), devTargets(learning)).first << " on dev\n"
                      << std::flush;
            save(machineOf(function, 1, 0, file), folder_ / file);
        }
    }

    void gender() {
        constexpr std::size_t mostLabelled = 11000, mostTaken = 5000;
        const auto use = [](const PortraitSet& set, std::size_t i, FloatSamples& out) {
            constexpr double adult = 16;
            const auto years = Labelled::ageOf(set.rowOf(i));
            // Children are learned from with less weight, and do not count in what is chosen on dev.
            const bool child = years && *years < adult;
            if (child && set.samples[i].split != Split::train) return;
            out.add(set.features(K::gender, i), set.rowOf(i).text("gender") == "m" ? 1.0f : -1.0f,
                    child ? 0.3f : 1.0f);
        };
        const std::vector<std::string> labelled{"portraits/utkface", "portraits/fairface", "portraits/mtfl"};
        Learning learning = collect(labelled, mostLabelled, use);
        balance(learning.samples);
        std::cout << "gedisc.dat: " << learning.train << " samples\n" << std::flush;
        QuadraticFunction first;
        {
            const QuadraticRegression regression(learning.samples.features);
            first = regression.reduced(learning.trainIndices(),
                                       regression.solve(learning.trainIndices(),
                                                        learning.head(learning.samples.targets),
                                                        learning.head(learning.samples.weights), 1),
                                       16);
            const auto [balance, threshold] = bestBalance(devValues(first, learning), devTargets(learning));
            first.constant -= threshold;
            std::cout << "  labelled ones alone: " << balance << " on dev\n" << std::flush;
        }
        // What several pictures of one known person agree on is taken for a label of all of them.
        FloatSamples taken;
        for (const char* folder : {"people/celeba", "people/lfw"}) {
            const PortraitSet& people = set(folder);
            struct Person {
                double sum = 0;
                std::vector<std::size_t> samples;
            };
            std::map<std::string, Person> persons;
            for (std::size_t i = 0; i < people.samples.size(); ++i) {
                if (people.samples[i].split != Split::train) continue;
                Person& person = persons[people.rowOf(i).text("person")];
                person.sum += std::clamp(first(people.features(K::gender, i)), -1.5, 1.5);
                person.samples.push_back(i);
            }
            for (const auto& [name, person] : persons) {
                constexpr std::size_t fewest = 4; // two pictures and their mirror images
                constexpr double agreed = 0.5;
                const double mean = person.sum / static_cast<double>(person.samples.size());
                if (person.samples.size() < fewest || std::abs(mean) < agreed) continue;
                for (const std::size_t i : person.samples)
                    taken.add(people.features(K::gender, i), mean > 0 ? 1.0f : -1.0f, 0.7f);
            }
        }
        thinOut(taken, mostTaken, random_);
        FloatSamples train = learning.samples, dev;
        for (std::size_t i = learning.train; i < learning.samples.size(); ++i)
            dev.add(learning.samples.features[i], learning.samples.targets[i]);
        train.features.resize(learning.train);
        train.targets.resize(learning.train);
        train.weights.resize(learning.train);
        for (std::size_t i = 0; i < taken.size(); ++i)
            train.add(taken.features[i], taken.targets[i], taken.weights[i]);
        Learning all = learningOf(std::move(train), dev, mostLabelled + mostTaken, random_);
        balance(all.samples);
        std::cout << "  with " << taken.size() << " of known persons\n" << std::flush;
        const QuadraticRegression regression(all.samples.features);
        const QuadraticFunction function =
            regression.reduced(all.trainIndices(), bestSolution(regression, all, {1}, classification), 24);
        const std::vector<double> values = devValues(function, all);
        const auto [balance, threshold] = bestBalance(values, devTargets(all));
        std::cout << "  reduced: " << balance << " on dev\n" << std::flush;
        save(machineOf(function, 1, -threshold, "gedisc.dat"), folder_ / "gedisc.dat");
    }

    void age() {
        using namespace Cmp::Portrait;
        constexpr float oldest = 90;
        constexpr std::size_t directions = 12;
        const auto use = [&](const PortraitSet& set, std::size_t i, FloatSamples& out) {
            const auto years = Labelled::ageOf(set.rowOf(i));
            const bool exact = set.rowOf(i).number("age").has_value();
            if (!years || (!exact && set.samples[i].split != Split::train)) return;
            if (set.samples[i].split != Split::train && *years > 80) return;
            out.add(set.features(K::age, i), std::min(static_cast<float>(*years), oldest), exact ? 1 : 0.6f);
        };
        Learning learning = collect({"portraits/utkface", "portraits/fairface"}, 9000, use);
        double mean = 0;
        for (std::size_t i = 0; i < learning.train; ++i)
            mean += static_cast<double>(learning.samples.targets[i]) / static_cast<double>(learning.train);
        for (float& value : learning.samples.targets) value -= static_cast<float>(mean);
        std::cout << "age: " << learning.train << " samples, mean " << mean << "\n" << std::flush;
        const QuadraticRegression regression(learning.samples.features);
        const std::vector<std::size_t> chosen = learning.trainIndices();
        constexpr double penalty = 1;
        const QuadraticFunction primary =
            regression.reduced(chosen, bestSolution(regression, learning, {penalty}, estimation), directions);
        std::vector<double> values = devValues(primary, learning);
        std::cout << "  primary reduced: " << meanError(values, devTargets(learning)) << " on dev\n"
                  << std::flush;
        save(machineOf(primary, 1, mean, "age-primary.dat"), folder_ / primaryAgeEstimator().file);

        // What the first stage says of samples that it has not learned from; mirror images stay together.
        const std::vector<double> estimates = outOfFold(regression, learning, penalty);
        std::vector<double> current = estimates;
        for (const AgeStage& stage : laterAgeStages()) {
            const double overlap = &stage == &laterAgeStages().front() ? 6 : 4;
            double lower = -std::numeric_limits<double>::max();
            std::vector<double> refined = current, refinedDev = values;
            for (const AgeEstimator& estimator : stage) {
                const double upper = static_cast<double>(estimator.boundary) - mean;
                const QuadraticFunction correction =
                    ageCorrection(regression, learning, estimates, current, lower - overlap, upper + overlap);
                QuadraticFunction function = primary;
                for (std::size_t k = 0; k < function.linear.size(); ++k)
                    function.linear[k] += correction.linear[k];
                function.constant += correction.constant;
                save(machineOf(function, 1, mean, "age"), folder_ / estimator.file);
                for (std::size_t j = 0; j < values.size(); ++j)
                    if (values[j] >= lower && values[j] < upper)
                        refinedDev[j] = function(learning.samples.features[learning.train + j]);
                for (std::size_t j = 0; j < current.size(); ++j)
                    if (current[j] >= lower && current[j] < upper)
                        refined[j] = estimates[j] + correction(learning.samples.features[j]);
                lower = upper;
            }
            values = refinedDev;
            current = refined;
            std::cout << "  stage: " << meanError(values, devTargets(learning)) << " on dev\n" << std::flush;
        }
    }

    /// What to add to the first stage's estimates where the present ones lie in a range: linear in the
    /// features, and nothing where there are few samples.
    QuadraticFunction ageCorrection(const QuadraticRegression& regression, const Learning& learning,
                                    const std::vector<double>& estimates, const std::vector<double>& current,
                                    double lower, double upper) {
        constexpr double penalty = 60;
        std::vector<std::size_t> chosen;
        std::vector<float> targets, weights;
        for (std::size_t i = 0; i < learning.train; ++i)
            if (current[i] >= lower && current[i] < upper) {
                chosen.push_back(i);
                targets.push_back(learning.samples.targets[i] - static_cast<float>(estimates[i]));
                weights.push_back(learning.samples.weights[i]);
            }
        return regression.linearFit(chosen, targets, weights, penalty);
    }

    std::vector<double> outOfFold(const QuadraticRegression& regression, const Learning& learning,
                                  double penalty) {
        // Samples were drawn at random, so a picture and its mirror image have to be brought together by what
        // they have in common.
        constexpr std::size_t folds = 2;
        std::vector<double> estimates(learning.train);
        for (std::size_t fold = 0; fold < folds; ++fold) {
            std::vector<std::size_t> chosen;
            std::vector<float> targets, weights;
            for (std::size_t i = 0; i < learning.train; ++i)
                if (foldOf(learning.samples.features[i].data()) != fold) {
                    chosen.push_back(i);
                    targets.push_back(learning.samples.targets[i]);
                    weights.push_back(learning.samples.weights[i]);
                }
            const std::vector<float> solution = regression.solve(chosen, targets, weights, penalty);
            for (std::size_t i = 0; i < learning.train; ++i)
                if (foldOf(learning.samples.features[i].data()) == fold)
                    estimates[i] = regression.predict(chosen, solution, i);
        }
        return estimates;
    }

    /// By the picture that the features are of.
    std::size_t foldOf(const float* features) const {
        for (const auto& [key, set] : sets_) {
            const Span all = set.features(K::age, 0);
            const std::ptrdiff_t offset = features - all.data();
            const auto i = static_cast<std::size_t>(offset) / set.dimension(K::age);
            if (std::less_equal<>()(all.data(), features) && i < set.samples.size())
                return set.samples[i].row % 2;
        }
        return 0;
    }

    void lighting() {
        // There are few persons, none of whom is in the dev part: some of the others stand in for it.
        PortraitSet light = set("portraits/light");
        for (std::size_t i = 0; i < light.samples.size(); ++i)
            if (light.samples[i].split == Split::train &&
                Labelled::splitOf(light.rowOf(i).splitKey() + " under light") != Split::train)
                light.samples[i].split = Split::dev;
        const auto data = trainLighting(light, random_);
        const std::filesystem::path file = folder_ / "sphartr.dat";
        std::ofstream stream(file, std::ios::binary);
        Cmp::Portrait::SpharTransformator::write(data, stream);
        if (!stream.flush()) FN_THROW(FNEIOError, file.string() + ": cannot be written");

        const Cmp::Portrait::SpharTransformator transformator(data);
        std::list<FNVector<float>> coefficients;
        FloatSamples train, dev;
        for (std::size_t i = 0; i < light.samples.size(); ++i) {
            const std::optional<bool> frontal = Labelled::frontalLight(light.rowOf(i));
            if (!frontal || light.samples[i].split == Split::test) continue;
            coefficients.push_back(transformator(lightingWindow(light.features(K::lighting, i))));
            (light.samples[i].split == Split::train ? train : dev)
                .add(coefficients.back().span(), *frontal ? 1.0f : -1.0f);
        }
        // Frontal portraits of all kinds have to pass, too.
        const PortraitSet& portraits = set("portraits/mtfl");
        for (std::size_t i = 0; i < portraits.samples.size(); ++i) {
            if (portraits.samples[i].split != Split::dev || portraits.rowOf(i).number("pose") != 0.0)
                continue;
            coefficients.push_back(transformator(lightingWindow(portraits.features(K::lighting, i))));
            dev.add(coefficients.back().span(), 1);
        }
        Learning learning = learningOf(std::move(train), dev, mostSamples, random_);
        balance(learning.samples);
        classifier("ludisc.dat", learning, 9, {1}, {0.75, 0.96, false, -1});
    }

    static constexpr std::size_t mostSamples = 7000;

    TrainingSources sources_;
    std::filesystem::path folder_;
    std::mt19937_64 random_;
    std::map<std::pair<std::string, PortraitViews>, PortraitSet> sets_; ///< of the present step
    std::vector<K> wanted_;                                             ///< by the present step
};

} // namespace

void trainPortrait(const TrainingSources& sources, const std::filesystem::path& folder,
                   const std::string& only) {
    std::filesystem::create_directories(folder);
    PortraitTraining(sources, folder).run(only);
}

} // namespace Train
