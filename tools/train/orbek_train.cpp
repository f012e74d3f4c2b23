// orbek-train: makes the model files of the library from labelled images.

#include "fn/exception.h"
#include "fn/numeric/blas.h"
#include "train/face_training.h"

#include <CLI/CLI.hpp>

#include <iostream>

int main(int argc, char** argv) {
    CLI::App app("Makes the model files of liborbek from labelled images.");
    app.require_subcommand(1);
    std::string data, out;
    std::uint64_t seed = 1;
    int threads = 2;
    const auto common = [&](CLI::App* command) {
        command->add_option("--data", data, "Root of the labelled images")
            ->required()
            ->check(CLI::ExistingDirectory);
        command->add_option("--out", out, "Folder that gets the model files")->required();
        command->add_option("--seed", seed, "Seed of all random choices")->capture_default_str();
        command->add_option("--threads", threads, "Threads of the linear algebra")->capture_default_str();
    };
    CLI::App* const face = app.add_subcommand("face", "The eleven files of the face finder");
    common(face);
    CLI11_PARSE(app, argc, argv);
    try {
        Fn::Numeric::setBlasThreads(threads);
        if (face->parsed()) Train::trainFaceFinder(data, out, seed);
    } catch (const std::exception& e) {
        std::cerr << "orbek-train: " << e.what() << "\n";
        return 1;
    }
}
