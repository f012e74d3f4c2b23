#include "train/portrait_samples.h"

#include "cmp/reshape.h"
#include "fn/imagefile/image_file.h"
#include "img/affine/transform.h"
#include "img/affine/turns.h"
#include "labelled/found_eyes.h"
#include "labelled/portrait_truth.h"
#include "train/sign_matrix.h"

#include <fstream>
#include <iostream>
#include <random>

namespace Train {
namespace {

using namespace Cmp::Portrait;
using Values = std::vector<float>;

constexpr float leastEyeDistance = 16;

void append(Values& values, const FNVector<float>& vector) {
    values.insert(values.end(), vector.begin(), vector.end());
}

/// A portrait and what has been made of it.
class Extraction {
public:
    Extraction(const PortraitFeatures& features, const Cmp::Face& face) : features_(features), face_(face) {}

    Values operator()(PortraitKind kind) {
        using Eye = PortraitFeatures::Eye;
        Values values;
        switch (kind) {
        case PortraitKind::glasses:
            append(values, features_.glasses(standard()));
            break;
        case PortraitKind::pose:
            append(values, features_.pose(standard()));
            break;
        case PortraitKind::mouth:
            append(values, features_.mouth(standard()));
            break;
        case PortraitKind::head:
            append(values, features_.head(standard()));
            break;
        case PortraitKind::closedEyes:
            for (const Eye eye : {Eye::eye0, Eye::eye1}) append(values, features_.closedEye(standard(), eye));
            break;
        case PortraitKind::gazeAway:
            for (const Eye eye : {Eye::eye0, Eye::eye1}) append(values, features_.gazeAway(standard(), eye));
            break;
        case PortraitKind::gender:
            append(values, features_.genderOrAge(portraitOf(face_, genderPortrait)));
            break;
        case PortraitKind::age:
            append(values, features_.genderOrAge(portraitOf(face_, agePortrait)));
            break;
        case PortraitKind::ethnicity:
            append(values, features_.ethnicity(portraitOf(face_, ethnicityPortrait)));
            break;
        case PortraitKind::lighting: {
            const FNImage<float> window = windowOf(standard(), Window::lighting);
            for (std::uint32_t x = 0; x < window.w(); ++x)
                for (std::uint32_t y = 0; y < window.h(); ++y) values.push_back(window(x, y));
            break;
        }
        case PortraitKind::iris:
            break; // from the labels
        }
        return values;
    }

private:
    const FNImage<float>& standard() {
        if (standard_.empty()) standard_ = portraitOf(face_, standardPortrait);
        return standard_;
    }

    const PortraitFeatures& features_;
    const Cmp::Face& face_;
    FNImage<float> standard_;
};

Values irisOffsets(const Labelled::Row& row, const FNImageReference& image) {
    constexpr float unseen = 2;
    const auto points = Labelled::Points68::of(row);
    if (!points) return {unseen, unseen};
    const FNImage<float> gray = image.toMonoFloat();
    return {points->irisOffset(gray, Labelled::Side::left).value_or(unseen),
            points->irisOffset(gray, Labelled::Side::right).value_or(unseen)};
}

using Eyes = Labelled::EyesAsFound::Eyes;

Cmp::Face faceOf(const FNImageReference& image, const Eyes& eyes) {
    return {image, {eyes.left, 0, 0}, {eyes.right, 0, 0}};
}

/// In the mirrored image.
Cmp::Face mirroredFaceOf(const FNImageReference& image, const Eyes& eyes) {
    const auto w = static_cast<float>(image.w());
    return {Cmp::vertReflection(image),
            {{w - eyes.right.x, eyes.right.y}, 0, 0},
            {{w - eyes.left.x, eyes.left.y}, 0, 0}};
}

Eyes jittered(const Eyes& eyes, Random& random) {
    constexpr float deviation = 0.02f; // of each coordinate, eye distances
    std::normal_distribution<float> normal(0, deviation * length(eyes.right - eyes.left));
    const auto moved = [&](FNPos pos) { return pos + FNPos(normal(random), normal(random)); };
    const FNPos left = moved(eyes.left);
    return {left, moved(eyes.right), false};
}

template <class T> void writeNumber(std::ostream& stream, T value) {
    stream.write(reinterpret_cast<const char*>(&value), sizeof value);
}
template <class T> T readNumber(std::istream& stream) {
    T value{};
    stream.read(reinterpret_cast<char*>(&value), sizeof value);
    return value;
}

} // namespace

/// Fills sets, from the cache where it has them.
class PortraitSampler {
public:
    PortraitSampler(const TrainingSources& sources, const std::string& folder, PortraitViews views)
        : sources_(sources), folder_(folder), further_(views == PortraitViews::further), features_(FNMutex()),
          random_(sources.seed + (further_ ? 1 : 0)) {
        std::filesystem::create_directories(sources.cache);
        set_.rows = Labelled::readLabels(sources.data / folder / "labels.tsv");
    }

