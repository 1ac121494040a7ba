#include "formats/settings/TGRTCstSxvPstWriters.h"

#include "formats/QVContentTaggingTypes.h"
#include "formats/StoredRecord.h"
#include "formats/settings/TGRTCstSxvPstMetaDataReader.h"
#include "metadata/StoredParts.h"

#include <utility>

namespace qvct {
namespace {

URL sideCar(const URL& url) {
    return TGRTCstSxvPstMetaDataReader::sideCarURLForURL(url);
}

}  // namespace

bool TGRTCstSxvPstTaggingWriter::writeTaggings(const ObjectSet<TGRTTagging>& taggings, const URL& url,
                                               Error* error, const ContentWriteOptions& options) const {
    const auto change = [&](PropertyList::Dictionary& stored) {
        stored.set(QVContentTaggingKeyName,
                   storedTaggings(std::as_const(stored).value(QVContentTaggingKeyName), taggings));
        stored.set(QVContentTaggingTypeKeyName,
                   std::int64_t{QVContentTaggingTypes::fallBackFileTypeForURL(url)});
        stored.remove(QVContentTaggingUUIDKeyName);
    };
    return changeStoredDictionary(url, sideCar(url).path(), change, error, options);
}

bool TGRTCstSxvPstContentInfoWriter::writeContentInfo(
    const std::shared_ptr<const TGRTContentInfo>& contentInfo, const URL& url, Error* error,
    const ContentWriteOptions& options) const {
    return changeStoredContentInfo(url, sideCar(url).path(), contentInfo, error, options);
}

bool TGRTCstSxvPstMetaDataWriter::writeMetaData(const std::shared_ptr<TGRTMetaData>& metaData, const URL& url,
                                                Error* error, const ContentWriteOptions& options) const {
    if (!metaData) return failForMissingRecord(url.path(), error);
    if (metaData->fileType() == kFileTypeNone) {
        metaData->setFileType(QVContentTaggingTypes::fallBackFileTypeForURL(url));
    }
    const auto change = [&](PropertyList::Dictionary& stored) { metaData->storeInto(stored); };
    return changeStoredDictionary(url, sideCar(url).path(), change, error, options);
}

}  // namespace qvct
