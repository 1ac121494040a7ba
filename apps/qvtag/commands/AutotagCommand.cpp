#include "CommandLine.h"
#include "Resources.h"
#include "RhythmMeasurement.h"
#include "Services.h"
#include "autotagging/ContentItem.h"
#include "autotagging/QVTaggingAggregator.h"
#include "autotagging/services/QVCTRhythmicTaggingService.h"
#include "commands/Commands.h"
#include "formats/QVContentTaggingTypes.h"
#include "media/loopfile/LCFileData.h"
#include "metadata/TGRTMetaData.h"
#include "output/ItemTable.h"
#include "output/StandardStreams.h"
#include "platform/data/PropertyListFile.h"

#include <algorithm>
#include <memory>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

struct Options {
    std::vector<std::string> paths;
    LinksOutside links = LinksOutside::files;
    std::vector<std::string> services;
    std::string keywordsFile;
    std::string rulesFile;
    bool measuresAnyRhythm = false;
};

using Taggings = std::vector<std::shared_ptr<TGRTTagging>>;

using Settings = QVTaggingAggregator::Settings;

/// The settings in a file; nothing, and a line on standard error, when it holds none.
template <typename Read>
Settings settingsIn(const std::string& file, std::string_view what, Read read, ToolContext& context) {
    if (file.empty()) return std::nullopt;
    Error error;
    Settings settings = read(file, &error);
    if (settings) return settings;
    error.reason += fmt::format(" (using the built-in {})", what);
    context.itemFailed(error);
    return settings;
}

Settings keywordsIn(const std::string& file, ToolContext& context) {
    const auto read = [](const std::string& path, Error* error) { return readDictionaryFile(path, error); };
    Settings keywords = settingsIn(file, "keywords", read, context);
    if (keywords) checkKeywords(*keywords, context);
    return keywords;
}

/// The item's kind as its record states it, or else as its name suggests.
std::int64_t fileTypeOf(ContentItem& item) {
    const auto record = item.record();
    const std::int64_t stored = record ? record->fileType() : std::int64_t{kFileTypeNone};
    return stored != kFileTypeNone ? stored : QVContentTaggingTypes::fallBackFileTypeForURL(item.url());
}

Json jsonOfItem(ContentItem& item, const Taggings& taggings) {
    Json json;
    json["path"] = item.url().path();
    json["type"] = QVContentTaggingTypes::nameForFileType(fileTypeOf(item));
    json["taggings"] = Json::array();
    for (const auto& tagging : taggings) json["taggings"].push_back(jsonOfTagging(*tagging));
    return json;
}

ItemRow rowOf(const URL& url, const Taggings& taggings) {
    ItemRow row{url.path(), {}};
    for (const auto& tagging : taggings)
        row.words.push_back({textOfTagging(*tagging), tagging->level() ? Color::accent : Color::plain});
    if (row.words.empty()) row.words.push_back({"no tags", Color::faint});
    return row;
}

/// How many items and tags there were.
struct Totals {
    std::size_t items = 0;
    std::size_t tagged = 0;
    std::size_t tags = 0;

    void add(const Taggings& taggings) {
        ++items;
        tagged += taggings.empty() ? 0 : 1;
        tags += taggings.size();
    }
};

bool isGraded(const ObjectSet<TGRTTagging>& taggings) {
    return std::any_of(taggings.begin(), taggings.end(),
                       [](const auto& tagging) { return tagging->label() == "Rhythmic Density"; });
}

/// Grades the rhythm of audio that the rhythm service leaves alone, if its length in beats is known.
void addAnyRhythm(ContentItem& item, const TGRTTaxonomy& taxonomy, ObjectSet<TGRTTagging>& taggings) {
    if (isGraded(taggings)) return;
    const auto data = item.fileData();
    if (!data || data->beatCount() == 0) return;
    Error ignored;
    const auto rhythm = measureRhythm(item.file(), {}, &ignored);
    if (!rhythm) return;
    for (const TagDictionary& tag :
         QVCTRhythmicTaggingService::tagsForValues(rhythm->density, rhythm->complexity)) {
        auto tagging =
            TGRTTagging::initWithTag(taxonomy.findTagForLabel(*tag.string(kTagDictionaryLabelKey)),
                                     TGRTLevel::levelWithWeight(*tag.doubleValue(kTagDictionaryLevelKey)));
        if (tagging) tagging->setIsAutoTagging(true);
        taggings.insert(tagging);
    }
}

void run(const Options& options, ToolContext& context) {
    const auto bits = optionsForServices(options.services, context);
    const auto aggregator =
        QVTaggingAggregator::initWithRules(settingsIn(options.rulesFile, "rules", readRules, context),
                                           keywordsIn(options.keywordsFile, context));
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    std::vector<ItemRow> rows;
    JsonItems json(context.format);
    Totals totals;
    context.forEachContentItem(options.paths, options.links, [&](const URL& url) {
        const auto item = std::make_shared<ContentItem>(url, ContentItem::Reading{bits, nullptr});
        auto found = aggregator->taggingsOfItem(item, *taxonomy, bits);
        if (options.measuresAnyRhythm) addAnyRhythm(*item, *taxonomy, found);
        const Taggings taggings = sortedTaggings(found);
        totals.add(taggings);
        if (context.format == Format::table) {
            rows.push_back(rowOf(url, taggings));
        } else {
            json.add(jsonOfItem(*item, taggings));
        }
    });
    if (context.format != Format::table) return json.finish();
    printItemTable(rows, context.terminal());
    context.note(fmt::format("{}, {} of them tagged, {}", counted(totals.items, "item"), totals.tagged,
                             counted(totals.tags, "tag")));
}

}  // namespace

void addAutotagCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command = tool.addCommand("autotag", "Derives tags for files and for everything below folders");
    command.addOption("paths", options->paths, "Files and folders").required().valueName("PATH");
    command.addFollowFlag(options->links);
    addServicesOption(command, options->services);
    command
        .addOption("--keywords", options->keywordsFile,
                   "Property list of keywords to use instead of the built-in")
        .valueName("FILE");
    command.addOption("--rules", options->rulesFile, "Property list of rules to use instead of the built-in")
        .valueName("FILE");
    command.addFlag("--rhythm-any", options->measuresAnyRhythm,
                    "Grade the rhythm of every sound whose length in beats is known");
    command.footer("Example:\n  qvtag autotag --json Loops \"Patches/Warm Pad.patch\"");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool
