#include "CommandLine.h"
#include "DatabaseAccess.h"
#include "Services.h"
#include "TaggerOptions.h"
#include "ToolContext.h"
#include "autotagging/ContentItem.h"
#include "autotagging/Contradictions.h"
#include "autotagging/ItemTagger.h"
#include "commands/Commands.h"
#include "output/StandardStreams.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <memory>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

struct Options {
    TaggerOptions tagger;
    std::string database;
    std::string query;
};

Json jsonOf(const Contradiction::Statement& statement) {
    constexpr double kThousandths = 1000;
    return {{"value", statement.value},
            {"source", statement.source},
            {"confidence", std::round(statement.confidence * kThousandths) / kThousandths}};
}

Json jsonOf(const std::string& path, const std::vector<Contradiction>& contradictions) {
    Json json;
    json["path"] = path;
    json["contradictions"] = Json::array();
    for (const auto& [subject, stated, against] : contradictions)
        json["contradictions"].push_back(
            {{"subject", subject}, {"stated", jsonOf(stated)}, {"against", jsonOf(against)}});
    return json;
}

/// "Kick by its name"
std::string textOf(const Contradiction::Statement& statement) {
    return fmt::format("{} by its {}", printable(statement.value), statement.source);
}

std::string confidenceOf(const Contradiction::Statement& statement) {
    return statement.confidence < 1 ? fmt::format("  {:.0f} %", statement.confidence * 100) : std::string();
}

void printItem(const std::string& path, const std::vector<Contradiction>& contradictions,
               const Terminal& terminal) {
    constexpr std::size_t kSubjectWidth = 10;  // of the longest
    std::size_t width = 0;
    for (const Contradiction& its : contradictions) width = std::max(width, displayWidth(textOf(its.stated)));
    print("{}\n", colored(terminal, Color::strong, printable(path)));
    for (const auto& [subject, stated, against] : contradictions)
        print("  {}  {}  {}{}\n", padded(std::string(subject), kSubjectWidth), padded(textOf(stated), width),
              textOf(against), colored(terminal, Color::faint, confidenceOf(against)));
}

/// Looks at items one after the other and shows those that contradict themselves.
class Linter {
  public:
    Linter(const TaggerOptions& options, ToolContext& context)
        : context_(context),
          services_(optionsForServices(options.services, context)),
          taxonomy_(TGRTTaxonomy::defaultTaxonomy()),
          tagger_(options.aggregator(context), taxonomy_),
          json_(context.format) {}

    void look(const URL& url, const std::string& root) {
        ContentItem::Reading reading;
        reading.options = services_;
        const auto item = std::make_shared<ContentItem>(url, reading);
        const ItemReport report = tagger_.report(item, ItemNames(url.path(), root), services_);
        ++looked_;
        const auto contradictions = contradictionsIn(*item, report, *taxonomy_);
        if (contradictions.empty()) return;
        ++found_;
        if (context_.format == Format::table) {
            printItem(url.path(), contradictions, context_.terminal());
        } else {
            json_.add(jsonOf(url.path(), contradictions));
        }
    }

    void finish() {
        if (context_.format != Format::table) json_.finish();
        context_.note(fmt::format("{} of {} contradict themselves", found_, counted(looked_, "item")));
    }

  private:
    ToolContext& context_;
    std::uint64_t services_;
    std::shared_ptr<TGRTTaxonomy> taxonomy_;
    ItemTagger tagger_;
    JsonItems json_;
    std::size_t looked_ = 0;
    std::size_t found_ = 0;
};

void lookAtFound(const Options& options, Linter& linter, ToolContext& context) {
    const auto database = openDatabase(options.database, context);
    if (!database) return;
    const auto query = queryIn(options.query, *database, context);
    const auto found =
        query ? searched(*query, std::numeric_limits<std::size_t>::max(), *database, context) : std::nullopt;
    if (!found) return;
    for (const contentdb::Found& one : *found)
        linter.look(URL::fileURLWithPath(one.item.path), one.item.path);
}

void run(const Options& options, ToolContext& context) {
    if (options.tagger.paths.empty() && options.query.empty())
        return context.usageFailed("a PATH or --query is needed");
    Linter linter(options.tagger, context);
    context.forEachContentItemBelow(options.tagger.paths, options.tagger.links,
                                    [&](const URL& url, const std::string& root) { linter.look(url, root); });
    if (!options.query.empty()) lookAtFound(options, linter, context);
    linter.finish();
}

}  // namespace

void addLintCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command =
        tool.addCommand("lint", "Finds items whose record, chunks, name and sound contradict each other");
    options->tagger.addTo(command);
    const Option database =
        command.addOption("--db", options->database, "A database to take items from").valueName("FILE");
    command.addOption("--query", options->query, "Items that it finds; their files are looked at")
        .needs(database)
        .valueName("QUERY");
    command.footer(
        "Example:\n  qvtag lint Loops\n"
        "  qvtag lint --db loops.db --query 'type:loop tempo:120'");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool
