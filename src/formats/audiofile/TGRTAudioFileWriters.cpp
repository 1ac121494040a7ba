#include "formats/audiofile/TGRTAudioFileWriters.h"

#include "formats/StoredRecord.h"
#include "media/loopfile/LCFileParser.h"
#include "media/loopfile/LCFileWriter.h"
#include "metadata/StoredParts.h"
#include "platform/files/EditLock.h"
#include "taxonomy/TaggingTypes.h"

#include <functional>
#include <set>
#include <string>

namespace qvct {
namespace {

/// Changes what the file says and writes it back.
bool changeFileData(const URL& url, bool isLoopType, const std::function<void(LCFileData&)>& change,
                    Error* error, const ContentWriteOptions& options) {
    const auto turn = EditLock::acquire(url.path(), error);
    if (!turn) return false;
    const FileStamp stamp = FileStamp::ofFile(url.path());
    const auto fileData = LCFileParser::fileParserForURL(url, false, kLCAllAudio)->fileData(error);
    if (!fileData) return false;
    change(*fileData);
    fileData->setTavioLoopType(isLoopType ? fileData->tavioLoopType() : -1);
    const LCWriteOptions how{.keepsTimes = options.keepsTimes,
                             .verifies = options.verifies,
                             .isDryRun = options.isDryRun,
                             .expected = options.expected.value_or(stamp)};
    return LCFileWriter::fileWriterForURL(url, how)->writeFileData(fileData, error);
}

void setTaggings(LCFileData& fileData, const ObjectSet<TGRTTagging>& taggings) {
    const auto changed = storedTaggings(fileData.record().value(QVContentTaggingKeyName), taggings);
    if (changed.dictionary() != nullptr) fileData.setTaggingDictionary(*changed.dictionary());
}

void setContentInfo(LCFileData& fileData, const TGRTContentInfo* contentInfo) {
    const auto changed = storedContentInfo(fileData.record().value(QVContentInfoKey),
                                           contentInfo ? *contentInfo : *TGRTContentInfo::init());
    if (changed.dictionary() != nullptr) fileData.setContentInfoDictionary(*changed.dictionary());
}

void setRejectedLabels(LCFileData& fileData, const std::set<std::string>& labels) {
    fileData.setRejectedLabels(
        storedRejections(fileData.record().value(QVContentTaggingRejectedKeyName), labels));
}

}  // namespace

bool TGRTAudioFileTaggingWriter::writeTaggings(const ObjectSet<TGRTTagging>& taggings, const URL& url,
                                               Error* error, const ContentWriteOptions& options) const {
    const auto change = [&taggings](LCFileData& fileData) { setTaggings(fileData, taggings); };
    return changeFileData(url, isLoopType(), change, error, options);
}

bool TGRTAudioFileContentInfoWriter::writeContentInfo(
    const std::shared_ptr<const TGRTContentInfo>& contentInfo, const URL& url, Error* error,
    const ContentWriteOptions& options) const {
    const auto change = [&contentInfo](LCFileData& fileData) { setContentInfo(fileData, contentInfo.get()); };
    return changeFileData(url, isLoopType(), change, error, options);
}

bool TGRTAudioFileMetaDataWriter::writeMetaData(const std::shared_ptr<TGRTMetaData>& metaData, const URL& url,
                                                Error* error, const ContentWriteOptions& options) const {
    if (!metaData) return failForMissingRecord(url.path(), error);
    const auto change = [&metaData](LCFileData& fileData) {
        setTaggings(fileData, metaData->taggings());
        const TGRTContentInfo* contentInfo = metaData->contentInfo().get();
        const bool hasSome = contentInfo != nullptr && !contentInfo->dictionary().empty();
        if (hasSome || fileData.contentInfoDictionary() != nullptr) setContentInfo(fileData, contentInfo);
        fileData.setDisplayName(metaData->displayName().value_or(std::string{}));
        if (metaData->knowsRejectedLabels()) setRejectedLabels(fileData, metaData->rejectedLabels());
    };
    return changeFileData(url, isLoopType(), change, error, options);
}

}  // namespace qvct
