// orbek config: the settings of a configuration file.

#include "command.h"
#include "configuration_file.h"
#include "output.h"

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <memory>

#include <nlohmann/json.hpp>

namespace Orbek::Tool {
namespace {

using Json = nlohmann::ordered_json;
using Setting = Configuration::Setting;

struct ConfigOptions : CommonOptions {
    std::string key;
    std::string value;
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

template <class T> bool isNumber(const std::string& text) {
    T value{};
    const char* const end = text.data() + text.size();
    const auto [parsed, error] = std::from_chars(text.data(), end, value);
    return error == std::errc() && parsed == end;
}

/// What is no value is told now, and not when an engine is made.
void demandFitting(const Setting& setting, const std::string& value) {
    const std::string& type = setting.type;
    const bool fits = type == "Bool"    ? value == "true" || value == "false"
                      : type == "Float" ? isNumber<float>(value)
                      : type == "Int"   ? isNumber<std::int32_t>(value)
                      : type == "UInt"  ? isNumber<std::uint32_t>(value)
                                        : true;
    if (!fits) throw std::runtime_error(setting.key + ": \"" + value + "\" is not of the type " + type);
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
    const Setting setting = settingOf(openConfiguration(file), options.key);
    demandValue(setting);
    demandFitting(setting, options.value);
    Configuration(file).setValue(options.key, options.value); // writes the file at its end
    if (openConfiguration(file).getValue(options.key) != options.value)
        throw std::runtime_error(file + ": cannot be written");
    return done;
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
    return commands;
}

} // namespace Orbek::Tool
