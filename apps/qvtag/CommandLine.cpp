#include "CommandLine.h"

#include <CLI/CLI.hpp>

namespace qvct::tool {
namespace {

CommandOption describe(const CLI::Option& option) {
    CommandOption result;
    if (option.get_positional()) {
        result.names = {option.get_name(true)};
    } else {
        for (const std::string& name : option.get_snames()) result.names.push_back("-" + name);
        for (const std::string& name : option.get_lnames()) result.names.push_back("--" + name);
    }
    if (option.get_type_size() != 0) result.value = option.get_type_name();
    result.description = option.get_description();
    result.isRequired = option.get_required();
    const std::string& value = result.value;
    result.takesFile = value.starts_with("FILE") || value == "DIR" || value == "PATH" || value == "RULES";
    return result;
}

CommandDescription describe(const CLI::App& app, const std::string& parents) {
    CommandDescription result;
    result.name = app.get_name();
    result.path = parents + result.name;
    result.description = app.get_description();
    result.example = app.get_footer();
    for (const CLI::Option* option :
         app.get_options([](const CLI::Option* o) { return !o->get_group().empty(); }))
        (option->get_positional() ? result.arguments : result.options).push_back(describe(*option));
    for (const CLI::App* command :
         app.get_subcommands([](const CLI::App* a) { return !a->get_group().empty(); }))
        result.commands.push_back(describe(*command, result.path + " "));
    return result;
}

void append(const CommandDescription& command, std::vector<const CommandDescription*>& all) {
    all.push_back(&command);
    for (const CommandDescription& below : command.commands) append(below, all);
}

}  // namespace

std::string refuseNegative(const std::string& text) {
    return text.starts_with('-') ? text + " is less than 0" : "";
}

void addFollowOption(CLI::App& command, LinksOutside& links) {
    command.add_flag_callback(
        "--follow", [&links] { links = LinksOutside::all; },
        "Also follow links that lead out of the folders named");
}

CommandDescription describeCommandLine(const CLI::App& app) {
    return describe(app, {});
}

std::vector<const CommandDescription*> allCommands(const CommandDescription& root) {
    std::vector<const CommandDescription*> all;
    append(root, all);
    return all;
}

}  // namespace qvct::tool
