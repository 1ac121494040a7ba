#include "autotagging/keywords/QVCTKeywordExtractor.h"

#include "autotagging/keywords/KeywordExpression.h"
#include "platform/base/Log.h"
#include "platform/data/PropertyListFile.h"
#include "platform/text/LiteralTrie.h"
#include "platform/text/Text.h"
#include "resources/QVCTCompiledResources.h"
#include "resources/ReplacementFile.h"

#include <algorithm>
#include <unordered_set>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

using Dictionary = PropertyList::Dictionary;

/// The labels of a mapping's value: a text, or the texts of an array.
std::vector<std::string> labelsOf(const PropertyList& value) {
    if (const std::string* label = value.string()) return {*label};
    std::vector<std::string> labels;
    if (const PropertyList::Array* items = value.array()) {
        for (const PropertyList& item : *items) {
            if (const std::string* label = item.string()) labels.push_back(*label);
        }
    }
    return labels;
}

/// The bytes on both sides of a place in a text; 0 at its ends.
struct Neighbours {
    Neighbours(std::string_view text, std::size_t offset)
        : before(offset == 0 ? '\0' : text[offset - 1]), after(offset == text.size() ? '\0' : text[offset]) {}

    bool areAscii() const {
        return ((static_cast<unsigned char>(before) | static_cast<unsigned char>(after)) & 0x80U) == 0;
    }
    bool areInsideAsciiWordOrGap() const {
        return areAscii() && isAsciiWordCharacter(before) == isAsciiWordCharacter(after);
    }
    /// Whether a word begins or ends between them.
    bool isBoundary(std::string_view text, std::size_t offset) const {
        return areAscii() ? isAsciiWordCharacter(before) != isAsciiWordCharacter(after)
                          : isWordBoundary(text, offset);
    }

    char before;
    char after;
};

/// Of what expressions have, only single characters and groups; the compiler need not be asked. It is slow at
/// first, and "Bright / Dark (0.0)" is such a keyword.
bool hasOnlyGroups(std::string_view keyword) {
    constexpr std::size_t deepest = 16;
    std::size_t depth = 0;
    for (std::size_t i = 0; i < keyword.size(); ++i) {
        if (std::string_view("\\[]{}*+?^$|").find(keyword[i]) != std::string_view::npos) return false;
        if (keyword[i] == '(' && ++depth > deepest) return false;
        if (keyword[i] == ')' && depth-- == 0) return false;
    }
    return depth == 0;
}

bool compiles(std::string_view keyword) {
    if (!keyword.starts_with("regex:") && isAscii(keyword) && hasOnlyGroups(keyword)) return true;
    return RegularExpression::compile(expressionForKeyword(keyword), RegularExpression::Case::insensitive)
        .has_value();
}

}  // namespace

Dictionary QVCTKeywordExtractor::defaultKeywordMapping() {
    const auto read = [](const std::string& path) { return readDictionaryFile(path); };
    return replacedOrBuiltIn({"DefaultKeywordMapping", "plist"}, read,
                             QVCTCompiledResources::DefaultKeywordMappingPlist)
        .value_or(Dictionary{});
}

std::shared_ptr<QVCTKeywordExtractor> QVCTKeywordExtractor::defaultKeywordExtractor() {
    return initWithKeywordMappingDictionary(std::nullopt);
}

std::shared_ptr<QVCTKeywordExtractor> QVCTKeywordExtractor::keywordExtractorWithKeywordMappingDictionaryURL(
    const std::optional<URL>& url, Error* error) {
    if (!url) return nullptr;
    auto mapping = readDictionaryFile(url->path(), error);
    return mapping ? initWithKeywordMappingDictionary(std::move(mapping)) : nullptr;
}

std::shared_ptr<QVCTKeywordExtractor> QVCTKeywordExtractor::initWithKeywordMappingDictionary(
    std::optional<Dictionary> mapping, std::shared_ptr<TGRTTaxonomy> taxonomy) {
    return std::shared_ptr<QVCTKeywordExtractor>(
        new QVCTKeywordExtractor(mapping ? *std::move(mapping) : defaultKeywordMapping(),
                                 taxonomy ? std::move(taxonomy) : TGRTTaxonomy::defaultTaxonomy()));
}

QVCTKeywordExtractor::QVCTKeywordExtractor(Dictionary mapping, std::shared_ptr<TGRTTaxonomy> taxonomy)
    : mapping_(std::move(mapping)), taxonomy_(std::move(taxonomy)) {
    setupKeywordMapping(mapping_);
    setupWithTaxonomy(*taxonomy_);
    compileKeywords();
    compileTrie();
}

QVCTKeywordExtractor::~QVCTKeywordExtractor() = default;

void QVCTKeywordExtractor::setupKeywordMapping(const Dictionary& mapping) {
    for (const auto& entry : mapping) {
        for (const std::string& label : labelsOf(entry.value)) addToKeywordsSet(label);
    }
}

