#include "eval/landmarks.h"

#include "fn/image_reference.h"
#include "fn/imagefile/image_file.h"

#include <algorithm>
#include <cstdio>
#include <map>

#include <nlohmann/json.hpp>

namespace Eval {
namespace {

/// What was measured on one face; nothing where the landmark was not looked for or has no label.
struct Measured {
    bool faceFound = false, looked = false;
    std::optional<std::pair<FNPos, FNPos>> eyes; ///< found less labelled, eye distances
    std::optional<float> mouth, bridge;
    const Labelled::FaceTruth* truth = nullptr;
};

template <class Finder>
std::optional<float> errorOf(const Finder& finder, const std::optional<FNPos>& label,
                             const FacialFeatureLocation& first, const FacialFeatureLocation& second,
                             const FNImageReference& image, float eyeDistance) {
    FacialFeatureLocation found;
    if (!label || !finder.find(first, second, image, found)) return {};
    return length(found.pos - *label) / eyeDistance;
}

Measured measure(const LandmarkFinders& finders, const FNImageReference& image,
                 const std::list<FaceFinder::Location>& reports, const Labelled::FaceTruth& truth) {
    Measured result;
    result.truth = &truth;
    const auto hit = std::find_if(reports.begin(), reports.end(),
                                  [&](const auto& report) { return truth.meantBy(report); });
    if (hit == reports.end()) return result;
    result.faceFound = true;
    bool foundFirst, foundSecond;
    FacialFeatureLocation first, second;
    finders.eyes.find(*hit, image, foundFirst, first, foundSecond, second);
    if (!foundFirst || !foundSecond) return result;
    result.looked = true;
    const float distance = truth.eyeDistance();
    result.eyes = {(first.pos - truth.leftEye) / distance, (second.pos - truth.rightEye) / distance};
    result.mouth = errorOf(finders.mouth, truth.mouth, first, second, image, distance);
    result.bridge = errorOf(finders.bridge, truth.bridge, first, second, image, distance);
    return result;
}

std::optional<float> worseEye(const Measured& face, FNPos leftOffset = {0, 0}, FNPos rightOffset = {0, 0}) {
    if (!face.eyes) return {};
    return std::max(length(face.eyes->first - leftOffset), length(face.eyes->second - rightOffset));
}

void add(LandmarkErrors& errors, const std::optional<float>& error) {
    ++errors.looked;
    if (error) errors.errors.push_back(*error);
}

nlohmann::json jsonOf(const LandmarkErrors& errors) {
    return {{"looked", errors.looked}, {"errors", errors.errors}};
}

} // namespace

double LandmarkErrors::within(float eyeDistances) const {
    const auto end = std::upper_bound(errors.begin(), errors.end(), eyeDistances);
    return errors.empty() ? 0
                          : static_cast<double>(end - errors.begin()) / static_cast<double>(errors.size());
}

float LandmarkErrors::quantile(double share) const {
    if (errors.empty()) return 0;
    return errors[static_cast<std::size_t>(share * static_cast<double>(errors.size() - 1))];
}

LandmarkReport measureLandmarks(const LandmarkFinders& finders, const Labelled::Selection& selection,
                                const EyeDistances& eyeDistances) {
    const std::vector<Labelled::Picture> pictures = Labelled::picturesOf(selection);
    std::vector<std::vector<Measured>> measured(pictures.size());
    std::vector<std::string> failures(pictures.size());
    Labelled::forEachOf(pictures.size(), selection.jobs, [&](std::size_t i) {
        try {
            const FNImageReference image = Fn::readImage(pictures[i].file.string());
            std::list<FaceFinder::Location> reports;
            finders.face.find(image, reports, eyeDistances.least, eyeDistances.most, FaceFinder::everywhere);
            for (const Labelled::FaceTruth& truth : pictures[i].faces)
                if (truth.counts) measured[i].push_back(measure(finders, image, reports, truth));
        } catch (const std::exception& e) {
            failures[i] = pictures[i].file.string() + ": " + e.what();
        }
    });

    LandmarkReport report;
    report.pictures = pictures.size();
    report.eyes.name = "eyes, the worse one";
    report.eyesCentred.name = "  without the mean offsets";
    report.mouth.name = "mouth";
    report.bridge.name = "nose bridge";
    std::map<std::string, LandmarkErrors> groups;
    for (const std::vector<Measured>& faces : measured)
        for (const Measured& face : faces) {
            ++report.faces;
            report.facesFound += face.faceFound;
            if (face.faceFound) {
                add(report.eyes, worseEye(face));
                add(groups[face.truth->group], worseEye(face));
                if (face.eyes) {
                    report.leftOffset += face.eyes->first;
                    report.rightOffset += face.eyes->second;
                }
            }
            if (face.looked && face.truth->mouth) add(report.mouth, face.mouth);
            if (face.looked && face.truth->bridge) add(report.bridge, face.bridge);
        }
    if (const auto found = static_cast<float>(report.eyes.errors.size()); found > 0) {
        report.leftOffset = report.leftOffset / found;
        report.rightOffset = report.rightOffset / found;
    }
    for (const std::vector<Measured>& faces : measured)
        for (const Measured& face : faces)
            if (face.faceFound)
                add(report.eyesCentred, worseEye(face, report.leftOffset, report.rightOffset));
    if (groups.size() > 1)
        for (auto& [group, errors] : groups) report.eyesByGroup.emplace_back(group, errors);
    for (LandmarkErrors* const errors : {&report.eyes, &report.eyesCentred, &report.mouth, &report.bridge})
        std::sort(errors->errors.begin(), errors->errors.end());
    for (auto& [group, errors] : report.eyesByGroup) {
        errors.name = group.empty() ? "unknown" : group;
        std::sort(errors.errors.begin(), errors.errors.end());
    }
    std::erase(failures, "");
    report.failures = failures;
    return report;
}

void printLandmarks(const LandmarkReport& report, std::ostream& stream) {
    stream << report.pictures << " pictures, " << report.faces << " labelled faces, " << report.facesFound
           << " of them found\n\n";
    char line[200];
    std::snprintf(line, sizeof line,
                  "  %-28s %7s %9s | of those, off by at most (eye distances)\n"
                  "  %-28s %7s %9s | %7s %7s %7s %7s %7s   median   90 %%\n",
                  "", "faces", "found", "", "", "", "0.05", "0.10", "0.12", "0.15", "0.25");
    stream << line;
    const auto print = [&](const LandmarkErrors& errors) {
        if (errors.looked == 0) return;
        std::snprintf(line, sizeof line,
                      "  %-28.28s %7zu %7.1f %% | %6.1f%% %6.1f%% %6.1f%% %6.1f%% %6.1f%%   %.4f %.4f\n",
                      errors.name.c_str(), errors.looked,
                      100.0 * static_cast<double>(errors.errors.size()) / static_cast<double>(errors.looked),
                      100 * errors.within(0.05f), 100 * errors.within(0.10f), 100 * errors.within(0.12f),
                      100 * errors.within(0.15f), 100 * errors.within(0.25f), errors.quantile(0.5),
                      errors.quantile(0.9));
        stream << line;
    };
    for (const LandmarkErrors* const errors :
         {&report.eyes, &report.eyesCentred, &report.mouth, &report.bridge})
        print(*errors);
    std::snprintf(line, sizeof line,
                  "\n  mean offsets of the eyes, x and y: left %+.3f %+.3f, right %+.3f %+.3f\n",
                  report.leftOffset.x, report.leftOffset.y, report.rightOffset.x, report.rightOffset.y);
    stream << line;
    if (!report.eyesByGroup.empty()) stream << "\n  eyes by group\n";
    for (const auto& [group, errors] : report.eyesByGroup) print(errors);
}

std::string landmarksJson(const LandmarkReport& report) {
    nlohmann::json json{{"pictures", report.pictures},
                        {"faces", report.faces},
                        {"faces_found", report.facesFound},
                        {"eyes", jsonOf(report.eyes)},
                        {"eyes_centred", jsonOf(report.eyesCentred)},
                        {"mouth", jsonOf(report.mouth)},
                        {"bridge", jsonOf(report.bridge)},
                        {"eyes_by_group", nlohmann::json::object()},
                        {"failures", report.failures}};
    for (const auto& [group, errors] : report.eyesByGroup) json["eyes_by_group"][group] = jsonOf(errors);
    return json.dump(1);
}

} // namespace Eval
