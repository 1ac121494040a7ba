#include "autotagging/services/QVCTAutoTaggingService.h"

#include "formats/ItemFile.h"

namespace qvct {

TagDictionarySet QVCTAutoTaggingService::tagsWithContentsOfFile(
    ItemFile& file, const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
    const std::shared_ptr<TGRTMetaData>& metaData, const std::shared_ptr<LCFileData>& fileData,
    std::uint64_t options) {
    return tagsWithContentsOfURL(file.url(), xmlDocument, metaData, fileData, options);
}

std::vector<TagClaim> QVCTAutoTaggingService::claims(const TaggedItem& item, std::uint64_t options) {
    std::vector<TagClaim> claims;
    for (const TagDictionary& tag :
         tagsWithContentsOfFile(item.file, item.xmlDocument, item.metaData, item.fileData, options)) {
        if (auto claim = claimOf(tag)) claims.push_back(*std::move(claim));
    }
    return claims;
}

std::optional<TagClaim> QVCTAutoTaggingService::claimOf(const TagDictionary& tag) const {
    const std::string* label = tag.string(kTagDictionaryLabelKey);
    if (label == nullptr) return std::nullopt;
    TagClaim claim;
    claim.label = *label;
    claim.level = tag.doubleValue(kTagDictionaryLevelKey);
    claim.service = name();
    return claim;
}

}  // namespace qvct
