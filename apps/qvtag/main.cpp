#include "commands/Commands.h"
#include "output/StandardStreams.h"
#include "platform/base/Version.h"
#include "platform/files/UnfinishedFile.h"
#include "platform/processes/HardLimit.h"

#include <algorithm>
#include <exception>
#include <sstream>
#include <string>

#include <CLI/CLI.hpp>

namespace {

// Exit statuses beside 0, done.
constexpr int kSomeFailed = 1;  // or output was lost
constexpr int kWrongUsage = 2;

void addSharedOptions(CLI::App& app, qvct::tool::ToolContext& context) {
    using qvct::tool::Format;
    auto* json = app.add_flag_callback(
        "--json", [&] { context.format = Format::json; }, "One JSON document");
    app.add_flag_callback(
           "--jsonl", [&] { context.format = Format::jsonLines; }, "One line of JSON for each item")
        ->excludes(json);
    app.add_flag("--quiet,-q", context.quiet, "No notes and progress; failures are still told");
    app.add_option("--taxonomy", context.taxonomyFile, "Property list to use as the default taxonomy")
        ->type_name("FILE");
    app.add_option("--resources", context.resourceDirectory,
                   "Folder whose files replace the built-in resources")
        ->type_name("DIR");
}

/// Refuses an empty path, such as an unset variable gives: it would name the current folder and all that is
/// in it.
void refuseEmptyPaths(CLI::App& app) {
    for (CLI::Option* option : app.get_options()) {
        const std::string type = option->get_type_name();
        if (type != "PATH" && type != "FILE" && type != "DIR") continue;
        option->check([](const std::string& path) {
            return path.empty() ? std::string("an empty path names nothing") : std::string();
        });
    }
    for (CLI::App* command : app.get_subcommands({})) refuseEmptyPaths(*command);
}

int run(int argc, char** argv) {
    qvct::tool::ToolContext context;
    CLI::App app("Describes sounds with tags: reads, derives and searches them.", "qvtag");
    app.set_version_flag("--version", std::string(qvct::version()));
    app.require_subcommand(1);
    app.fallthrough();
    addSharedOptions(app, context);
    app.parse_complete_callback([&context] { context.prepare(); });
    qvct::tool::addAutotagCommand(app, context);
    qvct::tool::addDatabaseCommand(app, context);
    qvct::tool::addGenerateCommand(app);
    qvct::tool::addIndexCommand(app, context);
    qvct::tool::addInspectCommand(app, context);
    qvct::tool::addKeywordsCommand(app, context);
    qvct::tool::addObjectCommand(app, context);
    qvct::tool::addReadCommand(app, context);
    qvct::tool::addRhythmCommand(app, context);
    qvct::tool::addRulesCommand(app, context);
    qvct::tool::addSearchCommands(app, context);
    qvct::tool::addTaxonomyCommand(app, context);
    qvct::tool::addWriteCommand(app, context);
    refuseEmptyPaths(app);
    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError& error) {
        std::ostringstream output;
        std::ostringstream errors;
        const int status = app.exit(error, output, errors) == 0 ? 0 : kWrongUsage;
        qvct::tool::printText(output.str());
        qvct::tool::printErrorText(errors.str());
        return status;
    }
    return context.exitStatus();
}

}  // namespace

int main(int argc, char** argv) {
    qvct::tool::prepareStandardStreams();
    qvct::removeUnfinishedFilesWhenEnded();
    qvct::HardLimit::enable(qvct::tool::flushOutput);
    int status = kSomeFailed;
    try {
        status = run(argc, argv);
    } catch (const std::exception& error) {
        qvct::tool::printError("qvtag: {}\n", error.what());
    }
    return qvct::tool::finishOutput() ? status : std::max(status, kSomeFailed);
}
