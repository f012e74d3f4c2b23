#pragma once

#include "eval/detect.h"
#include "eye/bridge_finder.h"
#include "eye/eyes_finder.h"
#include "eye/mouth_finder.h"

#include <cstddef>
#include <ostream>
#include <string>
#include <vector>

/// How exactly eyes, mouth and nose bridge are found on faces that the face finder found: each finder works
/// on what the one before reports, as in use.

namespace Eval {

struct LandmarkFinders {
    FaceFinder face;
    EyesFinder eyes;
    MouthFinder mouth;
    BridgeFinder bridge;
};

/// How well one landmark was found.
struct LandmarkErrors {
    std::string name;
    std::size_t looked = 0;    ///< faces on which it was looked for
    std::vector<float> errors; ///< where it was found, ascending, eye distances of the label

    /// Share of those found that are at most this far off.
    double within(float eyeDistances) const;
    /// The error that this share of those found stays below. @param share from 0 to 1
    float quantile(double share) const;
};

struct LandmarkReport {
    std::size_t pictures = 0, faces = 0, facesFound = 0;
    LandmarkErrors eyes; ///< the larger error of the two, where both were found
    /// The same with the mean offset of each eye taken off: sets of labels differ in where an eye's centre
    /// is.
    LandmarkErrors eyesCentred;
    FNPos leftOffset{0, 0}, rightOffset{0, 0}; ///< mean of found less labelled, eye distances
    LandmarkErrors mouth, bridge;
    std::vector<std::pair<std::string, LandmarkErrors>> eyesByGroup;
    std::vector<std::string> failures; ///< pictures that could not be read, and why
};

LandmarkReport measureLandmarks(const LandmarkFinders& finders, const Labelled::Selection& selection,
                                const EyeDistances& eyeDistances);

void printLandmarks(const LandmarkReport& report, std::ostream& stream);
std::string landmarksJson(const LandmarkReport& report);

} // namespace Eval
