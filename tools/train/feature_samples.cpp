#include "train/feature_samples.h"

#include "fn/imagefile/image_file.h"
#include "img/pyramid.h"
#include "train/face_samples.h"

namespace Train {
namespace {

/// Uniform in the disc.
FNPos inDisc(float radius, Random& random) {
    std::uniform_real_distribution<float> unit(-1, 1);
    for (;;)
        if (const FNPos pos{unit(random), unit(random)}; length(pos) <= 1) return pos * radius;
}

void scaleDown(LabelledFace& face, Random& random) {
    constexpr float least = 12, most = 28; // eye distance
    const float factor = face.eyeDistance() / std::uniform_real_distribution<float>(least, most)(random);
    if (factor <= 1) return;
    const auto level = Img::PyramidScaling<unsigned short>::level(face.image, factor);
    const Img::Affine::Mapping map = level.mapping.inverse();
    face.image = level.image;
    face.leftEye = map(face.leftEye);
    face.rightEye = map(face.rightEye);
    for (std::optional<FNPos>* const feature : {&face.mouth, &face.bridge})
        if (*feature) *feature = map(**feature);
}

/// How far the eyes of a set are labelled to the right of where the others have them, eye distances. The
/// finders look at one eye and at the other in a mirror, so they could learn this only as a blur.
float shiftOfLabels(const Labelled::Row& row) {
    return row.image().parent_path().filename() == "mtfl" ? 0.022f : 0.0f;
}

} // namespace

std::vector<LabelledFace> loadLabelledFaces(const std::filesystem::path& data, Labelled::Split split,
                                            std::size_t most, double smallShare, Random& random) {
    std::bernoulli_distribution small(smallShare);
    std::vector<LabelledFace> faces;
    for (const Labelled::Row& row : faceRows(data, split, most, random)) {
        faces.push_back({Fn::readImage(row.image().string()).toMono16(), *row.position("eye_left"),
                         *row.position("eye_right"), row.position("mouth"), row.position("bridge"),
                         row.text("source_labels") == "hand"});
        const FNPos shift{shiftOfLabels(row) * faces.back().eyeDistance(), 0};
        faces.back().leftEye -= shift;
        faces.back().rightEye -= shift;
        if (small(random)) scaleDown(faces.back(), random);
    }
    return faces;
}

FaceFinder::Location jitteredFace(const LabelledFace& face, Random& random) {
    constexpr float position = 0.15f, scale = 0.12f, rotation = 0.12f;
    std::uniform_real_distribution<float> unit(-1, 1);
    const float distance = face.eyeDistance();
    const FNPos across = face.rightEye - face.leftEye;
    FaceFinder::Location location;
    location.pos = (face.leftEye + face.rightEye) / 2.0f + inDisc(position * distance, random);
    location.width = distance * std::exp(std::log1p(scale) * unit(random));
    location.rotationAngle = std::atan2(across.y, across.x) + rotation * unit(random);
    return location;
}

EyePair jitteredEyes(const LabelledFace& face, Random& random) {
    constexpr float position = 0.05f;
    const float distance = face.eyeDistance();
    return {{face.leftEye + inDisc(position * distance, random), distance, 0},
            {face.rightEye + inDisc(position * distance, random), distance, 0}};
}

} // namespace Train
