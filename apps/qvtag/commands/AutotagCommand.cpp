#include "CommandLine.h"
#include "Services.h"
#include "TaggerOptions.h"
#include "autotagging/ContentItem.h"
#include "autotagging/ItemTagger.h"
#include "autotagging/QVTaggingAggregator.h"
#include "autotagging/services/QVCTRhythmicTaggingService.h"
#include "commands/Commands.h"
#include "formats/QVContentTaggingTypes.h"
#include "media/loopfile/LCFileData.h"
#include "metadata/TGRTMetaData.h"
#include "operations/RhythmMeasurement.h"
#include "output/ItemTable.h"
#include "output/StandardStreams.h"
#include "output/TaggingWords.h"

#include <algorithm>
#include <memory>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

struct Options {
    TaggerOptions tagger;
    bool measuresAnyRhythm = false;
    bool isStrict = false;
    bool showsAll = false;
};

using Taggings = std::vector<std::shared_ptr<TGRTTagging>>;

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
void addAnyRhythm(ContentItem& item, const TGRTTaxonomy& taxonomy, const Rejections& rejections,
                  ObjectSet<TGRTTagging>& taggings) {
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
        if (!tagging || !rejections.reasonFor(*tagging->tag()).empty()) continue;
        tagging->setIsAutoTagging(true);
        taggings.insert(tagging);
    }
}

void run(const Options& options, ToolContext& context) {
    const auto bits = optionsForServices(options.tagger.services, context);
    const bool isStrict = options.isStrict || (bits & QVCTAutoTaggingOptionNames) == 0;
    // What is weighed elsewhere; a list of services may ask for what the sound says by itself.
    const std::uint64_t notExact =
        QVCTAutoTaggingOptionNames | (options.isStrict ? QVCTAutoTaggingOptionSound : std::uint64_t{0});
    const auto aggregator = options.tagger.aggregator(context);
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    std::vector<ItemRow> rows;
    JsonItems json(context.format);
    Totals totals;
    ItemTagger tagger(aggregator, taxonomy);
    context.forEachContentItemBelow(
        options.tagger.paths, options.tagger.links, [&](const URL& url, const std::string& root) {
            const auto item = std::make_shared<ContentItem>(url, ContentItem::Reading{bits, nullptr});
            const ItemReport report =
                isStrict ? ItemReport() : tagger.report(item, ItemNames(url.path(), root), bits);
            auto found =
                isStrict ? aggregator->taggingsOfItem(item, *taxonomy, bits & ~notExact) : report.taggings();
            if (options.measuresAnyRhythm) addAnyRhythm(*item, *taxonomy, report.rejections, found);
            const Taggings taggings = sortedTaggings(found);
            totals.add(taggings);
            if (context.format == Format::table) {
                rows.push_back({url.path(), wordsForTaggings(taggings, options.showsAll)});
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
    options->tagger.addTo(command).required();
    command.addFlag("--strict", options->isStrict,
                    "Give all that the services say, as they say it; names are not read");
    command.addFlag("--all", options->showsAll,
                    "Also show parents, kinds of content and the like in the table");
    command.addFlag("--rhythm-any", options->measuresAnyRhythm,
                    "Grade the rhythm of every sound whose length in beats is known");
    command.footer("Example:\n  qvtag autotag --json Loops \"Patches/Warm Pad.patch\"");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool
