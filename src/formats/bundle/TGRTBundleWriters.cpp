#include "formats/bundle/TGRTBundleWriters.h"

#include "formats/StoredRecord.h"
#include "formats/bundle/TGRTBundleMetaDataReader.h"
#include "metadata/StoredParts.h"

#include <utility>

namespace qvct {
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
    return changeStoredDictionary(url, url.URLByAppendingPathComponent(plistPathComponent()).path(), change,
                                  error, options);
}

bool TGRTBundleContentInfoWriter::writeContentInfo(const std::shared_ptr<const TGRTContentInfo>& contentInfo,
                                                   const URL& url, Error* error,
                                                   const ContentWriteOptions& options) const {
    return changeStoredContentInfo(url, url.URLByAppendingPathComponent(plistPathComponent()).path(),
                                   contentInfo, error, options);
}

bool TGRTBundleMetaDataWriter::writeMetaData(const std::shared_ptr<TGRTMetaData>& metaData, const URL& url,
                                             Error* error, const ContentWriteOptions& options) const {
    if (!metaData) return failForMissingRecord(url.path(), error);
    if (metaData->fileType() == kFileTypeNone) metaData->setFileType(defaultFileType());
    const auto change = [&](PropertyList::Dictionary& stored) { metaData->storeOver(stored); };
    return changeStoredDictionary(url, url.URLByAppendingPathComponent(plistPathComponent()).path(), change,
                                  error, options);
}

}  // namespace qvct
