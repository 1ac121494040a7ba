#include "autotagging/services/QVCTAutoTaggingService.h"

#include "formats/ItemFile.h"

namespace qvct {

TagDictionarySet QVCTAutoTaggingService::tagsWithContentsOfFile(
    ItemFile& file, const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
    const std::shared_ptr<TGRTMetaData>& metaData, const std::shared_ptr<LCFileData>& fileData,
    std::uint64_t options) {
    return tagsWithContentsOfURL(file.url(), xmlDocument, metaData, fileData, options);
}

}  // namespace qvct
