// Lists, checks and unpacks the trained content.

#include "model_build.h"
#include "model_files.h"
#include "model_sums.h"

#include "fn/exception.h"

#include <CLI/CLI.hpp>

#include <filesystem>
#include <iostream>

namespace {

namespace fs = std::filesystem;
using namespace Orbek::Models;

void list(const fs::path& etc) {
    for (const ModelFile& model : modelFiles()) {
        const fs::path path = etc / model.directory / model.name;
        std::cout << path.string() << '\t' << model.reader << '\t';
        if (fs::exists(path))
            std::cout << fs::file_size(path) << '\t' << sha256(path) << '\n';
        else
            std::cout << "missing\n";
    }
}

/// @return number of files that are missing or that their readers refuse
int check(const fs::path& etc) {
    int failures = 0;
    for (const ModelFile& model : modelFiles()) {
        const fs::path path = etc / model.directory / model.name;
        if (!fs::exists(path)) {
            std::cout << path.string() << ": missing\n";
            ++failures;
        } else if (!model.open) {
            std::cout << path.string() << ": not opened, this version has no " << model.reader << '\n';
        } else {
            try {
                model.open((etc / model.directory).string(), model.name);
                std::cout << path.string() << ": opened\n";
            } catch (const std::exception& e) {
                std::cout << path.string() << ": " << e.what() << '\n';
                ++failures;
            }
        }
    }
    return failures;
}

} // namespace

int main(int argc, char** argv) {
    CLI::App app("Lists, checks and unpacks the trained content of the library.");
    app.require_subcommand(1);
    std::string etc = "etc", models = "models";
    const auto command = [&](const char* name, const char* doc) {
        CLI::App* const sub = app.add_subcommand(name, doc);
        sub->add_option("--etc", etc, "Folder of the unpacked files")->capture_default_str();
        return sub;
    };
    const CLI::App* const listing =
        command("list", "Each file with its reader, size and SHA-256, or \"missing\".");
    const CLI::App* const checking =
        command("check", "Opens each file with its reader; fails if one is missing or refused.");
    CLI::App* const building = command("build", "Unpacks the compact sources and checks their sums.");
    building->add_option("--models", models, "Folder of the compact sources")->capture_default_str();
    CLI11_PARSE(app, argc, argv);

    try {
        if (*listing) list(etc);
        if (*checking && check(etc) != 0) return 1;
        if (*building) std::cout << build(models, etc, std::cout) << " files\n";
        return 0;
    } catch (const std::exception& e) {
        std::cerr << "orbek-models: " << e.what() << '\n';
        return 1;
    }
}
