#include "CommandLine.h"
#include "commands/Commands.h"
#include "contentdb/ContentDatabase.h"
#include "output/StandardStreams.h"
#include "platform/text/Text.h"

#include <memory>

namespace qvct::tool {
namespace {

using namespace contentdb;

struct Options {
    std::vector<std::string> databases;
    std::string target;
};

void merge(const Options& options, ToolContext& context) {
    Error error;
    if (!mergeDatabases(options.databases, options.target, &error)) return context.itemFailed(error);
    const auto merged = ContentDatabase::open(options.target, &error);
    const auto totals = merged ? merged->totals(&error) : std::nullopt;
    if (!totals) return context.itemFailed(error);
    if (context.format == Format::table)
        return print("{}, {} of them failed\n", counted(static_cast<std::uint64_t>(totals->items), "item"),
                     totals->failures);
    printJson(Json{{"database", options.target}, {"items", totals->items}, {"failed", totals->failures}},
              context.format);
}

void check(const Options& options, ToolContext& context) {
    Json json = Json::array();
    for (const std::string& path : options.databases) {
        Error error;
        const auto database = ContentDatabase::open(path, &error);
        const bool isIntact = database && database->check(&error);
        const auto totals = isIntact ? database->totals(&error) : std::nullopt;
        if (!totals) {
            context.itemFailed(error);
            json.push_back({{"database", path}, {"intact", false}, {"reason", error.message()}});
            continue;
        }
        Json failures = Json::array();
        database->forEachFailure([&](const IndexedItem& item) {
            if (context.format == Format::table) print("{}\n", errorOfFailure(item).message());
            failures.push_back({{"path", item.path}, {"reason", item.failure}});
            return true;
        });
        if (context.format == Format::table)
            print("{}: intact, {}, {} of them failed\n", printable(path),
                  counted(static_cast<std::uint64_t>(totals->items), "item"), totals->failures);
        json.push_back(
            {{"database", path}, {"intact", true}, {"items", totals->items}, {"failures", failures}});
    }
    if (context.format != Format::table) printJson(json, context.format);
}

}  // namespace

void addDatabaseCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command = tool.addCommand("db", "Merges and checks databases");
    command.requireCommand();
    command.footer("Example:\n  qvtag db merge part1.db part2.db --db all.db\n  qvtag db check all.db");

    Command merging = command.addCommand("merge", "Unites the databases of parts into a new one");
    merging.addOption("databases", options->databases, "The parts").required().valueName("FILE");
    merging.addOption("--db", options->target, "The new database").required().valueName("FILE");
    merging.footer("Example:\n  qvtag db merge part1.db part2.db --db all.db");
    merging.callback([options, &context] { merge(*options, context); });

    Command checking = command.addCommand("check", "Reads a database whole; lists the items that failed");
    checking.addOption("databases", options->databases, "The databases").required().valueName("FILE");
    checking.footer("Example:\n  qvtag db check all.db");
    checking.callback([options, &context] { check(*options, context); });
}

}  // namespace qvct::tool
