#include "CommandLine.h"
#include "commands/Commands.h"
#include "output/StandardStreams.h"

#include <map>
#include <memory>

#include <CLI/CLI.hpp>

namespace qvct::tool {

void addGenerateCommand(CLI::App& app) {
    using Writer = std::string (*)(const CommandDescription&);
    static const std::map<std::string, Writer> writers = {
        {"bash", bashCompletion}, {"zsh", zshCompletion}, {"fish", fishCompletion}, {"man", manualPage}};
    const auto kind = std::make_shared<std::string>();
    auto* command = app.add_subcommand("generate", "Completions for a shell, or the manual page");
    command->group("");  // for the build, not for people
    command->add_option("kind", *kind)->required()->check(CLI::IsMember(writers));
    command->callback([kind, &app] { printText(writers.at(*kind)(describeCommandLine(app))); });
}

}  // namespace qvct::tool
