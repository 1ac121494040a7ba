#include "formats/audiofile/TGRTAudioFileMetaDataReader.h"

#include "formats/ItemFile.h"
#include "formats/audiofile/TGRTAudioFileTypeValidator.h"

#include <array>

namespace qvct {

bool TGRTAudioFileMetaDataReader::supportsFileExtension(std::string_view extension) {
    constexpr std::array<std::string_view, 4> extensions = {"aif", "aiff", "caf", "wav"};
    return isExtensionIn(extension, extensions);
}

std::shared_ptr<TGRTMetaData> TGRTAudioFileMetaDataReader::readMetaDataFromURL(const URL& url,
                                                                               std::uint64_t options,
                                                                               Error* error) const {
    ItemFile file(url);
    return readMetaDataFromFile(file, options, error);
}

std::shared_ptr<TGRTMetaData> TGRTAudioFileMetaDataReader::readMetaDataFromFile(ItemFile& file,
                                                                                std::uint64_t options,
                                                                                Error* error) const {
    const URL& url = file.url();
    if (TGRTAudioFileTypeValidator::isPrelistenFile(url)) {
        fail(error, kErrorUnreadable, "is the recorded preview of another item", {url.path()});
        return nullptr;
    }
    const std::shared_ptr<const LCFileData> fileData = file.audio(error);
    if (!readSuccessForFileData(fileData, url)) return nullptr;
    auto record = TGRTMetaData::init();
    record->setKeyValues(readKeyValuesFromFileData(fileData, url));
    record->setTaggings(readTaggingsFromFileData(fileData, options, url));
    std::int64_t subType = -1;
    record->setFileType(fileTypeFromFileData(fileData, url, subType));
    record->setSubFileType(subType);
    record->setContentInfo(readContentInfoFromFileData(fileData));
    record->setDisplayName(fileData->displayName());
    record->setRejectedLabels(TGRTMetaData::rejectedLabelsFromDictionary(fileData->record()));
    return record;
}

bool TGRTAudioFileMetaDataReader::readSuccessForFileData(const std::shared_ptr<const LCFileData>& fileData,
                                                         const URL& /*url*/) const {
    return fileData != nullptr;
}

std::int64_t TGRTAudioFileMetaDataReader::fileTypeFromFileData(
    const std::shared_ptr<const LCFileData>& fileData, const URL& /*url*/, std::int64_t& subType) const {
    subType = -1;
    return fileData ? kFileTypeAudioFile : kFileTypeNone;
}

ObjectSet<TGRTKeyValue> TGRTAudioFileMetaDataReader::readKeyValuesFromFileData(
    const std::shared_ptr<const LCFileData>& fileData, const URL& /*url*/) const {
    if (!fileData) return {};
    return {TGRTKeyValue::initWithKeyNumberValue(std::string(QVContentKeyLengthInSeconds),
                                                 double{fileData->lengthInSeconds()})};
}

ObjectSet<TGRTTagging> TGRTAudioFileMetaDataReader::readTaggingsFromFileData(
    const std::shared_ptr<const LCFileData>& fileData, std::uint64_t /*options*/, const URL& /*url*/) const {
    if (!fileData || !fileData->hasAuthoredChunks()) return {};
    const PropertyList dictionary(fileData->taggingDictionary());
    return TGRTTagging::taggingsWithTaggingDictionary(&dictionary, *taxonomy());
}

std::shared_ptr<TGRTContentInfo> TGRTAudioFileMetaDataReader::readContentInfoFromFileData(
    const std::shared_ptr<const LCFileData>& fileData) const {
    if (!fileData || fileData->contentInfoDictionary() == nullptr) return TGRTContentInfo::init();
    const PropertyList dictionary(*fileData->contentInfoDictionary());
    return TGRTContentInfo::initWithDictionary(&dictionary);
}

}  // namespace qvct
