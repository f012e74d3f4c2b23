#pragma once

#include "fn/image.h"
#include "labelled/labels.h"
#include "train/sign_matrix.h"

#include <filesystem>
#include <optional>
#include <utility>
#include <vector>

namespace Train {

/// A picture with one labelled face.
struct FacePicture {
    FNImage<unsigned short> image;
    FNPos leftEye, rightEye;
};

/// The rows of one split in the face folders below `data`, in random order: both eyes labelled, not too close
/// to each other, no profile.
std::vector<Labelled::Row> faceRows(const std::filesystem::path& data, Labelled::Split split,
                                    std::size_t most, Random& random);

/// All faces of one split in the face folders below `data`.
std::vector<FacePicture> loadFaces(const std::filesystem::path& data, Labelled::Split split, std::size_t most,
                                   Random& random);

/// A picture to learn from what is no face.
struct Scenery {
    FNImage<unsigned short> image;
    std::optional<std::pair<FNPos, FNPos>> eyes; ///< of the one face in it, if there is one

    /// Whether a window around `centre` made for this eye distance shows that face, even badly.
    bool showsFace(FNPos centre, float eyeDistance) const;
};

/// Pictures without a face.
std::vector<FNImage<unsigned short>> loadBackgrounds(const std::filesystem::path& data,
                                                     Labelled::Split split);
/// Pictures without a face and their mirror images, and pictures cut around a single face.
/// @param mostSurroundings so many of the latter at most
std::vector<Scenery> loadSceneries(const std::filesystem::path& data, Labelled::Split split,
                                   std::size_t mostSurroundings, Random& random);

/// How a training patch deviates from the labelled face.
struct Jitter {
    float rotation;       ///< of the face in the patch, radians: the middle
    float rotationSpread; ///< uniform up to this much either way
    float position;       ///< uniform up to this many patch pixels either way
    float scale;          ///< uniform in the logarithm up to this factor - 1 either way
};

/// A square patch around a face, as the finder would see it.
/// @param pixels side of the patch @param eyeDistance in patch pixels
FNImage<unsigned short> facePatch(const FacePicture& face, std::uint32_t pixels, float eyeDistance,
                                  const Jitter& jitter, Random& random);

} // namespace Train
