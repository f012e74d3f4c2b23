#include "labelled/pictures.h"

#include <algorithm>
#include <atomic>
#include <cmath>
#include <numbers>
#include <thread>

namespace Labelled {
namespace {

bool counts(const FaceTruth& face, const Row& row, const Selection& selection) {
    const FNPos across = face.rightEye - face.leftEye;
    const double degrees = std::abs(std::atan2(across.y, across.x)) * 180 / std::numbers::pi;
    return (!selection.onlyByHand || row.text("source_labels") == "hand") &&
           face.eyeDistance() >= selection.leastEyeDistance &&
           face.eyeDistance() <= selection.mostEyeDistance && degrees <= selection.mostRotation;
}

} // namespace

bool FaceTruth::meantBy(const FaceFinder::Location& report) const {
    constexpr float mostOff = 0.35f, mostRatio = 1.6f;
    const float distance = eyeDistance(), ratio = report.width / distance;
    return length(report.pos - (leftEye + rightEye) / 2.0f) <= mostOff * distance && ratio <= mostRatio &&
           ratio >= 1 / mostRatio;
}

std::vector<Picture> picturesOf(const Selection& selection) {
    std::vector<Picture> pictures;
    for (const std::string& labels : selection.labels)
        for (const Row& row : readLabels(labels)) {
            if (selection.split && splitOf(row.splitKey()) != *selection.split) continue;
            if (pictures.empty() || pictures.back().file != row.image())
                pictures.push_back({row.image(), {}});
            const auto left = row.position("eye_left"), right = row.position("eye_right");
            if (!left || !right) continue;
            FaceTruth face{
                *left, *right, row.position("mouth"), row.position("bridge"), row.text(selection.groupColumn),
                true};
            face.counts = counts(face, row, selection);
            pictures.back().faces.push_back(face);
        }
    return pictures;
}

void forEachOf(std::size_t n, unsigned jobs, const std::function<void(std::size_t i)>& visit) {
    std::atomic<std::size_t> next = 0;
    std::vector<std::jthread> threads;
    for (unsigned job = 0; job < std::max(jobs, 1u); ++job)
        threads.emplace_back([&] {
            for (std::size_t i; (i = next++) < n;) visit(i);
        });
}

} // namespace Labelled
