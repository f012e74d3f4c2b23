// orbek-train: makes the model files of the library from labelled images.

#include "fn/exception.h"
#include "fn/numeric/blas.h"
#include "train/b7_training.h"
#include "train/calibration.h"
#include "train/face_training.h"
#include "train/feature_training.h"
#include "train/l5_training.h"
#include "train/portrait_training.h"
#include "train/synth_training.h"

#include <CLI/CLI.hpp>

#include <functional>
#include <iostream>

int main(int argc, char** argv) {
    CLI::App app("Makes the model files of liborbek from labelled images.");
    app.require_subcommand(1);
    std::string data, folder;
    std::uint64_t seed = 1;
    int threads = 2;
    using Path = std::filesystem::path;
    using Task = std::function<void(const Path& data, const Path& folder, std::uint64_t seed)>;
    const auto training = [&](const char* name, const char* doc, Task task) {
        CLI::App* const sub = app.add_subcommand(name, doc);
        sub->add_option("--data", data, "Root of the labelled images")
            ->required()
            ->check(CLI::ExistingDirectory);
        sub->add_option("--out", folder, "Folder that gets the model files")->required();
        sub->add_option("--seed", seed, "Seed of all random choices")->capture_default_str();
        sub->add_option("--threads", threads, "Threads of the linear algebra")->capture_default_str();
        sub->callback([&, task] {
            Fn::Numeric::setBlasThreads(threads);
            task(data, folder, seed);
        });
        return sub;
    };
    training("face", "The eleven files of the face finder", Train::trainFaceFinder);
    training("eyes", "The file of the eyes finder", Train::trainEyesFinder);
    training("mouth", "The file of the mouth finder", Train::trainMouthFinder);
    training("bridge", "The file of the nose bridge finder", Train::trainBridgeFinder);
    training("synth", "The model of sample people who do not exist", Train::trainSynth);
    std::string samples;
    CLI::App* const measure = app.add_subcommand(
        "measure-synth", "How far sample portraits are from the photos that their model learned from");
    measure->add_option("--data", data, "Root of the labelled images")
        ->required()
        ->check(CLI::ExistingDirectory);
    measure->add_option("--samples", samples, "Label file of the portraits")
        ->required()
        ->check(CLI::ExistingFile);
    measure->callback([&] { Train::measureSynth(data, samples); });
    training("l5", "The transformation and the mapping files of the L5 comparison", Train::trainL5);
    std::string etc, cache, only;
    const auto cached = [&](const char* name, const char* doc, auto task) {
        CLI::App* const sub = training(name, doc, [&, task](const auto&...) {
            task(Train::TrainingSources{data, etc, cache, seed}, folder);
        });
        sub->add_option("--etc", etc, "Unpacked models of the finders")
            ->required()
            ->check(CLI::ExistingDirectory);
        sub->add_option("--cache", cache, "Folder that keeps extracted features")->required();
        return sub;
    };
    cached("portrait", "The files of the portrait analyser",
           [&](const Train::TrainingSources& sources, const Path& out) {
               Train::trainPortrait(sources, out, only);
           })
        ->add_option("--only", only, "One step, such as age or mouth");
    cached("b7", "The transformation and the mapping files of the B7 comparison", Train::trainB7);
    cached("calibrate-b7", "The mapping files for a transformation of B7 that is there", Train::calibrateB7);
    std::string scores, algorithm;
    CLI::App* const calibration = app.add_subcommand(
        "calibrate", "The score and rate mapping files of a comparison algorithm, from scores of pairs");
    calibration->add_option("--scores", scores, "Lines of \"genuine\" or \"impostor\" and a raw score")
        ->required()
        ->check(CLI::ExistingFile);
    calibration->add_option("--algorithm", algorithm, "Ends the files' names: smap-ALGORITHM.dat")
        ->required();
    calibration->add_option("--out", folder, "Folder that gets the mapping files and a report")->required();
    calibration->callback([&] { Train::calibrate(scores, algorithm, folder); });
    try {
        CLI11_PARSE(app, argc, argv);
    } catch (const std::exception& e) {
        std::cerr << "orbek-train: " << e.what() << "\n";
        return 1;
    }
}
