#include "autotagging/services/QVCTFilenameKeywordExtractorTaggingService.h"

#include "platform/text/Text.h"

namespace qvct {
namespace {

/// Levels as the records hold them, in single precision.
std::string labelAndLevel(std::string_view result, std::optional<double>& level) {
    std::string label = labelFromString(result, &level);
    if (level) level = static_cast<float>(*level);
    return label;
}

}  // namespace

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
        const std::string label = labelAndLevel(result, level);
        if (!label.empty()) tags.insert(tagDictionary(label, level));
    }
    return tags;
}

std::vector<TagClaim> QVCTFilenameKeywordExtractorTaggingService::claims(const TaggedItem& item,
                                                                         std::uint64_t options) {
    std::vector<TagClaim> claims;
    if ((options & QVCTAutoTaggingOptionFilenameKeywords) == 0) return claims;
    for (std::size_t i = 0; i < item.names.size(); ++i) {
        const std::string_view text = item.names[i];
        if (!isValidUtf8(text)) continue;
        for (const auto& [offset, end, results] : keywordExtractor_->occurrencesInString(text)) {
            for (const std::string_view result : results) {
                TagClaim& claim = claims.emplace_back();
                claim.label = labelAndLevel(result, claim.level);
                claim.service = name();
                claim.evidence = {std::string(text.substr(offset, end - offset)), std::string(text), offset};
                claim.distance = static_cast<int>(i);
            }
        }
    }
    std::erase_if(claims, [](const TagClaim& claim) { return claim.label.empty(); });
    return claims;
}

}  // namespace qvct
