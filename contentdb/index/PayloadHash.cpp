#include "contentdb/index/PayloadHash.h"

#include "contentdb/store/Digest.h"
#include "formats/QVContentTaggingTypes.h"
#include "formats/preset/PresetRecord.h"
#include "platform/files/FileAccess.h"
#include "platform/files/FileDescriptor.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <array>
#include <filesystem>
#include <vector>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

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
        std::string bytes;
        for (const std::uint64_t number : {size, digest.value()}) {
            for (unsigned shift = 0; size > 0 && shift < 64; shift += 8)
                bytes += static_cast<char>(number >> shift & 0xFFU);
        }
        return bytes;
    }
};

bool addBlock(Payload& payload, int file, std::uint64_t offset, std::uint64_t size) {
    std::array<char, kBlock * kBlocks> buffer;
    for (std::uint64_t filled = 0; filled < size;) {
        const ssize_t count =
            ::pread(file, buffer.data() + filled, size - filled, static_cast<off_t>(offset + filled));
        if (count <= 0) return false;
        filled += static_cast<std::uint64_t>(count);
    }
    payload.digest.add(std::string_view(buffer.data(), size));
    return true;
}

/// Whether the range could be read.
bool addRange(Payload& payload, int file, std::uint64_t offset, std::uint64_t size) {
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

bool addFile(Payload& payload, const std::string& path) {
    const FileDescriptor file(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    struct stat status {};
    if (!file.isOpen() || ::fstat(file.number(), &status) != 0 || !S_ISREG(status.st_mode)) return false;
    return addRange(payload, file.number(), 0, static_cast<std::uint64_t>(status.st_size));
}

bool addAudio(Payload& payload, const std::string& path, const LCFileData& audio) {
    const LCAudioFacts& facts = audio.facts();
    const PropertyList::Data& notes = audio.midiData();
    if (!notes.empty()) payload.add({reinterpret_cast<const char*>(notes.data()), notes.size()});
    if (facts.audioSize == 0) return true;
    const FileDescriptor file(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    return file.isOpen() && addRange(payload, file.number(), facts.audioOffset, facts.audioSize);
}

bool addPreset(Payload& payload, const std::string& path) {
    const auto bytes = readFile(path);
    if (!bytes) return false;
    const auto preset = PresetText::parse({reinterpret_cast<const char*>(bytes->data()), bytes->size()});
    if (preset) payload.add(textWithoutRecord(*preset));
    return preset.has_value();
}

/// The files below the folder but for records and what is hidden, in the order of their names; links are not
/// followed.
bool addFolder(Payload& payload, const fs::path& folder, std::size_t& budget, std::size_t depth) {
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
        if (fs::is_directory(status) && !addFolder(payload, entry.path(), budget, depth + 1)) return false;
        if (fs::is_regular_file(status) && !addFile(payload, entry.path().string())) return false;
    }
    return true;
}

bool addContent(Payload& payload, const URL& url, const LCFileData* audio) {
    constexpr std::size_t mostFiles = 10000;
    const std::string& path = url.path();
    std::size_t budget = mostFiles;
    switch (QVContentTaggingTypes::fallBackFileTypeForURL(url)) {
        case kFileTypePatch:
        case kFileTypeProject:
            return addFolder(payload, path, budget, 0);
        case kFileTypeSynthPreset:
            return addPreset(payload, path);
        case kFileTypeSamplerSettings:
        case kFileTypePlugInSettings:
        case kFileTypeChannelStrip:
            return addFile(payload, path);
        default:
            return audio != nullptr && addAudio(payload, path, *audio);
    }
}

}  // namespace

std::string payloadHash(const URL& url, const LCFileData* audio) {
    Payload payload;
    return addContent(payload, url, audio) ? payload.hash() : std::string();
}

}  // namespace qvct::contentdb
