#include "autotagging/services/QVCTFilenameKeywordExtractorTaggingService.h"

#include "platform/text/Text.h"

namespace qvct {

std::shared_ptr<QVCTFilenameKeywordExtractorTaggingService>
QVCTFilenameKeywordExtractorTaggingService::init() {
    return initWithKeywordMapping(std::nullopt);
}

std::shared_ptr<QVCTFilenameKeywordExtractorTaggingService>
QVCTFilenameKeywordExtractorTaggingService::initWithKeywordMapping(
    std::optional<PropertyList::Dictionary> mapping) {
    return std::shared_ptr<QVCTFilenameKeywordExtractorTaggingService>(
        new QVCTFilenameKeywordExtractorTaggingService(QVCTKeywordExtractor::initWithKeywordMappingDictionary(
            std::move(mapping), TGRTTaxonomy::defaultTaxonomy())));
}

TagDictionarySet QVCTFilenameKeywordExtractorTaggingService::tagsWithContentsOfURL(
    const URL& url, const std::shared_ptr<QVCTXMLDocument>& /*xmlDocument*/,
    const std::shared_ptr<TGRTMetaData>& /*metaData*/, const std::shared_ptr<LCFileData>& /*fileData*/,
    std::uint64_t options) {
    TagDictionarySet tags;
    const std::string text = url.decodedString();
    if ((options & QVCTAutoTaggingOptionFilenameKeywords) == 0 || !isValidUtf8(text)) return tags;
    for (const auto& [result, _] : keywordExtractor_->extractKeywordsFromString(text)) {
        std::optional<double> level;
        const std::string label = labelFromString(result, &level);
        if (level) level = static_cast<float>(*level);
        if (!label.empty()) tags.insert(tagDictionary(label, level));
    }
    return tags;
}

}  // namespace qvct
