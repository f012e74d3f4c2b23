#include "options.h"

#include "orbek/image_io.h"

#include <algorithm>
#include <thread>

#include <CLI/CLI.hpp>

namespace Orbek::Tool {
namespace {

/// What CLI::Range takes for one, "nan" is no share.
std::string complaintOfShare(const std::string& text) {
    float share = 0;
    const bool number = CLI::detail::lexical_cast(text, share);
    return number && share >= 0 && share <= 1 ? "" : "\"" + text + "\" is not a number from 0 to 1";
}

template <class Share>
CLI::Option* add(CLI::App& command, const std::string& name, Share& share, const std::string& description) {
    return command.add_option(name, share, description)
        ->check(CLI::Validator(complaintOfShare, "FLOAT in [0 - 1]"));
}

/// Options that change what the readers of pictures refuse.
void addLimits(CLI::App& command) {
    const auto add = [&](const char* name, std::uint64_t greatest, const char* description, auto set) {
        const auto change = [set](const std::uint64_t& value) {
            ImageIO::Limits limits = ImageIO::limits();
            set(limits, value);
            ImageIO::setLimits(limits);
        };
        command.add_option_function<std::uint64_t>(name, change, description)
            ->type_name("N")
            ->check(CLI::Range(std::uint64_t{1}, greatest));
    };
    add("--max-pixels", std::uint64_t{1} << 40,
        "Refuse pictures of more pixels, 134217728 otherwise; for more, memory grows with it",
        [](ImageIO::Limits& limits, std::uint64_t value) {
            constexpr std::uint64_t mostBytesPerPixel = 24;
            if (value > limits.maxPixels) limits.maxBytes = mostBytesPerPixel * value;
            limits.maxPixels = value;
        });
    add("--max-side", 0x7FFFFFFF, "Refuse pictures of more columns or rows, 65535 otherwise",
        [](ImageIO::Limits& limits, std::uint64_t value) {
            limits.maxWidth = limits.maxHeight = static_cast<std::uint32_t>(value);
        });
}

} // namespace

CLI::App* addCommand(CLI::App& parent, const std::string& name, const std::string& description,
                     CommonOptions& options) {
    CLI::App* const command = parent.add_subcommand(name, description);
    command->add_option("--config", options.configuration, "Configuration file in place of the installed one")
        ->type_name("FILE");
    command->add_flag("--json", options.json, "Print results as JSON, one object a line");
    command->add_flag("--quiet", options.quiet, "Show no progress bar");
    addLimits(*command);
    return command;
}

CLI::App* addGroup(CLI::App& program, const std::string& name, const std::string& description) {
    CLI::App* const group = program.add_subcommand(name, description);
    group->require_subcommand(1);
    return group;
}

void addImages(CLI::App& command, std::vector<std::string>& images, const std::string& description) {
    command.add_option("images", images, description)->required()->type_name("IMAGE");
}

void addJobs(CLI::App& command, unsigned int& jobs) {
    jobs = std::clamp(std::thread::hardware_concurrency(), 1u, 1024u);
    command.add_option("--jobs", jobs, "Threads that share the work; one for each processor otherwise")
        ->type_name("N")
        ->check(CLI::Range(1u, 1024u));
}

CLI::Option* addShare(CLI::App& command, const std::string& name, float& share,
                      const std::string& description) {
    return add(command, name, share, description)->capture_default_str();
}

CLI::Option* addShare(CLI::App& command, const std::string& name, std::optional<float>& share,
                      const std::string& description) {
    return add(command, name, share, description);
}

} // namespace Orbek::Tool
