// orbek-eval: accuracy reports over labelled images.

#include "eval/detect.h"
#include "eval/finder_access.h"
#include "fn/exception.h"

#include <CLI/CLI.hpp>

#include <fstream>
#include <iostream>

namespace {

void writeFile(const std::string& name, const std::string& content) {
    std::ofstream file(name);
    if (!(file << content)) FN_THROW(FNEIOError, "Cannot write " + name);
}

} // namespace

int main(int argc, char** argv) {
    CLI::App app("Accuracy reports over labelled images (labels.tsv).");
    app.require_subcommand(1);
    std::string etc, json;
    Eval::DetectOptions options;
    CLI::App* const detect = app.add_subcommand("detect", "Faces found, and false alarms");
    detect->add_option("--labels", options.labels, "Label files; image paths are relative to them")
        ->required()
        ->check(CLI::ExistingFile);
    detect->add_option("--etc", etc, "Folder with the trained content")
        ->required()
        ->check(CLI::ExistingDirectory);
    detect->add_option("--split", options.split, "Only this part of the data")
        ->transform(
            CLI::CheckedTransformer(std::map<std::string, Labelled::Split>{{"train", Labelled::Split::train},
                                                                           {"dev", Labelled::Split::dev},
                                                                           {"test", Labelled::Split::test}}));
    detect
        ->add_option("--min-eye", options.minRelEyeDistance, "Smallest eye distance, in widths of the image")
        ->capture_default_str();
    detect->add_option("--max-eye", options.maxRelEyeDistance, "Largest eye distance, in widths of the image")
        ->capture_default_str();
    detect->add_option("--jobs", options.jobs, "Pictures at a time")->capture_default_str();
    detect->add_option("--json", json, "File that gets every figure");
    CLI11_PARSE(app, argc, argv);
    try {
        const auto pictures = Eval::detect(Eval::makeFaceFinder(etc), options);
        Eval::printDetection(pictures, std::cout);
        if (!json.empty()) writeFile(json, Eval::detectionJson(pictures));
    } catch (const std::exception& e) {
        std::cerr << "orbek-eval: " << e.what() << "\n";
        return 1;
    }
}
