#include "train/face_training.h"

#include "eye/cara/combined_cascade.h"
#include "eye/cara/face_pyramid.h"
#include "eye/cara/sod_image.h"
#include "eye/cara/window_geometry.h"
#include "eye/face_finder.h"
#include "eye/gabor/window_convolver.h"
#include "img/scaling_table.h"
#include "train/discriminator_training.h"
#include "train/face_samples.h"
#include "train/working_point.h"

#include <cmath>
#include <cstdio>
#include <functional>
#include <memory>
#include <optional>

namespace Train {
namespace {

using namespace Eye::Cara;
using Eye::Implementation::CascadeSettings;
using Eye::Implementation::SodImage;
using Eye::Implementation::TrainedSvm;
using Image = FNImage<unsigned short>;
using WindowConvolver =
    Impl::FastSpatialGaborConvolver<unsigned short, int, Impl::SpatialGaborConvolverSettings_T8>;
using FinalConvolver =
    Impl::FastSpatialGaborConvolver<unsigned short, int, Impl::SpatialGaborConvolverSettings_T8_FinalDecider>;

constexpr float windowEyeDistance = T8::trainedEyeDistance, finalEyeDistance = T8::finalEyeDistance;
constexpr std::uint32_t windowPixels = 17, finalPixels = 23;

/// The window's scale is at most the root of 4/3 off, and its place half a pixel.
constexpr float windowScale = 0.13f, windowShift = 0.55f;

/// The working points of the configuration; what share of faces passes each.
struct Rotation {
    const char* name;
    float angle;
    std::vector<WorkingStep> disc1B, disc1C, disc2A;
};

const std::vector<WorkingStep> disc1ASteps = {{1, -1.9, 0.999}, {2, -0.6, 0.998}};
const std::vector<WorkingStep> disc3ASteps = {{200, -0.4, 0.985}};
const Rotation rotations[] = {
    {"l",
     -0.23f,
     {{1, -2.1, 0.999}, {2, -0.47, 0.998}, {6, 0.18, 0.995}},
     {{15, -0.82, 0.995}, {40, -0.56, 0.992}, {300, 0.38, 0.985}},
     {{200, -0.18, 0.975}}},
    {"c",
     0.0f,
     {{1, -2.0, 0.999}, {2, -0.5, 0.998}, {6, 0.22, 0.995}},
     {{15, -0.78, 0.995}, {40, -0.55, 0.992}, {300, 0.36, 0.985}},
     {{200, -0.23, 0.975}}},
    {"r",
     0.23f,
     {{1, -2.15, 0.999}, {2, -0.55, 0.998}, {6, 0.12, 0.995}},
     {{15, -0.72, 0.995}, {40, -0.56, 0.992}, {300, 0.32, 0.985}},
     {{200, -0.21, 0.975}}},
};
constexpr float rotationSpread = 0.16f;

/// A level of a picture with its border, as the finder scans it.
struct ScannedLevel {
    Img::ScaledImage<unsigned short> bordered;
    SodImage sods;
    float eyeDistance;
};

template <class Visit> void forEachLevel(const Image& image, Visit visit) {
    const double largest = std::max(2.0, image.w() * 0.5);
    const std::list<float> scales = Img::createScalingTable(
        windowEyeDistance, T8::scaleStepRoot, windowEyeDistance, std::max(largest, 8.0), 0.0, true);
    const T8::Pyramid pyramid(image, scales.front(), scales.size());
    for (const auto& level : pyramid) {
        const auto bordered = T8::addBorder(level, FaceFinder::everywhere);
        visit(ScannedLevel{bordered, SodImage(bordered.image),
                           windowEyeDistance * averageEffectiveFactor(level)});
    }
}

/// Collects a random sample of bounded size (reservoir sampling, Vitter 1985).
class Reservoir {
public:
    Reservoir(std::size_t most, Random& random) : most_(most), random_(random) {}

