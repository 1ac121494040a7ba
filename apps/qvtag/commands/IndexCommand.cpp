#include "CommandLine.h"
#include "Services.h"
#include "autotagging/services/QVCTAutoTaggingService.h"
#include "commands/Commands.h"
#include "contentdb/ContentDatabase.h"
#include "contentdb/ContentDescriber.h"
#include "formats/library/ContentFolderWalk.h"
#include "output/Progress.h"
#include "output/StandardStreams.h"
#include "platform/processes/Interruption.h"

#include <chrono>
#include <memory>

namespace qvct::tool {
namespace {

using contentdb::IndexOptions;
using contentdb::IndexProgress;

struct Options {
    IndexOptions index;
    std::vector<std::string> services;
    bool listens = true;
    unsigned secondsPerItem = 30;
};

Json jsonOfRun(const IndexOptions& options, const IndexProgress& progress, double seconds) {
    Json json;
    json["database"] = options.database;
    json["items"] = progress.seen;
    json["unchanged"] = progress.unchanged;
    json["indexed"] = progress.described;
    json["moved"] = progress.moved;
    json["failed"] = progress.failed;
    json["missing"] = progress.missing;
    json["pruned"] = progress.pruned;
    json["seconds"] = seconds;
    json["itemsPerSecond"] = seconds > 0 ? static_cast<double>(progress.seen) / seconds : 0;
    return json;
}

void printRun(const Json& run, const IndexProgress& progress, const ToolContext& context) {
    if (context.format != Format::table) return printJson(run, context.format);
    print("{}: {} indexed ({} of them moved), {} unchanged, {} failed", counted(progress.seen, "item"),
          progress.described, progress.moved, progress.unchanged, progress.failed);
    if (progress.missing > 0) print(", {} missing of which {} pruned", progress.missing, progress.pruned);
    print("; {:.1f} s, {:.0f} a second\n", run["seconds"].get<double>(), run["itemsPerSecond"].get<double>());
}

/// Counts by listing only, for the progress bar; the run reports what cannot be listed.
std::uint64_t countItems(const std::string& folder, LinksOutside links) {
    std::uint64_t count = 0;
    const auto add = [&count](const ContentFolder& found) {
        count += found.items.size();
        return true;
    };
    walkContentFolders(folder, add, nullptr, {links, nullptr});
    return count;
}

void run(Options& options, ToolContext& context) {
    auto services = optionsForServices(options.services, context);
    if (!options.listens) services &= ~std::uint64_t{QVCTAutoTaggingOptionSound};
    // Indexing with fewer services would mark the items as done. That a resource is broken does no harm: the
    // built-in one is used, and items are read again when it is whole.
    if (context.isUsageWrong()) return;
    Progress bar(context.quiet);
    IndexOptions& index = options.index;
    index.services = services;
    index.describer = contentdb::ContentDescriber::digest(services);
    index.timeLimitPerItem = std::chrono::seconds(options.secondsPerItem);
    std::uint64_t total = 0;
    if (bar.isShown()) {
        for (const std::string& folder : index.folders) total += countItems(folder, index.links.outside);
    }
    index.progress = [&](const IndexProgress& at) {
        bar.show(at.unchanged + at.described + at.failed, total / index.parts);
    };
    index.failed = [&](const Error& error) {
        bar.hide();
        context.itemFailed(error);
    };
    index.note = [&](const std::string& message) {
        bar.hide();
        context.note(message);
    };
    std::vector<URL> passedOver;
    index.links.passedOver = [&passedOver](const URL& link) { passedOver.push_back(link); };
    interruptGently();
    index.isCancelled = wasInterrupted;
    Error error;
    const auto progress = indexLibrary(index, &error);
    bar.hide();
    if (!progress) return context.itemFailed(error);
    context.notePassedOver(passedOver);
    printRun(jsonOfRun(index, *progress, bar.seconds()), *progress, context);
    if (wasInterrupted()) context.itemFailed("interrupted; the next run goes on from here");
}

}  // namespace

void addIndexCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    IndexOptions& index = options->index;
    Command command = tool.addCommand("index", "Brings a database up to date with folders of sounds");
    command.addOption("folders", index.folders, "Folders to walk").required().valueName("DIR");
    command.addOption("--db", index.database, "The database; made if there is none")
        .required()
        .valueName("FILE");
    command.addFollowFlag(index.links.outside);
    Option prune = command.addFlag("--prune", index.prune, "Take items out whose files are gone");
    command
        .addFlag("--prune-roots", index.pruneRoots,
                 "Also where a named folder is empty or missing, as when its disk is away")
        .needs(prune);
    command.addFlag("--retry", index.retryFailed, "Read items again that failed before");
    command.addFlag("--check", index.check,
                    "Read the database whole first; what is damaged is built anew. Without, only its pages "
                    "are held against their checksums");
    addServicesOption(command, options->services);
    const Option listen = command.addFlag("--listen", options->listens, "Listen to sounds; the default");
    command
        .addFlag(
            "--no-listen", [options] { options->listens = false; },
            "Do not listen to sounds: what has no telling name stays unknown, but a run is faster")
        .excludes(listen);
    Option part = command.addOption("--part", index.part, "Index only part I of the items")
                      .valueName("I")
                      .between(1, 1000000);
    Option parts = command.addOption("--parts", index.parts, "Into how many parts the items are divided")
                       .valueName("N")
                       .between(1, 1000000);
    part.needs(parts);
    parts.needs(part);
    command.addOption("--workers", index.workers, "Processes that read items (default: one a processor)")
        .between(0, 1024);
    command.addOption("--time-limit", options->secondsPerItem, "Seconds that one item may take")
        .between(1, 86400);
    command.footer(
        "Example:\n  qvtag index ~/Music/Loops --db loops.db\n"
        "  qvtag index /sounds --db part2.db --part 2 --parts 4");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool
