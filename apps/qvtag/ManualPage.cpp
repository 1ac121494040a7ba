#include "CommandDescription.h"
#include "platform/base/Version.h"
#include "platform/text/Text.h"

#include <fmt/format.h>

namespace qvct::tool {
namespace {

/// Text that the formatter takes as it is.
std::string plain(const std::string& text) {
    std::string result;
    for (const std::string& line : split(replaceAll(replaceAll(text, "\\", "\\e"), "-", "\\-"), "\n"))
        result += (line.starts_with('.') || line.starts_with('\'') ? "\\&" : "") + line + "\n";
    return result;
}

std::string line(const std::string& text) {
    std::string result = plain(text);
    result.pop_back();
    return result;
}

std::string entry(const CommandOption& option) {
    std::vector<std::string> names;
    for (const std::string& name : option.names) names.push_back("\\fB" + line(name) + "\\fR");
    const std::string value = option.value.empty() ? "" : " \\fI" + line(option.value) + "\\fR";
    return ".TP\n" + join(names, ", ") + value + "\n" + plain(option.description);
}

std::string synopsis(const CommandDescription& command) {
    std::string text = ".B " + line(command.path) + "\n";
    for (const CommandOption& argument : command.arguments) {
        const std::string name = line(argument.value.empty() ? argument.names.front() : argument.value);
        text += argument.isRequired ? ".I " + name + "\n" : ".RI [ " + name + " ]\n";
    }
    if (!command.options.empty()) text += ".RI [ options ]\n";
    return text;
}

std::string section(const CommandDescription& command) {
    std::string text =
        ".SS " + line(command.path) + "\n" + plain(command.description + ".") + ".PP\n" + synopsis(command);
    for (const CommandOption& argument : command.arguments) text += entry(argument);
    for (const CommandOption& option : command.options) {
        if (option.names.back() != "--help") text += entry(option);
    }
    if (!command.example.empty()) text += ".PP\n.nf\n" + plain(command.example) + ".fi\n";
    return text;
}

}  // namespace

std::string manualPage(const CommandDescription& tool) {
    std::string text = fmt::format(".TH QVTAG 1 \"\" \"qvtag {}\" \"User Commands\"\n", version());
    text +=
        ".SH NAME\nqvtag \\- describes sounds with tags\n.SH SYNOPSIS\n.B qvtag\n.RI [ options ]\n"
        ".I command\n.RI [ arguments ]\n.SH DESCRIPTION\n" +
        plain(tool.description) +
        "Folders are walked; what cannot be read is named on standard error, and the rest is done all the "
        "same.\n.SH OPTIONS\nThey may stand behind every command, too.\n";
    for (const CommandOption& option : tool.options) text += entry(option);
    text += ".SH COMMANDS\n";
    for (const CommandDescription* command : allCommands(tool)) {
        if (command != &tool) text += section(*command);
    }
    return text + R"(.SH EXIT STATUS
.TP
.B 0
done
.TP
.B 1
some items failed; each is named on standard error with the reason
.TP
.B 2
wrong usage
.SH ENVIRONMENT
.TP
.B QVCT_RESOURCES
Folder whose files replace those of the installation, as
.B \-\-resources
does, which wins.
.SH FILES
.TP
.I share/qvcontenttagging/resources
The taxonomy, keywords and rules of the installation, in the prefix that it lies in.
)";
}

}  // namespace qvct::tool
