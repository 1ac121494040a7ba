#include "formats/bundle/TGRTBundleWriters.h"

#include "formats/StoredRecord.h"
#include "formats/bundle/TGRTBundleMetaDataReader.h"
#include "metadata/StoredParts.h"

#include <filesystem>
#include <system_error>
#include <utility>

namespace qvct {
namespace {

/// The path of the property list, whose folder there is now, or the write will say why not.
std::string preparedPath(const URL& bundle, const std::string& plistPathComponent) {
    const URL list = bundle.URLByAppendingPathComponent(plistPathComponent);
    std::error_code ignored;
    if (list.isFileURL()) {
        std::filesystem::create_directories(list.URLByDeletingLastPathComponent().path(), ignored);
    }
    return list.path();
}

}  // namespace

std::int64_t TGRTBundleTaggingWriter::subTypeFromTaggings(const ObjectSet<TGRTTagging>& taggings) const {
    return TGRTBundleMetaDataReader::subTypeFromTaggings(taggings);
}

bool TGRTBundleTaggingWriter::writeTaggings(const ObjectSet<TGRTTagging>& taggings, const URL& url,
                                            Error* error, const ContentWriteOptions& options) const {
    const auto change = [&](PropertyList::Dictionary& stored) {
        stored.set(QVContentTaggingKeyName,
                   storedTaggings(std::as_const(stored).value(QVContentTaggingKeyName), taggings));
        stored.set(QVContentTaggingTypeKeyName, defaultFileType());
        stored.remove(QVContentTaggingUUIDKeyName);
        const std::int64_t subType = subTypeFromTaggings(taggings);
        if (subType != 0) {
            stored.set(QVContentTaggingSubTypeKeyName, subType);
        } else {
            stored.remove(QVContentTaggingSubTypeKeyName);
        }
    };
    return changeStoredDictionary(url, preparedPath(url, plistPathComponent()), change, error, options);
}

bool TGRTBundleContentInfoWriter::writeContentInfo(const std::shared_ptr<const TGRTContentInfo>& contentInfo,
                                                   const URL& url, Error* error,
                                                   const ContentWriteOptions& options) const {
    return changeStoredContentInfo(url, preparedPath(url, plistPathComponent()), contentInfo, error, options);
}

bool TGRTBundleMetaDataWriter::writeMetaData(const std::shared_ptr<TGRTMetaData>& metaData, const URL& url,
                                             Error* error, const ContentWriteOptions& options) const {
    if (!metaData) return failForMissingRecord(url.path(), error);
    if (metaData->fileType() == kFileTypeNone) metaData->setFileType(defaultFileType());
    const auto change = [&](PropertyList::Dictionary& stored) { metaData->storeOver(stored); };
    return changeStoredDictionary(url, preparedPath(url, plistPathComponent()), change, error, options);
}

}  // namespace qvct
