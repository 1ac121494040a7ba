#include "CommandDescription.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <functional>
#include <set>

#include <fmt/format.h>

// The three scripts work alike: they find out which command the words before the cursor name, and offer what
// that command takes.

namespace qvct::tool {
namespace {

std::string quoted(const std::string& text) {
    return "'" + replaceAll(text, "'", "'\\''") + "'";
}

/// In fish, a backslash is the only way to write an apostrophe between apostrophes.
std::string quotedForFish(const std::string& text) {
    return "'" + replaceAll(replaceAll(text, "\\", "\\\\"), "'", "\\'") + "'";
}

/// The command's own options and, behind every command, those of the tool.
std::vector<CommandOption> optionsOf(const CommandDescription& command, const CommandDescription& tool) {
    std::vector<CommandOption> options = command.options;
    std::set<std::string> known;
    for (const CommandOption& option : options) known.insert(option.names.back());
    for (const CommandOption& option : tool.options) {
        // Only the tool itself has `--version`.
        const bool isOfToolOnly = option.names.back() == "--version" && &command != &tool;
        if (!isOfToolOnly && known.insert(option.names.back()).second) options.push_back(option);
    }
    return options;
}

/// Whether a word that is no option may be a file: the command takes files, or has no commands below it.
bool offersFiles(const CommandDescription& command) {
    return command.commands.empty() ||
           std::any_of(command.arguments.begin(), command.arguments.end(),
                       [](const CommandOption& argument) { return argument.takesFile; });
}

std::string patternOfCommands(const CommandDescription& tool) {
    std::vector<std::string> paths;
    for (const CommandDescription* command : allCommands(tool)) {
        if (command != &tool) paths.push_back(quoted(command->path));
    }
    return join(paths, "|");
}

/// One branch of a `case` for each command.
std::string branches(const CommandDescription& tool,
                     const std::function<std::string(const CommandDescription&)>& body) {
    std::string text;
    for (const CommandDescription* command : allCommands(tool))
        text += fmt::format("    {}) {} ;;\n", quoted(command->path), body(*command));
    return text;
}

std::string bashBranch(const CommandDescription& command, const CommandDescription& tool) {
    std::vector<std::string> commands;
    for (const CommandDescription& below : command.commands) commands.push_back(below.name);
    std::vector<std::string> options;
    std::vector<std::string> filesBehind;
    std::vector<std::string> valuesBehind;
    for (const CommandOption& option : optionsOf(command, tool)) {
        options.insert(options.end(), option.names.begin(), option.names.end());
        auto& list = option.takesFile ? filesBehind : valuesBehind;
        if (!option.value.empty()) list.insert(list.end(), option.names.begin(), option.names.end());
    }
    return fmt::format("commands={} options={} files={} values={} takesfiles={}", quoted(join(commands, " ")),
                       quoted(join(options, " ")), quoted(join(filesBehind, " ")),
                       quoted(join(valuesBehind, " ")), offersFiles(command) ? "yes" : "");
}

std::string zshPair(const std::string& name, const std::string& description) {
    return " " + quoted(name + ":" + replaceAll(description, ":", "\\:"));
}

std::string zshBranch(const CommandDescription& command, const CommandDescription& tool) {
    std::string commands;
    for (const CommandDescription& below : command.commands)
        commands += zshPair(below.name, below.description);
    std::string options;
    for (const CommandOption& option : optionsOf(command, tool)) {
        for (const std::string& name : option.names) options += zshPair(name, option.description);
    }
    return fmt::format("commands=({} ) options=({} ) takesfiles={}", commands, options,
                       offersFiles(command) ? "yes" : "");
}

std::string fishLines(const CommandDescription& command, const CommandDescription& tool) {
    const std::string here =
        fmt::format("complete -c qvtag -n 'test (__qvtag_command) = \"{}\"'", command.path);
    std::string text = offersFiles(command) ? "" : here + " -f\n";
    for (const CommandDescription& below : command.commands)
        text += fmt::format("{} -a {} -d {}\n", here, below.name, quotedForFish(below.description));
    for (const CommandOption& option : optionsOf(command, tool)) {
        text += here;
        for (const std::string& name : option.names) {
            const bool isLong = name.starts_with("--");
            text += fmt::format(" -{} {}", isLong ? 'l' : 's', name.substr(isLong ? 2 : 1));
        }
        if (!option.value.empty()) text += option.takesFile ? " -rF" : " -x";
        text += fmt::format(" -d {}\n", quotedForFish(option.description));
    }
    return text;
}

/// Finds the command in the words before the one being typed, and runs its branch.
template <typename Branch>
std::string wordsOfCommand(std::string_view words, const CommandDescription& tool, Branch branch) {
    return fmt::format(
        "  for word in {}; do\n    case \"$command $word\" in {}) command=\"$command $word\" ;; esac\n"
        "  done\n  case \"$command\" in\n{}  esac\n",
        words, patternOfCommands(tool),
        branches(tool, [&](const auto& command) { return branch(command, tool); }));
}

}  // namespace

std::string bashCompletion(const CommandDescription& tool) {
    return R"(_qvtag() {
  local command=qvtag word commands options files values takesfiles current=${COMP_WORDS[COMP_CWORD]}
)" + wordsOfCommand(R"("${COMP_WORDS[@]:1:COMP_CWORD-1}")", tool, bashBranch) +
           R"(  local before=" ${COMP_WORDS[COMP_CWORD-1]} "
  if [[ " $files " == *"$before"* ]]; then compopt -o filenames; mapfile -t COMPREPLY < <(compgen -f -- "$current")
  elif [[ " $values " == *"$before"* ]]; then COMPREPLY=()
  elif [[ $current == -* ]]; then mapfile -t COMPREPLY < <(compgen -W "$options" -- "$current")
  else
    mapfile -t COMPREPLY < <(compgen -W "$commands" -- "$current")
    if [[ -n $takesfiles ]]; then compopt -o filenames; mapfile -t -O ${#COMPREPLY[@]} COMPREPLY < <(compgen -f -- "$current"); fi
  fi
}
complete -F _qvtag qvtag
)";
}

std::string zshCompletion(const CommandDescription& tool) {
    return R"(#compdef qvtag
_qvtag() {
  local command=qvtag word takesfiles
  local -a commands options
)" + wordsOfCommand(R"("${(@)words[2,CURRENT-1]}")", tool, zshBranch) +
           R"(  if [[ $PREFIX == -* ]]; then _describe option options
  else
    (( $#commands )) && _describe command commands
    [[ -n $takesfiles ]] && _files
  fi
}
_qvtag "$@"
)";
}

std::string fishCompletion(const CommandDescription& tool) {
    std::string text =
        "function __qvtag_command\n  set -l command qvtag\n  for word in (commandline -opc)[2..]\n"
        "    switch \"$command $word\"\n      case " +
        replaceAll(patternOfCommands(tool), "|", " ") +
        "\n        set command \"$command $word\"\n    end\n  end\n  echo $command\nend\n";
    for (const CommandDescription* command : allCommands(tool)) text += fishLines(*command, tool);
    return text;
}

}  // namespace qvct::tool
