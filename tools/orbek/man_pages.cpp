// orbek man-pages: what --help tells, as pages for man. The build runs it; people need not see it.

#include "command.h"
#include "whole_file.h"

#include <filesystem>
#include <memory>
#include <sstream>

namespace Orbek::Tool {
namespace {

/// Text that troff shows as it is.
std::string shown(const std::string& text) {
    std::string result;
    for (const char c : text) {
        const bool lineStart = result.empty() || result.back() == '\n';
        if (lineStart && (c == '.' || c == '\'')) result += "\\&";
        if (c == '\n') result += "\n.br";
        result += c == '\\' ? "\\e" : c == '-' ? "\\-" : std::string(1, c);
    }
    return result;
}

std::string firstLine(const std::string& text) {
    return text.substr(0, text.find('\n'));
}

/// "orbek gallery add", with another separator for the name of the page.
std::string fullName(const CLI::App& app, char separator) {
    const CLI::App* const parent = app.get_parent();
    return (parent ? fullName(*parent, separator) + separator : "") + app.get_name();
}

std::vector<const CLI::App*> below(const CLI::App& app) {
    return app.get_subcommands([](const CLI::App* command) { return !command->get_group().empty(); });
}

std::string argument(const CLI::Option& option) {
    const std::string type = option.get_type_name();
    return option.get_items_expected_max() == 0 ? ""
                                                : type.substr(0, type.find(':')); // a range comes behind it
}

void writeSynopsis(const CLI::App& app, std::ostream& page) {
    page << ".SH SYNOPSIS\n.B " << shown(fullName(app, ' ')) << "\n";
    if (!below(app).empty()) page << ".I command\n";
    page << "[\\fIoptions\\fR]";
    for (const CLI::Option* option : app.get_options())
        if (option->get_positional()) {
            const bool several = option->get_items_expected_max() > 1, required = option->get_required();
            page << (required ? " " : " [") << shown(option->get_type_name()) << (several ? "..." : "")
                 << (required ? "" : "]");
        }
    page << "\n";
}

void writeOptions(const CLI::App& app, std::ostream& page) {
    page << ".SH OPTIONS\n";
    for (const CLI::Option* option : app.get_options()) {
        const bool positional = option->get_positional();
        page << ".TP\n.B " << shown(positional ? option->get_type_name() : option->get_name(false, true));
        if (const std::string type = argument(*option); !positional && !type.empty())
            page << " \\fI" << shown(type) << "\\fR";
        page << "\n" << shown(option->get_description());
        if (const std::string value = option->get_default_str(); !value.empty())
            page << " (" << shown(value) << " unless told otherwise)";
        page << "\n";
    }
}

void writeCommands(const CLI::App& app, std::ostream& page) {
    if (below(app).empty()) return;
    page << ".SH COMMANDS\nEach has a page of its own.\n";
    for (const CLI::App* command : below(app))
        page << ".TP\n.BR " << shown(fullName(*command, '-')) << " (1)\n"
             << shown(firstLine(command->get_description())) << "\n";
}

void writePages(const CLI::App& app, const std::filesystem::path& folder) {
    const std::string name = fullName(app, '-');
    const std::filesystem::path file = folder / (name + ".1");
    std::ostringstream page;
    page << ".TH " << shown(name) << " 1 \"\" orbek \"Face recognition\"\n"
         << ".SH NAME\n"
         << shown(name) << " \\- " << shown(firstLine(app.get_description())) << "\n";
    writeSynopsis(app, page);
    page << ".SH DESCRIPTION\n" << shown(app.get_description()) << "\n";
    writeCommands(app, page);
    writeOptions(app, page);
    if (const CLI::App* const parent = app.get_parent())
        page << ".SH SEE ALSO\n.BR " << shown(fullName(*parent, '-')) << " (1)\n";
    writeWhole(file.string(), page.str());
    for (const CLI::App* command : below(app)) writePages(*command, folder);
}

} // namespace

Command manPagesCommand(CLI::App& program) {
    const auto folder = std::make_shared<std::string>();
    CLI::App* const app = program.add_subcommand("man-pages", "Write the manual pages into a folder.");
    app->group(""); // not shown
    app->add_option("folder", *folder, "Folder that is there")->required()->type_name("DIR");
    return {app, [folder, &program] {
                writePages(program, *folder);
                return done;
            }};
}

} // namespace Orbek::Tool
