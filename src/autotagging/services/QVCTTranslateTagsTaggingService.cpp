#include "autotagging/services/QVCTTranslateTagsTaggingService.h"

#include "formats/ItemFile.h"
#include "formats/QVContentTaggingTypes.h"
#include "formats/audiofile/TGRTTavioLoopMetaDataReader.h"
#include "formats/preset/TGRTVorthalLegacyTaggingParser.h"
#include "media/loopfile/LCFileData.h"
#include "platform/base/bytes/BytesAsText.h"
#include "platform/files/FileAccess.h"
#include "taxonomy/TaggingTypes.h"

#include <optional>

namespace qvct {
namespace {

ObjectSet<TGRTTagging> translatedTaggings(ItemFile& file, const std::shared_ptr<LCFileData>& fileData) {
    if (fileData) {
        const auto reader = TGRTTavioLoopMetaDataReader::initWithTaxonomy(TGRTTaxonomy::defaultTaxonomy());
        return reader->mappedTaggingsForFileData(fileData);
    }
    if (QVContentTaggingTypes::fallBackFileTypeForURL(file.url()) != kFileTypeSynthPreset) return {};
    const auto bytes = file.bytes(kLargestWholeFile);
    if (!bytes) return {};
    return TGRTVorthalLegacyTaggingParser::mappedTaggingsForText(textOf(*bytes));
}

}  // namespace

TagDictionarySet QVCTTranslateTagsTaggingService::tagsWithContentsOfURL(
    const URL& url, const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
    const std::shared_ptr<TGRTMetaData>& metaData, const std::shared_ptr<LCFileData>& fileData,
    std::uint64_t options) {
    ItemFile file(url);
    return tagsWithContentsOfFile(file, xmlDocument, metaData, fileData, options);
}

TagDictionarySet QVCTTranslateTagsTaggingService::tagsWithContentsOfFile(
    ItemFile& file, const std::shared_ptr<QVCTXMLDocument>& /*xmlDocument*/,
    const std::shared_ptr<TGRTMetaData>& /*metaData*/, const std::shared_ptr<LCFileData>& fileData,
    std::uint64_t options) {
    TagDictionarySet tags;
    if ((options & QVCTAutoTaggingOptionTranslateTags) == 0) return tags;
    for (const auto& tagging : translatedTaggings(file, fileData)) {
        const auto& level = tagging->level();
        tags.insert(tagDictionary(tagging->label(), level ? std::optional(level->weight()) : std::nullopt));
    }
    return tags;
}

}  // namespace qvct
