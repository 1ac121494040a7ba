#include "CommandLine.h"
#include "Resources.h"
#include "autotagging/services/QVCTXMLRulesTaggingService.h"
#include "autotagging/xml/QVCTXMLDocument.h"
#include "commands/Commands.h"
#include "formats/QVContentEditorFileUtilities.h"
#include "output/StandardStreams.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <memory>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

using Service = std::shared_ptr<QVCTXMLRulesTaggingService>;

struct Options {
    std::vector<std::string> paths;
    LinksOutside links = LinksOutside::files;
    std::string rulesFile;
};

/// What one rule did to all items.
struct Tally {
    RuleDescription rule;
    std::size_t matches = 0;
    std::chrono::nanoseconds time{0};
};

std::shared_ptr<QVCTXMLDocument> documentOf(const URL& url) {
    const auto cache = QVContentEditorFileUtilities::intermediateCacheURLForURL(url);
    return cache ? QVCTXMLDocument::initWithContentsOfURL(*cache) : nullptr;
}

std::string textOf(const TagDictionary& tag) {
    const std::string* label = tag.string(kTagDictionaryLabelKey);
    const auto level = tag.doubleValue(kTagDictionaryLevelKey);
    return (label == nullptr ? "(no label)" : printable(*label)) +
           (level ? fmt::format(" {:.0f}%", *level * 100) : "");
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
    if (!document) context.note(errorOf(kErrorUnreadable, "has no XML description", {url.path()}).message());
    std::vector<RuleOutcome> outcomes = service->outcomesForXMLDocument(document);
    std::erase_if(outcomes, [](const RuleOutcome& outcome) { return outcome.tags.empty(); });
    return outcomes;
}

void printMatches(const URL& url, const std::vector<RuleOutcome>& matches, const Terminal& terminal) {
    constexpr std::size_t evidenceShown = 160;
    print("{}\n", colored(terminal, Color::strong, printable(url.path())));
    for (const RuleOutcome& match : matches) {
        std::vector<std::string> tags;
        for (const TagDictionary& tag : match.tags) tags.push_back(textOf(tag));
        print("  {:>2}  {:<10}  {}\n", match.number, match.type, join(tags, "  "));
        std::string evidence = printable(match.evidence);
        if (evidence.size() > evidenceShown) evidence = evidence.substr(0, evidenceShown) + "...";
        print("      {}\n", colored(terminal, Color::faint, evidence));
    }
}

/// The rules of a file, or null and a line on standard error; without a file the default ones.
Service serviceWith(const std::string& rulesFile, ToolContext& context) {
    if (rulesFile.empty()) return QVCTXMLRulesTaggingService::init();
    Error error;
    auto rules = readRules(rulesFile, &error);
    if (rules) return QVCTXMLRulesTaggingService::initWithRules(std::move(rules));
    context.itemFailed(error);
    return nullptr;
}

void show(const Options& options, ToolContext& context) {
    const Service service = serviceWith(options.rulesFile, context);
    if (!service) return;
    JsonItems items(context.format);
    context.forEachContentItem(options.paths, options.links, [&](const URL& url) {
        const auto matches = matchesOf(service, url, context);
        if (context.format == Format::table) {
            printMatches(url, matches, context.terminal());
            return;
        }
        Json rules = Json::array();
        for (const RuleOutcome& match : matches) rules.push_back(jsonOf(match));
        items.add({{"path", url.path()}, {"rules", rules}});
    });
    if (context.format != Format::table) items.finish();
}

/// A tally of each rule, and a line on standard error for each that can never match.
std::vector<Tally> emptyTallies(const Service& service, const std::string& rulesFile, ToolContext& context) {
    std::vector<Tally> tallies;
    for (RuleDescription& rule : service->rules()) {
        if (!rule.problem.empty()) {
            context.itemFailed(errorOf(kErrorMalformed, rule.problem,
                                       {.path = rulesFile, .part = fmt::format("rule {}", rule.number)}));
        }
        tallies.push_back({std::move(rule)});
    }
    return tallies;
}

void count(const std::vector<URL>& items, const Service& service, std::vector<Tally>& tallies) {
    for (const URL& url : items) {
        for (const RuleOutcome& outcome : service->outcomesForXMLDocument(documentOf(url))) {
            Tally& tally = tallies[outcome.number - 1];
            tally.matches += outcome.tags.empty() ? 0 : 1;
            tally.time += outcome.time;
        }
    }
}

double microseconds(std::chrono::nanoseconds time) {
    return std::chrono::duration<double, std::micro>(time).count();
}

void printTallies(const std::vector<Tally>& tallies, std::size_t items, ToolContext& context) {
    if (context.format != Format::table) {
        Json rules = Json::array();
        for (const Tally& tally : tallies) {
            Json json{{"number", tally.rule.number},
                      {"type", tally.rule.type},
                      {"matches", tally.matches},
                      {"microseconds", microseconds(tally.time)}};
            if (!tally.rule.problem.empty()) json["problem"] = tally.rule.problem;
            rules.push_back(std::move(json));
        }
        return printJson(Json{{"items", items}, {"rules", rules}}, context.format);
    }
    print("rule  type        matches of {:<5}  time an item\n", items);
    for (const Tally& tally : tallies) {
        if (!tally.rule.problem.empty()) {
            print("{:>4}  {:<10}  {:>16}\n", tally.rule.number, printable(tally.rule.type), "never matches");
            continue;
        }
        print("{:>4}  {:<10}  {:>16}  {:>9.1f} us\n", tally.rule.number, tally.rule.type, tally.matches,
              microseconds(tally.time) / static_cast<double>(std::max<std::size_t>(items, 1)));
    }
}

void test(const Options& options, ToolContext& context) {
    const Service service = serviceWith(options.rulesFile, context);
    if (!service) return;
    std::vector<Tally> tallies = emptyTallies(service, options.rulesFile, context);
    const std::vector<URL> items = context.contentItems(options.paths, options.links);
    count(items, service, tallies);
    printTallies(tallies, items.size(), context);
}

}  // namespace

void addRulesCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command rules = tool.addCommand("rules", "Shows which rules match a patch, and why");
    rules.addOption("paths", options->paths, "Patches, settings, and folders of them").valueName("PATH");
    rules.addOption("--rules", options->rulesFile, "Property list of rules to use instead of the built-in")
        .valueName("FILE");
    rules.addFollowFlag(options->links);
    rules.footer(
        "Example:\n  qvtag rules \"Patches/Warm Pad.patch\"\n  qvtag rules test MyRules.plist Patches");

    Command testing = rules.addCommand("test", "Tries rules of your own: faults, matches and time of each");
    testing.addOption("rules", options->rulesFile, "Property list of rules").required().valueName("RULES");
    testing.addOption("paths", options->paths, "Patches, settings, and folders of them")
        .required()
        .valueName("PATH");
    testing.addFollowFlag(options->links);
    testing.footer("Example:\n  qvtag rules test MyRules.plist Patches");
    testing.callback([options, &context] { test(*options, context); });
    rules.callback([rules, options, &context] {
        if (rules.isCommandNamed()) return;
        if (options->paths.empty()) return context.usageFailed("rules: which files? See qvtag rules --help");
        show(*options, context);
    });
}

}  // namespace qvct::tool
