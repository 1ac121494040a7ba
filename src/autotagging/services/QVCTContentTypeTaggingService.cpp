#include "autotagging/services/QVCTContentTypeTaggingService.h"

#include "autotagging/xml/QVCTXMLDocument.h"
#include "formats/QVContentTaggingTypes.h"
#include "media/loopfile/LCFileData.h"
#include "metadata/TGRTMetaData.h"
#include "platform/text/RegularExpression.h"
#include "platform/text/Text.h"
#include "taxonomy/TaggingTypes.h"

#include <array>
#include <string>
#include <string_view>

namespace qvct {
namespace {

constexpr std::string_view kAudioLoop = "Audio Loop";
constexpr std::string_view kMidiLoop = "MIDI Loop";
constexpr std::string_view kOneShot = "One Shot";
constexpr std::string_view kSample = "Sample";

/// What is known of one item, and the labels that it gets.
struct Item {
    const URL& url;
    const QVCTXMLDocument* xml;
    const TGRTMetaData* record;
    const LCFileData* file;
    TagDictionarySet tags;

    void add(std::string_view label) { tags.insert(tagDictionary(label)); }
    std::int64_t subType() const { return record == nullptr ? 0 : record->subFileType(); }
};

/// Whether a chunk says so, or the length in beats is known, which is never given for a single sound.
bool isLoop(const Item& item) {
    return item.file != nullptr && (item.file->hasLoopTypeChunks() || item.file->beatCount() > 0);
}

/// "Deep House 122bpm.aif" is meant to be played in time, even if its chunks do not say so.
bool namesATempo(const URL& url) {
    thread_local RegularExpression tempo =
        *RegularExpression::compile("\\d\\s?bpm\\b", RegularExpression::Case::insensitive);
    return tempo.occursIn(utf16FromUtf8(url.lastPathComponent()));
}

std::int64_t fileTypeOf(const Item& item) {
    const bool isKnown = item.record != nullptr && item.record->fileType() != kFileTypeNone;
    const std::int64_t type =
        isKnown ? item.record->fileType() : QVContentTaggingTypes::fallBackFileTypeForURL(item.url);
    // A chunk of another maker may call a file a loop that no record describes.
    return type == kFileTypeAudioFile && isLoop(item) ? std::int64_t{kFileTypeLoop} : type;
}

void addPatchKind(Item& item) {
    constexpr std::array<std::string_view, 5> kinds = {"", QVTagInstrumentPatch, QVTagAudioPatch,
                                                       QVTagAuxPatch, QVTagOutputPatch};
    constexpr std::array<std::string_view, 5> channels = {"", "Instrument", "Audio", "Aux", "Output"};
    const std::int64_t stored = item.subType();
    for (std::size_t kind = 1; kind < kinds.size(); ++kind) {
        const bool isStored = stored == static_cast<std::int64_t>(kind);
        const auto firstChannel = [&] {
            return "/Patch/Channels/Channel[1][@type='" + std::string(channels[kind]) + "']";
        };
        if (isStored || (stored == 0 && item.xml != nullptr && item.xml->isMatchingXPath(firstChannel()))) {
            item.add(kinds[kind]);
        }
    }
}

void addProjectKind(Item& item) {
    constexpr std::array<std::string_view, 4> kinds = {"", QVTagDemoSong, QVTagLiveLoopGrid,
                                                       QVTagRemixSession};
    const std::int64_t kind = item.subType();
    if (kind > 0 && kind < std::int64_t{kinds.size()}) item.add(kinds[static_cast<std::size_t>(kind)]);
}

void addLoopKind(Item& item) {
    if (item.file != nullptr) item.add(item.file->midiData().empty() ? kAudioLoop : kMidiLoop);
}

void addLength(Item& item) {
    const float seconds = item.file == nullptr ? 0 : item.file->lengthInSeconds();
    if (seconds <= 0 || namesATempo(item.url)) return;
    item.add(seconds <= QVCTContentTypeTaggingService::kLongestOneShotInSeconds ? kOneShot : kSample);
}

void addType(Item& item) {
    switch (fileTypeOf(item)) {
        case kFileTypePatch:
            item.add(QVTagPatch);
            return addPatchKind(item);
        case kFileTypeProject:
            item.add(QVTagProject);
            return addProjectKind(item);
        case kFileTypeLoop:
            item.add(QVTagTavioLoop);
            return addLoopKind(item);
        case kFileTypeAudioFile:
            return addLength(item);
        case kFileTypeSynthPreset:
            return item.add(QVTagVorthalSetting);
        case kFileTypeSamplerSettings:
            return item.add(QVTagSXV);
        case kFileTypePlugInSettings:
            return item.add(QVTagPST);
        case kFileTypeChannelStrip:
            return item.add(QVTagCST);
        default:
            return;
    }
}

}  // namespace

TagDictionarySet QVCTContentTypeTaggingService::tagsWithContentsOfURL(
    const URL& url, const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
    const std::shared_ptr<TGRTMetaData>& metaData, const std::shared_ptr<LCFileData>& fileData,
    std::uint64_t options) {
    Item item{url, xmlDocument.get(), metaData.get(), fileData.get(), {}};
    if ((options & QVCTAutoTaggingOptionContentType) != 0) addType(item);
    return std::move(item.tags);
}

}  // namespace qvct