    template <class Make> void offer(Make make) {
        ++seen_;
        if (vectors_.size() < most_) {
            vectors_.push_back(make());
        } else if (const std::size_t at = random_() % seen_; at < most_) {
            vectors_[at] = make();
        }
    }
    std::size_t seen() const { return seen_; }
    const std::vector<Signs>& vectors() const { return vectors_; }

private:
    std::size_t most_, seen_ = 0;
    Random& random_;
    std::vector<Signs> vectors_;
};

/// A place where a window of the scan lies on a picture without a face, or away from its face.
struct Place {
    const Scenery& scenery;
    const ScannedLevel& level;
    std::uint32_t x, y; ///< of the window in the level's grid

    FNGridPos gridPos() const { return {static_cast<std::int32_t>(x), static_cast<std::int32_t>(y)}; }
    FNPos centre() const {
        return level.bordered.mapping(
            {static_cast<float>(x) + T8::windowCentre, static_cast<float>(y) + T8::windowCentre});
    }
};

/// How much more than in use the last stage lets through where the final test learns.
constexpr double relaxed = 0.35;

std::vector<WorkingStep> relaxedSteps(std::vector<WorkingStep> steps) {
    for (WorkingStep& step : steps) step.threshold -= relaxed;
    return steps;
}

/// What a window passes on its way to the final test, for one rotation.
struct TrainedRotation {
    float angle;
    T8::SodDotDiscriminator disc1B;
    T8::SodPolynomialDiscriminator disc1C;
    T8::GaborDiscriminator disc2A;
};

class FaceTraining {
public:
    FaceTraining(const std::filesystem::path& data, const std::filesystem::path& out, std::uint64_t seed)
        : data_(data), out_(out), random_(seed) {}

    void run() {
        constexpr std::size_t mostFaces = 14000, mostDevFaces = 3000, mostSurroundings = 2500;
        faces_ = loadFaces(data_, Labelled::Split::train, mostFaces, random_);
        devFaces_ = loadFaces(data_, Labelled::Split::dev, mostDevFaces, random_);
        sceneries_ = loadSceneries(data_, Labelled::Split::train, mostSurroundings, random_);
        std::printf(
            "%zu faces to learn from, %zu to set working points, %zu pictures to learn what is none\n",
            faces_.size(), devFaces_.size(), sceneries_.size());
        trainFirst();
        for (const Rotation& rotation : rotations) trainRotation(rotation);
        trainFinal();
    }

private:
    using Accept = std::function<bool(const Signs& window)>;

    std::vector<Signs> sods(const std::vector<FacePicture>& faces, const Jitter& jitter, int copies) {
        std::vector<Signs> vectors;
        for (int copy = 0; copy < copies; ++copy)
            for (const FacePicture& face : faces)
                vectors.push_back(SodImage(facePatch(face, windowPixels, windowEyeDistance, jitter, random_))
                                      .trainedWindow(0, 0));
        return vectors;
    }

    /// Visits the windows without a face that `accept` lets through, of all pictures.
    /// @param skip look at one window of so many
    template <class Visit> void forEachBackground(std::size_t skip, const Accept& accept, Visit visit) {
        Signs window(SodImage::windowBits);
        unsigned char* const bytes = window.exclusiveBytes();
        std::size_t visited = 0, passed = 0;
        for (const Scenery& scenery : sceneries_)
            forEachLevel(scenery.image, [&](const ScannedLevel& level) {
                for (std::uint32_t y = 0; y < level.sods.gridHeight(); ++y)
                    for (std::uint32_t x = 0; x < level.sods.gridWidth(); ++x) {
                        if (skip > 1 && random_() % skip != 0) continue;
                        const Place place{scenery, level, x, y};
                        level.sods.getWindow(x, y, bytes);
                        ++visited;
                        if (!accept(window) || scenery.showsFace(place.centre(), level.eyeDistance)) continue;
                        ++passed;
                        visit(place);
                    }
            });
        std::printf("  %zu of %zu background windows pass (%.4f %%)\n", passed, visited,
                    100.0 * static_cast<double>(passed) / static_cast<double>(visited));
        std::fflush(stdout);
    }

