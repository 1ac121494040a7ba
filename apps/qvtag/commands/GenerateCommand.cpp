#include "CommandLine.h"
#include "commands/Commands.h"
#include "output/StandardStreams.h"

#include <map>
#include <memory>

namespace qvct::tool {

void addGenerateCommand(Command& tool) {
    using Writer = std::string (*)(const CommandDescription&);
    static const std::map<std::string, Writer> writers = {
        {"bash", bashCompletion}, {"zsh", zshCompletion}, {"fish", fishCompletion}, {"man", manualPage}};
    const auto kind = std::make_shared<std::string>();
    Command command = tool.addCommand("generate", "Completions for a shell, or the manual page");
    command.hide();  // for the build, not for people
    command.addOption("kind", *kind, "").required().oneOf({"bash", "fish", "man", "zsh"});
    command.callback([kind, tool] { printText(writers.at(*kind)(tool.describe())); });
}

}  // namespace qvct::tool
