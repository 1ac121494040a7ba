#include "autotagging/services/QVCTXMLRulesTaggingService.h"

#include "autotagging/scripts/QVCTJavaScriptUtilities.h"
#include "autotagging/xml/QVCTXMLDocument.h"
#include "autotagging/xml/XPathExpression.h"
#include "platform/base/Log.h"
#include "platform/data/Json.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"
#include "resources/QVCTCompiledResources.h"
#include "resources/ReplacementFile.h"

#include <cstdlib>
#include <string_view>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::string_view kXPathType = "XPath";
constexpr std::string_view kScriptType = "JavaScript";
constexpr std::string_view kFileScheme = "file://";

std::optional<std::string> textForKey(const PropertyList::Dictionary& dictionary, std::string_view key) {
    const std::string* text = dictionary.string(key);
    return text == nullptr ? std::nullopt : std::optional(*text);
}

/// The path that a rule text of the form "file://..." names.
std::string pathOfRule(std::string_view rule) {
    std::string path = replaceAll(rule, kFileScheme, "");
    const char* home = std::getenv("HOME");
    if (home != nullptr && (path == "~" || path.starts_with("~/"))) path.replace(0, 1, home);
    if (path.empty() || path.front() != '/') path = URL::fileURLWithPath(path).path();
    return URL::URLWithString(std::string(kFileScheme) + path).path();
}

/// The text to evaluate: that of the file which the rule names if there is one, else the rule's own; empty
/// when the file cannot be read.
std::string resolvedText(const std::string& rule, Error* error = nullptr) {
    if (!rule.starts_with(kFileScheme)) return rule;
    const std::string path = pathOfRule(rule);
    if (!fileExists(path)) return rule;
    Error reason;
    std::optional<std::string> text = readTextFile(path, &reason);
    if (text) return *std::move(text);
    if (error != nullptr) {
        *error = std::move(reason);
    } else {
        log(reason.message());
    }
    return {};
}

/// The dictionaries of a script's result; other elements are no tags.
std::vector<TagDictionary> tagsOf(std::optional<PropertyList::Array> result) {
    std::vector<TagDictionary> tags;
    if (!result) return tags;
    for (PropertyList& element : *result) {
        if (TagDictionary* dictionary = element.dictionary()) {
            tags.push_back(std::move(*dictionary));
        } else {
            log("JavaScript Exception: TypeError: main returned something that is no tag dictionary");
        }
    }
    return tags;
}

bool matches(const std::string& expression, const QVCTXMLDocument& document, std::string* evidence) {
    if (evidence == nullptr) return document.anyNodesForXPath(expression);
    const auto node = document.firstNodeForXPath(expression);
    if (node) *evidence = node->XMLData();
    return node != nullptr;
}

/// The tags that a rule of that type gives; the evidence only where it is asked for.
std::vector<TagDictionary> evaluate(std::string_view type, const std::string& text,
                                    const std::optional<std::string>& tag,
                                    const std::shared_ptr<QVCTXMLDocument>& document, std::string* evidence) {
    if (type == kXPathType) {
        if (!tag || !matches(text, *document, evidence)) return {};
        return {tagDictionary(*tag)};
    }
    auto result = QVCTJavaScriptUtilities::tagsForXMLDocument(document, text);
    if (evidence != nullptr && result) *evidence = jsonText(PropertyList(*result), JsonStyle::compact);
    return tagsOf(std::move(result));
}

}  // namespace

std::shared_ptr<QVCTXMLRulesTaggingService> QVCTXMLRulesTaggingService::init() {
    return initWithRules(std::nullopt);
}

std::shared_ptr<QVCTXMLRulesTaggingService> QVCTXMLRulesTaggingService::initWithRules(
    std::optional<PropertyList::Dictionary> rules) {
    return std::shared_ptr<QVCTXMLRulesTaggingService>(
        new QVCTXMLRulesTaggingService(rules ? *rules : defaultRules()));
}

QVCTXMLRulesTaggingService::QVCTXMLRulesTaggingService(const PropertyList::Dictionary& rules) {
    setupWithRules(rules);
}

PropertyList::Dictionary QVCTXMLRulesTaggingService::defaultRules() {
    const auto read = [](const std::string& path) { return readDictionaryFile(path); };
    return replacedOrBuiltIn({"DefaultRules", "plist"}, read, QVCTCompiledResources::DefaultRulesPlist)
        .value_or(PropertyList::Dictionary{});
}

