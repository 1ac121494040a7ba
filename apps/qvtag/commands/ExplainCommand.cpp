#include "CommandLine.h"
#include "DatabaseAccess.h"
#include "Services.h"
#include "TaggerOptions.h"
#include "ToolContext.h"
#include "autotagging/ContentItem.h"
#include "autotagging/ItemTagger.h"
#include "commands/Commands.h"
#include "contentdb/Explanation.h"
#include "metadata/TGRTMetaData.h"
#include "operations/StoredReport.h"
#include "output/StandardStreams.h"
#include "output/TaggingWords.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <memory>
#include <utility>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

struct Options {
    TaggerOptions tagger;
    std::string database;
    std::string query;
    std::size_t limit = 50;
};

std::string_view nameOf(SoundKind kind) {
    return kind == SoundKind::loop ? "loop" : "one-shot";
}

Json jsonOfConfidence(double confidence) {
    return std::round(confidence * 1000) / 1000;
}

Json jsonOfClaims(const std::vector<TagClaim>& claims) {
    Json list = Json::array();
    for (const TagClaim& claim : claims) {
        Json json;
        json["service"] = claim.service;
        json["what"] = claim.evidence.what;
        json["where"] = claim.evidence.where;
        json["confidence"] = jsonOfConfidence(claim.confidence);
        list.push_back(std::move(json));
    }
    return list;
}

void addCertain(const ObjectSet<TGRTTagging>& taggings, std::string_view state, Json& list) {
    for (const auto& tagging : sortedTaggings(taggings)) {
        Json its = jsonOfTagging(*tagging);
        its["state"] = state;
        its["confidence"] = 1;
        its["evidence"] = Json::array();
        list.push_back(std::move(its));
    }
}

Json jsonOfItem(const std::string& path, const ExplainedItem& item) {
    const ItemReport& report = item.report;
    Json json;
    json["path"] = path;
    json["kind"] = report.kind == SoundKind::unsaid ? Json() : Json(nameOf(report.kind));
    json["tempo"] = report.tempo ? jsonOfNumber(*report.tempo) : Json();
    json["tempoFromLength"] = report.isTempoFromLength;
    json["beats"] = report.beats ? Json(*report.beats) : Json();
    json["taggings"] = Json::array();
    addCertain(item.stored, "stored", json["taggings"]);
    addCertain(item.following, "virtual", json["taggings"]);
    for (const HeldTag& held : report.resolution.held) {
        Json its = jsonOfTagging(*held.tagging());
        its["state"] = held.claims.empty() ? "parent" : "derived";
        its["confidence"] = jsonOfConfidence(held.confidence);
        its["evidence"] = jsonOfClaims(held.claims);
        json["taggings"].push_back(std::move(its));
    }
    json["dropped"] = Json::array();
    for (const DroppedTag& dropped : report.resolution.dropped) {
        Json its;
        its["label"] = dropped.label;
        its["confidence"] = jsonOfConfidence(dropped.confidence);
        its["reason"] = dropped.reason;
        its["evidence"] = jsonOfClaims(dropped.claims);
        json["dropped"].push_back(std::move(its));
    }
    return json;
}

/// "Kick" in the name, rule 3, user
std::string textOf(const TagClaim& claim) {
    const auto& [what, where, offset] = claim.evidence;
    const bool isOfName = claim.service == "names" || claim.service == "keywords";
    if (!isOfName)
        return where.empty() ? std::string(claim.service) : fmt::format("{}: {}", where, printable(what));
    if (where.empty()) return fmt::format("\"{}\"", printable(what));
    const std::string place =
        claim.distance == 0 ? "the name" : fmt::format("the folder \"{}\"", printable(where));
    return fmt::format("\"{}\" in {}", printable(what), place);
}

/// What speaks for a tag, each thing once.
std::string textOf(const std::vector<TagClaim>& claims) {
    std::vector<std::string> texts;
    for (const TagClaim& claim : claims) {
        std::string text = textOf(claim);
        const bool isNew = std::find(texts.begin(), texts.end(), text) == texts.end();
        if (isNew && claim.doubt.empty()) texts.push_back(std::move(text));
    }
    return join(texts, ", ");
}

constexpr std::string_view kStored = "stored in the file";

struct Line {
    std::string tag;
    std::string confidence;
    std::string why;
    Color color = Color::plain;
};

std::string percent(double confidence) {
    return fmt::format("{:.0f} %", confidence * 100);
}

std::vector<Line> linesOf(const ExplainedItem& item) {
    std::vector<Line> lines;
    for (const auto& tagging : sortedTaggings(item.stored))
        lines.push_back({textOfTagging(*tagging), "", std::string(kStored)});
    for (const auto& tagging : sortedTaggings(item.following))
        lines.push_back({textOfTagging(*tagging), "", "follows from the file"});
    const Resolution& resolution = item.report.resolution;
    std::vector<const HeldTag*> held;
    for (const HeldTag& tag : resolution.held) held.push_back(&tag);
    const auto rank = [](const HeldTag* tag) {
        return rankOfTag(tag->tag->categoryIdentifier(), tag->tag->label());
    };
    std::stable_sort(held.begin(), held.end(), [&rank](auto* a, auto* b) { return rank(a) < rank(b); });
    for (const HeldTag* tag : held) {
        const bool isParent = tag->claims.empty();
        lines.push_back({textOfTagging(*tag->tagging()), percent(tag->confidence),
                         isParent ? "belongs to another" : textOf(tag->claims),
                         isParent || isBookkeeping(rank(tag)) ? Color::faint : Color::strong});
    }
    for (const DroppedTag& tag : resolution.dropped)
        lines.push_back({"not " + printable(tag.label), percent(tag.confidence),
                         fmt::format("{}: {}", tag.reason,
                                     tag.claims.empty() ? std::string(kStored) : textOf(tag.claims.front())),
                         Color::faint});
    return lines;
}

