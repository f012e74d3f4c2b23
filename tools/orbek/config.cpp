// orbek config: the settings of a configuration file.

#include "command.h"
#include "configuration_file.h"
#include "output.h"

#include <algorithm>
#include <memory>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

using Json = nlohmann::ordered_json;
using Setting = Configuration::Setting;

struct ConfigOptions : CommonOptions {
    std::string key;
    std::string value;
    std::string file; ///< to check
};

/// @throws std::runtime_error naming the key
Setting settingOf(const Configuration& configuration, const std::string& key) {
    const std::vector<Setting> settings = configuration.settings();
    const auto setting = std::ranges::find(settings, key, &Setting::key);
    if (setting == settings.end())
        throw std::runtime_error(key + ": is no key of the configuration; 'orbek config list' shows all");
    return *setting;
}

void demandValue(const Setting& setting) {
    if (!setting.hasValue) throw std::runtime_error(setting.key + ": is a group of keys and has no value");
}

int get(const ConfigOptions& options) {
    const Configuration configuration = openConfiguration(options.configuration);
    demandValue(settingOf(configuration, options.key));
    const std::string value = configuration.getValue(options.key);
    Output(options).result({{"key", options.key}, {"value", value}}, value);
    return done;
}

int set(const ConfigOptions& options) {
    const std::string file = configurationFile(options.configuration);
    const Configuration present = openConfiguration(file, options.key);
    demandValue(settingOf(present, options.key));
    present.checkValue(options.key, options.value);
    Configuration changed(file);
    changed.setValue(options.key, options.value);
    changed.flush();
    return done;
}

int check(const ConfigOptions& options) {
    const std::string file = configurationFile(options.file.empty() ? options.configuration : options.file);
    const std::vector<Configuration::Fault> faults = readConfiguration(file).faults();
    Output output(options);
    for (const auto& [line, key, reason] : faults)
        output.result({{"file", file}, {"line", line}, {"key", key}, {"reason", reason}},
                      file + ": line " + std::to_string(line) + ": " + key + ": " + reason);
    return faults.empty() ? done : failed;
}

int list(const ConfigOptions& options) {
    const Configuration configuration = openConfiguration(options.configuration);
    Output output(options);
    bool found = false;
    for (const Setting& setting : configuration.settings()) {
        const bool inside =
            options.key.empty() || setting.key == options.key || setting.key.starts_with(options.key + ".");
        found = found || inside;
        if (!inside || !setting.hasValue) continue;
        const std::string value = configuration.getValue(setting.key);
        output.result({{"key", setting.key}, {"value", value}}, setting.key + " = " + value);
    }
    if (!found) (void)settingOf(configuration, options.key);
    return done;
}

int explain(const ConfigOptions& options) {
    const Configuration configuration = openConfiguration(options.configuration);
    const Setting setting = settingOf(configuration, options.key);
    Json json{{"key", setting.key}, {"type", setting.type}};
    if (setting.hasValue) {
        json["value"] = configuration.getValue(setting.key);
        json["default"] = setting.defaultValue;
    }
    json["description"] = setting.description;
    std::string text;
    for (const auto& [name, value] : json.items()) {
        if (name == "key")
            text = value;
        else
            text += "\n  " + name + ": " + value.get<std::string>();
    }
    Output(options).result(json, text);
    return done;
}

} // namespace

std::vector<Command> configCommands(CLI::App& program) {
    CLI::App* const group = addGroup(program, "config", "Show and change settings.");
    const auto options = std::make_shared<ConfigOptions>();
    const auto command = [&](const char* name, const char* description, int (*run)(const ConfigOptions&)) {
        return Command{addCommand(*group, name, description, *options),
                       [options, run] { return run(*options); }};
    };
    const auto addKey = [&](const Command& to) {
        return to.app->add_option("key", options->key, "Key, as ORBEK.FaceTracker.FrameRate")
            ->type_name("KEY");
    };
    std::vector<Command> commands{
        command("get", "Tell the value of a key.", get),
        command("set",
                "Change the value of a key in the configuration file.\n"
                "The file is written anew without its comments; the one before stays beside it as FILE.bak.",
                set),
        command("list", "Tell all values, or those below a key.", list),
        command("explain", "Tell what a key means.", explain)};
    for (const Command& made : commands) addKey(made)->required(made.app->get_name() != "list");
    commands[1].app->add_option("value", options->value, "Value")->required()->type_name("VALUE");
    commands.push_back(command("check",
                               "Tell which lines of a configuration file are wrong.\n"
                               "These are unknown keys, keys that come twice, and values that are none.\n"
                               "Exit status: 0 nothing is wrong, 1 something is.",
                               check));
    commands.back()
        .app->add_option("file", options->file, "Configuration file; --config or the installed one otherwise")
        ->type_name("FILE");
    return commands;
}

} // namespace Orbek::Tool