void QVCTXMLRulesTaggingService::setupWithRules(const PropertyList::Dictionary& rules) {
    const PropertyList::Array* list = rules.array("DefaultRules");
    if (list == nullptr) return;
    const PropertyList::Dictionary empty;
    std::size_t number = 0;
    for (const PropertyList& element : *list) {
        const PropertyList::Dictionary& rule =
            element.dictionary() != nullptr ? *element.dictionary() : empty;
        const bool hasType = rule.value("type") != nullptr;
        rules_.push_back({++number, hasType ? textForKey(rule, "type").value_or("") : std::string(kXPathType),
                          textForKey(rule, "rule").value_or(""), textForKey(rule, "tag")});
    }
}

template <typename Visit>
void QVCTXMLRulesTaggingService::forEachTag(const std::shared_ptr<QVCTXMLDocument>& document,
                                            std::uint64_t options, Visit visit) const {
    if ((options & QVCTAutoTaggingOptionXMLRules) == 0 || !document) return;
    for (const Rule& rule : rules_) {
        if (rule.type != kXPathType && rule.type != kScriptType) continue;
        const LogScope scope(fmt::format("rule {}: ", rule.number));
        const std::string text = resolvedText(rule.text);
        if (text.empty()) continue;
        for (TagDictionary& tag : evaluate(rule.type, text, rule.tag, document, nullptr))
            visit(rule, std::move(tag));
    }
}

TagDictionarySet QVCTXMLRulesTaggingService::tagsWithContentsOfURL(
    const URL& /*url*/, const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
    const std::shared_ptr<TGRTMetaData>& /*metaData*/, const std::shared_ptr<LCFileData>& /*fileData*/,
    std::uint64_t options) {
    TagDictionarySet tags;
    forEachTag(xmlDocument, options,
               [&tags](const Rule&, TagDictionary tag) { tags.insert(std::move(tag)); });
    return tags;
}

std::vector<TagClaim> QVCTXMLRulesTaggingService::claims(const TaggedItem& item, std::uint64_t options) {
    constexpr std::size_t longestShown = 200;
    std::vector<TagClaim> claims;
    forEachTag(item.xmlDocument, options, [&](const Rule& rule, const TagDictionary& tag) {
        auto claim = claimOf(tag);
        if (!claim) return;
        const bool isPath = rule.type == kXPathType && rule.text.size() <= longestShown;
        claim->evidence = {isPath ? rule.text : rule.type, fmt::format("rule {}", rule.number), 0};
        claims.push_back(*std::move(claim));
    });
    return claims;
}

std::vector<RuleOutcome> QVCTXMLRulesTaggingService::outcomesForXMLDocument(
    const std::shared_ptr<QVCTXMLDocument>& document) const {
    std::vector<RuleOutcome> outcomes;
    if (!document) return outcomes;
    for (const Rule& rule : rules_) {
        if (problemOf(rule)) continue;
        const LogScope scope(fmt::format("rule {}: ", rule.number));
        const std::string text = resolvedText(rule.text);
        RuleOutcome outcome{rule.number, rule.type, {}, {}, {}};
        const auto start = std::chrono::steady_clock::now();
        outcome.tags = evaluate(rule.type, text, rule.tag, document, &outcome.evidence);
        outcome.time = std::chrono::steady_clock::now() - start;
        outcomes.push_back(std::move(outcome));
    }
    return outcomes;
}

std::optional<std::string> QVCTXMLRulesTaggingService::problemOf(const Rule& rule) {
    if (rule.text.empty()) return "there is no text under \"rule\"";
    Error error;
    const std::string text = resolvedText(rule.text, &error);
    if (text.empty()) return error.isSet() ? error.message() : "the rule's file is empty";
    const std::string path = text == rule.text ? std::string() : pathOfRule(rule.text);
    const auto problem = [&](bool isSound) {
        failIn(path, &error);
        return isSound ? std::nullopt : std::optional(error.message());
    };
    if (rule.type == kXPathType) {
        if (!rule.tag) return "there is no text under \"tag\"";
        if (text == rule.text && text.starts_with(kFileScheme)) return pathOfRule(text) + ": no such file";
        return problem(XPathExpression::cached(text, &error) != nullptr);
    }
    if (rule.type == kScriptType) return problem(ScriptContext::checkSyntax(text, &error));
    return fmt::format("unknown type \"{}\" (XPath or JavaScript)", printable(rule.type));
}

std::vector<RuleDescription> QVCTXMLRulesTaggingService::rules() const {
    std::vector<RuleDescription> descriptions;
    for (const Rule& rule : rules_)
        descriptions.push_back({rule.number, rule.type, problemOf(rule).value_or("")});
    return descriptions;
}

}  // namespace qvct
