#include "formats/settings/TGRTCstSxvPstMetaDataReader.h"

#include "formats/QVContentTaggingTypes.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/FileAccess.h"

#include <array>

namespace qvct {

bool TGRTCstSxvPstMetaDataReader::supportsFileExtension(std::string_view extension) {
    constexpr std::array<std::string_view, 4> extensions = {"sxv", "pst", "cst", "aaz"};
    return isExtensionIn(extension, extensions);
}

std::shared_ptr<TGRTMetaData> TGRTCstSxvPstMetaDataReader::readMetaDataFromURL(const URL& url,
                                                                               std::uint64_t /*options*/,
                                                                               Error* error) const {
    const std::string path = sideCarURLForURL(url).path();
    if (url.isFileURL() && !fileExists(path)) return nullptr;
    const auto dictionary = readDictionaryFile(path, error);
    auto record = TGRTMetaData::metaDataFromDictionary(dictionary ? &*dictionary : nullptr, *taxonomy());
    if (record && record->fileType() == kFileTypeNone) {
        record->setFileType(QVContentTaggingTypes::fallBackFileTypeForURL(url));
    }
    return record;
}

}  // namespace qvct
