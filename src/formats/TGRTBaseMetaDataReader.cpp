#include "formats/TGRTBaseMetaDataReader.h"

#include "formats/ItemFile.h"
#include "platform/text/Text.h"

#include <algorithm>

namespace qvct {

std::shared_ptr<TGRTMetaData> TGRTBaseMetaDataReader::readMetaDataFromURL(const URL& /*url*/,
                                                                          std::uint64_t /*options*/,
                                                                          Error* /*error*/) const {
    return nullptr;
}

std::shared_ptr<TGRTMetaData> TGRTBaseMetaDataReader::readMetaDataFromFile(ItemFile& file,
                                                                           std::uint64_t options,
                                                                           Error* error) const {
    return readMetaDataFromURL(file.url(), options, error);
}

bool TGRTBaseMetaDataReader::readUUID(std::string* /*uuid*/, std::int64_t* fileType,
                                      ObjectSet<TGRTTagging>* taggings, ObjectSet<TGRTKeyValue>* keyValues,
                                      std::uint64_t options, const URL& url) const {
    const auto record = readMetaDataFromURL(url, options);
    const std::int64_t type = record ? record->fileType() : std::int64_t{kFileTypeNone};
    if (keyValues != nullptr) *keyValues = record ? record->keyValues() : ObjectSet<TGRTKeyValue>{};
    if (taggings != nullptr) *taggings = record ? record->taggings() : ObjectSet<TGRTTagging>{};
    if (fileType != nullptr) *fileType = type;
    return type != kFileTypeNone;
}

ObjectSet<TGRTTagging> TGRTBaseMetaDataReader::taggingsForFileURL(const URL& url) const {
    return taggingsForFileURL(url, 0);
}

ObjectSet<TGRTTagging> TGRTBaseMetaDataReader::taggingsForFileURL(const URL& url,
                                                                  std::uint64_t options) const {
    ObjectSet<TGRTTagging> taggings;
    readUUID(nullptr, nullptr, &taggings, nullptr, options, url);
    return taggings;
}

bool TGRTBaseMetaDataReader::isExtensionIn(std::string_view extension,
                                           std::span<const std::string_view> lowercased) {
    const std::string wanted = lowercase(extension);
    return std::find(lowercased.begin(), lowercased.end(), wanted) != lowercased.end();
}

}  // namespace qvct
