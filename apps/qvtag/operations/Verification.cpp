#include "operations/Verification.h"

#include "formats/QVContentTaggingTypes.h"
#include "formats/TGRTFileNode.h"
#include "formats/preset/PresetRecord.h"
#include "platform/files/FileAccess.h"

#include <fmt/format.h>

namespace qvct::tool {
namespace {

/// What a preset holds besides its record, even inside the record's sections.
std::string untouchedText(PresetText& preset) {
    std::string text = textWithoutRecord(preset);
    setTaggings(preset, {});
    setRejectedLabels(preset, {});
    setDescription(preset, *TGRTMetaData::init());
    for (const PresetText::Section& section : preset.sections()) {
        for (const PresetText::Item& item : section.items)
            text += fmt::format("\n<{}> {} = {}", section.name, item.key, item.value);
    }
    return text;
}

/// The bytes of an item that no write may change.
std::optional<std::string> untouchedBytes(const URL& url, Error* error) {
    if (isDirectory(url.path())) return std::string{};
    const auto bytes = readFile(url.path(), error);
    if (!bytes) return std::nullopt;
    std::string text(bytes->begin(), bytes->end());
    if (QVContentTaggingTypes::fallBackFileTypeForURL(url) != kFileTypeSynthPreset) return text;
    auto preset = PresetText::parse(text, error);
    if (!preset) failIn(url.path(), error);
    return preset ? std::optional(untouchedText(*preset)) : std::nullopt;
}

bool isAudio(const URL& url) {
    const FileType type = QVContentTaggingTypes::fallBackFileTypeForURL(url);
    return type == kFileTypeAudioFile || type == kFileTypeLoop || type == kFileTypeNone;
}

}  // namespace

std::optional<Verification> Verification::before(const URL& url, Error* error) {
    Verification verification(url);
    if (isAudio(url)) {
        verification.audio_ = fingerprintOfFile(url, error);
        return verification.audio_ ? std::optional(verification) : std::nullopt;
    }
    verification.untouched_ = untouchedBytes(url, error);
    return verification.untouched_ ? std::optional(verification) : std::nullopt;
}

std::vector<std::string> Verification::faultsAfterWriting(const TGRTMetaData& expected) const {
    std::vector<std::string> faults;
    Error error;
    const auto addError = [&] {
        if (error.path == url_.path()) error.path.clear();  // whoever shows the faults says whose they are
        faults.push_back(error.message());
    };
    if (audio_) {
        const auto after = fingerprintOfFile(url_, &error);
        if (after) faults = audio_->differences(*after);
        if (!after) addError();
    } else {
        const auto after = untouchedBytes(url_, &error);
        if (!after) addError();
        if (after && *after != *untouched_) faults.emplace_back("what is not ours differs");
    }
    const auto stored = TGRTFileNode::nodeWithFileURL(url_)->readMetaDataWithOptions(0, &error);
    if (!stored) {
        if (!error.isSet()) fail(&error, kErrorUnwritable, "no record is there");
        addError();
    } else if (!(stored->taggings() == expected.taggings()) ||
               stored->displayName().value_or("") != expected.displayName().value_or("") ||
               stored->rejectedLabels() != expected.rejectedLabels()) {
        faults.emplace_back("the record that is there is not the one that was written");
    }
    return faults;
}

Json Verification::summary() const {
    Json json = Json::object();
    if (audio_) {
        json["audioBytes"] = audio_->audioSize;
        json["audioHash"] = fmt::format("{:016x}", audio_->audioHash);
        json["chunks"] = audio_->chunks.size();
    } else if (!untouched_->empty()) {
        json["bytes"] = untouched_->size();
    }
    return json;
}

std::string Verification::description() const {
    if (audio_) {
        return fmt::format("compared: {} bytes of audio (hash {:016x}) and {} chunks", audio_->audioSize,
                           audio_->audioHash, audio_->chunks.size());
    }
    if (!untouched_->empty()) return fmt::format("compared: {} bytes that are not ours", untouched_->size());
    return "compared: the record";
}

}  // namespace qvct::tool
