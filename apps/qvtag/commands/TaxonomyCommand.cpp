#include "CommandLine.h"
#include "commands/Commands.h"
#include "operations/SimilarTags.h"
#include "output/StandardStreams.h"
#include "platform/data/PropertyListFile.h"
#include "platform/text/Text.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TGRTTaxonomySearching.h"

#include <memory>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

using TagPointer = std::shared_ptr<TGRTTag>;

struct Options {
    std::string label;
    std::string category;
    std::string parent;
    std::string text;
    std::string what;
    std::vector<std::string> categories;
};

std::string_view kindOf(const TGRTTag& tag) {
    switch (tag.valueType()) {
        case kTagValuePercentage:
            return "percentage";
        case kTagValueBipolar:
            return "bipolar";
        case kTagValueStepped:
            return "steps";
        case kTagValueFlag:
            return "flag";
        default:
            return "plain";
    }
}

Json jsonOfTree(const TGRTTag& tag) {
    Json json;
    json["label"] = tag.label();
    json["kind"] = kindOf(tag);
    json["steps"] = tag.valueStepLabels();
    json["children"] = Json::array();
    for (const auto& child : tag.children()) json["children"].push_back(jsonOfTree(*child));
    return json;
}

Json jsonOfTag(const TGRTTag& tag) {
    Json json = jsonOfTree(tag);
    const auto parent = tag.parent();
    json["parent"] = parent ? Json(parent->label()) : Json();
    json["category"] = tag.categoryIdentifier();
    return json;
}

void printTree(const TGRTTag& tag, const Terminal& terminal, std::size_t depth) {
    std::string remark = tag.valueType() == kTagValuePlain ? "" : std::string(kindOf(tag));
    if (!tag.valueStepLabels().empty()) remark += ": " + join(tag.valueStepLabels(), ", ");
    print("{}{}{}\n", std::string(2 * depth, ' '), printable(tag.label()),
          remark.empty() ? "" : "  " + colored(terminal, Color::faint, "(" + printable(remark) + ")"));
    for (const auto& child : tag.children()) printTree(*child, terminal, depth + 1);
}

/// The named categories, or all of them.
std::vector<std::shared_ptr<TGRTCategory>> chosenCategories(const std::vector<std::string>& identifiers,
                                                            const TGRTTaxonomy& taxonomy,
                                                            ToolContext& context) {
    if (identifiers.empty()) return taxonomy.categories().ordered();
    std::vector<std::shared_ptr<TGRTCategory>> chosen;
    for (const std::string& identifier : identifiers) {
        if (const auto category = taxonomy.findCategoryWithIdentifier(identifier)) {
            chosen.push_back(category);
        } else {
            context.itemFailed(fmt::format("no category \"{}\"", printable(identifier)));
        }
    }
    return chosen;
}

void show(const Options& options, ToolContext& context) {
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    Json json = Json::array();
    for (const auto& category : chosenCategories(options.categories, *taxonomy, context)) {
        if (context.format == Format::table) {
            print("{}  {}\n", colored(context.terminal(), Color::strong, printable(category->identifier())),
                  colored(context.terminal(), Color::faint, fmt::format("{} tags", category->tags().size())));
            for (const auto& tag : category->rootTags()) printTree(*tag, context.terminal(), 1);
            continue;
        }
        Json tags = Json::array();
        for (const auto& tag : category->rootTags()) tags.push_back(jsonOfTree(*tag));
        json.push_back({{"category", category->identifier()}, {"tags", tags}});
    }
    if (context.format != Format::table) printJson(json, context.format);
}

TagPointer findTag(const Options& options, const TGRTTaxonomy& taxonomy, ToolContext& context) {
    const TGRTTaxonomy::OptionalLabel parent =
        options.parent.empty() ? TGRTTaxonomy::OptionalLabel() : TGRTTaxonomy::OptionalLabel(options.parent);
    if (options.category.empty() && !parent) return taxonomy.findTagForLabel(options.label);
    const auto categories = chosenCategories(
        options.category.empty() ? std::vector<std::string>{} : std::vector{options.category}, taxonomy,
        context);
    for (const auto& category : categories) {
        if (auto tag = taxonomy.findTagForLabel(options.label, parent, category->identifier())) return tag;
    }
    return nullptr;
}

