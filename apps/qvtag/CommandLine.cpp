#include "CommandLine.h"

#include "output/StandardStreams.h"
#include "platform/base/bytes/Printable.h"
#include "platform/text/Spelling.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <optional>
#include <sstream>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

namespace qvct::tool {
namespace {

std::string refuseEmpty(const std::string& path) {
    return path.empty() ? "an empty path names nothing" : "";
}

std::string refuseNegative(const std::string& text) {
    return text.starts_with('-') ? text + " is less than 0" : "";
}

/// Catches a NaN, which a range check lets through.
std::string refuseNotANumber(const std::string& text) {
    double value = 0;
    return CLI::detail::lexical_cast(text, value) && std::isnan(value) ? "not a number" : "";
}

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

/// The command that a misspelt word stands for; empty when it is one, or is like none.
std::string meantCommand(const CLI::App& tool, const std::string& word) {
    std::vector<std::string> names;
    for (const CLI::App* command : tool.get_subcommands({})) names.push_back(command->get_name());
    if (std::find(names.begin(), names.end(), word) != names.end()) return {};
    return std::string(nearestSpelling(word, names));
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

}  // namespace

Option& Option::required() {
    option_->required();
    return *this;
}

Option& Option::valueName(const std::string& name) {
    option_->type_name(name);
    if (name == "PATH" || name == "FILE" || name == "DIR") option_->check(CLI::Validator(refuseEmpty, ""));
    return *this;
}

Option& Option::oneOf(const std::vector<std::string>& words) {
    option_->check(CLI::IsMember(words));
    return *this;
}

Option& Option::between(int least, int most) {
    option_->check(CLI::Range(least, most));
    return *this;
}

Option& Option::between(double least, double most) {
    option_->check(CLI::Range(least, most) & CLI::Validator(refuseNotANumber, ""));
    return *this;
}

Option& Option::notNegative() {
    option_->check(CLI::Validator(refuseNegative, ""));
    return *this;
}

Option& Option::separatedBy(char separator) {
    option_->delimiter(separator);
    return *this;
}

Option& Option::oneWordEach() {
    option_->allow_extra_args(false);
    return *this;
}

Option& Option::showsDefault() {
    option_->capture_default_str();
    return *this;
}

Option& Option::needs(const Option& other) {
    option_->needs(other.option_);
    return *this;
}

Option& Option::excludes(const Option& other) {
    option_->excludes(other.option_);
    return *this;
}

Command Command::addCommand(const std::string& name, const std::string& description) {
    return Command(*parser_->add_subcommand(name, description));
}

template <typename Value>
Option Command::addOption(const std::string& names, Value& value, const std::string& description) {
    return Option(*parser_->add_option(names, value, description));
}

template Option Command::addOption(const std::string&, std::string&, const std::string&);
template Option Command::addOption(const std::string&, std::optional<std::string>&, const std::string&);
template Option Command::addOption(const std::string&, std::vector<std::string>&, const std::string&);
template Option Command::addOption(const std::string&, unsigned&, const std::string&);
template Option Command::addOption(const std::string&, std::uint64_t&, const std::string&);
template Option Command::addOption(const std::string&, std::optional<std::int32_t>&, const std::string&);
template Option Command::addOption(const std::string&, std::optional<double>&, const std::string&);

Option Command::addFlag(const std::string& names, bool& value, const std::string& description) {
    return Option(*parser_->add_flag(names, value, description));
}

Option Command::addFlag(const std::string& names, const std::function<void()>& action,
                        const std::string& description) {
    return Option(*parser_->add_flag_callback(names, action, description));
}

Option Command::addFollowFlag(LinksOutside& links) {
    return addFlag(
        "--follow", [&links] { links = LinksOutside::all; },
        "Also follow links that lead out of the folders named");
}

void Command::requireCommand() {
    parser_->require_subcommand(1);
}

void Command::allowOneCommand() {
    parser_->require_subcommand(0, 1);
}

bool Command::isCommandNamed() const {
    return !parser_->get_subcommands().empty();
}

void Command::footer(const std::string& text) {
    parser_->footer(text);
}

void Command::hide() {
    parser_->group("");
}

void Command::callback(const std::function<void()>& run) {
    parser_->callback(run);
}

CommandDescription Command::describe() const {
    return tool::describe(*parser_, {});
}

CommandLine::CommandLine(const std::string& name, const std::string& description, const std::string& version)
    : parser_(std::make_unique<CLI::App>(description, name)) {
    parser_->set_version_flag("--version", version);
    parser_->require_subcommand(1);
    parser_->fallthrough();
}

CommandLine::~CommandLine() = default;

Command CommandLine::tool() {
    return Command(*parser_);
}

bool CommandLine::run(int argc, char** argv, const std::function<void()>& prepare) {
    parser_->parse_complete_callback(prepare);
    try {
        parser_->parse(argc, argv);
    } catch (const CLI::ParseError& error) {
        // The first word that is no option is meant as a command.
        const auto* const word = std::find_if(argv + std::min(argc, 1), argv + argc,
                                              [](const char* text) { return *text != '-'; });
        const std::string meant = word == argv + argc ? std::string() : meantCommand(*parser_, *word);
        if (!meant.empty()) {
            printErrorText(
                fmt::format("There is no command \"{}\"; did you mean \"{}\"?\n", printable(*word), meant));
            return false;
        }
        std::ostringstream output;
        std::ostringstream errors;
        const bool isAnswered = parser_->exit(error, output, errors) == 0;
        printText(output.str());
        printErrorText(errors.str());
        return isAnswered;
    }
    return true;
}

}  // namespace qvct::tool
