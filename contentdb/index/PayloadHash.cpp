#include "contentdb/index/PayloadHash.h"

#include "contentdb/index/BundleWalk.h"
#include "contentdb/store/Digest.h"
#include "formats/QVContentTaggingTypes.h"
#include "formats/preset/PresetRecord.h"
#include "media/loopfile/LCFileData.h"
#include "platform/base/bytes/ByteOrder.h"
#include "platform/base/bytes/BytesAsText.h"
#include "platform/files/FolderListing.h"
#include "platform/files/Paths.h"
#include "platform/files/reading/RandomAccessReader.h"
#include "taxonomy/TaggingTypes.h"

#include <array>
#include <span>

namespace qvct::contentdb {
namespace {

constexpr std::uint64_t kBlock = 4096;
constexpr std::uint64_t kBlocks = 16;

/// How much content there is, and a digest of it.
struct Payload {
    std::uint64_t size = 0;
    Digest digest;

    void add(std::string_view bytes) {
        digest.add(bytes);
        size += bytes.size();
    }

    std::string hash() const {
        if (size == 0) return {};
        return bytesOf(size, 8, ByteOrder::little) + bytesOf(digest.value(), 8, ByteOrder::little);
    }
};

bool addBlock(Payload& payload, const RandomAccessReader& file, std::uint64_t offset, std::uint64_t size) {
    std::array<std::uint8_t, kBlock * kBlocks> buffer;
    if (!file.read(offset, std::span(buffer).first(size))) return false;
    payload.digest.add(textOf(std::span(buffer).first(size)));
    return true;
}

/// Whether the range could be read.
bool addRange(Payload& payload, const RandomAccessReader& file, std::uint64_t offset, std::uint64_t size) {
    payload.digest.add(size);
    payload.size += size;
    if (size <= kBlock * kBlocks) return addBlock(payload, file, offset, size);
    for (std::uint64_t i = 0; i < kBlocks; ++i) {
        const std::uint64_t place = (size - kBlock) / (kBlocks - 1) * i;
        if (!addBlock(payload, file, offset + (i + 1 == kBlocks ? size - kBlock : place), kBlock))
            return false;
    }
    return true;
}

bool addFile(Payload& payload, ItemFile& file) {
    const auto reader = file.reader();
    return reader && addRange(payload, *reader, 0, reader->size());
}

bool addAudio(Payload& payload, ItemFile& file) {
    const auto audio = file.audio();
    if (!audio) return false;
    const LCAudioFacts& facts = audio->facts();
    const PropertyList::Data& notes = audio->midiData();
    if (!notes.empty()) payload.add(textOf(notes));
    return facts.audioSize == 0 || addRange(payload, *file.reader(), facts.audioOffset, facts.audioSize);
}

bool addPreset(Payload& payload, ItemFile& file) {
    const auto bytes = file.bytes(kLargestPreset);
    if (!bytes) return false;
    const auto preset = PresetText::parse(textOf(*bytes));
    if (preset) payload.add(textWithoutRecord(*preset));
    return preset.has_value();
}

bool addFileOfBundle(Payload& payload, ContentItem& item, const std::string& path) {
    ItemFile* description = item.descriptionFile();
    if (description != nullptr && description->url().path() == path) return addFile(payload, *description);
    ItemFile file(URL::fileURLWithPath(path));
    return addFile(payload, file);
}

/// The files in the bundle with their names, but for records.
bool addBundle(Payload& payload, ContentItem& item) {
    const auto bundle = FolderListing::read(item.url().path());
    return bundle && forEachInBundle(*bundle, [&](const BundleEntry& found) {
               const std::string name(found.entry.name);
               if (name == QVContentTaggingTagsPlistName) return true;
               payload.digest.add(name);
               const std::string path = pathIn(item.url().path(), found.folderPath + name);
               return found.entry.kind != EntryKind::file || addFileOfBundle(payload, item, path);
           });
}

bool addContent(Payload& payload, ContentItem& item) {
    switch (QVContentTaggingTypes::fallBackFileTypeForURL(item.url())) {
        case kFileTypePatch:
        case kFileTypeProject:
            return addBundle(payload, item);
        case kFileTypeSynthPreset:
            return addPreset(payload, item.file());
        case kFileTypeSamplerSettings:
        case kFileTypePlugInSettings:
        case kFileTypeChannelStrip:
            return addFile(payload, item.file());
        default:
            return addAudio(payload, item.file());
    }
}

}  // namespace

std::string payloadHash(ContentItem& item) {
    Payload payload;
    return addContent(payload, item) ? payload.hash() : std::string();
}

}  // namespace qvct::contentdb