    /// Windows that pass `accept`, in trained order.
    std::vector<Signs> mineSods(std::size_t most, std::size_t skip, const Accept& accept) {
        Reservoir reservoir(most, random_);
        forEachBackground(skip, accept, [&](const Place& place) {
            reservoir.offer([&] { return place.level.sods.trainedWindow(place.x, place.y); });
        });
        return reservoir.vectors();
    }

    static SignSet join(const std::vector<Signs>& faces, const std::vector<Signs>& others) {
        SignSet set;
        for (const Signs& vector : faces) set.add(vector, true);
        for (const Signs& vector : others) set.add(vector, false);
        return set;
    }

    void trainFirst() {
        const Jitter jitter{0, 0.36f, windowShift, windowScale};
        const SignSet set =
            join(sods(faces_, jitter, 2), mineSods(60000, 40, [](const Signs&) { return true; }));
        TrainedSvm svm = trainDot(set, 2, random_);
        setWorkingPoint(svm, sods(devFaces_, jitter, 2), disc1ASteps);
        save(svm, out_ / "is1717da.dat");
        first_ = std::make_unique<T8::SodDotDiscriminator>(svm, settingsOf("is1717da.dat", disc1ASteps));
    }

    void trainRotation(const Rotation& rotation) {
        const std::string name = rotation.name;
        const Jitter jitter{rotation.angle, rotationSpread, windowShift, windowScale};
        const std::vector<Signs> faces = sods(faces_, jitter, 2), devFaces = sods(devFaces_, jitter, 2);
        float score;

        const Accept passesA = [&](const Signs& window) { return (*first_)(window, score); };
        TrainedSvm svmB = trainDot(join(faces, mineSods(60000, 8, passesA)), 6, random_);
        setWorkingPoint(svmB, devFaces, rotation.disc1B);
        save(svmB, out_ / ("is1717d" + name + ".dat"));
        const T8::SodDotDiscriminator discB(svmB, settingsOf("B", rotation.disc1B));

        const Accept passesB = [&](const Signs& window) { return passesA(window) && discB(window, score); };
        std::vector<Signs> others = mineSods(30000, 2, passesB);
        TrainedSvm svmC = trainC(rotation, faces, devFaces, others);
        // A second round against what the first one lets through.
        const T8::SodPolynomialDiscriminator firstC(svmC, settingsOf("C", rotation.disc1C));
        const Accept passesC = [&](const Signs& window) { return passesB(window) && firstC(window, score); };
        const std::vector<Signs> hard = mineSods(20000, 1, passesC);
        others.insert(others.end(), hard.begin(), hard.end());
        svmC = trainC(rotation, faces, devFaces, others);
        save(svmC, out_ / ("is1717f" + name + ".dat"));
        const T8::SodPolynomialDiscriminator discC(svmC, settingsOf("C", rotation.disc1C));

        const Accept passesAll = [&](const Signs& window) { return passesB(window) && discC(window, score); };
        TrainedSvm svm2 = growPolynomial(join(gaborSigns(faces_, jitter, 2), mineGabor(20000, passesAll)),
                                         {{200}, 0.1f}, random_);
        setWorkingPoint(svm2, gaborSigns(devFaces_, jitter, 2), rotation.disc2A);
        save(svm2, out_ / ("gs1717f" + name + ".dat"));
        rotations_.push_back({rotation.angle, discB, discC,
                              T8::GaborDiscriminator(svm2, settingsOf("2A", relaxedSteps(rotation.disc2A)))});
    }

    /// What passes the stages of a rotation on background, the last one nearly, as the final test sees it.
    /// @param most so many at random
    std::vector<Signs> mineFinal(std::size_t most) {
        const WindowConvolver convolver;
        Reservoir reservoir(most, random_);
        Signs window(SodImage::windowBits);
        float score;
        const Accept passesA = [&](const Signs& sods) { return (*first_)(sods, score); };
        forEachBackground(1, passesA, [&](const Place& place) {
            place.level.sods.getWindow(place.x, place.y, window.exclusiveBytes());
            std::optional<Signs> gabor;
            for (const TrainedRotation& rotation : rotations_) {
                if (!rotation.disc1B(window, score) || !rotation.disc1C(window, score)) continue;
                if (!gabor) gabor = convolver.getGaborSODs(place.level.bordered.image, place.gridPos());
                if (rotation.disc2A(*gabor, score))
                    reservoir.offer([&] {
                        return finalSigns(place.scenery.image, place.centre(), place.level.eyeDistance,
                                          rotation.angle);
                    });
            }
        });
        std::printf("  %zu background windows come to the final test\n", reservoir.seen());
        return reservoir.vectors();
    }

