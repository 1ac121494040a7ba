#include "autotagging/QVTaggingAggregator.h"

#include "autotagging/services/QVCTContentTypeTaggingService.h"
#include "autotagging/services/QVCTFilenameKeywordExtractorTaggingService.h"
#include "autotagging/services/QVCTRhythmicTaggingService.h"
#include "autotagging/services/QVCTSoftwareInstrumentTaggingService.h"
#include "autotagging/services/QVCTTranslateTagsTaggingService.h"
#include "autotagging/services/QVCTUserGeneratedTaggingService.h"
#include "autotagging/services/QVCTXMLRulesTaggingService.h"
#include "autotagging/xml/QVCTXMLDocument.h"
#include "formats/QVContentEditorFileUtilities.h"
#include "formats/TGRTFileNode.h"
#include "media/loopfile/LCFileParser.h"

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

/// Reads records in a taxonomy of its own.
class IndependentAggregator : public QVTaggingAggregator {
  public:
    IndependentAggregator()
        : QVTaggingAggregator(defaultTaggingServicesWithRules(std::nullopt, std::nullopt)) {
        setTaxonomy(TGRTTaxonomy::newTaxonomyOfType(kDefaultTaxonomy, false, false));
    }
    std::shared_ptr<TGRTMetaData> metaDataForURL(const URL& url, std::uint64_t options) override {
        return TGRTFileNode::nodeWithFileURL(url)->readMetaDataWithOptions(options, taxonomy());
    }
};

}  // namespace

std::shared_ptr<QVTaggingAggregator> QVTaggingAggregator::independentTaggingAggregator() {
    return std::make_shared<IndependentAggregator>();
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
            std::make_shared<QVCTTranslateTagsTaggingService>()};
}

QVTaggingAggregator::QVTaggingAggregator(Services services) : taggingServices_(std::move(services)) {
    std::erase(taggingServices_, nullptr);
}

std::shared_ptr<QVCTXMLDocument> QVTaggingAggregator::xmlDocumentForURL(const URL& url) {
    const auto cache = QVContentEditorFileUtilities::intermediateCacheURLForURL(url);
    return cache ? QVCTXMLDocument::initWithContentsOfURL(*cache) : nullptr;
}

std::shared_ptr<TGRTMetaData> QVTaggingAggregator::metaDataForURL(const URL& url, std::uint64_t options) {
    return TGRTFileNode::nodeWithFileURL(url)->readMetaDataWithOptions(options);
}

std::shared_ptr<LCFileData> QVTaggingAggregator::fileDataForURL(const URL& url) {
    return LCFileParser::fileParserForURL(url)->enhancedFileData();
}

TagDictionarySet QVTaggingAggregator::tagsWithContentsOfURL(const URL& url, std::uint64_t options) {
    const auto xmlDocument = xmlDocumentForURL(url);
    const auto metaData = metaDataForURL(url, options);
    const auto fileData = fileDataForURL(url);
    TagDictionarySet tags;
    for (const auto& service : taggingServices_) {
        tags.insertAll(service->tagsWithContentsOfURL(url, xmlDocument, metaData, fileData, options));
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
