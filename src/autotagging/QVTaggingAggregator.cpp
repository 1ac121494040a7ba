#include "autotagging/QVTaggingAggregator.h"

#include "autotagging/ContentItem.h"
#include "autotagging/services/QVCTContentTypeTaggingService.h"
#include "autotagging/services/QVCTFilenameKeywordExtractorTaggingService.h"
#include "autotagging/services/QVCTNamesTaggingService.h"
#include "autotagging/services/QVCTRhythmicTaggingService.h"
#include "autotagging/services/QVCTSoftwareInstrumentTaggingService.h"
#include "autotagging/services/QVCTSoundTaggingService.h"
#include "autotagging/services/QVCTTranslateTagsTaggingService.h"
#include "autotagging/services/QVCTUserGeneratedTaggingService.h"
#include "autotagging/services/QVCTXMLRulesTaggingService.h"
#include "autotagging/xml/QVCTXMLDocument.h"

#include <iterator>
#include <string>
#include <utility>

namespace qvct {
namespace {

/// The tagging that a tag dictionary stands for, or null when the taxonomy does not know its label.
std::shared_ptr<TGRTTagging> taggingForTagDictionary(const TagDictionary& dictionary,
                                                     const TGRTTaxonomy& taxonomy) {
    const std::string* label = dictionary.string(kTagDictionaryLabelKey);
    if (label == nullptr) return nullptr;
    const std::optional<double> weight = dictionary.doubleValue(kTagDictionaryLevelKey);
    auto tagging = TGRTTagging::initWithTag(taxonomy.findTagForLabel(*label),
                                            weight ? TGRTLevel::levelWithWeight(*weight) : nullptr);
    if (tagging) tagging->setIsAutoTagging(true);
    return tagging;
}

ObjectSet<TGRTTagging> taggingsForTags(const TagDictionarySet& tags, const TGRTTaxonomy& taxonomy) {
    ObjectSet<TGRTTagging> taggings;
    for (const TagDictionary& dictionary : tags)
        taggings.insert(taggingForTagDictionary(dictionary, taxonomy));
    return taggings;
}

/// Keeps the item of a call until the call ends, in whatever way.
class AtHand {
  public:
    AtHand(std::shared_ptr<ContentItem>& place, const std::shared_ptr<ContentItem>& item) : place_(place) {
        place_ = item;
    }
    AtHand(const AtHand&) = delete;
    AtHand& operator=(const AtHand&) = delete;
    ~AtHand() { place_.reset(); }

  private:
    std::shared_ptr<ContentItem>& place_;
};

}  // namespace

std::shared_ptr<QVTaggingAggregator> QVTaggingAggregator::independentTaggingAggregator() {
    auto aggregator = initWithRules(std::nullopt, std::nullopt);
    aggregator->setTaxonomy(TGRTTaxonomy::newTaxonomyOfType(kDefaultTaxonomy, false, false));
    aggregator->readsInItsTaxonomy_ = true;
    return aggregator;
}

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

QVTaggingAggregator::Services QVTaggingAggregator::defaultTaggingServicesWithRules(Settings rules,
                                                                                   Settings keywordMapping) {
    return {QVCTFilenameKeywordExtractorTaggingService::initWithKeywordMapping(std::move(keywordMapping)),
            QVCTXMLRulesTaggingService::initWithRules(std::move(rules)),
            std::make_shared<QVCTRhythmicTaggingService>(),
            std::make_shared<QVCTContentTypeTaggingService>(),
            QVCTSoftwareInstrumentTaggingService::init(),
            std::make_shared<QVCTUserGeneratedTaggingService>(),
            std::make_shared<QVCTTranslateTagsTaggingService>(),
            std::make_shared<QVCTNamesTaggingService>(),
            std::make_shared<QVCTSoundTaggingService>()};
}

QVTaggingAggregator::QVTaggingAggregator(Services services) : taggingServices_(std::move(services)) {
    std::erase(taggingServices_, nullptr);
}

std::shared_ptr<ContentItem> QVTaggingAggregator::itemForURL(const URL& url, std::uint64_t options) const {
    if (item_ && item_->url() == url) return item_;
    return std::make_shared<ContentItem>(
        url, ContentItem::Reading{options, readsInItsTaxonomy_ ? taxonomy_ : nullptr});
}

std::shared_ptr<QVCTXMLDocument> QVTaggingAggregator::xmlDocumentForURL(const URL& url) {
    return itemForURL(url, 0)->xmlDocument();
}

std::shared_ptr<TGRTMetaData> QVTaggingAggregator::metaDataForURL(const URL& url, std::uint64_t options) {
    return itemForURL(url, options)->record();
}

std::shared_ptr<LCFileData> QVTaggingAggregator::fileDataForURL(const URL& url) {
    return itemForURL(url, 0)->fileData();
}

TagDictionarySet QVTaggingAggregator::tagsOfItem(const std::shared_ptr<ContentItem>& item,
                                                 std::uint64_t options) {
    const AtHand atHand(item_, item);
    const URL& url = item->url();
    const auto xmlDocument = xmlDocumentForURL(url);
    const auto metaData = metaDataForURL(url, options);
    const auto fileData = fileDataForURL(url);
    TagDictionarySet tags;
    for (const auto& service : taggingServices_) {
        tags.insertAll(
            service->tagsWithContentsOfFile(item->file(), xmlDocument, metaData, fileData, options));
    }
    return tags;
}

std::vector<TagClaim> QVTaggingAggregator::claimsOfItem(const std::shared_ptr<ContentItem>& item,
                                                        std::span<const std::string_view> names,
                                                        std::uint64_t options) {
    const AtHand atHand(item_, item);
    const URL& url = item->url();
    const TaggedItem tagged{item->file(), xmlDocumentForURL(url), metaDataForURL(url, options),
                            fileDataForURL(url), names};
    std::vector<TagClaim> claims;
    for (const auto& service : taggingServices_) {
        std::vector<TagClaim> its = service->claims(tagged, options);
        std::move(its.begin(), its.end(), std::back_inserter(claims));
    }
    return claims;
}

TagDictionarySet QVTaggingAggregator::tagsWithContentsOfURL(const URL& url, std::uint64_t options) {
    return tagsOfItem(itemForURL(url, options), options);
}

ObjectSet<TGRTTagging> QVTaggingAggregator::taggingsOfItem(const std::shared_ptr<ContentItem>& item,
                                                           const TGRTTaxonomy& taxonomy,
                                                           std::uint64_t options) {
    return taggingsForTags(tagsOfItem(item, options), taxonomy);
}

ObjectSet<TGRTTagging> QVTaggingAggregator::taggingsWithContentsOfURL(const URL& url,
                                                                      const TGRTTaxonomy& taxonomy,
                                                                      std::uint64_t options) {
    return taggingsForTags(tagsWithContentsOfURL(url, options), taxonomy);
}

}  // namespace qvct
