#include "autotagging/QVTaggingAggregator.h"

#include "autotagging/QVCTFilenameKeywordExtractorTaggingService.h"

#include <string>
#include <utility>

namespace qvct {
namespace {

/// The tagging that a tag dictionary stands for, or null when the taxonomy does not know its label.
std::shared_ptr<TGRTTagging> taggingForTagDictionary(const TagDictionary& dictionary,
                                                     const TGRTTaxonomy& taxonomy) {
    const PropertyList* label = dictionary.value(kTagDictionaryLabelKey);
    const std::string* text = label == nullptr ? nullptr : label->string();
    if (text == nullptr) return nullptr;
    const PropertyList* level = dictionary.value(kTagDictionaryLevelKey);
    const std::optional<double> weight = level == nullptr ? std::nullopt : level->doubleValue();
    auto tagging = TGRTTagging::initWithTag(taxonomy.findTagForLabel(*text),
                                            weight ? TGRTLevel::levelWithWeight(*weight) : nullptr);
    if (tagging) tagging->setIsAutoTagging(true);
    return tagging;
}

}  // namespace

std::shared_ptr<QVTaggingAggregator> QVTaggingAggregator::defaultTaggingAggregator() {
    auto aggregator = initWithRules(std::nullopt, std::nullopt);
    aggregator->setTaxonomy(TGRTTaxonomy::defaultTaxonomy());
    return aggregator;
}

std::shared_ptr<QVTaggingAggregator> QVTaggingAggregator::initWithRules(Settings rules,
                                                                        Settings keywordMapping) {
    return std::shared_ptr<QVTaggingAggregator>(new QVTaggingAggregator(
        defaultTaggingServicesWithRules(std::move(rules), std::move(keywordMapping))));
}

QVTaggingAggregator::Services QVTaggingAggregator::defaultTaggingServicesWithRules(Settings /*rules*/,
                                                                                   Settings keywordMapping) {
    return {QVCTFilenameKeywordExtractorTaggingService::initWithKeywordMapping(std::move(keywordMapping))};
}

TagDictionarySet QVTaggingAggregator::tagsWithContentsOfURL(const URL& url, std::uint64_t options) {
    TagDictionarySet tags;
    for (const auto& service : taggingServices_) {
        tags.insertAll(service->tagsWithContentsOfURL(url, nullptr, nullptr, nullptr, options));
    }
    return tags;
}

ObjectSet<TGRTTagging> QVTaggingAggregator::taggingsWithContentsOfURL(const URL& url,
                                                                      const TGRTTaxonomy& taxonomy,
                                                                      std::uint64_t options) {
    ObjectSet<TGRTTagging> taggings;
    for (const TagDictionary& dictionary : tagsWithContentsOfURL(url, options)) {
        taggings.insert(taggingForTagDictionary(dictionary, taxonomy));
    }
    return taggings;
}

}  // namespace qvct
