#pragma once

#include "eye/face_finder.h"
#include "labelled/labels.h"

#include <optional>
#include <ostream>
#include <string>
#include <vector>

/// How well faces are found: which labelled faces are found, and what is reported that is none.

namespace Eval {

struct DetectOptions {
    std::vector<std::string> labels;      ///< files in the format of labels.tsv
    std::optional<Labelled::Split> split; ///< only this part, all of it if not set
    double minRelEyeDistance = 0.02;      ///< in widths of the image
    double maxRelEyeDistance = 0.5;
    unsigned jobs = 1;
};

/// What one picture gave.
struct DetectedPicture {
    struct Face {
        float eyeDistance;               ///< image pixels
        std::optional<float> confidence; ///< of what was found there
    };
    std::string file;
    std::vector<Face> faces;
    std::vector<float> falseAlarms; ///< their confidences
    std::string failure;            ///< why the picture could not be read
};

/// Runs the finder over all pictures. A report stands for a labelled face if its midpoint of the eyes lies
/// within 0.35 eye distances of the label's, and the eye distances differ by no more than a factor of 1.6.
std::vector<DetectedPicture> detect(const FaceFinder& finder, const DetectOptions& options);

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
