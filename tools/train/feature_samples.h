#pragma once

#include "eye/ojo/search_area.h"
#include "fn/image.h"
#include "labelled/labels.h"
#include "train/sign_matrix.h"

#include <filesystem>
#include <optional>
#include <vector>

namespace Train {

/// A picture with one face and the features labelled on it.
struct LabelledFace {
    FNImage<unsigned short> image;
    FNPos leftEye, rightEye;
    std::optional<FNPos> mouth, bridge;
    bool byHand; ///< eyes and mouth; the others come from an automatic annotator

    float eyeDistance() const { return length(rightEye - leftEye); }
};

/// Faces of one split in random order. @param most faces at most
/// @param smallShare share of the faces whose pictures are scaled down, so that they look like small ones
std::vector<LabelledFace> loadLabelledFaces(const std::filesystem::path& data, Labelled::Split split,
                                            std::size_t most, double smallShare, Random& random);

/// The face as a face finder would report it: with errors of up to 0.15 eye distances in place, 12 % in scale
/// and 0.12 radians.
FaceFinder::Location jitteredFace(const LabelledFace& face, Random& random);

/// The eyes as an eyes finder would report them: with errors of up to 0.05 eye distances.
struct EyePair {
    FacialFeatureLocation first, second;
};
EyePair jitteredEyes(const LabelledFace& face, Random& random);

} // namespace Train