void printItem(const std::string& path, const ExplainedItem& item, const Terminal& terminal) {
    const ItemReport& report = item.report;
    print("{}", colored(terminal, Color::strong, printable(path)));
    if (report.kind != SoundKind::unsaid) print("  {}", nameOf(report.kind));
    if (report.tempo) print("  {:g} bpm", *report.tempo);
    if (report.beats)
        print("{}{} beats", report.isTempoFromLength ? ", since it is as long as " : "  ", *report.beats);
    print("\n");
    const std::vector<Line> lines = linesOf(item);
    std::size_t width = 0;
    for (const Line& line : lines) width = std::max(width, displayWidth(line.tag));
    for (const Line& line : lines)
        print("  {}  {:>5}  {}\n", colored(terminal, line.color, padded(line.tag, width)), line.confidence,
              colored(terminal, line.color == Color::faint ? Color::faint : Color::plain, line.why));
    if (lines.empty()) print("  {}\n", colored(terminal, Color::faint, "nothing is known of it"));
}

void show(const std::string& path, const ExplainedItem& item, JsonItems& json, const ToolContext& context) {
    if (context.format == Format::table) {
        printItem(path, item, context.terminal());
    } else {
        json.add(jsonOfItem(path, item));
    }
}

void explainFiles(const TaggerOptions& options, JsonItems& json, ToolContext& context) {
    const auto bits = optionsForServices(options.services, context);
    ItemTagger tagger(options.aggregator(context), TGRTTaxonomy::defaultTaxonomy());
    context.forEachContentItemBelow(
        options.paths, options.links, [&](const URL& url, const std::string& root) {
            const auto item = std::make_shared<ContentItem>(url, ContentItem::Reading{bits, nullptr});
            const auto record = item->record();
            ExplainedItem explained;
            explained.report = tagger.report(item, ItemNames(url.path(), root), bits);
            if (record) explained.stored = explained.report.withoutRejected(record->taggings());
            show(url.path(), explained, json, context);
        });
}

void explainIndexed(const Options& options, JsonItems& json, ToolContext& context) {
    using namespace contentdb;
    const auto database = openDatabase(options.database, context);
    if (!database) return;
    // Records may name tags of the user's own.
    const auto taxonomy = TGRTTaxonomy::newTaxonomyOfType(kDefaultTaxonomy, false, false);
    std::size_t outlines = 0;
    const auto explain = [&](const IndexedItem& item) {
        if (!item.failure.empty()) return context.itemFailed(errorOfFailure(item));
        outlines += explanationOf(item).isWhole ? 0 : 1;
        show(item.path, storedReport(item, *taxonomy), json, context);
    };
    for (const std::string& path : options.tagger.paths) {
        Error error;
        const auto found = database->item(URL::fileURLWithPath(path).path(), &error);
        if (found) {
            explain(found->item);
        } else {
            context.itemFailed(error);
        }
    }
    const auto query = options.query.empty() ? std::nullopt : queryIn(options.query, *database, context);
    const auto found = query ? searched(*query, options.limit, *database, context) : std::nullopt;
    if (found) {
        for (const Found& one : *found) explain(one.item);
    }
    if (outlines > 0)
        context.note(
            fmt::format("of {} only what holds is in the database, not all that was said: indexed "
                        "by an earlier version, or without naming habits",
                        counted(outlines, "item")));
}

void run(const Options& options, ToolContext& context) {
    const bool isIndexed = !options.database.empty();
    if (options.tagger.paths.empty() && options.query.empty())
        return context.usageFailed(isIndexed ? "a PATH or --query is needed" : "a PATH is needed");
    JsonItems json(context.format);
    if (isIndexed) {
        explainIndexed(options, json, context);
    } else {
        explainFiles(options.tagger, json, context);
    }
    if (context.format != Format::table) json.finish();
}

}  // namespace

void addExplainCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command = tool.addCommand("explain", "Shows why each tag is there, and what was dropped and why");
    const Option database =
        command.addOption("--db", options->database, "Of indexed items, without looking at their files")
            .valueName("FILE");
    options->tagger.addTo(command, &database);
    const Option query = command.addOption("--query", options->query, "Also the items that it finds")
                             .needs(database)
                             .valueName("QUERY");
    command.addOption("--limit", options->limit, "Most items that the query finds")
        .showsDefault()
        .notNegative()
        .needs(query);
    command.footer(
        "Example:\n  qvtag explain \"Drums/BD0010.wav\"\n"
        "  qvtag explain --db loops.db --query 'kick -type:loop' --limit 5");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool
