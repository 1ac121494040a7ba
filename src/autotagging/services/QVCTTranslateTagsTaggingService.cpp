#include "autotagging/services/QVCTTranslateTagsTaggingService.h"

#include "formats/QVContentTaggingTypes.h"
#include "formats/audiofile/TGRTTavioLoopMetaDataReader.h"
#include "formats/preset/TGRTVorthalLegacyTaggingParser.h"
#include "media/loopfile/LCFileData.h"
#include "taxonomy/TaggingTypes.h"

#include <string>

namespace qvct {
namespace {

ObjectSet<TGRTTagging> translatedTaggings(const URL& url, const std::shared_ptr<LCFileData>& fileData) {
    if (fileData) {
        const auto reader = TGRTTavioLoopMetaDataReader::initWithTaxonomy(TGRTTaxonomy::defaultTaxonomy());
        return reader->mappedTaggingsForFileData(fileData);
    }
    const bool isPreset = QVContentTaggingTypes::fallBackFileTypeForURL(url) == kFileTypeSynthPreset;
    return isPreset ? TGRTVorthalLegacyTaggingParser::mappedTaggingsForFileURL(url)
                    : ObjectSet<TGRTTagging>();
}

}  // namespace

TagDictionarySet QVCTTranslateTagsTaggingService::tagsWithContentsOfURL(
    const URL& url, const std::shared_ptr<QVCTXMLDocument>& /*xmlDocument*/,
    const std::shared_ptr<TGRTMetaData>& /*metaData*/, const std::shared_ptr<LCFileData>& fileData,
    std::uint64_t options) {
    TagDictionarySet tags;
    if ((options & QVCTAutoTaggingOptionTranslateTags) == 0) return tags;
    for (const auto& tagging : translatedTaggings(url, fileData)) {
        const auto& level = tagging->level();
        tags.insert(tagDictionary(tagging->label(), level ? std::optional(level->weight()) : std::nullopt));
    }
    return tags;
}

}  // namespace qvct