    Signs finalSigns(const Image& image, FNPos centre, float eyeDistance, float angle) const {
        const float side = eyeDistance * static_cast<float>(finalPixels) / finalEyeDistance;
        const FNPos u = FNPos{std::cos(angle), std::sin(angle)} * side, v{-u.y, u.x};
        Image patch(finalPixels, finalPixels);
        Img::Affine::transform(image, patch, centre - u / 2.0f - v / 2.0f, u, v, true, 0);
        return finalConvolver_.getGaborSODs(patch, {0, 0});
    }

    TrainedSvm trainC(const Rotation& rotation, const std::vector<Signs>& faces,
                      const std::vector<Signs>& devFaces, const std::vector<Signs>& others) {
        TrainedSvm svm = growPolynomial(join(faces, others), {{15, 40, 300}, 0.1f}, random_);
        std::vector<Signs> windows = faces;
        windows.insert(windows.end(), others.begin(), others.end());
        setWorkingPoints(svm, devFaces, rotation.disc1C, windows);
        return svm;
    }

    std::vector<Signs> gaborSigns(const std::vector<FacePicture>& faces, const Jitter& jitter, int copies) {
        const WindowConvolver convolver;
        std::vector<Signs> vectors;
        for (int copy = 0; copy < copies; ++copy)
            for (const FacePicture& face : faces)
                vectors.push_back(convolver.getGaborSODs(
                    facePatch(face, windowPixels, windowEyeDistance, jitter, random_), {0, 0}));
        return vectors;
    }

    std::vector<Signs> mineGabor(std::size_t most, const Accept& accept) {
        const WindowConvolver convolver;
        Reservoir reservoir(most, random_);
        forEachBackground(1, accept, [&](const Place& place) {
            reservoir.offer(
                [&] { return convolver.getGaborSODs(place.level.bordered.image, place.gridPos()); });
        });
        return reservoir.vectors();
    }

    std::vector<Signs> finalFaces(const std::vector<FacePicture>& faces, int copies) {
        // Clusters sit closer to the face than single windows.
        const Jitter jitter{0, 0.12f, 0.45f, 0.1f};
        std::vector<Signs> vectors;
        for (int copy = 0; copy < copies; ++copy)
            for (const FacePicture& face : faces)
                vectors.push_back(finalConvolver_.getGaborSODs(
                    facePatch(face, finalPixels, finalEyeDistance, jitter, random_), {0, 0}));
        return vectors;
    }

    void trainFinal() {
        constexpr std::size_t mostOthers = 80000;
        constexpr double sureFaces =
            2; // brings most faces above 0, where the tracker trusts them without eyes
        const std::vector<Signs> faces = finalFaces(faces_, 2), devFaces = finalFaces(devFaces_, 2);
        TrainedSvm svm = growPolynomial(join(faces, mineFinal(mostOthers)), {{200}, 0.1f}, random_);
        setWorkingPoint(svm, devFaces, disc3ASteps);
        spreadScores(svm, disc3ASteps.back().threshold, sureFaces);
        save(svm, out_ / "gs2323fc.dat");
    }

    std::filesystem::path data_, out_;
    Random random_;
    FinalConvolver finalConvolver_;
    std::vector<TrainedRotation> rotations_;
    std::vector<FacePicture> faces_, devFaces_;
    std::vector<Scenery> sceneries_;
    std::unique_ptr<T8::SodDotDiscriminator> first_;
};

} // namespace

void trainFaceFinder(const std::filesystem::path& data, const std::filesystem::path& out,
                     std::uint64_t seed) {
    std::filesystem::create_directories(out);
    FaceTraining(data, out, seed).run();
}

} // namespace Train
