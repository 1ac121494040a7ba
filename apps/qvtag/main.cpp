#include "CommandLine.h"
#include "commands/Commands.h"
#include "output/StandardStreams.h"
#include "platform/base/Version.h"
#include "platform/files/replacement/UnfinishedFile.h"
#include "platform/processes/HardLimit.h"

#include <algorithm>
#include <exception>
#include <string>

namespace qvct::tool {
namespace {

// Exit statuses beside 0, done.
constexpr int kSomeFailed = 1;  // or output was lost
constexpr int kWrongUsage = 2;

void addSharedOptions(Command tool, ToolContext& context) {
    Option json = tool.addFlag(
        "--json", [&] { context.format = Format::json; }, "One JSON document");
    tool.addFlag(
            "--jsonl", [&] { context.format = Format::jsonLines; }, "One line of JSON for each item")
        .excludes(json);
    tool.addFlag("--quiet,-q", context.quiet, "No notes and progress; failures are still told");
    tool.addOption("--taxonomy", context.taxonomyFile, "Property list to use as the default taxonomy")
        .valueName("FILE");
    tool.addOption("--resources", context.resourceDirectory,
                   "Folder whose files replace the built-in resources")
        .valueName("DIR");
}

void addCommands(Command tool, ToolContext& context) {
    addAutotagCommand(tool, context);
    addDatabaseCommand(tool, context);
    addDuplicatesCommand(tool, context);
    addEvaluateCommand(tool, context);
    addExplainCommand(tool, context);
    addGenerateCommand(tool);
    addIndexCommand(tool, context);
    addInspectCommand(tool, context);
    addKeywordsCommand(tool, context);
    addLintCommand(tool, context);
    addListenCommand(tool, context);
    addObjectCommand(tool, context);
    addReadCommand(tool, context);
    addRhythmCommand(tool, context);
    addRulesCommand(tool, context);
    addSearchCommands(tool, context);
    addTaxonomyCommand(tool, context);
    addWriteCommand(tool, context);
}

int run(int argc, char** argv) {
    ToolContext context;
    CommandLine commandLine("qvtag", "Describes sounds with tags: reads, derives and searches them.",
                            std::string(version()));
    addSharedOptions(commandLine.tool(), context);
    addCommands(commandLine.tool(), context);
    const bool isUnderstood = commandLine.run(argc, argv, [&context] { context.prepare(); });
    return isUnderstood ? context.exitStatus() : kWrongUsage;
}

}  // namespace
}  // namespace qvct::tool

int main(int argc, char** argv) {
    qvct::tool::prepareStandardStreams();
    qvct::removeUnfinishedFilesWhenEnded();
    qvct::HardLimit::enable(qvct::tool::flushOutput);
    int status = qvct::tool::kSomeFailed;
    try {
        status = qvct::tool::run(argc, argv);
    } catch (const std::exception& error) {
        qvct::tool::printError("qvtag: {}\n", error.what());
    }
    return qvct::tool::finishOutput() ? status : std::max(status, qvct::tool::kSomeFailed);
}
