#include "CommandLine.h"
#include "DatabaseAccess.h"
#include "commands/Commands.h"
#include "contentdb/Explanation.h"
#include "formats/QVContentTaggingTypes.h"
#include "output/ItemTable.h"
#include "output/StandardStreams.h"
#include "output/TaggingWords.h"
#include "platform/text/Decimal.h"
#include "platform/text/Text.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <algorithm>
#include <cmath>
#include <map>
#include <memory>
#include <unordered_map>
#include <variant>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

using namespace contentdb;

struct Options {
    std::vector<std::string> words;
    std::string database;
    std::size_t limit = 50;
    std::string path;
    std::string by = "tags";
};

std::string_view nameOf(Provenance provenance) {
    switch (provenance) {
        case Provenance::virtualTag:
            return "virtual";
        case Provenance::automatic:
            return "automatic";
        case Provenance::stored:
            break;
    }
    return "stored";
}

/// In tenths; if the tagging has no level, the tag's default level is used.
std::int64_t weightLevelOf(const IndexedTagging& tagging) {
    const auto level = tagging.level ? TGRTLevel::levelWithWeight(decimalOf(*tagging.level)) : nullptr;
    const auto tag = TGRTTaxonomy::defaultTaxonomy()->findTagForLabel(tagging.label, tagging.category);
    const auto known = TGRTTagging::initWithTag(tag, level);
    constexpr float tenths = 10;
    return known ? known->weightLevel() : std::lround(tagging.level.value_or(1) * tenths);
}

/// The word, or the rule: what a person needs to understand the tag.
Json jsonOfEvidence(const TagClaim& claim) {
    const auto& [what, where, offset] = claim.evidence;
    const std::string& text = what.empty() || claim.service == "rules" ? where : what;
    return text.empty() ? Json() : Json(text);
}

/// `held`: why it holds, where that is known.
Json jsonOf(const IndexedTagging& tagging, const Explanation::Held* held) {
    Json json;
    json["label"] = tagging.label;
    json["parent"] = tagging.ancestors.empty() ? Json() : Json(tagging.ancestors[0]);
    json["category"] = tagging.category;
    json["level"] = tagging.level ? Json(decimalOf(*tagging.level)) : Json();
    json["auto"] = tagging.isAuto;
    json["weightLevel"] = weightLevelOf(tagging);
    json["provenance"] = nameOf(tagging.provenance);
    json["service"] = tagging.service.empty() ? Json() : Json(tagging.service);
    json["confidence"] = held == nullptr ? Json() : jsonOfNumber(held->confidence);
    json["evidence"] =
        held == nullptr || held->claims.empty() ? Json() : jsonOfEvidence(held->claims.front());
    return json;
}

Json jsonOfTaggings(const IndexedItem& item) {
    const Explanation explanation = explanationOf(item);
    std::vector<const Explanation::Held*> reasons(item.taggings.size());
    for (const Explanation::Held& held : explanation.held) {
        const bool isWeighed = !item.explanation.empty();
        const bool isAutomatic = item.taggings[held.tagging].provenance == Provenance::automatic;
        if (isWeighed && isAutomatic) reasons[held.tagging] = &held;
    }
    Json json = Json::array();
    for (std::size_t i = 0; i < item.taggings.size(); ++i)
        json.push_back(jsonOf(item.taggings[i], reasons[i]));
    return json;
}

/// When a key comes twice, its last value is used.
Json jsonOf(const std::vector<IndexedValue>& values) {
    Json json = Json::object();
    auto& members = json.get_ref<Json::object_t&>();
    std::unordered_map<std::string_view, std::size_t> places;  // the object's own search is linear
    for (const auto& [key, value] : values) {
        const auto* number = std::get_if<double>(&value);
        const auto [hit, isNew] = places.emplace(key, members.size());
        if (isNew) members.emplace_back(key, Json());
        (members.begin() + static_cast<std::ptrdiff_t>(hit->second))->second =
            number != nullptr ? jsonOfNumber(*number) : Json(std::get<std::string>(value));
    }
    return json;
}

/// Reports an error when the database cannot be read any more.
Json jsonOf(ContentDatabase& database, ItemId id, const IndexedItem& item, Error* error) {
    Json json;
    json["id"] = id;
    json["path"] = item.path;
    json["earlierPaths"] = database.earlierPaths(id, error).value_or(std::vector<std::string>());
    json["name"] = item.name;
    json["title"] = item.title.empty() ? Json() : Json(item.title);
    json["displayName"] = item.title.empty() ? item.name : item.title;
    json["type"] = QVContentTaggingTypes::nameForFileType(item.fileType);
    json["fileType"] = item.fileType;
    json["subFileType"] = item.subFileType;
    json["previewAvailable"] = item.previewAvailable;
    json["taggings"] = jsonOfTaggings(item);
    json["keyValues"] = jsonOf(item.values);
    json["packages"] = item.packs;
    json["dependencies"] = Json::array();
    for (const IndexedDependency& dependency : item.dependencies)
        json["dependencies"].push_back({{"uuid", dependency.uuid}, {"path", dependency.path}});
    return json;
}

std::string textOf(const IndexedTagging& tagging) {
    return tagging.level ? fmt::format("{} {:.0f}%", tagging.label, *tagging.level * 100) : tagging.label;
}

std::optional<double> tempoOf(const IndexedItem& item) {
    const auto hit = std::find_if(item.values.begin(), item.values.end(),
                                  [](const IndexedValue& value) { return value.key == "Tempo"; });
    const auto* tempo = hit == item.values.end() ? nullptr : std::get_if<double>(&hit->value);
    return tempo == nullptr ? std::nullopt : std::optional(*tempo);
}

