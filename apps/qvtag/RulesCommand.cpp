#include "Commands.h"
#include "autotagging/QVCTXMLDocument.h"
#include "autotagging/QVCTXMLRulesTaggingService.h"
#include "formats/QVContentEditorFileUtilities.h"
#include "platform/PropertyListFile.h"
#include "platform/Text.h"

#include <algorithm>
#include <map>
#include <memory>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

namespace qvct::tool {
namespace {

using Service = std::shared_ptr<QVCTXMLRulesTaggingService>;

struct Options {
    std::vector<std::string> paths;
    std::string rulesFile;
};

/// What one rule did to all items.
struct Tally {
    std::string type;
    std::size_t matches = 0;
    std::chrono::nanoseconds time{0};
};

std::shared_ptr<QVCTXMLDocument> documentOf(const URL& url) {
    const auto cache = QVContentEditorFileUtilities::intermediateCacheURLForURL(url);
    return cache ? QVCTXMLDocument::initWithContentsOfURL(*cache) : nullptr;
}

std::string textOf(const TagDictionary& tag) {
    const PropertyList* label = tag.value(kTagDictionaryLabelKey);
    const PropertyList* level = tag.value(kTagDictionaryLevelKey);
    std::string text = label != nullptr && label->string() != nullptr ? *label->string() : "(no label)";
    if (const auto weight = level == nullptr ? std::nullopt : level->doubleValue()) {
        text += fmt::format(" {:.0f}%", *weight * 100);
    }
    return text;
}

Json jsonOf(const TagDictionary& tag) {
    Json json = Json::object();
    for (const auto& [key, value] : tag) {
        if (value.string() != nullptr) json[key] = *value.string();
        if (value.isNumber()) json[key] = *value.doubleValue();
    }
    return json;
}

Json jsonOf(const RuleOutcome& outcome) {
    Json json{{"number", outcome.number}, {"type", outcome.type}, {"tags", Json::array()}};
    for (const TagDictionary& tag : outcome.tags) json["tags"].push_back(jsonOf(tag));
    json["evidence"] = outcome.evidence;
    return json;
}

/// The outcomes of the rules that gave a tag.
std::vector<RuleOutcome> matchesOf(const Service& service, const URL& url, ToolContext& context) {
    const auto document = documentOf(url);
    if (!document) context.note(fmt::format("{}: has no XML description", printable(url.path())));
    std::vector<RuleOutcome> outcomes = service->outcomesForXMLDocument(document);
    std::erase_if(outcomes, [](const RuleOutcome& outcome) { return outcome.tags.empty(); });
    return outcomes;
}

void printMatches(const URL& url, const std::vector<RuleOutcome>& matches, const Terminal& terminal) {
    constexpr std::size_t evidenceShown = 160;
    fmt::print("{}\n", colored(terminal, Color::strong, printable(url.path())));
    for (const RuleOutcome& match : matches) {
        std::vector<std::string> tags;
        for (const TagDictionary& tag : match.tags) tags.push_back(textOf(tag));
        fmt::print("  {:>2}  {:<10}  {}\n", match.number, match.type, join(tags, "  "));
        std::string evidence = printable(match.evidence);
        if (evidence.size() > evidenceShown) evidence = evidence.substr(0, evidenceShown) + "...";
        fmt::print("      {}\n", colored(terminal, Color::faint, evidence));
    }
}

/// The rules of a file, or null and a line on standard error; without a file the default ones.
Service serviceWith(const std::string& rulesFile, ToolContext& context) {
    if (rulesFile.empty()) return QVCTXMLRulesTaggingService::init();
    Error error;
    auto rules = readDictionaryFile(rulesFile, &error);
    if (!rules) {
        context.itemFailed(error.message);
        return nullptr;
    }
    const PropertyList* list = rules->value("DefaultRules");
    if (list == nullptr || list->array() == nullptr) {
        context.itemFailed(fmt::format("{}: there is no array under \"DefaultRules\"", printable(rulesFile)));
        return nullptr;
    }
    return QVCTXMLRulesTaggingService::initWithRules(std::move(rules));
}

void show(const Options& options, ToolContext& context) {
    const Service service = serviceWith(options.rulesFile, context);
    if (!service) return;
    Json items = Json::array();
    for (const URL& url : context.contentItems(options.paths)) {
        const auto matches = matchesOf(service, url, context);
        if (context.format == Format::table) {
            printMatches(url, matches, context.terminal());
            continue;
        }
        Json rules = Json::array();
        for (const RuleOutcome& match : matches) rules.push_back(jsonOf(match));
        items.push_back({{"path", url.path()}, {"rules", rules}});
    }
    if (context.format != Format::table) printJson(items, context.format);
}

std::map<std::size_t, Tally> tallyOver(const std::vector<URL>& items, const Service& service) {
    std::map<std::size_t, Tally> tallies;
    for (const URL& url : items) {
        for (const RuleOutcome& outcome : service->outcomesForXMLDocument(documentOf(url))) {
            Tally& tally = tallies[outcome.number];
            tally.type = outcome.type;
            tally.matches += outcome.tags.empty() ? 0 : 1;
            tally.time += outcome.time;
        }
    }
    return tallies;
}

double microseconds(std::chrono::nanoseconds time) {
    return std::chrono::duration<double, std::micro>(time).count();
}

void printTallies(const std::map<std::size_t, Tally>& tallies, std::size_t items, ToolContext& context) {
    if (context.format != Format::table) {
        Json rules = Json::array();
        for (const auto& [number, tally] : tallies) {
            rules.push_back({{"number", number},
                             {"type", tally.type},
                             {"matches", tally.matches},
                             {"microseconds", microseconds(tally.time)}});
        }
        return printJson(Json{{"items", items}, {"rules", rules}}, context.format);
    }
    fmt::print("rule  type        matches of {:<5}  time an item\n", items);
    for (const auto& [number, tally] : tallies) {
        fmt::print("{:>4}  {:<10}  {:>16}  {:>9.1f} us\n", number, tally.type, tally.matches,
                   microseconds(tally.time) / static_cast<double>(std::max<std::size_t>(items, 1)));
    }
}

void test(const Options& options, ToolContext& context) {
    const Service service = serviceWith(options.rulesFile, context);
    if (!service) return;
    for (const RuleProblem& problem : service->problems()) {
        context.itemFailed(
            fmt::format("{}: rule {}: {}", printable(options.rulesFile), problem.number, problem.reason));
    }
    const std::vector<URL> items = context.contentItems(options.paths);
    printTallies(tallyOver(items, service), items.size(), context);
}

}  // namespace

void addRulesCommand(CLI::App& app, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    auto* rules = app.add_subcommand("rules", "Shows which rules match a patch, and why");
    rules->add_option("paths", options->paths, "Patches, settings, and folders of them")->type_name("PATH");
    rules->add_option("--rules", options->rulesFile, "Property list of rules to use instead of the built-in")
        ->type_name("FILE");
    rules->footer(
        "Example:\n  qvtag rules \"Patches/Warm Pad.patch\"\n  qvtag rules test MyRules.plist Patches");

    auto* testing =
        rules->add_subcommand("test", "Tries rules of your own: faults, matches and time of each");
    testing->add_option("rules", options->rulesFile, "Property list of rules")
        ->required()
        ->type_name("RULES");
    testing->add_option("paths", options->paths, "Patches, settings, and folders of them")
        ->required()
        ->type_name("PATH");
    testing->footer("Example:\n  qvtag rules test MyRules.plist Patches");
    testing->callback([options, &context] { test(*options, context); });
    rules->callback([rules, options, &context] {
        if (!rules->get_subcommands().empty()) return;
        if (options->paths.empty()) return context.usageFailed("rules: which files? See qvtag rules --help");
        show(*options, context);
    });
}

}  // namespace qvct::tool
