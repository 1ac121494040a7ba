#include "formats/preset/TGRTVorthalPresetMetaDataWriter.h"

#include "formats/StoredRecord.h"
#include "formats/preset/PresetRecord.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"
#include "taxonomy/TaggingTypes.h"

#include <functional>

namespace qvct {
namespace {

bool changePreset(const URL& url, const std::function<void(PresetText&)>& change, Error* error,
                  const ContentWriteOptions& options) {
    if (!fileExists(url.path())) {
        return fail(error, kErrorUnreadable, "no such preset", {url.path()});
    }
    const auto changeText = [&change](const std::string& stored,
                                      Error* reason) -> std::optional<std::string> {
        auto preset = PresetText::parse(stored, reason);
        if (!preset) return std::nullopt;
        if (const auto line = preset->firstUnclosedSection()) {
            fail(reason, kErrorMalformed, "the section does not end", {.line = *line});
            return std::nullopt;
        }
        change(*preset);
        std::string text = preset->text();
        if (isValidUtf8(text)) return text;
        fail(reason, kErrorInvalidArgument, "the record holds a text that cannot be stored");
        return std::nullopt;
    };
    return changeStoredFile(url, url.path(), changeText, error, options);
}

}  // namespace

bool TGRTVorthalPresetMetaDataWriter::writeTaggings(const ObjectSet<TGRTTagging>& taggings, const URL& url,
                                                    Error* error, const ContentWriteOptions& options) const {
    return changePreset(
        url, [&](PresetText& preset) { setTaggings(preset, taggings); }, error, options);
}

bool TGRTVorthalPresetMetaDataWriter::writeContentInfo(
    const std::shared_ptr<const TGRTContentInfo>& contentInfo, const URL& url, Error* error,
    const ContentWriteOptions& options) const {
    const auto change = [&](PresetText& preset) {
        setContentInfo(preset, contentInfo ? *contentInfo : *TGRTContentInfo::init());
    };
    return changePreset(url, change, error, options);
}

bool TGRTVorthalPresetMetaDataWriter::writeMetaData(const std::shared_ptr<TGRTMetaData>& metaData,
                                                    const URL& url, Error* error,
                                                    const ContentWriteOptions& options) const {
    if (!metaData) return failForMissingRecord(url.path(), error);
    if (metaData->fileType() == kFileTypeNone) metaData->setFileType(kFileTypeSynthPreset);
    const auto change = [&](PresetText& preset) {
        setTaggings(preset, metaData->taggings());
        if (metaData->contentInfo()) setContentInfo(preset, *metaData->contentInfo());
        setDescription(preset, *metaData);
        if (metaData->knowsRejectedLabels()) setRejectedLabels(preset, metaData->rejectedLabels());
    };
    return changePreset(url, change, error, options);
}

}  // namespace qvct
