#include "train/face_samples.h"

#include "eye/cara/window_geometry.h"
#include "fn/imagefile/image_file.h"
#include "img/affine/transform.h"
#include "img/affine/turns.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace Train {
namespace {

/// Closer eyes are no good example.
constexpr float leastEyeDistance = 14;

constexpr const char* faceFolders[] = {"people/lfw",        "people/celeba",  "portraits/fairface",
                                       "portraits/utkface", "portraits/mtfl", "scenes/faces"};

bool nearProfile(const Labelled::Row& row) {
    return std::abs(row.number("pose").value_or(0)) > 1;
}

} // namespace

std::vector<Labelled::Row> faceRows(const std::filesystem::path& data, Labelled::Split split,
                                    std::size_t most, Random& random) {
    std::vector<Labelled::Row> rows;
    for (const char* folder : faceFolders)
        for (const Labelled::Row& row : Labelled::readLabels(data / folder / "labels.tsv")) {
            const auto left = row.position("eye_left"), right = row.position("eye_right");
            if (!left || !right || length(*right - *left) < leastEyeDistance || nearProfile(row)) continue;
            if (Labelled::splitOf(row.splitKey()) == split) rows.push_back(row);
        }
    std::shuffle(rows.begin(), rows.end(), random);
    if (rows.size() > most) rows.erase(rows.begin() + static_cast<std::ptrdiff_t>(most), rows.end());
    return rows;
}

std::vector<FacePicture> loadFaces(const std::filesystem::path& data, Labelled::Split split, std::size_t most,
                                   Random& random) {
    std::vector<FacePicture> faces;
    for (const Labelled::Row& row : faceRows(data, split, most, random))
        faces.push_back({Fn::readImage(row.image().string()).toMono16(), *row.position("eye_left"),
                         *row.position("eye_right")});
    return faces;
}

std::vector<FNImage<unsigned short>> loadBackgrounds(const std::filesystem::path& data,
                                                     Labelled::Split split) {
    std::vector<FNImage<unsigned short>> images;
    for (const Labelled::Row& row : Labelled::readLabels(data / "scenes/background/labels.tsv"))
        if (Labelled::splitOf(row.image().stem().string()) == split)
            images.push_back(Fn::readImage(row.image().string()).toMono16());
    return images;
}

std::vector<Scenery> loadSceneries(const std::filesystem::path& data, Labelled::Split split,
                                   std::size_t mostSurroundings, Random& random) {
    std::vector<Scenery> sceneries;
    for (const FNImage<unsigned short>& image : loadBackgrounds(data, split)) {
        sceneries.push_back({image, {}});
        sceneries.push_back({Img::Affine::vertReflection(image, image.box()), {}});
    }
    constexpr std::size_t all = std::numeric_limits<std::size_t>::max();
    for (const Labelled::Row& row : faceRows(data, split, all, random)) {
        if (mostSurroundings == 0) break;
        if (row.text("person").empty()) continue; // other people may be in it
        --mostSurroundings;
        sceneries.push_back({Fn::readImage(row.image().string()).toMono16(),
                             {{*row.position("eye_left"), *row.position("eye_right")}}});
    }
    return sceneries;
}

bool Scenery::showsFace(FNPos centre, float eyeDistance) const {
    constexpr float mostOff = 0.6f, mostRatio = 1.8f;
    if (!eyes) return false;
    const FNPos across = eyes->second - eyes->first;
    const float distance = length(across), ratio = eyeDistance / distance;
    const FNPos middle =
        (eyes->first + eyes->second) / 2.0f + FNPos{-across.y, across.x} * Eye::Cara::T8::eyeLineToCentre;
    return length(centre - middle) < mostOff * distance && ratio < mostRatio && ratio > 1 / mostRatio;
}

FNImage<unsigned short> facePatch(const FacePicture& face, std::uint32_t pixels, float eyeDistance,
                                  const Jitter& jitter, Random& random) {
    std::uniform_real_distribution<float> unit(-1, 1);
    const FNPos across = face.rightEye - face.leftEye;
    const float distance = length(across);
    const bool mirrored = random() % 2 == 0;
    const float rotation = jitter.rotation + jitter.rotationSpread * unit(random);
    const float angle = std::atan2(across.y, across.x) - (mirrored ? -rotation : rotation);
    const float scale = std::exp(std::log1p(jitter.scale) * unit(random));
    const float side = static_cast<float>(pixels) * distance / (eyeDistance * scale);

    const FNPos u = FNPos{std::cos(angle), std::sin(angle)} * side, v{-u.y, u.x};
    const FNPos down = FNPos{-across.y, across.x};
    const float pixel = 1 / static_cast<float>(pixels);
    const FNPos centre = (face.leftEye + face.rightEye) / 2.0f + down * Eye::Cara::T8::eyeLineToCentre +
                         u * (jitter.position * unit(random) * pixel) +
                         v * (jitter.position * unit(random) * pixel);
    const FNPos corner = centre - u / 2.0f - v / 2.0f;
    FNImage<unsigned short> patch(pixels, pixels);
    Img::Affine::transform(face.image, patch, mirrored ? corner + u : corner, mirrored ? -u : u, v, true, 0);
    return patch;
}

} // namespace Train
