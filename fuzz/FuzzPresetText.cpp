// Whatever the text: no crash; what is not ours comes out byte for byte; what is written can be read.

#include "ExactInput.h"
#include "formats/preset/PresetRecord.h"

using namespace qvct;

namespace {

using Dictionary = PropertyList::Dictionary;

/// What a record stores: weights are clamped, so that taggings themselves may differ after a write.
Dictionary stored(const TGRTMetaData& record) {
    Dictionary result = {
        {"Tagging", TGRTTagging::taggingDictionaryForTaggings(record.taggings())},
        {"SubType", record.subFileType()},
        {"Values", TGRTKeyValue::keyValueDictionaryForKeyValues(record.keyValues())},
        {"Rejected", PropertyList::Array(record.rejectedLabels().begin(), record.rejectedLabels().end())},
        {"ContentInfo", record.contentInfo()->dictionary()}};
    if (record.displayName()) result.set("DisplayName", *record.displayName());
    return result;
}

/// The text with the record written into it.
std::string rewritten(PresetText preset, const TGRTMetaData& record) {
    setTaggings(preset, record.taggings());
    setContentInfo(preset, *record.contentInfo());
    setDescription(preset, record);
    setRejectedLabels(preset, record.rejectedLabels());
    return preset.text();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const fuzz::ExactInput input(data, size);
    const auto preset = PresetText::parse(input.text());
    if (!preset) return 0;
    fuzz::require(preset->text() == input.text());
    const auto taxonomy = TGRTTaxonomy::init();
    const auto record = recordOfPreset(*preset, *taxonomy);
    if (preset->firstUnclosedSection()) return 0;
    const auto once = PresetText::parse(rewritten(*preset, *record));
    fuzz::require(once && !once->firstUnclosedSection());
    const auto recordOnce = recordOfPreset(*once, *taxonomy);
    fuzz::require(recordOnce->displayName() == record->displayName());
    const auto twice = PresetText::parse(rewritten(*once, *recordOnce));
    const auto recordTwice = recordOfPreset(*twice, *taxonomy);
    fuzz::require(stored(*recordOnce) == stored(*recordTwice));
    fuzz::require(rewritten(*twice, *recordTwice) == twice->text());
    return 0;
}
