#include "formats/bundle/TGRTBundleMetaDataReader.h"

#include "formats/bundle/BundleRecord.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/FileAccess.h"
#include "taxonomy/TaggingSetAdditions.h"

#include <algorithm>
#include <array>

namespace qvct {

std::shared_ptr<TGRTMetaData> TGRTBundleMetaDataReader::readMetaDataFromURL(const URL& url,
                                                                            std::uint64_t /*options*/,
                                                                            Error* error) const {
    const std::string path = url.URLByAppendingPathComponent(plistPathComponent()).path();
    if (url.isFileURL() && !fileExists(path)) return nullptr;
    const auto dictionary = readDictionaryFile(path, error);
    auto record = TGRTMetaData::metaDataFromDictionary(dictionary ? &*dictionary : nullptr, *taxonomy());
    if (record && record->fileType() == kFileTypeNone) record->setFileType(defaultFileType());
    return record;
}

std::int64_t TGRTBundleMetaDataReader::subTypeFromTaggings(const ObjectSet<TGRTTagging>& taggings) {
    constexpr std::array<BundleSubType, 3> ofProjects = {
        {{QVTagDemoSong, 1}, {QVTagLiveLoopGrid, 2}, {QVTagRemixSession, 3}}};
    const std::int64_t ofPatch = firstSubType(kPatchSubTypes, taggings);
    return ofPatch != 0 ? ofPatch : firstSubType(ofProjects, taggings);
}

bool TGRTOstraProjectMetaDataReader::supportsFileExtension(std::string_view extension) {
    constexpr std::array<std::string_view, 1> extensions = {"ostrax"};
    return isExtensionIn(extension, extensions);
}

std::string TGRTOstraProjectMetaDataReader::plistPathComponent() const {
    return projectPlistPathComponent();
}

}  // namespace qvct
