#include "formats/audiofile/TGRTTavioLoopMetaDataReader.h"

#include "taxonomy/legacy/TGRTLegacyTaxonomyMapping.h"

#include <array>
#include <utility>

namespace qvct {

bool TGRTTavioLoopMetaDataReader::supportsFileExtension(std::string_view extension) {
    constexpr std::array<std::string_view, 5> extensions = {"aif", "aiff", "caf", "loopdata", "wav"};
    return isExtensionIn(extension, extensions);
}

bool TGRTTavioLoopMetaDataReader::isTavioLoopFromFileData(
    const std::shared_ptr<const LCFileData>& fileData) const {
    return fileData && fileData->hasAuthoredChunks() && fileData->hasLoopTypeChunks();
}

std::int64_t TGRTTavioLoopMetaDataReader::fileTypeFromFileData(
    const std::shared_ptr<const LCFileData>& fileData, const URL& url, std::int64_t& subType) const {
    const std::int64_t type = TGRTAudioFileMetaDataReader::fileTypeFromFileData(fileData, url, subType);
    if (!isTavioLoopFromFileData(fileData)) return type;
    subType = fileData->tavioLoopType();
    return kFileTypeLoop;
}

ObjectSet<TGRTKeyValue> TGRTTavioLoopMetaDataReader::readKeyValuesFromFileData(
    const std::shared_ptr<const LCFileData>& fileData, const URL& url) const {
    auto keyValues = TGRTAudioFileMetaDataReader::readKeyValuesFromFileData(fileData, url);
    if (!isTavioLoopFromFileData(fileData)) return keyValues;
    const std::array<std::pair<std::string_view, int>, 6> numbers = {
        {{QVContentKeyBeatCount, fileData->beatCount()},
         {QVContentKeyTavioLoopType, fileData->tavioLoopType()},
         {QVContentKeyMidiRootNote, fileData->midiRootNote()},
         {QVContentKeyKeyType, fileData->keyType()},
         {QVContentKeySignatureTop, fileData->signatureTop()},
         {QVContentKeySignatureBottom, fileData->signatureBottom()}}};
    for (const auto& [key, number] : numbers) {
        keyValues.insert(TGRTKeyValue::initWithKeyNumberValue(std::string(key), number));
    }
    return keyValues;
}

ObjectSet<TGRTTagging> TGRTTavioLoopMetaDataReader::readTaggingsFromFileData(
    const std::shared_ptr<const LCFileData>& fileData, std::uint64_t options, const URL& url) const {
    auto taggings = TGRTAudioFileMetaDataReader::readTaggingsFromFileData(fileData, options, url);
    if (!isTavioLoopFromFileData(fileData)) return taggings;
    if ((options & kReadLegacyTaggings) != 0) taggings.insertAll(legacyFormatTaggingsForFileData(fileData));
    if ((options & kReadMappedTaggings) != 0) taggings.insertAll(mappedTaggingsForFileData(fileData));
    return taggings;
}

TGRTTavioLoopMetaDataReader::Keywords TGRTTavioLoopMetaDataReader::legacyKeywordsForFileData(
    const std::shared_ptr<const LCFileData>& fileData) const {
    if (!fileData || !fileData->hasAuthoredChunks()) return {};
    Keywords keywords = fileData->descriptors();
    for (auto& keyword :
         {fileData->instrumentTypeTag(), fileData->instrumentSubTypeTag(), fileData->genreTag()}) {
        if (keyword) keywords.insert(*keyword);
    }
    return keywords;
}

ObjectSet<TGRTTag> TGRTTavioLoopMetaDataReader::tagsForLegacyKeywords(const Keywords& keywords) const {
    const auto taxonomy = TGRTTaxonomy::legacyLoopTaxonomy();
    ObjectSet<TGRTTag> tags;
    for (const std::string& keyword : keywords) tags.insert(taxonomy->findTagForLabel(keyword));
    return tags;
}

ObjectSet<TGRTTagging> TGRTTavioLoopMetaDataReader::taggingsForLegacyTags(const Keywords& keywords) const {
    ObjectSet<TGRTTagging> taggings;
    for (const auto& tag : tagsForLegacyKeywords(keywords)) {
        taggings.insert(TGRTTagging::initWithTag(tag, nullptr));
    }
    return taggings;
}

ObjectSet<TGRTTagging> TGRTTavioLoopMetaDataReader::legacyFormatTaggingsForFileData(
    const std::shared_ptr<const LCFileData>& fileData) const {
    return taggingsForLegacyTags(legacyKeywordsForFileData(fileData));
}

ObjectSet<TGRTTagging> TGRTTavioLoopMetaDataReader::mappedTaggingsForLegacyKeywords(
    const Keywords& keywords) const {
    ObjectSet<TGRTTagging> taggings;
    const auto mapping = TGRTLegacyTaxonomyMapping::legacyLoopTaxonomyMapping();
    if (!mapping) return taggings;
    for (const auto& tag : tagsForLegacyKeywords(keywords)) {
        taggings.insertAll(mapping->taggingsForLegacyTag(*tag));
    }
    return taggings;
}

ObjectSet<TGRTTagging> TGRTTavioLoopMetaDataReader::mappedTaggingsForFileData(
    const std::shared_ptr<const LCFileData>& fileData) const {
    return mappedTaggingsForLegacyKeywords(legacyKeywordsForFileData(fileData));
}

}  // namespace qvct
