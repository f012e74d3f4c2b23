#include "eval/detect.h"

#include "fn/exception.h"
#include "fn/imagefile/image_file.h"

#include <algorithm>
#include <cstdio>
#include <map>

#include <nlohmann/json.hpp>

namespace Eval {
namespace {

DetectedPicture judge(const FaceFinder& finder, const EyeDistances& eyeDistances,
                      const Labelled::Picture& picture) {
    DetectedPicture result;
    result.file = picture.file.string();
    std::list<FaceFinder::Location> reports;
    try {
        finder.find(Fn::readImage(result.file), reports, eyeDistances.least, eyeDistances.most,
                    FaceFinder::everywhere);
    } catch (const std::exception& e) {
        result.failure = e.what();
        return result;
    }
    for (const Labelled::FaceTruth& truth : picture.faces) {
        DetectedPicture::Face face{truth.eyeDistance(), {}, truth.group};
        const auto hit = std::find_if(reports.begin(), reports.end(),
                                      [&](const auto& report) { return truth.meantBy(report); });
        if (hit != reports.end()) {
            face.confidence = hit->confidence;
            reports.erase(hit);
        }
        if (truth.counts) result.faces.push_back(face);
    }
    for (const FaceFinder::Location& report : reports) result.falseAlarms.push_back(report.confidence);
    return result;
}

/// How many faces there are, and how many of them were found.
struct Share {
    std::size_t all = 0, found = 0;
    void add(const DetectedPicture::Face& face) {
        ++all;
        found += face.confidence.has_value();
    }
    double percent() const { return 100.0 * static_cast<double>(found) / static_cast<double>(all); }
};

} // namespace

std::vector<DetectedPicture> detect(const FaceFinder& finder, const Labelled::Selection& selection,
                                    const EyeDistances& eyeDistances) {
    const std::vector<Labelled::Picture> pictures = Labelled::picturesOf(selection);
    std::vector<DetectedPicture> results(pictures.size());
    Labelled::forEachOf(pictures.size(), selection.jobs,
                        [&](std::size_t i) { results[i] = judge(finder, eyeDistances, pictures[i]); });
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
        Share share;
        for (const DetectedPicture& picture : pictures)
            for (const auto& face : picture.faces)
                if (face.eyeDistance >= bounds[i] && face.eyeDistance < bounds[i + 1]) share.add(face);
        if (share.all == 0) continue;
        std::snprintf(line, sizeof line, "  from %4.0f px  %7zu   %6.2f %%\n", bounds[i], share.all,
                      share.percent());
        stream << line;
    }

    std::map<std::string, Share> groups;
    for (const DetectedPicture& picture : pictures)
        for (const auto& face : picture.faces) groups[face.group].add(face);
    if (groups.size() < 2) return;
    stream << "\n  group                faces   found\n";
    for (const auto& [group, share] : groups) {
        std::snprintf(line, sizeof line, "  %-17.40s  %7zu   %6.2f %%\n",
                      group.empty() ? "unknown" : group.c_str(), share.all, share.percent());
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
                 {"group", face.group},
                 {"confidence", face.confidence ? nlohmann::json(*face.confidence) : nullptr}});
        if (!picture.failure.empty()) entry["failure"] = picture.failure;
        json["pictures"].push_back(entry);
    }
    return json.dump(1);
}

} // namespace Eval