    PortraitSet faces(const std::vector<PortraitKind>& kinds, const std::vector<PortraitKind>& wanted,
                      std::size_t most) {
        if (!cached(kinds)) extractFaces(kinds, most);
        set_.samples.clear();
        set_.columns_.clear();
        if (!readCache(wanted))
            FN_THROW(FNEIOError, sources_.cache.string() + ": features that cannot be read back");
        return set_;
    }

    void extractFaces(const std::vector<PortraitKind>& kinds, std::size_t most) {
        clear();
        const Labelled::EyesAsFound find(sources_.etc);
        const std::size_t step = (set_.rows.size() + most - 1) / most;
        for (std::size_t r = 0; r < set_.rows.size(); r += std::max<std::size_t>(step, 1)) {
            const Labelled::Row& row = set_.rows[r];
            const auto left = row.position("eye_left"), right = row.position("eye_right");
            if (!left || !right || right->x - left->x < leastEyeDistance) continue;
            const Labelled::Split split = Labelled::splitOf(row.splitKey());
            if (further_ && split != Labelled::Split::train) continue;
            const Eyes label{*left, *right, false};
            const FNImageReference image = Fn::readImage(row.image().string());
            const Eyes eyes = find(image, *left, *right), moved = jittered(label, random_);
            const bool twice = split == Labelled::Split::train;
            const Values iris = irisOffsets(row, image);
            const auto face = [&](const Eyes& seen, bool mirrored) {
                add({r, split, mirrored, seen.left, seen.right, seen.found},
                    mirrored ? mirroredFaceOf(image, seen) : faceOf(image, seen), kinds, iris);
            };
            face(eyes, further_);
            if (twice) face(moved, !further_);
        }
        writeCache();
    }

    PortraitSet eyePictures() {
        const std::vector<PortraitKind> kinds{PortraitKind::closedEyes};
        if (readCache(kinds)) return set_;
        clear();
        // Where the eye lies in the picture, and how much of its side the patch is, on average.
        constexpr float centreX = 0.5f, centreY = 0.6f, share = 0.66f;
        constexpr int variants = 6;
        std::normal_distribution<float> normal(0, 1);
        for (std::size_t r = 0; r < set_.rows.size(); ++r) {
            const FNImage<float> picture = Fn::readImage(set_.rows[r].image().string()).toMonoFloat();
            const Labelled::Split split = Labelled::splitOf(set_.rows[r].splitKey());
            for (int v = 0; v < (split == Labelled::Split::train ? variants : 1); ++v) {
                const float d = v == 0 ? 0.0f : 1.0f;
                const float size = share * std::exp(0.12f * d * normal(random_));
                const FNPos centre(centreX + 0.04f * d * normal(random_),
                                   centreY + 0.04f * d * normal(random_));
                addEye({r, split, v % 2 == 1, {}, {}, false}, picture, centre, size);
            }
        }
        writeCache();
        return set_;
    }

private:
    void add(const PortraitSample& sample, const Cmp::Face& face, const std::vector<PortraitKind>& kinds,
             const Values& iris) {
        Extraction extract(features_, face);
        set_.samples.push_back(sample);
        for (const PortraitKind kind : kinds) {
            const Values values = kind != PortraitKind::iris ? extract(kind)
                                  : sample.mirrored          ? Values{-iris[1], -iris[0]}
                                                             : iris;
            append(kind, values);
        }
    }

    void addEye(const PortraitSample& sample, const FNImage<float>& picture, FNPos centre, float size) {
        constexpr std::uint32_t side = 16;
        const float pixels = static_cast<float>(picture.w());
        FNImage<float> patch(side, side);
        const FNPos corner = (centre - FNPos(size, size) / 2.0f) * pixels;
        Img::Affine::transform(picture, patch, corner, FNPos(size * pixels, 0), FNPos(0, size * pixels), true,
                               0.0f);
        if (sample.mirrored) patch = Img::Affine::vertReflection(patch, patch.box());
        const FNVector<float> features = ClosedEyeFeatureExtractor().extract(patch);
        set_.samples.push_back(sample);
        append(PortraitKind::closedEyes, Values(features.begin(), features.end()));
    }

