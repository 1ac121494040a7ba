#pragma once

#include "autotagging/keywords/QVCTKeywordExtractor.h"
#include "platform/text/Text.h"

#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>

namespace qvct::test {

/// Keyword extraction as it is defined: one expression per keyword, run over the whole text, one after the
/// other. The reference that the fast extractor must equal, and the baseline that it is measured against.
class OneByOneExtractor {
  public:
    explicit OneByOneExtractor(const QVCTKeywordExtractor& extractor)
        : mapping_(extractor.keywordMappingDictionary()),
          keywords_(extractor.keywordsSet()),
          isKeyword_(keywords_.begin(), keywords_.end()),
          taxonomy_(extractor.taxonomy()) {}

    CountedSet extract(std::string_view text) {
        const std::u16string wide = utf16FromUtf8(text);
        CountedSet found;
        for (const auto& entry : mapping_) addMatch(entry.key, wide, found);
        for (const std::string& keyword : keywords_) addMatch(keyword, wide, found);
        CountedSet parents;
        for (const auto& [result, _] : found) {
            const auto tag = taxonomy_->findTagForLabel(labelFromString(result));
            const auto parent = tag ? tag->parent() : nullptr;
            if (parent && parents.count(parent->label()) == 0) parents.add(parent->label());
        }
        for (const auto& [parent, _] : parents) found.add(parent);
        return found;
    }

  private:
    void addMatch(const std::string& keyword, const std::u16string& text, CountedSet& found) {
        auto [entry, isNew] = expressions_.try_emplace(keyword);
        if (isNew) entry->second = QVCTKeywordExtractor::regexForKeyword(keyword);
        if (!entry->second || !entry->second->occursIn(text)) return;
        if (const PropertyList* value = mapping_.value(keyword)) {
            if (value->string() != nullptr) found.add(*value->string());
            for (const auto& label : value->array() == nullptr ? PropertyList::Array{} : *value->array()) {
                if (label.string() != nullptr) found.add(*label.string());
            }
        }
        if (isKeyword_.contains(keyword)) found.add(keyword);
    }

    PropertyList::Dictionary mapping_;
    std::vector<std::string> keywords_;
    std::unordered_set<std::string> isKeyword_;
    std::shared_ptr<TGRTTaxonomy> taxonomy_;
    std::unordered_map<std::string, std::optional<RegularExpression>> expressions_;
};

}  // namespace qvct::test