/// Its title, tempo and tags.
ItemRow rowOf(const IndexedItem& item) {
    ItemRow row{item.path, {}};
    if (!item.title.empty())
        row.words.push_back({fmt::format("\"{}\"", printable(item.title)), Color::plain});
    if (const auto tempo = tempoOf(item))
        row.words.push_back({fmt::format("{:g} bpm", *tempo), Color::faint});
    std::vector<ShownTag> tags;
    for (const IndexedTagging& tagging : item.taggings)
        tags.push_back(
            {tagging.label, tagging.category, textOf(tagging), tagging.ancestors, tagging.level.has_value()});
    for (Word& word : wordsForTags(tags, false)) row.words.push_back(std::move(word));
    return row;
}

void searchItems(const Options& options, ToolContext& context) {
    const auto database = openDatabase(options.database, context);
    const auto query = database ? queryIn(join(options.words, " "), *database, context) : std::nullopt;
    const auto found = query ? searched(*query, options.limit, *database, context) : std::nullopt;
    if (!found) return;
    Error error;
    if (context.format != Format::table) {
        Json json = Json::array();
        for (const Found& one : *found) json.push_back(jsonOf(*database, one.id, one.item, &error));
        if (error.isSet()) return context.itemFailed(error);
        return printJson(json, context.format);
    }
    std::vector<ItemRow> rows;
    for (const Found& one : *found) rows.push_back(rowOf(one.item));
    printItemTable(rows, context.terminal());
    const auto count = rows.size() < options.limit ? std::optional(static_cast<std::int64_t>(rows.size()))
                                                   : database->count(*query, &error);
    if (!count) return context.itemFailed(error);
    context.note(fmt::format("{} found, {} shown", *count, rows.size()));
}

void countTags(const Options& options, ToolContext& context) {
    const auto database = openDatabase(options.database, context);
    const auto query = database ? queryIn(join(options.words, " "), *database, context) : std::nullopt;
    if (!query) return;
    Error error;
    const auto found = database->facets(*query, &error);
    if (!found) return context.itemFailed(error);
    if (context.format != Format::table) {
        Json json = Json::array();
        for (const Facet& facet : *found)
            json.push_back({{"label", facet.label}, {"category", facet.category}, {"count", facet.count}});
        return printJson(json, context.format);
    }
    std::map<std::string, std::vector<const Facet*>> categories;
    for (const Facet& facet : *found) categories[facet.category].push_back(&facet);
    for (const auto& [category, tags] : categories) {
        print("{}\n", colored(context.terminal(), Color::strong, printable(category)));
        for (const Facet* facet : tags) print("  {:>9}  {}\n", facet->count, printable(facet->label));
    }
}

void findSimilar(const Options& options, ToolContext& context) {
    const auto database = openDatabase(options.database, context);
    if (!database) return;
    Error error;
    const std::string path = URL::fileURLWithPath(options.path).path();
    const auto found = options.by == "sound" ? database->soundingLike(path, options.limit, &error)
                                             : database->similar(path, options.limit, &error);
    if (!found) return context.itemFailed(error);
    if (context.format != Format::table) {
        Json json = Json::array();
        for (const Similar& one : *found) {
            json.push_back(jsonOf(*database, one.id, one.item, &error));
            json.back()["similarity"] = one.similarity;
        }
        if (error.isSet()) return context.itemFailed(error);
        return printJson(json, context.format);
    }
    std::vector<ItemRow> rows;
    for (const Similar& one : *found) {
        rows.push_back(rowOf(one.item));
        rows.back().words.insert(rows.back().words.begin(),
                                 {fmt::format("{:3.0f}%", one.similarity * 100), Color::strong});
    }
    printItemTable(rows, context.terminal());
}

Command addCommand(Command& tool, const char* name, const char* what, const std::shared_ptr<Options>& options,
                   ToolContext& context, void (*run)(const Options&, ToolContext&)) {
    Command command = tool.addCommand(name, what);
    command.addOption("--db", options->database, "The database").required().valueName("FILE");
    command.callback([options, &context, run] { run(*options, context); });
    return command;
}

}  // namespace

void addSearchCommands(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    const auto addLimit = [&options](Command command) {
        command.addOption("--limit", options->limit, "Most items to show").showsDefault().notNegative();
    };
    Command searching =
        addCommand(tool, "search", "Finds items in a database", options, context, searchItems);
    searching.addOption("query", options->words, "What to find; a query that begins with - goes behind --");
    addLimit(searching);
    searching.footer(
        "Example:\n  qvtag search 'kick genre:House bpm:118..124 -type:loop bpm+' --db loops.db\n"
        "  qvtag search 'tempo:120..126 like:untitled.wav' --db loops.db");

    Command counting =
        addCommand(tool, "facets", "Counts the tags of what a query finds", options, context, countTags);
    counting.addOption("query", options->words, "What to find; everything if left out");
    counting.footer("Example:\n  qvtag facets 'type:loop bpm:90..100' --db loops.db");

    Command nearing =
        addCommand(tool, "similar", "Finds the items nearest to one", options, context, findSimilar);
    nearing.addOption("path", options->path, "An item of the database; by sound any file")
        .required()
        .valueName("PATH");
    nearing.addOption("--by", options->by, "What counts: tags (with rhythm, tempo and key) or how they sound")
        .oneOf({"tags", "sound"})
        .showsDefault();
    addLimit(nearing);
    nearing.footer(
        "Example:\n  qvtag similar 'Loops/Dusty Kick.wav' --db loops.db --limit 10\n"
        "  qvtag similar --by sound ~/untitled.wav --db loops.db");
}

}  // namespace qvct::tool
