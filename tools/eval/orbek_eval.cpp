// orbek-eval: accuracy reports over labelled images. Exit status 0, 1 for a failure, 2 if a picture could not
// be read.

#include "eval/detect.h"
#include "eval/landmarks.h"
#include "eval/life.h"
#include "eval/plot.h"
#include "eval/portrait.h"
#include "eval/recognition.h"
#include "eval/yardsticks.h"
#include "fn/exception.h"
#include "labelled/finder_access.h"

#include <CLI/CLI.hpp>

#include <fstream>
#include <iostream>

namespace {

/// What all reports take.
struct Options {
    Labelled::Selection selection;
    Eval::PeopleSelection people; ///< what only reports on recognition take
    Eval::EyeDistances eyeDistances;
    Cmp::LifeChecker::Settings life;
    int lifeLoss = life.lossThreshold;
    std::vector<int> lifeThresholds{5, 10, 15, 20, 25, 30, 35, 40, 45, 50, 55, 60};
    std::string etc, finder = "orbek", settings = "Strict", json, plot;
};

void writeFile(const std::string& name, const std::string& content) {
    std::ofstream file(name);
    if (!(file << content)) FN_THROW(FNEIOError, "Cannot write " + name);
}

int statusOf(const std::vector<std::string>& failures) {
    for (const std::string& failure : failures) std::cerr << "orbek-eval: " << failure << "\n";
    return failures.empty() ? 0 : 2;
}

int detect(const Options& options) {
    const std::optional<FaceFinder> yardstick = Eval::makeYardstick(options.finder);
    const FaceFinder finder = yardstick ? *yardstick : Labelled::makeFaceFinder(options.etc);
    const auto pictures = Eval::detect(finder, options.selection, options.eyeDistances);
    Eval::printDetection(pictures, std::cout);
    if (!options.json.empty()) writeFile(options.json, Eval::detectionJson(pictures));
    if (!options.plot.empty()) {
        Eval::Curve curve{options.finder, {}};
        for (const Eval::OperatingPoint& point : Eval::operatingCurve(pictures))
            curve.points.emplace_back(point.falseAlarmsPerImage, point.recall);
        writeFile(options.plot, Eval::plotSvg("Faces found", {"false alarms per picture", 0.001, 10, true},
                                              {"share of faces", 0, 1}, {curve}));
    }
    std::vector<std::string> failures;
    for (const Eval::DetectedPicture& picture : pictures)
        if (!picture.failure.empty()) failures.push_back(picture.file + ": " + picture.failure);
    return statusOf(failures);
}

int eyes(const Options& options) {
    const Eval::LandmarkFinders finders{
        Labelled::makeFaceFinder(options.etc), Labelled::makeEyesFinder(options.etc, options.settings),
        Labelled::makeMouthFinder(options.etc), Labelled::makeBridgeFinder(options.etc)};
    const Eval::LandmarkReport report =
        Eval::measureLandmarks(finders, options.selection, options.eyeDistances);
    Eval::printLandmarks(report, std::cout);
    if (!options.json.empty()) writeFile(options.json, Eval::landmarksJson(report));
    if (!options.plot.empty()) {
        std::vector<Eval::Curve> curves;
        for (const Eval::LandmarkErrors* const errors : {&report.eyes, &report.mouth, &report.bridge}) {
            Eval::Curve curve{errors->name, {}};
            constexpr float most = 0.25f, step = 0.0025f;
            for (float limit = 0; limit <= most; limit += step)
                curve.points.emplace_back(limit, errors->within(limit));
            curves.push_back(curve);
        }
        writeFile(options.plot, Eval::plotSvg("Landmarks", {"error, eye distances", 0, 0.25},
                                              {"share of those found", 0, 1}, curves));
    }
    return statusOf(report.failures);
}

int portrait(const Options& options) {
    const Eval::PortraitReports reports = Eval::measurePortraits(options.etc, options.selection);
    Eval::printPortraits(reports, std::cout);
    if (!options.json.empty()) writeFile(options.json, Eval::portraitsJson(reports));
    return statusOf(reports.failures);
}

/// Enrols the people of the options, and hands their records to a report.
template <class Report> auto recognise(const Options& options, Report report) {
    Eval::PeopleSelection selection = options.people;
    selection.labels = options.selection.labels;
    selection.split = options.selection.split;
    selection.jobs = options.selection.jobs;
    const Eval::Enrolment enrolment(options.etc, options.eyeDistances);
    const auto result = report(enrolment.enrol(selection), enrolment.strategy(), selection.jobs);
    Eval::print(result, std::cout);
    if (!options.json.empty()) writeFile(options.json, Eval::toJson(result));
    return result;
}

int verify(const Options& options) {
    const Eval::VerificationReport report = recognise(options, Eval::verify);
    if (!options.plot.empty())
        writeFile(options.plot, Eval::plotSvg("Verification", {"false acceptance rate", 1e-5, 1, true},
                                              {"false rejection rate", 0, 1}, {{"orbek", report.curve}}));
    return statusOf(report.failures);
}

int identify(const Options& options) {
    const Eval::IdentificationReport report = recognise(options, Eval::identify);
    if (!options.plot.empty())
        writeFile(options.plot, Eval::plotSvg("Identification",
                                              {"searches for strangers that find somebody", 1e-3, 1, true},
                                              {"people who are not found", 0, 1}, {{"orbek", report.curve}}));
    return statusOf(report.failures);
}

int life(const Options& options) {
    Cmp::LifeChecker::Settings settings = options.life;
    settings.lossThreshold = static_cast<unsigned char>(options.lifeLoss);
    const Eval::LifeReport report =
        Eval::measureLife(options.etc, options.selection, options.eyeDistances, settings);
    Eval::printLife(report, options.lifeThresholds, std::cout);
    if (!options.json.empty()) writeFile(options.json, Eval::lifeJson(report));
    return statusOf(report.failures);
}

CLI::App* report(CLI::App& app, const char* name, const char* doc, Options& options) {
    CLI::App* const command = app.add_subcommand(name, doc);
    Labelled::Selection& selection = options.selection;
    command->add_option("--labels", selection.labels, "Label files; image paths are relative to them")
        ->required()
        ->check(CLI::ExistingFile);
    command->add_option("--split", selection.split, "Only this part of the data")
        ->transform(
            CLI::CheckedTransformer(std::map<std::string, Labelled::Split>{{"train", Labelled::Split::train},
                                                                           {"dev", Labelled::Split::dev},
                                                                           {"test", Labelled::Split::test}}));
    command->add_flag("--by-hand", selection.onlyByHand, "Only faces count whose eyes were labelled by hand");
    command->add_option("--from-pixels", selection.leastEyeDistance,
                        "Only faces count whose eyes are so far apart");
    command->add_option("--to-pixels", selection.mostEyeDistance,
                        "Only faces count whose eyes are no farther apart");
    command->add_option("--max-rotation", selection.mostRotation,
                        "Only faces count that are turned no more in the image plane, degrees");
    command->add_option("--by", selection.groupColumn, "Column of the labels to divide figures by");
    command->add_option("--jobs", selection.jobs, "Pictures at a time")->capture_default_str();
    command->add_option("--etc", options.etc, "Folder with the trained content")
        ->required()
        ->check(CLI::ExistingDirectory);
    command
        ->add_option("--min-eye", options.eyeDistances.least,
                     "Smallest eye distance to look for, in widths of the image")
        ->capture_default_str();
    command
        ->add_option("--max-eye", options.eyeDistances.most, "Largest eye distance, in widths of the image")
        ->capture_default_str();
    command->add_option("--json", options.json, "File that gets every figure");
    command->add_option("--plot", options.plot, "SVG file that gets the curve");
    return command;
}

} // namespace