void QVCTKeywordExtractor::setupWithTaxonomy(const TGRTTaxonomy& taxonomy) {
    for (const auto& tag : taxonomy.allTags()) addToKeywordsSet(tag->label());
}

void QVCTKeywordExtractor::addToKeywordsSet(const std::string& label) {
    const bool isNew = resultIndices_.find(label) == resultIndices_.end();
    if (isNew) keywordsSet_.push_back(label);
    resultIndex(label);
}

std::uint32_t QVCTKeywordExtractor::resultIndex(const std::string& text) {
    const auto [entry, isNew] = resultIndices_.try_emplace(text, static_cast<std::uint32_t>(results_.size()));
    if (isNew) results_.push_back(text);
    return entry->second;
}

// The keys of the mapping are looked for first, then the members of the keyword set. A text that is both is
// looked for twice, and all that it yields counts twice; here it is one keyword with its results doubled.
void QVCTKeywordExtractor::compileKeywords() {
    const std::unordered_set<std::string> labels(keywordsSet_.begin(), keywordsSet_.end());
    std::unordered_map<std::string, std::uint32_t> indices;
    const auto look = [&](const std::string& text) {
        const auto [entry, isNew] = indices.try_emplace(text, static_cast<std::uint32_t>(keywords_.size()));
        if (isNew) keywords_.push_back({text, {}});
        std::vector<std::uint32_t>& results = keywords_[entry->second].results;
        if (const PropertyList* value = mapping_.value(text)) {
            for (const std::string& label : labelsOf(*value)) results.push_back(resultIndex(label));
        }
        if (labels.contains(text)) results.push_back(resultIndex(text));
    };
    for (const auto& entry : mapping_) look(entry.key);
    for (const std::string& label : keywordsSet_) look(label);
}

void QVCTKeywordExtractor::compileTrie() {
    std::unordered_map<std::string, std::size_t> indices;
    for (std::uint32_t i = 0; i < keywords_.size(); ++i) {
        const std::string& keyword = keywords_[i].text;
        const bool isPlain = isPlainKeyword(keyword);
        const std::string literal = foldCase(requiredLiteral(keyword));
        if (literal.empty() || (!isPlain && !compiles(keyword))) {
            alwaysRun_.push_back(i);
            continue;
        }
        const auto [entry, isNew] = indices.try_emplace(literal, literals_.size());
        if (isNew) literals_.push_back({literal, {}, {}});
        Literal& scanned = literals_[entry->second];
        (isPlain ? scanned.plain : scanned.expressions).push_back(i);
        hasNonAsciiLiterals_ = hasNonAsciiLiterals_ || !isAscii(literal);
    }
    std::vector<std::string> texts;
    for (const Literal& literal : literals_) texts.push_back(literal.text);
    trie_ = std::make_unique<LiteralTrie>(texts);
    marks_.assign(keywords_.size(), Mark::unseen);
}

std::optional<RegularExpression> QVCTKeywordExtractor::regexForKeyword(std::string_view keyword) {
    auto expression =
        RegularExpression::compile(expressionForKeyword(keyword), RegularExpression::Case::insensitive);
    if (!expression) log(fmt::format("Error when evalating regex: {}", keyword));
    return expression;
}

RegularExpression* QVCTKeywordExtractor::cachedRegexForKeyword(std::string_view keyword) {
    const std::string key(keyword);
    if (const auto hit = regexCacheDictionary_.find(key); hit != regexCacheDictionary_.end()) {
        return hit->second.get();
    }
    auto expression = regexForKeyword(keyword);
    if (!expression) return nullptr;
    const auto [entry, _] =
        regexCacheDictionary_.emplace(key, std::make_unique<RegularExpression>(*std::move(expression)));
    return entry->second.get();
}

void QVCTKeywordExtractor::mark(std::uint32_t keyword, Mark mark) {
    if (marks_[keyword] == Mark::unseen) touched_.push_back(keyword);
    marks_[keyword] = std::max(marks_[keyword], mark);
}

void QVCTKeywordExtractor::scanForCandidates(std::string_view text) {
    for (std::size_t start = 0; start < text.size(); ++start) {
        if (!Neighbours(text, start).isBoundary(text, start)) continue;
        trie_->matchAt(text, start, [&](std::uint32_t index, std::size_t end) {
            const Literal& literal = literals_[index];
            for (const std::uint32_t keyword : literal.expressions) mark(keyword, Mark::candidate);
            if (literal.plain.empty() || !Neighbours(text, end).isBoundary(text, end)) return;
            for (const std::uint32_t keyword : literal.plain) mark(keyword, Mark::found);
        });
    }
    const bool mayFoldIntoMore = !isAscii(text) && (hasNonAsciiLiterals_ || !foldsApartFromAscii(text));
    if (mayFoldIntoMore) scanFolded(foldCase(text));
}

