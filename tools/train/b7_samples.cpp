#include "train/b7_samples.h"

#include "cmp/b7/preprocessor.h"
#include "cmp/b7/reshape_warp.h"
#include "fn/image_reference.h"
#include "fn/imagefile/image_file.h"
#include "img/affine/turns.h"
#include "labelled/finder_access.h"
#include "labelled/pictures.h"

#include <algorithm>
#include <cmath>
#include <fstream>
#include <iostream>
#include <random>
#include <sstream>
#include <thread>

namespace Train {
namespace {

using Labelled::Split;

constexpr const char* peopleFolders[] = {"people/lfw", "people/celeba"};
/// The same few people in light from all sides. Labels are rough: the same for all pictures of a person.
constexpr const char* lightFolder = "portraits/light";
constexpr const char* unnamedFolders[] = {"portraits/fairface", "portraits/utkface", "portraits/mtfl"};

/// Standard deviation of the jitter of each coordinate of a landmark, eye distances: about what separates
/// two finds of our own finders.
constexpr float jitter = 0.025f;

struct Landmarks {
    FNPos left, right, mouth, bridge;
};

class Extraction {
public:
    explicit Extraction(const std::filesystem::path& etc)
        : faces_(Labelled::makeFaceFinder(etc)), eyes_(Labelled::makeEyesFinder(etc, "Strict")),
          mouth_(Labelled::makeMouthFinder(etc)), bridge_(Labelled::makeBridgeFinder(etc)) {}

    /// Of the face that the truth means. Nothing if a finder fails.
    std::optional<Landmarks> find(const FNImageReference& image, const Labelled::FaceTruth& truth) const {
        constexpr double least = 0.05, most = 0.4; // as enrolment looks for them
        std::list<FaceFinder::Location> reports;
        faces_.find(image, reports, least, most, FaceFinder::everywhere);
        const auto hit = std::ranges::find_if(reports, [&](const auto& r) { return truth.meantBy(r); });
        if (hit == reports.end()) return {};
        bool foundLeft, foundRight;
        FacialFeatureLocation left, right, mouth, bridge;
        eyes_.find(*hit, image, foundLeft, left, foundRight, right);
        if (!foundLeft || !foundRight || !mouth_.find(left, right, image, mouth) ||
            !bridge_.find(left, right, image, bridge))
            return {};
        return Landmarks{left.pos, right.pos, mouth.pos, bridge.pos};
    }

