#include "CommandLine.h"
#include "commands/Commands.h"
#include "output/StandardStreams.h"
#include "platform/text/Text.h"
#include "taxonomy/TGRTTaxonomySearching.h"
#include "taxonomy/legacy/TGRTLegacyTaxonomyMapping.h"

#include <algorithm>
#include <memory>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

using TagPointer = std::shared_ptr<TGRTTag>;

struct Options {
    std::string label;
    std::string vocabulary;
};

/// A retired vocabulary with what has become of it.
struct Vocabulary {
    std::string name;
    std::shared_ptr<TGRTTaxonomy> taxonomy;
    std::shared_ptr<const TGRTLegacyTaxonomyMapping> mapping;
};

/// The chosen vocabulary, or both; those whose table cannot be used are reported and left out.
std::vector<Vocabulary> vocabularies(const Options& options, ToolContext& context) {
    std::vector<Vocabulary> chosen;
    if (options.vocabulary != "synth") {
        chosen.push_back({"loop", TGRTTaxonomy::legacyLoopTaxonomy(),
                          TGRTLegacyTaxonomyMapping::legacyLoopTaxonomyMapping()});
    }
    if (options.vocabulary != "loop") {
        chosen.push_back({"synth", TGRTTaxonomy::legacyVorthalTaxonomy(),
                          TGRTLegacyTaxonomyMapping::legacyVorthalTaxonomyMapping()});
    }
    std::erase_if(chosen, [&context](const Vocabulary& vocabulary) {
        if (vocabulary.mapping) return false;
        const auto url = vocabulary.name == "loop"
                             ? TGRTLegacyTaxonomyMapping::defaultLegacyLoopTaxonomyMappingURL()
                             : TGRTLegacyTaxonomyMapping::defaultLegacyVorthalTaxonomyMappingURL();
        context.itemFailed(errorOf(kErrorMalformed, "not a mapping table", {url ? url->path() : "built-in"}));
        return true;
    });
    return chosen;
}

Json jsonOfLegacyTag(const TGRTTag& tag) {
    const auto parent = tag.parent();
    return {{"label", tag.label()},
            {"parent", parent ? Json(parent->label()) : Json()},
            {"category", tag.categoryIdentifier()}};
}

/// "Synth, Short / Long Release 80%"
std::string textOfTaggings(const ObjectSet<TGRTTagging>& taggings) {
    std::vector<std::string> texts;
    for (const auto& tagging : taggings) texts.push_back(textOfTagging(*tagging));
    return join(texts, ", ");
}

struct Translation {
    std::string vocabulary;
    TagPointer tag;
    const ObjectSet<TGRTTagging>* taggings;
};

void printTranslations(const std::vector<Translation>& translations, const Terminal& terminal) {
    std::size_t width = 0;
    for (const auto& [_, tag, taggings] : translations)
        width = std::max(width, displayWidth(pathOfTag(*tag)));
    for (const auto& [vocabulary, tag, taggings] : translations) {
        print("{}  {}  {}\n", padded(vocabulary, 5), padded(pathOfTag(*tag), width),
              taggings->empty() ? colored(terminal, Color::faint, "(nothing)")
                                : colored(terminal, Color::accent, textOfTaggings(*taggings)));
    }
}

void reportUnknown(const std::string& label, const std::vector<Vocabulary>& chosen, ToolContext& context) {
    std::vector<std::string> similar;
    for (const Vocabulary& vocabulary : chosen) {
        const auto searching = TGRTTaxonomySearching::initWithTaxonomy(vocabulary.taxonomy);
        for (std::string& found : searching->findTagLabelsForString(label, false)) {
            if (std::find(similar.begin(), similar.end(), found) == similar.end()) {
                similar.push_back(std::move(found));
            }
        }
    }
    context.itemFailed(fmt::format("no retired keyword \"{}\"{}", printable(label),
                                   similar.empty() ? "" : "; there are: " + join(similar, ", ")));
}

void map(const Options& options, ToolContext& context) {
    const auto chosen = vocabularies(options, context);
    std::vector<Translation> translations;
    for (const auto& [name, taxonomy, mapping] : chosen) {
        for (const auto& tag : taxonomy->allTags()) {
            if (tag->label() == options.label)
                translations.push_back({name, tag, &mapping->taggingsForLegacyTag(*tag)});
        }
    }
    if (translations.empty() && !chosen.empty()) return reportUnknown(options.label, chosen, context);
    if (context.format == Format::table) return printTranslations(translations, context.terminal());
    Json json = Json::array();
    for (const auto& [vocabulary, tag, taggings] : translations) {
        Json item = {{"vocabulary", vocabulary}};
        item.update(jsonOfLegacyTag(*tag));
        item["taggings"] = Json::array();
        for (const auto& tagging : *taggings) item["taggings"].push_back(jsonOfTagging(*tagging));
        json.push_back(std::move(item));
    }
    printJson(json, context.format);
}

