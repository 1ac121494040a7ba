#include "autotagging/services/QVCTUserGeneratedTaggingService.h"

#include "formats/library/TGRTPackage.h"
#include "platform/text/Text.h"
#include "resources/PackDisplayNames.h"

#include <algorithm>
#include <string_view>
#include <vector>

namespace qvct {
namespace {

constexpr std::string_view kUserGenerated = "User generated";

}  // namespace

QVCTUserGeneratedTaggingService::QVCTUserGeneratedTaggingService() {
    for (const auto& [identifier, displayName] : packDisplayNames()) {
        packFolderNames_.insert(lowercase(identifier));
        packFolderNames_.insert(lowercase(displayName));
    }
}

bool QVCTUserGeneratedTaggingService::liesInPackFolder(const URL& url) const {
    const std::vector<std::string> folders = split(url.URLByDeletingLastPathComponent().path(), "/");
    return std::any_of(folders.begin(), folders.end(), [this](const std::string& folder) {
        return packFolderNames_.contains(lowercase(folder));
    });
}

TagDictionarySet QVCTUserGeneratedTaggingService::tagsWithContentsOfURL(
    const URL& url, const std::shared_ptr<QVCTXMLDocument>& /*xmlDocument*/,
    const std::shared_ptr<TGRTMetaData>& metaData, const std::shared_ptr<LCFileData>& /*fileData*/,
    std::uint64_t options) {
    TagDictionarySet tags;
    if ((options & QVCTAutoTaggingOptionUserGenerated) == 0 || liesInPackFolder(url)) return tags;
    if (metaData && !TGRTPackage::identifiersForMetaData(*metaData).empty()) return tags;
    tags.insert(tagDictionary(kUserGenerated));
    return tags;
}

}  // namespace qvct
