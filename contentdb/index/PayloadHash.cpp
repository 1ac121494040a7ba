#include "contentdb/index/PayloadHash.h"

#include "contentdb/store/Digest.h"
#include "formats/QVContentTaggingTypes.h"
#include "formats/preset/PresetRecord.h"
#include "media/loopfile/LCFileData.h"
#include "platform/base/ByteOrder.h"
#include "platform/base/BytesAsText.h"
#include "platform/files/RandomAccessReader.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <array>
#include <filesystem>
#include <span>
#include <vector>

namespace qvct::contentdb {
namespace {

namespace fs = std::filesystem;

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

bool addFileOfBundle(Payload& payload, ContentItem& item, const fs::path& path) {
    ItemFile* description = item.descriptionFile();
    if (description != nullptr && description->url().path() == path) return addFile(payload, *description);
    ItemFile file(URL::fileURLWithPath(path.string()));
    return addFile(payload, file);
}

/// The files below the folder but for records and what is hidden, in the order of their names; links are not
/// followed.
bool addFolder(Payload& payload, ContentItem& item, const fs::path& folder, std::size_t& budget,
               std::size_t depth) {
    constexpr std::size_t deepest = 16;
    std::error_code failure;
    std::vector<fs::directory_entry> entries;
    for (fs::directory_iterator at(folder, failure), end; !failure && at != end; at.increment(failure)) {
        const std::string name = at->path().filename().string();
        if (name[0] != '.' && name != QVContentTaggingTagsPlistName) entries.push_back(*at);
    }
    if (failure || depth > deepest || entries.size() > budget) return false;
    budget -= entries.size();
    std::sort(entries.begin(), entries.end());
    for (const fs::directory_entry& entry : entries) {
        const fs::file_status status = entry.symlink_status(failure);
        payload.digest.add(entry.path().filename().string());
        if (fs::is_directory(status) && !addFolder(payload, item, entry.path(), budget, depth + 1))
            return false;
        if (fs::is_regular_file(status) && !addFileOfBundle(payload, item, entry.path())) return false;
    }
    return true;
}

bool addContent(Payload& payload, ContentItem& item) {
    constexpr std::size_t mostFiles = 10000;
    const URL& url = item.url();
    std::size_t budget = mostFiles;
    switch (QVContentTaggingTypes::fallBackFileTypeForURL(url)) {
        case kFileTypePatch:
        case kFileTypeProject:
            return addFolder(payload, item, url.path(), budget, 0);
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