int main(int argc, char** argv) {
    CLI::App app("Accuracy reports over labelled images (labels.tsv).");
    app.require_subcommand(1);
    Options options;
    CLI::App* const detectCommand = report(app, "detect", "Faces found, and false alarms", options);
    std::vector<std::string> finders = Eval::yardstickNames();
    finders.push_back("orbek");
    detectCommand->add_option("--finder", options.finder, "This library's finder, or one to compare with")
        ->check(CLI::IsMember(finders))
        ->capture_default_str();
    CLI::App* const eyesCommand =
        report(app, "eyes", "How exactly eyes, mouth and nose bridge are found", options);
    eyesCommand->add_option("--settings", options.settings, "Thresholds of the eyes finder")
        ->check(CLI::IsMember({"Strict", "Tolerant"}))
        ->capture_default_str();
    CLI::App* const portraitCommand =
        report(app, "portrait", "How often the portrait analyser is right", options);
    const auto recognition = [&](const char* name, const char* doc) {
        CLI::App* const command = report(app, name, doc, options);
        command
            ->add_option("--pictures", options.people.picturesPerRecord,
                         "Pictures in a record that single pictures are compared with")
            ->check(CLI::PositiveNumber)
            ->capture_default_str();
        command->add_option("--max-yaw", options.people.mostYaw,
                            "Only pictures of heads that are turned no more to a side, degrees");
        command->add_option("--max-light", options.people.mostLightAngle,
                            "Only pictures lit from no more degrees off the front");
        return command;
    };
    CLI::App* const verifyCommand = recognition("verify", "Error rates of comparing two people");
    CLI::App* const identifyCommand = recognition("identify", "Error rates of searches in a gallery");
    CLI::App* const lifeCommand =
        report(app, "life", "How often the life check passes living people, and photos of them", options);
    lifeCommand->add_option("--thresholds", options.lifeThresholds, "Thresholds to tell of")
        ->capture_default_str();
    lifeCommand->add_option("--loss", options.lifeLoss, "Differing bits of a pixel that do not count")
        ->check(CLI::Range(0, 8))
        ->capture_default_str();
    for (const auto& [name, value] : {std::pair{"--width", &options.life.width},
                                      {"--height", &options.life.height},
                                      {"--template-width", &options.life.templateWidth},
                                      {"--template-height", &options.life.templateHeight}})
        lifeCommand
            ->add_option(name, *value, "Pixels of the standard face, and of the window that is compared")
            ->capture_default_str();
    CLI11_PARSE(app, argc, argv);
    try {
        if (*verifyCommand) return verify(options);
        if (*identifyCommand) return identify(options);
        if (*lifeCommand) return life(options);
        if (*portraitCommand) return portrait(options);
        return *detectCommand ? detect(options) : eyes(options);
    } catch (const std::exception& e) {
        std::cerr << "orbek-eval: " << e.what() << "\n";
        return 1;
    }
}
