#include "eval/detect.h"

#include "fn/exception.h"
#include "fn/imagefile/image_file.h"

#include <algorithm>
#include <atomic>
#include <cstdio>
#include <thread>

#include <nlohmann/json.hpp>

namespace Eval {
namespace {

struct LabelledPicture {
    std::filesystem::path file;
    std::vector<std::pair<FNPos, FNPos>> eyes;
};

std::vector<LabelledPicture> picturesOf(const DetectOptions& options) {
    std::vector<LabelledPicture> pictures;
    for (const std::string& labels : options.labels)
        for (const Labelled::Row& row : Labelled::readLabels(labels)) {
            if (options.split && Labelled::splitOf(row.splitKey()) != *options.split) continue;
            if (pictures.empty() || pictures.back().file != row.image())
                pictures.push_back({row.image(), {}});
            const auto left = row.position("eye_left"), right = row.position("eye_right");
            if (left && right) pictures.back().eyes.emplace_back(*left, *right);
        }
    return pictures;
}

bool standsFor(const FaceFinder::Location& report, const std::pair<FNPos, FNPos>& eyes) {
    constexpr float mostOff = 0.35f, mostRatio = 1.6f;
    const float distance = length(eyes.second - eyes.first);
    const float ratio = report.width / distance;
    return length(report.pos - (eyes.first + eyes.second) / 2.0f) <= mostOff * distance &&
           ratio <= mostRatio && ratio >= 1 / mostRatio;
}

DetectedPicture judge(const FaceFinder& finder, const DetectOptions& options,
                      const LabelledPicture& picture) {
    DetectedPicture result;
    result.file = picture.file.string();
    std::list<FaceFinder::Location> reports;
    try {
        finder.find(Fn::readImage(result.file), reports, options.minRelEyeDistance, options.maxRelEyeDistance,
                    FaceFinder::everywhere);
    } catch (const std::exception& e) {
        result.failure = e.what();
        return result;
    }
    for (const auto& eyes : picture.eyes) {
        DetectedPicture::Face face{length(eyes.second - eyes.first), {}};
        const auto hit =
            std::find_if(reports.begin(), reports.end(),
                         [&](const FaceFinder::Location& report) { return standsFor(report, eyes); });
        if (hit != reports.end()) {
            face.confidence = hit->confidence;
            reports.erase(hit);
        }
        result.faces.push_back(face);
    }
    for (const FaceFinder::Location& report : reports) result.falseAlarms.push_back(report.confidence);
    return result;
}

} // namespace

std::vector<DetectedPicture> detect(const FaceFinder& finder, const DetectOptions& options) {
    const std::vector<LabelledPicture> pictures = picturesOf(options);
    std::vector<DetectedPicture> results(pictures.size());
    std::atomic<std::size_t> next = 0;
    std::vector<std::thread> threads;
    for (unsigned job = 0; job < std::max(options.jobs, 1u); ++job)
        threads.emplace_back([&] {
            for (std::size_t i; (i = next++) < pictures.size();)
                results[i] = judge(finder, options, pictures[i]);
        });
    for (std::thread& thread : threads) thread.join();
    return results;
}

std::vector<OperatingPoint> operatingCurve(const std::vector<DetectedPicture>& pictures) {
    std::vector<std::pair<float, bool>> reports; // confidence, whether it is a face
    std::size_t faces = 0;
    for (const DetectedPicture& picture : pictures) {
        faces += picture.faces.size();
        for (const auto& face : picture.faces)
            if (face.confidence) reports.emplace_back(*face.confidence, true);
        for (const float confidence : picture.falseAlarms) reports.emplace_back(confidence, false);
    }
    std::sort(reports.rbegin(), reports.rend());
    std::vector<OperatingPoint> curve;
    std::size_t found = 0, alarms = 0;
    for (const auto& [confidence, isFace] : reports) {
        ++(isFace ? found : alarms);
        curve.push_back({confidence,
                         static_cast<double>(found) / static_cast<double>(std::max<std::size_t>(faces, 1)),
                         static_cast<double>(alarms) / static_cast<double>(pictures.size())});
    }
    return curve;
}

void printDetection(const std::vector<DetectedPicture>& pictures, std::ostream& stream) {
    std::size_t faces = 0, unread = 0;
    for (const DetectedPicture& picture : pictures) {
        faces += picture.faces.size();
        unread += !picture.failure.empty();
    }
    stream << pictures.size() << " pictures, " << faces << " labelled faces";
    if (unread != 0) stream << ", " << unread << " pictures could not be read";
    stream << "\n\n";

    char line[160];
    stream << "  confidence   faces found   false alarms per picture\n";
    const std::vector<OperatingPoint> curve = operatingCurve(pictures);
    const auto print = [&](const OperatingPoint& point) {
        std::snprintf(line, sizeof line, "  %10.2f   %9.2f %%   %.4f\n", point.confidence, 100 * point.recall,
                      point.falseAlarmsPerImage);
        stream << line;
    };
    for (const double rate : {0.001, 0.003, 0.01, 0.03, 0.1, 0.3, 1.0}) {
        const auto beyond = std::find_if(curve.begin(), curve.end(), [&](const OperatingPoint& point) {
            return point.falseAlarmsPerImage > rate;
        });
        if (beyond == curve.end()) break;
        if (beyond != curve.begin()) print(*std::prev(beyond));
    }
    if (!curve.empty()) print(curve.back());

    stream << "\n  eye distance   faces   found\n";
    constexpr float bounds[] = {0, 10, 15, 20, 30, 40, 60, 80, 1e9f};
    for (std::size_t i = 0; i + 1 < std::size(bounds); ++i) {
        std::size_t all = 0, found = 0;
        for (const DetectedPicture& picture : pictures)
            for (const auto& face : picture.faces)
                if (face.eyeDistance >= bounds[i] && face.eyeDistance < bounds[i + 1]) {
                    ++all;
                    found += face.confidence.has_value();
                }
        if (all == 0) continue;
        std::snprintf(line, sizeof line, "  from %4.0f px  %7zu   %6.2f %%\n", bounds[i], all,
                      100.0 * static_cast<double>(found) / static_cast<double>(all));
        stream << line;
    }
}

std::string detectionJson(const std::vector<DetectedPicture>& pictures) {
    nlohmann::json json;
    json["curve"] = nlohmann::json::array();
    for (const OperatingPoint& point : operatingCurve(pictures))
        json["curve"].push_back({{"confidence", point.confidence},
                                 {"recall", point.recall},
                                 {"false_alarms_per_image", point.falseAlarmsPerImage}});
    json["pictures"] = nlohmann::json::array();
    for (const DetectedPicture& picture : pictures) {
        nlohmann::json entry{{"file", picture.file}, {"false_alarms", picture.falseAlarms}};
        for (const auto& face : picture.faces)
            entry["faces"].push_back(
                {{"eye_distance", face.eyeDistance},
                 {"confidence", face.confidence ? nlohmann::json(*face.confidence) : nullptr}});
        if (!picture.failure.empty()) entry["failure"] = picture.failure;
        json["pictures"].push_back(entry);
    }
    return json.dump(1);
}

} // namespace Eval
