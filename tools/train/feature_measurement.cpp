#include "train/feature_measurement.h"

#include "eye/boca/mouth_finder.h"
#include "eye/ojo/eyes_finder.h"
#include "eye/raiz/bridge_finder.h"
#include "fn/deployment/app_config_db.h"
#include "fn/image_reference.h"
#include "fn/image_representation.h"
#include "train/face_samples.h"
#include "train/feature_samples.h"

#include <algorithm>
#include <cstdio>
#include <numeric>
#include <string>

namespace Train {
namespace {

using namespace Fn::Deployment;

/// The finder with its default settings, but for its folder and those given.
template <class Finder>
Finder finderWith(const std::filesystem::path& folder, const std::string& choice = "") {
    const FNCountedPtr<AppConfigDB> db(new AppVolatileConfigDB);
    db->set("F.TemplatePath", folder.string());
    if (!choice.empty()) db->set("F.DiscSettings", choice);
    return Finder(Component(db, Property(type<Finder>(), "F", "", "", false)));
}

/// Errors in eye distances, and how many faces there were.
class Errors {
public:
    void add(bool found, float error) {
        ++faces_;
        if (found) errors_.push_back(error);
    }
    void print(const std::string& what) {
        if (errors_.empty()) return;
        std::sort(errors_.begin(), errors_.end());
        const auto share = [&](std::size_t n) {
            return 100.0 * static_cast<double>(n) / static_cast<double>(faces_);
        };
        std::printf("%-34s %5zu faces, found %6.2f %%, below 0.05: %5.2f %%, 0.10: %5.2f %%, 0.25: %5.2f %%, "
                    "median %.4f, mean %.4f\n",
                    what.c_str(), faces_, share(errors_.size()), share(below(0.05f)), share(below(0.10f)),
                    share(below(0.25f)), errors_[errors_.size() / 2],
                    std::accumulate(errors_.begin(), errors_.end(), 0.0) /
                        static_cast<double>(errors_.size()));
    }

private:
    std::size_t below(float limit) const {
        return static_cast<std::size_t>(std::lower_bound(errors_.begin(), errors_.end(), limit) -
                                        errors_.begin());
    }

    std::size_t faces_ = 0;
    std::vector<float> errors_;
};

/// The larger error of the two eyes.
float worstError(const LabelledFace& face, const FacialFeatureLocation& first,
                 const FacialFeatureLocation& second) {
    return std::max(length(first.pos - face.leftEye), length(second.pos - face.rightEye)) /
           face.eyeDistance();
}

void measureEyes(const std::vector<LabelledFace>& faces, const EyesFinder::Body& finder,
                 const std::string& what, std::uint64_t seed) {
    Random random(seed);
    Errors all, byHand, again;
    for (const LabelledFace& face : faces) {
        const FNImageReference image = FNImageReferenceFactory::create(face.image);
        bool foundFirst, foundSecond;
        FacialFeatureLocation first, second;
        finder.find(jitteredFace(face, random), image, foundFirst, first, foundSecond, second);
        const bool found = foundFirst && foundSecond;
        const float error = worstError(face, first, second);
        all.add(found, error);
        if (face.byHand) byHand.add(found, error);
        if (!found) continue;
        finder.find(first, second, image, foundFirst, first, foundSecond, second);
        again.add(foundFirst && foundSecond, worstError(face, first, second));
    }
    all.print(what + ", worst of both");
    byHand.print(what + ", labels by hand");
    again.print(what + ", again around them");
}

/// How often both eyes are seen where there is no face.
void measureBackgrounds(const std::vector<FNImage<unsigned short>>& backgrounds,
                        const EyesFinder::Body& finder, const std::string& what) {
    constexpr float eyeDistances[] = {20, 40};
    std::size_t places = 0, seen = 0;
    for (const FNImage<unsigned short>& background : backgrounds)
        for (const float distance : eyeDistances) {
            const FNPos middle{static_cast<float>(background.w()) / 2,
                               static_cast<float>(background.h()) / 2};
            bool foundFirst, foundSecond;
            FacialFeatureLocation first, second;
            finder.find({middle, distance, 0, 0}, FNImageReferenceFactory::create(background), foundFirst,
                        first, foundSecond, second);
            ++places;
            seen += foundFirst && foundSecond;
        }
    std::printf("%s, on background: seen at %zu of %zu places\n", what.c_str(), seen, places);
}

template <class Finder>
void measureFeature(const std::vector<LabelledFace>& faces, const Finder& finder,
                    std::optional<FNPos> LabelledFace::*feature, const std::string& what,
                    std::uint64_t seed) {
    Random random(seed);
    Errors errors;
    for (const LabelledFace& face : faces) {
        if (!(face.*feature)) continue;
        const EyePair eyes = jitteredEyes(face, random);
        FacialFeatureLocation result;
        const bool found =
            finder.find(eyes.first, eyes.second, FNImageReferenceFactory::create(face.image), result);
        errors.add(found, length(result.pos - *(face.*feature)) / face.eyeDistance());
    }
    errors.print(what);
}

} // namespace

void measureFeatureFinders(const std::filesystem::path& data, const std::filesystem::path& etc,
                           std::uint64_t seed) {
    constexpr std::size_t mostFaces = 3000;
    Random random(seed);
    const std::vector<LabelledFace> faces =
        loadLabelledFaces(data, Labelled::Split::test, mostFaces, 0, random);
    const auto backgrounds = loadBackgrounds(data, Labelled::Split::test);
    for (const char* const choice : {"Strict", "Tolerant"}) {
        const auto finder = finderWith<Eye::Ojo::T8::EyesFinder>(etc / "ojo", choice);
        const std::string what = std::string("eyes, ") + choice;
        measureEyes(faces, finder, what, seed);
        measureBackgrounds(backgrounds, finder, what);
    }
    measureFeature(faces, finderWith<Eye::Boca::MouthFinder>(etc / "boca"), &LabelledFace::mouth, "mouth",
                   seed);
    measureFeature(faces, finderWith<Eye::Raiz::BridgeFinder>(etc / "raiz"), &LabelledFace::bridge,
                   "nose bridge", seed);
}

} // namespace Train
