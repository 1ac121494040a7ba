#include "formats/audiofile/TGRTAudioFileWriters.h"

#include "formats/StoredRecord.h"
#include "platform/LCFileParser.h"
#include "platform/LCFileWriter.h"

#include <functional>

namespace qvct {
namespace {

/// Changes what the file says and writes it back.
bool changeFileData(const URL& url, bool isLoopType, const std::function<void(LCFileData&)>& change,
                    Error* error, const ContentWriteOptions& options) {
    const auto fileData = LCFileParser::fileParserForURL(url, false, kLCAllAudio)->fileData(error);
    if (!fileData) return false;
    change(*fileData);
    fileData->setTavioLoopType(isLoopType ? fileData->tavioLoopType() : -1);
    const LCWriteOptions how{.keepsTimes = options.keepsTimes, .verifies = options.verifies};
    return LCFileWriter::fileWriterForURL(url, how)->writeFileData(fileData, error);
}

PropertyList::Dictionary dictionaryOf(const TGRTContentInfo* contentInfo) {
    return contentInfo == nullptr ? PropertyList::Dictionary{} : contentInfo->dictionary();
}

}  // namespace

bool TGRTAudioFileTaggingWriter::writeTaggings(const ObjectSet<TGRTTagging>& taggings, const URL& url,
                                               Error* error, const ContentWriteOptions& options) const {
    const auto change = [&taggings](LCFileData& fileData) {
        fileData.setTaggingDictionary(TGRTTagging::taggingDictionaryForTaggings(taggings));
    };
    return changeFileData(url, isLoopType(), change, error, options);
}

bool TGRTAudioFileContentInfoWriter::writeContentInfo(
    const std::shared_ptr<const TGRTContentInfo>& contentInfo, const URL& url, Error* error,
    const ContentWriteOptions& options) const {
    const auto change = [&contentInfo](LCFileData& fileData) {
        fileData.setContentInfoDictionary(dictionaryOf(contentInfo.get()));
    };
    return changeFileData(url, isLoopType(), change, error, options);
}

bool TGRTAudioFileMetaDataWriter::writeMetaData(const std::shared_ptr<TGRTMetaData>& metaData, const URL& url,
                                                Error* error, const ContentWriteOptions& options) const {
    if (!metaData) return failForMissingRecord(url.path(), error);
    const auto change = [&metaData](LCFileData& fileData) {
        fileData.setTaggingDictionary(TGRTTagging::taggingDictionaryForTaggings(metaData->taggings()));
        fileData.setContentInfoDictionary(dictionaryOf(metaData->contentInfo().get()));
        fileData.setDisplayName(metaData->displayName().value_or(std::string{}));
    };
    return changeFileData(url, isLoopType(), change, error, options);
}

}  // namespace qvct
