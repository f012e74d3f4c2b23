#pragma once

#include "labelled/pictures.h"

#include <optional>
#include <ostream>
#include <string>
#include <vector>

/// How well faces are found: which labelled faces are found, and what is reported that is none.

namespace Eval {

/// Eye distances to look for, in widths of the image.
struct EyeDistances {
    double least = 0.02, most = 0.5;
};

/// What one picture gave.
struct DetectedPicture {
    struct Face {
        float eyeDistance;               ///< image pixels
        std::optional<float> confidence; ///< of what was found there
        std::string group = {};          ///< its value in the column that figures are divided by
    };
    std::string file;
    std::vector<Face> faces;        ///< that count
    std::vector<float> falseAlarms; ///< their confidences
    std::string failure;            ///< why the picture could not be read
};

/// Runs the finder over all pictures.
std::vector<DetectedPicture> detect(const FaceFinder& finder, const Labelled::Selection& selection,
                                    const EyeDistances& eyeDistances);

/// One line of the table: what holds for reports of at least this confidence.
struct OperatingPoint {
    float confidence;
    double recall; ///< share of labelled faces
    double falseAlarmsPerImage;
};
/// From the highest confidence down.
std::vector<OperatingPoint> operatingCurve(const std::vector<DetectedPicture>& pictures);

void printDetection(const std::vector<DetectedPicture>& pictures, std::ostream& stream);
std::string detectionJson(const std::vector<DetectedPicture>& pictures);

} // namespace Eval
