#include "formats/preset/TGRTVorthalPresetMetaDataReader.h"

#include "formats/ItemFile.h"
#include "formats/preset/PresetRecord.h"
#include "formats/preset/TGRTVorthalLegacyTaggingParser.h"
#include "platform/base/bytes/BytesAsText.h"

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
    const auto bytes = file.bytes(kLargestPreset, error);
    if (!bytes) return nullptr;
    const std::string_view text = textOf(*bytes);
    const auto preset = PresetText::parse(text, error);
    if (!preset) {
        failIn(file.url().path(), error);
        return nullptr;
    }
    auto record = recordOfPreset(*preset, *taxonomy());
    auto taggings = record->taggings();
    if ((options & kReadLegacyTaggings) != 0) {
        taggings.insertAll(TGRTVorthalLegacyTaggingParser::legacyFormatTaggingsForText(text));
    }
    if ((options & kReadMappedTaggings) != 0) {
        taggings.insertAll(TGRTVorthalLegacyTaggingParser::mappedTaggingsForText(text));
    }
    record->setTaggings(std::move(taggings));
    return record;
}

}  // namespace qvct
