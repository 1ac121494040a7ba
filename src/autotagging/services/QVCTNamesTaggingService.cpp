#include "autotagging/services/QVCTNamesTaggingService.h"

#include "autotagging/names/ItemNames.h"

namespace qvct {

NameReader& QVCTNamesTaggingService::reader() {
    if (!reader_) reader_.emplace();
    return *reader_;
}

TagDictionarySet QVCTNamesTaggingService::tagsWithContentsOfURL(
    const URL& url, const std::shared_ptr<QVCTXMLDocument>& /*xmlDocument*/,
    const std::shared_ptr<TGRTMetaData>& /*metaData*/, const std::shared_ptr<LCFileData>& /*fileData*/,
    std::uint64_t options) {
    TagDictionarySet tags;
    if ((options & QVCTAutoTaggingOptionNames) == 0) return tags;
    const ItemNames names(url.path());
    for (const TagClaim& claim : reader().read(names.all(), names.extension()).claims)
        tags.insert(tagDictionary(claim.label, claim.level));
    return tags;
}

std::vector<TagClaim> QVCTNamesTaggingService::claims(const TaggedItem& item, std::uint64_t options) {
    if ((options & QVCTAutoTaggingOptionNames) == 0) return {};
    return reader().read(item.names).claims;
}

}  // namespace qvct