struct Coverage {
    std::string vocabulary;
    std::size_t tags = 0;
    std::vector<TagPointer> withEmptyRow;
    std::vector<TagPointer> withoutRow;
    std::vector<std::string> unknownLabels;
    std::vector<std::string> unknownKeywords;
};

Coverage coverageOf(const Vocabulary& vocabulary) {
    Coverage coverage;
    coverage.vocabulary = vocabulary.name;
    for (const auto& tag : vocabulary.taxonomy->allTags()) {
        ++coverage.tags;
        if (!vocabulary.mapping->taggingsForLegacyTag(*tag).empty()) continue;
        const bool hasRow = vocabulary.mapping->hasRowForLegacyTag(*tag);
        (hasRow ? coverage.withEmptyRow : coverage.withoutRow).push_back(tag);
    }
    coverage.unknownLabels = vocabulary.mapping->unknownNewLabels();
    coverage.unknownKeywords = vocabulary.mapping->unknownLegacyKeywords();
    return coverage;
}

Json jsonOfCoverage(const Coverage& coverage) {
    const auto tags = [](const std::vector<TagPointer>& list) {
        Json json = Json::array();
        for (const auto& tag : list) json.push_back(jsonOfLegacyTag(*tag));
        return json;
    };
    return {{"vocabulary", coverage.vocabulary},           {"tags", coverage.tags},
            {"withEmptyRow", tags(coverage.withEmptyRow)}, {"withoutRow", tags(coverage.withoutRow)},
            {"unknownLabels", coverage.unknownLabels},     {"unknownKeywords", coverage.unknownKeywords}};
}

void printList(std::string_view heading, const std::vector<std::string>& lines) {
    if (lines.empty()) return;
    print("  {} ({})\n", heading, lines.size());
    for (const std::string& line : lines) print("    {}\n", printable(line));
}

void printCoverage(const Coverage& coverage, const Terminal& terminal) {
    const auto paths = [](const std::vector<TagPointer>& tags) {
        std::vector<std::string> lines(tags.size());
        std::transform(tags.begin(), tags.end(), lines.begin(),
                       [](const auto& tag) { return pathOfTag(*tag); });
        return lines;
    };
    const std::size_t mapped = coverage.tags - coverage.withEmptyRow.size() - coverage.withoutRow.size();
    print("{}  {} of {} tags have a mapping\n", colored(terminal, Color::strong, coverage.vocabulary), mapped,
          coverage.tags);
    printList("rows that name no new tag", paths(coverage.withEmptyRow));
    printList("tags without a row", paths(coverage.withoutRow));
    printList("new labels that the taxonomy does not know", coverage.unknownLabels);
    printList("rows of tags that do not exist", coverage.unknownKeywords);
}

void showCoverage(const Options& options, ToolContext& context) {
    Json json = Json::array();
    for (const Vocabulary& vocabulary : vocabularies(options, context)) {
        const Coverage coverage = coverageOf(vocabulary);
        if (context.format == Format::table) printCoverage(coverage, context.terminal());
        json.push_back(jsonOfCoverage(coverage));
    }
    if (context.format != Format::table) printJson(json, context.format);
}

}  // namespace

void addLegacyTaxonomyCommands(Command& taxonomy, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    const auto addVocabulary = [&options](Command command) {
        command.addOption("--vocabulary", options->vocabulary, "Only loop or synth").oneOf({"loop", "synth"});
    };
    Command mapping = taxonomy.addCommand("map", "What a keyword of a retired vocabulary has become");
    mapping.addOption("label", options->label, "The old keyword, as it is written").required();
    addVocabulary(mapping);
    mapping.footer("Example:\n  qvtag taxonomy map Dark --vocabulary loop");
    mapping.callback([options, &context] { map(*options, context); });

    Command coverage = taxonomy.addCommand(
        "coverage", "Old tags that have become nothing, and new labels that the taxonomy does not know");
    addVocabulary(coverage);
    coverage.footer("Example:\n  qvtag taxonomy coverage");
    coverage.callback([options, &context] { showCoverage(*options, context); });
}

}  // namespace qvct::tool
