#include "formats/preset/TGRTVorthalPresetMetaDataReader.h"

#include "formats/ItemFile.h"
#include "formats/preset/PresetRecord.h"
#include "formats/preset/TGRTVorthalLegacyTaggingParser.h"

#include <array>

namespace qvct {

bool TGRTVorthalPresetMetaDataReader::supportsFileExtension(std::string_view extension) {
    constexpr std::array<std::string_view, 1> extensions = {"vcp"};
    return isExtensionIn(extension, extensions);
}

std::shared_ptr<TGRTMetaData> TGRTVorthalPresetMetaDataReader::readMetaDataFromURL(const URL& url,
                                                                                   std::uint64_t options,
                                                                                   Error* error) const {
    ItemFile file(url);
    return readMetaDataFromFile(file, options, error);
}

std::shared_ptr<TGRTMetaData> TGRTVorthalPresetMetaDataReader::readMetaDataFromFile(ItemFile& file,
                                                                                    std::uint64_t options,
                                                                                    Error* error) const {
    const URL& url = file.url();
    const auto bytes = file.bytes(kLargestPreset, error);
    if (!bytes) return nullptr;
    const auto preset =
        PresetText::parse({reinterpret_cast<const char*>(bytes->data()), bytes->size()}, error);
    if (!preset) {
        failIn(url.path(), error);
        return nullptr;
    }
    auto record = recordOfPreset(*preset, *taxonomy());
    auto taggings = record->taggings();
    if ((options & kReadLegacyTaggings) != 0) {
        taggings.insertAll(TGRTVorthalLegacyTaggingParser::legacyFormatTaggingsForFileURL(url));
    }
    if ((options & kReadMappedTaggings) != 0) {
        taggings.insertAll(TGRTVorthalLegacyTaggingParser::mappedTaggingsForFileURL(url));
    }
    record->setTaggings(std::move(taggings));
    return record;
}

}  // namespace qvct
