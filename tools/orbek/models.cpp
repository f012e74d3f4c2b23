// orbek models: the trained content that is installed.

#include "command.h"
#include "configuration_file.h"
#include "feature_finders.h"
#include "model_sums.h"
#include "output.h"
#include "parallel.h"

#include <atomic>
#include <filesystem>
#include <memory>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

namespace fs = std::filesystem;

struct ModelsOptions : CommonOptions {
    unsigned int jobs = 0;
};

/// What should be installed: sums by path below a folder.
struct InstalledModels {
    fs::path folder;
    std::vector<std::pair<std::string, std::string>> sums;
};

/// @throws UnreadableInput naming the list
InstalledModels installedModels(const CommonOptions& options) {
    const Configuration configuration = openConfiguration(options.configuration);
    const fs::path folder = fs::path(installationFolder(configuration)) / "etc";
    try {
        const auto sums = Models::readSums(folder / Models::sumsName);
        return {folder, {sums.begin(), sums.end()}};
    } catch (const std::exception& e) {
        throw UnreadableInput(e.what());
    }
}

int list(const ModelsOptions& options) {
    const InstalledModels models = installedModels(options);
    Output output(options);
    for (const auto& [path, sum] : models.sums) {
        const fs::path file = models.folder / path;
        std::error_code missing;
        const auto bytes = fs::file_size(file, missing);
        if (missing)
            output.complaint(file.string(), missing.message());
        else
            output.result({{"file", file.string()}, {"bytes", bytes}});
    }
    return output.complained() ? unreadable : done;
}

int check(const ModelsOptions& options) {
    const InstalledModels models = installedModels(options);
    Output output(options, models.sums.size());
    std::atomic<std::size_t> good = 0;
    inParallel(options.jobs, models.sums.size(), [&](std::size_t, std::size_t item) {
        const auto& [path, sum] = models.sums[item];
        const std::string file = (models.folder / path).string();
        try {
            if (Models::sha256(file) == sum)
                ++good;
            else
                output.complaint(file, "is not as it was installed, its SHA-256 is another one");
        } catch (const std::exception& e) {
            output.complaint(e.what());
        }
        output.step();
    });
    output.result({{"good", good.load()}, {"bad", models.sums.size() - good}});
    return output.complained() ? unreadable : done;
}

} // namespace

std::vector<Command> modelsCommands(CLI::App& program) {
    CLI::App* const group = addGroup(program, "models", "Look at the trained models that are installed.");
    const auto options = std::make_shared<ModelsOptions>();
    CLI::App* const listing = addCommand(*group, "list", "Tell the files and their sizes.", *options);
    CLI::App* const checking = addCommand(
        *group, "check", "Compare the files with the checksums that were installed with them.", *options);
    addJobs(*checking, options->jobs);
    return {{listing, [options] { return list(*options); }},
            {checking, [options] { return check(*options); }}};
}

} // namespace Orbek::Tool