    void append(PortraitKind kind, const Values& values) {
        PortraitSet::Columns& columns = set_.columns_[kind];
        columns.dimension = values.size();
        columns.values.insert(columns.values.end(), values.begin(), values.end());
    }

    void clear() {
        std::cout << "extracting from " << folder_ << "\n" << std::flush;
        set_.samples.clear();
        set_.columns_.clear();
    }

    std::filesystem::path file(const std::string& what) const {
        const std::string views = further_ ? ".further." : ".";
        std::string name = folder_ + views + std::to_string(sources_.seed) + "." + what;
        std::replace(name.begin(), name.end(), '/', '-');
        return sources_.cache / name;
    }
    static std::string nameOf(PortraitKind kind) { return "kind" + std::to_string(static_cast<int>(kind)); }

    bool cached(const std::vector<PortraitKind>& kinds) const {
        return std::filesystem::exists(file("samples")) &&
               std::all_of(kinds.begin(), kinds.end(),
                           [&](PortraitKind kind) { return std::filesystem::exists(file(nameOf(kind))); });
    }

    bool readCache(const std::vector<PortraitKind>& kinds) {
        std::ifstream samples(file("samples"), std::ios::binary);
        const auto n = readNumber<std::uint64_t>(samples);
        for (std::size_t i = 0; i < n && samples; ++i) {
            PortraitSample sample{};
            sample.row = readNumber<std::uint64_t>(samples);
            sample.split = readNumber<Labelled::Split>(samples);
            sample.mirrored = readNumber<bool>(samples);
            sample.leftEye = readNumber<FNPos>(samples);
            sample.rightEye = readNumber<FNPos>(samples);
            sample.found = readNumber<bool>(samples);
            set_.samples.push_back(sample);
        }
        if (!samples || n == 0) return false;
        for (const PortraitKind kind : kinds) {
            std::ifstream stream(file(nameOf(kind)), std::ios::binary);
            PortraitSet::Columns columns;
            columns.dimension = readNumber<std::uint64_t>(stream);
            if (!stream) return false;
            columns.values.resize(columns.dimension * n);
            stream.read(reinterpret_cast<char*>(columns.values.data()),
                        static_cast<std::streamsize>(columns.values.size() * sizeof(float)));
            if (!stream) return false;
            set_.columns_[kind] = std::move(columns);
        }
        return true;
    }

    void writeCache() const {
        for (const auto& [kind, columns] : set_.columns_) {
            std::ofstream stream(file(nameOf(kind)), std::ios::binary);
            writeNumber(stream, std::uint64_t{columns.dimension});
            stream.write(reinterpret_cast<const char*>(columns.values.data()),
                         static_cast<std::streamsize>(columns.values.size() * sizeof(float)));
        }
        std::ofstream samples(file("samples"), std::ios::binary);
        writeNumber(samples, std::uint64_t{set_.samples.size()});
        for (const PortraitSample& sample : set_.samples) {
            writeNumber(samples, std::uint64_t{sample.row});
            writeNumber(samples, sample.split);
            writeNumber(samples, sample.mirrored);
            writeNumber(samples, sample.leftEye);
            writeNumber(samples, sample.rightEye);
            writeNumber(samples, sample.found);
        }
    }

    TrainingSources sources_;
    std::string folder_;
    bool further_; ///< views
    PortraitFeatures features_;
    Random random_;
    PortraitSet set_;
};

std::span<const float> PortraitSet::features(PortraitKind kind, std::size_t i) const {
    const Columns& columns = columns_.at(kind);
    return {columns.values.data() + i * columns.dimension, columns.dimension};
}

std::size_t PortraitSet::dimension(PortraitKind kind) const {
    const auto columns = columns_.find(kind);
    return columns == columns_.end() ? 0 : columns->second.dimension;
}

PortraitSet loadPortraits(const TrainingSources& sources, const std::string& folder,
                          const std::vector<PortraitKind>& kinds, const std::vector<PortraitKind>& wanted,
                          PortraitViews views, std::size_t most) {
    return PortraitSampler(sources, folder, views).faces(kinds, wanted, most);
}

PortraitSet loadEyePictures(const TrainingSources& sources, const std::string& folder) {
    return PortraitSampler(sources, folder, PortraitViews::first).eyePictures();
}

} // namespace Train
