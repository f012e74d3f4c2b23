#include "train/feature_training.h"

#include "eye/boca/mouth_scan.h"
#include "eye/ojo/feature_search.h"
#include "eye/raiz/bridge_scan.h"
#include "train/discriminator_training.h"
#include "train/feature_samples.h"
#include "train/position_tuning.h"
#include "train/working_point.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <functional>
#include <limits>
#include <map>

namespace Train {
namespace {

using namespace Eye::Ojo::T8;
using Eye::Implementation::TrainedSvm;

/// How a feature is learned.
struct FeatureSettings {
    std::vector<WorkingStep> steps; ///< the thresholds are those of the finder's default settings
    /// Distances from the labelled place, in pixels of the level: nearer windows are the feature, farther
    /// ones are not, and those between are not learned. They follow how exactly the place is defined.
    float nearEnough, farEnough;
    /// What lies farther than this is another thing, not the feature's own surroundings.
    float elsewhere;
    float errorScale; ///< of the tuning, eye distances
};

/// The median score of the feature above the threshold. The place that is found is a mean of windows weighted
/// with the exponential of their scores: with a greater spread, the best one alone would decide.
constexpr double mostSpread = 0.5;

/// How much more a label by hand counts than one of the automatic annotator.
constexpr float handWeight = 3;

/// An area to search, and what is there.
struct Target {
    SearchArea area;
    FNPos truth;
    float eyeDistance;
};
using Targets = std::function<std::vector<Target>(const LabelledFace&, Random&)>;

/// Brings windows from the layout of the scan to the order in which machines are trained.
template <class Layout> class TrainedOrder {
public:
    explicit TrainedOrder(std::uint32_t size) {
        for (std::uint32_t i = 0; i < size; ++i) {
            Signs single(size);
            single.exclusiveBytes()[i / 8] = static_cast<unsigned char>(1 << i % 8);
            const Signs placed = Layout::convert(single, 0);
            std::uint32_t place = 0;
            while (placed[place] < 0) ++place;
            places_.push_back(place);
        }
    }
    Signs operator()(const Signs& window) const {
        Fn::SVVectorSequentialBuilder<int> builder(static_cast<std::uint32_t>(places_.size()));
        for (const std::uint32_t place : places_) builder.setNextSign(window[place] > 0);
        return builder.vector();
    }

private:
    std::vector<std::uint32_t> places_;
};

/// A window in the layout of the scan.
struct Window {
    Signs signs;
    float distance = 0; ///< from the labelled place, pixels of the level
    bool rightScale = false;
};

/// Keeps the windows of the greatest rank.
class Hardest {
public:
    static constexpr float ignored = -std::numeric_limits<float>::infinity();