// Letters that equal a keyword's only after case folding are found in the folded text. Folding changes
// offsets and can turn a mark into a letter, so here a place is passed over only when ASCII stands on both
// sides.
void QVCTKeywordExtractor::scanFolded(std::string_view text) {
    for (std::size_t start = 0; start < text.size(); ++start) {
        if (Neighbours(text, start).areInsideAsciiWordOrGap()) continue;
        trie_->matchAt(text, start, [&](std::uint32_t index, std::size_t end) {
            const Literal& literal = literals_[index];
            for (const std::uint32_t keyword : literal.expressions) mark(keyword, Mark::candidate);
            if (Neighbours(text, end).areInsideAsciiWordOrGap()) return;
            for (const std::uint32_t keyword : literal.plain) mark(keyword, Mark::candidate);
        });
    }
}

std::vector<std::uint32_t> QVCTKeywordExtractor::matchingKeywords(std::string_view text) {
    scanForCandidates(text);
    for (const std::uint32_t keyword : alwaysRun_) mark(keyword, Mark::candidate);
    std::u16string wide;
    std::vector<std::uint32_t> matching;
    for (const std::uint32_t keyword : touched_) {
        if (std::exchange(marks_[keyword], Mark::unseen) == Mark::found) {
            matching.push_back(keyword);
            continue;
        }
        if (wide.empty()) wide = utf16FromUtf8(text);
        RegularExpression* expression = cachedRegexForKeyword(keywords_[keyword].text);
        if (expression != nullptr && expression->occursIn(wide)) matching.push_back(keyword);
    }
    touched_.clear();
    std::sort(matching.begin(), matching.end());
    return matching;
}

void QVCTKeywordExtractor::findParents() {
    const std::uint64_t revision = taxonomy_->revision();
    if (parentsRevision_ == revision) return;
    parentsRevision_ = revision;
    parentOf_.clear();
    const std::size_t count = results_.size();
    for (std::size_t i = 0; i < count; ++i) {
        const auto tag = taxonomy_->findTagForLabel(labelFromString(results_[i]));
        const auto parent = tag ? tag->parent() : nullptr;
        parentOf_.push_back(parent ? std::int64_t{resultIndex(parent->label())} : -1);
    }
}

CountedSet QVCTKeywordExtractor::resultsOf(const std::vector<std::uint32_t>& keywords) {
    findParents();
    std::vector<std::pair<std::uint32_t, std::size_t>>
        counts;  // result, times; in the order of first addition
    const auto add = [&counts](std::uint32_t result) {
        const auto hit =
            std::find_if(counts.begin(), counts.end(), [result](auto& c) { return c.first == result; });
        if (hit == counts.end()) {
            counts.emplace_back(result, 1);
        } else {
            ++hit->second;
        }
    };
    for (const std::uint32_t keyword : keywords) {
        for (const std::uint32_t result : keywords_[keyword].results) add(result);
    }
    std::vector<std::uint32_t> parents;
    for (const auto& [result, _] : counts) {
        const std::int64_t parent = parentOf_[result];
        if (parent < 0) continue;
        const auto index = static_cast<std::uint32_t>(parent);
        if (std::find(parents.begin(), parents.end(), index) == parents.end()) parents.push_back(index);
    }
    for (const std::uint32_t parent : parents) add(parent);
    CountedSet set;
    for (const auto& [result, times] : counts) set.add(results_[result], times);
    return set;
}

std::optional<std::pair<std::uint32_t, std::uint32_t>> QVCTKeywordExtractor::placeOf(
    const std::string& keyword, std::string_view text) {
    RegularExpression* expression = cachedRegexForKeyword(keyword);
    if (expression == nullptr) return std::nullopt;
    const std::u16string wide = utf16FromUtf8(text);
    const auto match = expression->firstMatch(wide);
    if (match.empty()) return std::nullopt;
    const auto bytesBefore = [&wide](std::size_t offset) {
        return static_cast<std::uint32_t>(utf8FromUtf16(std::u16string_view(wide).substr(0, offset)).size());
    };
    return std::pair(bytesBefore(match[0].start), bytesBefore(match[0].end));
}

std::vector<QVCTKeywordExtractor::Occurrence> QVCTKeywordExtractor::occurrencesInString(
    std::string_view text) {
    std::vector<Occurrence> occurrences;
    for (const std::uint32_t index : matchingKeywords(text)) {
        const Keyword& keyword = keywords_[index];
        const auto place = placeOf(keyword.text, text);
        if (!place) continue;
        Occurrence occurrence{place->first, place->second, {}};
        for (const std::uint32_t result : keyword.results) occurrence.labels.emplace_back(results_[result]);
        occurrences.push_back(std::move(occurrence));
    }
    return occurrences;
}

CountedSet QVCTKeywordExtractor::extractKeywordsFromString(std::string_view text) {
    return resultsOf(matchingKeywords(text));
}

}  // namespace qvct
