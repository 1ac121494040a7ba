#pragma once

#include <string>
#include <vector>

namespace qvct::tool {

/// An option of the command line, or a positional argument.
struct CommandOption {
    std::vector<std::string> names;  ///< With their dashes; of an argument its one name.
    std::string value;               ///< What stands for the value in a synopsis; empty for a flag.
    std::string description;
    bool isRequired = false;
    bool takesFile = false;
};

/// A command with those below it, read off the parser, so that what is made from it is never out of date.
struct CommandDescription {
    std::string path;  ///< "qvtag taxonomy find"
    std::string name;
    std::string description;
    std::string example;
    std::vector<CommandOption> arguments;
    std::vector<CommandOption> options;  ///< Its own; those of the tool may stand behind every command.
    std::vector<CommandDescription> commands;
};

/// The command and all commands below it, each before those below it.
std::vector<const CommandDescription*> allCommands(const CommandDescription& root);

std::string bashCompletion(const CommandDescription& tool);
std::string zshCompletion(const CommandDescription& tool);
std::string fishCompletion(const CommandDescription& tool);
/// The manual page in the macros of `man`, with the version in its footer.
std::string manualPage(const CommandDescription& tool);

}  // namespace qvct::tool