    FNVector<float> rawVector(const FNImage<float>& image, const Landmarks& landmarks) const {
        float padding;
        return processor_(Cmp::B7::reshapeWarp(image, landmarks.left, landmarks.right, landmarks.mouth,
                                               landmarks.bridge, padding));
    }

private:
    FaceFinder faces_;
    EyesFinder eyes_;
    MouthFinder mouth_;
    BridgeFinder bridge_;
    Cmp::B7::PreProcessor processor_;
};

Landmarks mirroredLandmarks(const Landmarks& l, float width) {
    const auto mirror = [&](FNPos p) { return FNPos{width - p.x, p.y}; };
    return {mirror(l.right), mirror(l.left), mirror(l.mouth), mirror(l.bridge)};
}

Landmarks jitteredLandmarks(const Landmarks& l, std::mt19937_64& random) {
    std::normal_distribution<float> normal(0, jitter * length(l.right - l.left));
    const auto moved = [&](FNPos p) { return FNPos{p.x + normal(random), p.y + normal(random)}; };
    return {moved(l.left), moved(l.right), moved(l.mouth), moved(l.bridge)};
}

struct Source {
    Labelled::Row row;
    std::string file, person;
    Split split;
    bool named;
};

std::vector<Source> sourcesBelow(const std::filesystem::path& data) {
    std::vector<Source> sources;
    const auto add = [&](const std::string& folder, bool named) {
        for (const Labelled::Row& row : Labelled::readLabels(data / folder / "labels.tsv")) {
            if (!row.position("eye_left") || !row.position("eye_right")) continue;
            const std::string file = folder + "/" + row.image().filename().string();
            const Split split = Labelled::splitOf(row.splitKey());
            if (!named && split != Split::train) continue;
            sources.push_back({row, file, named ? folder + "/" + row.text("person") : file, split, named});
        }
    };
    for (const char* folder : peopleFolders) add(folder, true);
    for (const char* folder : unnamedFolders) add(folder, false);
    add(lightFolder, true);
    return sources;
}

std::optional<Landmarks> labelled(const Labelled::Row& row) {
    const auto mouth = row.position("mouth"), bridge = row.position("bridge");
    if (!mouth || !bridge) return {};
    return Landmarks{*row.position("eye_left"), *row.position("eye_right"), *mouth, *bridge};
}

Labelled::FaceTruth truthOf(const Landmarks& l) {
    return {l.left, l.right, l.mouth, l.bridge, "", true};
}

std::uint8_t digit(float rank) {
    return static_cast<std::uint8_t>(std::lround(rank * (255 / Cmp::B7::PreProcessor::rankTable.front())));
}

/// The variants of one picture, item and digits.
struct Extracted {
    std::vector<std::pair<RawVectors::Item, std::vector<std::uint8_t>>> variants;
};

Extracted extract(const Extraction& extraction, const Source& source, std::uint64_t seed) {
    Extracted result;
    const FNImageReference picture = Fn::readImage(source.row.image().string());
    const FNImage<float> image = picture.toMonoFloat();
    const auto keep = [&](RawVectors::Variant variant, const FNImage<float>& pixels,
                          const Landmarks& landmarks, bool found) {
        try {
            const FNVector<float> raw = extraction.rawVector(pixels, landmarks);
            std::vector<std::uint8_t> digits(raw.size());
            std::transform(raw.begin(), raw.end(), digits.begin(), digit);
            result.variants.push_back(
                {{source.file, source.person, source.split, variant, found}, std::move(digits)});
        } catch (const FNEBadArg&) {
            // Landmarks that no face can have: a mouth above the eyes.
        }
    };
    const std::optional<Landmarks> label = labelled(source.row);
    const Landmarks place = label.value_or(
        Landmarks{*source.row.position("eye_left"), *source.row.position("eye_right"), {}, {}});
    const auto both = [&](const FNImage<float>& pixels, const Landmarks& labelPlace,
                          RawVectors::Variant plain, RawVectors::Variant moved, RawVectors::Variant onLabel) {
        const std::optional<Landmarks> found =
            extraction.find(FNImageReferenceFactory::create(pixels), truthOf(labelPlace));
        if (!found && !label) return;
        const Landmarks landmarks = found.value_or(labelPlace);
        keep(plain, pixels, landmarks, found.has_value());
        if (!source.named || source.split != Split::train) return;
        std::mt19937_64 random(seed ^ std::hash<std::string>()(source.file) ^ plain);
        keep(moved, pixels, jitteredLandmarks(landmarks, random), found.has_value());
        if (found && label && !source.file.starts_with(lightFolder)) keep(onLabel, pixels, labelPlace, false);
    };
    both(image, place, RawVectors::asFound, RawVectors::jittered, RawVectors::labelled);
    if (source.named && source.split == Split::train)
        both(Img::Affine::vertReflection(image, image.box()),
             mirroredLandmarks(place, static_cast<float>(image.w())), RawVectors::mirrored,
             RawVectors::mirrorJittered, RawVectors::mirrorLabelled);
    return result;
}

} // namespace

RawVectors::RawVectors(const TrainingSources& sources)
    : dimension_(Cmp::B7::PreProcessor::computeFeatureVectorSize()) {
    const std::filesystem::path valueFile = sources.cache / "b7-raw.bin",
                                itemFile = sources.cache / "b7-raw.tsv";
    if (!std::filesystem::exists(itemFile)) {
        std::filesystem::create_directories(sources.cache);
        const std::vector<Source> pictures = sourcesBelow(sources.data);
        const Extraction extraction(sources.etc);
        std::ofstream values(valueFile, std::ios::binary);
        std::ostringstream items;
        // In blocks, so that the order is that of the sources whatever thread was first.
        constexpr std::size_t block = 500;
        for (std::size_t begin = 0; begin < pictures.size(); begin += block) {
            std::vector<Extracted> extracted(std::min(block, pictures.size() - begin));
            Labelled::forEachOf(extracted.size(), std::thread::hardware_concurrency(), [&](std::size_t i) {
                extracted[i] = extract(extraction, pictures[begin + i], sources.seed);
            });
            for (const Extracted& e : extracted)
                for (const auto& [item, digits] : e.variants) {
                    items << item.file << '\t' << item.person << '\t' << static_cast<int>(item.split) << '\t'
                          << item.variant << '\t' << item.found << '\n';
                    values.write(reinterpret_cast<const char*>(digits.data()),
                                 static_cast<std::streamsize>(digits.size()));
                }
            std::cout << "  raw vectors of " << begin + extracted.size() << " of " << pictures.size()
                      << " pictures\n"
                      << std::flush;
        }
        values.close();
        std::ofstream list(itemFile);
        list << items.str();
        if (!values || !list.flush())
            FN_THROW(FNEIOError, "Cannot write raw vectors to " + sources.cache.string());
    }
    std::ifstream list(itemFile), values(valueFile, std::ios::binary);
    std::string line;
    while (std::getline(list, line)) {
        std::istringstream fields(line);
        Item item;
        int split, variant;
        std::getline(fields, item.file, '\t');
        std::getline(fields, item.person, '\t');
        if (!(fields >> split >> variant >> item.found))
            FN_THROW(FNEIOError, "Damaged list of raw vectors " + itemFile.string());
        item.split = static_cast<Split>(split);
        item.variant = static_cast<Variant>(variant);
        items_.push_back(item);
    }
    values_.resize(items_.size() * dimension_);
    values.read(reinterpret_cast<char*>(values_.data()), static_cast<std::streamsize>(values_.size()));
    if (!values) FN_THROW(FNEIOError, "Raw vectors are missing in " + valueFile.string());
}

} // namespace Train