    explicit Hardest(std::size_t most) : most_(most) {}
    void offer(const Window& window, float rank) {
        if (rank == ignored) return;
        windows_.emplace(rank, window);
        if (windows_.size() > most_) windows_.erase(windows_.begin());
    }
    const std::multimap<float, Window>& windows() const { return windows_; }

private:
    std::size_t most_;
    std::multimap<float, Window> windows_;
};

template <class Scan> class FeatureTraining {
public:
    FeatureTraining(const Targets& targets, const FeatureSettings& settings, std::uint64_t seed)
        : targets_(targets), settings_(settings), random_(seed) {}

    TrainedSvm run(const std::filesystem::path& data) {
        constexpr std::size_t mostFaces = 14000, mostDevFaces = 2500;
        constexpr double smallShare = 0.3;
        constexpr std::size_t vectorsOfRounds[] = {60, 120}, vectorsThatTell = 150;
        faces_ = loadLabelledFaces(data, Labelled::Split::train, mostFaces, smallShare, random_);
        devFaces_ = loadLabelledFaces(data, Labelled::Split::dev, mostDevFaces, smallShare, random_);
        collect(2, [&](const Signs&) { return static_cast<float>(random_() >> 40); });
        for (const std::size_t vectors : vectorsOfRounds) {
            const Discriminator discriminator(grown(vectors), {"round", {}});
            const float threshold = static_cast<float>(settings_.steps.back().threshold) - 0.5f;
            collect(2, [&](const Signs& window) {
                float score;
                discriminator(window, score);
                return score > threshold ? score : Hardest::ignored;
            });
        }
        return tuned(grown(vectorsThatTell));
    }

    /// The machine and more vectors that bring the place that is found to the label.
    TrainedSvm tuned(const TrainedSvm& machine) {
        PositionTuning tuning(machine, settings_.steps.back().vectors, settings_.errorScale);
        for (const LabelledFace& face : faces_)
            for (const Target& target : targets_(face, random_)) {
                std::vector<SearchedWindow> windows;
                forEachWindow<Scan>(
                    face.image, target.area, [&](const Signs& signs, FNPos centre, float size) {
                        windows.push_back({trainedOrder_(signs), (centre - target.truth) / target.eyeDistance,
                                           2 * std::log(size)});
                    });
                tuning.add(windows, face.byHand ? handWeight : 1.0f);
            }
        return tuning.tuned(bestWindows(machine), settings_.steps, random_);
    }

private:
    using Search = FeatureSearch<Scan>;
    using Layout = typename Search::Layout;
    using Discriminator = typename Search::Discriminator;

    TrainedSvm grown(std::size_t vectors) {
        GrowthSettings settings;
        std::vector<WorkingStep> steps = settings_.steps;
        steps.back().vectors = vectors;
        for (const WorkingStep& step : steps) settings.groups.push_back(step.vectors);
        TrainedSvm svm = growPolynomial(set_, settings, random_);
        const std::vector<Signs> dev = bestWindows(svm);
        setWorkingPoint(svm, dev, steps);
        limitSpread(svm, dev);
        return svm;
    }

    /// Brings scores closer to the last threshold, if need be; what passes there stays the same.
    void limitSpread(TrainedSvm& svm, const std::vector<Signs>& dev) const {
        const double threshold = settings_.steps.back().threshold;
        std::vector<double> scores;
        for (const Signs& window : dev) scores.push_back(svm.evaluate(window));
        const auto middle = scores.begin() + static_cast<std::ptrdiff_t>(scores.size() / 2);
        std::nth_element(scores.begin(), middle, scores.end());
        const double gain = mostSpread / (*middle - threshold);
        if (gain < 1) spreadScores(svm, threshold, gain);
    }

    /// Of the eye distances that the levels of a target's area stand for, the one that fits its face best.
    static float bestSize(const Target& target) {
        const auto [origin, u, v] = target.area;
        constexpr float pixels = static_cast<float>(Scan::patchWidth * Scan::patchHeight);
        const float unscaled = trainedEyeSize * std::sqrt(std::abs(u.x * v.y - u.y * v.x) / pixels);
        const auto misfit = [&](float factor) {
            return std::abs(std::log(unscaled * factor / target.eyeDistance));
        };
        return unscaled * *std::min_element(Scan::scaleFactors.begin(), Scan::scaleFactors.end(),
                                            [&](float a, float b) { return misfit(a) < misfit(b); });
    }

    template <class Visit>
    static void forEachWindowOf(const LabelledFace& face, const Target& target, Visit visit) {
        const float best = bestSize(target);
        forEachWindow<Scan>(face.image, target.area, [&](const Signs& signs, FNPos centre, float size) {
            visit(Window{signs, length(centre - target.truth) * trainedEyeSize / size,
                         std::abs(size / best - 1) < 0.01f});
        });
    }

    /// Adds windows at the labelled places, and of those away from them the ones with the greatest rank, up
    /// to `most` around each feature and as many elsewhere.
    void collect(std::size_t most, const std::function<float(const Signs&)>& rank) {
        const std::size_t before = set_.size();
        for (const LabelledFace& face : faces_)
            for (const Target& target : targets_(face, random_)) {
                Hardest around(most), others(most);
                forEachWindowOf(face, target, [&](const Window& window) {
                    if (window.rightScale && window.distance < settings_.nearEnough)
                        set_.add(trainedOrder_(window.signs), true);
                    else if (window.distance > settings_.farEnough)
                        (window.distance < settings_.elsewhere ? around : others)
                            .offer(window, rank(window.signs));
                });
                for (const Hardest* const hardest : {&around, &others})
                    for (const auto& [r, window] : hardest->windows())
                        set_.add(trainedOrder_(window.signs), false);
            }
        std::printf("  %zu windows more, %zu in all\n", set_.size() - before, set_.size());
        std::fflush(stdout);
    }

    /// The window with the highest score at each labelled place of the dev split: as the finder takes the
    /// best one, it is enough that this one passes.
    std::vector<Signs> bestWindows(const TrainedSvm& svm) {
        std::vector<Signs> windows;
        for (const LabelledFace& face : devFaces_)
            for (const Target& target : targets_(face, random_)) {
                Signs best;
                double bestScore = -std::numeric_limits<double>::infinity();
                forEachWindowOf(face, target, [&](const Window& window) {
                    if (!window.rightScale || window.distance > settings_.farEnough) return;
                    const Signs trained = trainedOrder_(window.signs);
                    if (const double score = svm.evaluate(trained); score > bestScore) {
                        best = trained;
                        bestScore = score;
                    }
                });
                if (best.size() != 0) windows.push_back(best);
            }
        return windows;
    }

    Targets targets_;
    FeatureSettings settings_;
    Random random_;
    TrainedOrder<Layout> trainedOrder_{static_cast<std::uint32_t>(
        Eye::Implementation::GSodConversion::trainedSize(Scan::columns, Scan::rows, 6))};
    std::vector<LabelledFace> faces_, devFaces_;
    SignSet set_;
};

std::vector<Target> eyeTargets(const LabelledFace& face, Random& random) {
    const EyeSearchAreas areas = EyeSearchAreas::of(jitteredFace(face, random));
    return {{areas.first, face.leftEye, face.eyeDistance()},
            {areas.second, face.rightEye, face.eyeDistance()}};
}

/// One area, mirrored at random.
std::vector<Target> placedTarget(const LabelledFace& face, const std::optional<FNPos>& feature,
                                 const Placement& placement, Random& random) {
    if (!feature) return {};
    const EyePair eyes = jitteredEyes(face, random);
    SearchArea area = placement.area(eyes.first.pos, eyes.second.pos);
    if (random() % 2 == 0) area = {area.origin + area.u, -area.u, area.v};
    return {{area, *feature, face.eyeDistance()}};
}

template <class Scan>
void train(const std::filesystem::path& data, const std::filesystem::path& out, const char* file,
           const Targets& targets, const FeatureSettings& settings, std::uint64_t seed) {
    std::filesystem::create_directories(out);
    save(FeatureTraining<Scan>(targets, settings, seed).run(data), out / file);
}

} // namespace

void trainEyesFinder(const std::filesystem::path& data, const std::filesystem::path& out,
                     std::uint64_t seed) {
    train<EyeScan>(data, out, "eyedisc.dat", eyeTargets,
                   {{{5, -1.27, 0.995}, {300, -0.34, 0.985}}, 0.75f, 2.0f, 4.0f, 0.05f}, seed);
}

void trainMouthFinder(const std::filesystem::path& data, const std::filesystem::path& out,
                      std::uint64_t seed) {
    using Scan = Eye::Boca::MouthScan;
    const auto targets = [](const LabelledFace& face, Random& random) {
        return placedTarget(face, face.mouth, Scan::placement, random);
    };
    train<Scan>(data, out, "mouthdisc.dat", targets, {{{300, -1.3, 0.99}}, 1.25f, 3.5f, 6.0f, 0.10f}, seed);
}

void trainBridgeFinder(const std::filesystem::path& data, const std::filesystem::path& out,
                       std::uint64_t seed) {
    using Scan = Eye::Raiz::BridgeScan;
    const auto targets = [](const LabelledFace& face, Random& random) {
        return placedTarget(face, face.bridge, Scan::placement, random);
    };
    train<Scan>(data, out, "bridgedisc.dat", targets, {{{300, -0.87, 0.985}}, 0.75f, 2.0f, 4.0f, 0.05f},
                seed);
}

} // namespace Train