/// " in Genres below House", or the part of it that was asked for.
std::string placeOf(const Options& options) {
    std::string place;
    if (!options.category.empty()) place += " in " + printable(options.category);
    if (!options.parent.empty()) place += " below " + printable(options.parent);
    return place;
}

void find(const Options& options, ToolContext& context) {
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    const TagPointer tag = findTag(options, *taxonomy, context);
    if (!tag) {
        return context.itemFailed(fmt::format("no tag \"{}\"{}{}", printable(options.label), placeOf(options),
                                              similarTags(options.label, taxonomy)));
    }
    if (context.format != Format::table) return printJson(jsonOfTag(*tag), context.format);
    print("{}\n", colored(context.terminal(), Color::faint, pathOfTag(*tag)));
    printTree(*tag, context.terminal(), 0);
}

void search(const Options& options, ToolContext& context) {
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    if (context.format != Format::table) {
        const auto searching = TGRTTaxonomySearching::initWithTaxonomy(taxonomy);
        return printJson(Json(searching->findTagLabelsForString(options.text, false)), context.format);
    }
    for (const auto& tag : tagsHolding(options.text, taxonomy)) print("{}\n", pathOfTag(*tag));
}

void exportTaxonomy(const Options& options, ToolContext& /*context*/) {
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    if (options.what == "plist") {
        printText(serializePropertyList(taxonomy->dictionary(), PropertyListFormat::xml));
    } else if (options.what == "strings") {
        printText(taxonomy->localizedStrings());
    } else {
        print("{}\n", join(taxonomy->mappingExport(), "\n"));
    }
}

template <typename Run>
void callback(Command command, const std::shared_ptr<Options>& options, ToolContext& context, Run run) {
    command.callback([options, &context, run] { run(*options, context); });
}

}  // namespace

void addTaxonomyCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command taxonomy = tool.addCommand("taxonomy", "Shows, searches and exports the tags that there are");
    taxonomy.allowOneCommand();
    taxonomy.callback([taxonomy, options, &context] {
        if (!taxonomy.isCommandNamed()) show(*options, context);
    });
    taxonomy.footer("Example:\n  qvtag taxonomy show Genres\n  qvtag taxonomy search house");

    Command showing = taxonomy.addCommand("show", "The tree of tags, whole or of some categories");
    showing.addOption("categories", options->categories, "Categories, such as Genres").valueName("CATEGORY");
    showing.footer("Example:\n  qvtag taxonomy show Genres \"Sound Descriptors\"");
    callback(showing, options, context, show);

    Command finding = taxonomy.addCommand("find", "The tag with a label, and what lies below it");
    finding.addOption("label", options->label, "The label, as it is written").required();
    finding.addOption("--category", options->category, "Only in this category");
    finding.addOption("--parent", options->parent, "Only below the tag with this label");
    finding.footer("Example:\n  qvtag taxonomy find \"Deep House\" --category Genres");
    callback(finding, options, context, find);

    Command searching = taxonomy.addCommand("search", "The tags whose labels hold a text, in any case");
    searching.addOption("text", options->text, "Part of a label").required();
    searching.footer("Example:\n  qvtag taxonomy search reggae");
    callback(searching, options, context, search);

    Command exporting = taxonomy.addCommand("export", "The taxonomy as a file of its own");
    exporting
        .addOption("what", options->what, "plist, strings (for translators) or mapping (rows to fill in)")
        .required()
        .oneOf({"plist", "strings", "mapping"});
    exporting.footer("Example:\n  qvtag taxonomy export strings > Tags.strings");
    callback(exporting, options, context, exportTaxonomy);

    addLegacyTaxonomyCommands(taxonomy, context);
}

}  // namespace qvct::tool
