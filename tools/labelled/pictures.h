#pragma once

#include "eye/face_finder.h"
#include "labelled/labels.h"

#include <cstddef>
#include <filesystem>
#include <functional>
#include <optional>
#include <string>
#include <vector>

/// Labelled pictures to judge finders on.

namespace Labelled {

/// What the label of one face says, image pixels.
struct FaceTruth {
    FNPos leftEye, rightEye;
    std::optional<FNPos> mouth, bridge;
    std::string group; ///< its value in the column that figures are divided by
    bool counts;       ///< false for faces that are neither to be found nor false alarms

    float eyeDistance() const { return length(rightEye - leftEye); }
    /// Whether the report means this face: its midpoint of the eyes lies within 0.35 eye distances of the
    /// label's, and the eye distances differ by no more than a factor of 1.6.
    bool meantBy(const FaceFinder::Location& report) const;
};

struct Picture {
    std::filesystem::path file;
    std::vector<FaceTruth> faces;
};

/// Which pictures and faces to judge on.
struct Selection {
    std::vector<std::string> labels; ///< files in the format of labels.tsv
    std::optional<Split> split;      ///< only this part, all of it if not set
    bool onlyByHand = false;         ///< only faces whose eyes were labelled by hand count
    double leastEyeDistance = 0;     ///< of the faces that count, pixels
    double mostEyeDistance = 1e9;
    double mostRotation = 180; ///< of the line through the eyes, degrees
    std::string groupColumn;   ///< column to divide figures by
    unsigned jobs = 1;         ///< pictures at a time
};

/// @throws FNEIOError naming the file and the line
std::vector<Picture> picturesOf(const Selection& selection);

/// Calls visit(i) for all i below n, from as many threads as there are jobs.
void forEachOf(std::size_t n, unsigned jobs, const std::function<void(std::size_t i)>& visit);

} // namespace Labelled
