#include "media/loopfile/LCFingerprint.h"

#include "media/loopfile/containers/Container.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct {
namespace {

/// 64-bit FNV-1a.
class Hash {
  public:
    void add(std::span<const std::uint8_t> bytes) {
        for (const std::uint8_t byte : bytes) {
            value_ = (value_ ^ byte) * 0x100000001B3ULL;
        }
    }
    std::uint64_t value() const { return value_; }

  private:
    std::uint64_t value_ = 0xCBF29CE484222325ULL;
};

bool addRange(Hash& hash, const RandomAccessReader& reader, std::uint64_t begin, std::uint64_t end) {
    std::vector<std::uint8_t> buffer(std::min<std::uint64_t>(end - begin, 1U << 18U));
    while (begin < end) {
        const auto part = std::span(buffer).first(std::min<std::uint64_t>(end - begin, buffer.size()));
        if (!reader.read(begin, part)) return false;
        hash.add(part);
        begin += part.size();
    }
    return true;
}

/// The contents, without what a rewrite has to change. A pad byte counts when it is not zero, since a missing
/// one is added as zero.
std::optional<std::uint64_t> hashOf(const RandomAccessReader& reader, const Container& container,
                                    const Chunk& chunk) {
    Hash hash;
    const std::uint64_t contentsEnd = chunk.contents + chunk.size;
    if (!addRange(hash, reader, chunk.contents + container.rewrittenPrefix(chunk), contentsEnd)) {
        return std::nullopt;
    }
    if (chunk.end > contentsEnd) {
        std::uint8_t pad = 0;
        if (!reader.read(contentsEnd, {&pad, 1})) return std::nullopt;
        if (pad != 0) hash.add({&pad, 1});
    }
    return hash.value();
}

/// What lies behind the last chunk.
bool addTrail(LCFingerprint& result, const RandomAccessReader& reader, const Container& container) {
    const std::uint64_t begin = container.chunks().empty() ? 0 : container.chunks().back().end;
    if (begin >= reader.size()) return true;
    Hash hash;
    if (!addRange(hash, reader, begin, reader.size())) return false;
    result.chunks.push_back({"behind the last chunk", reader.size() - begin, hash.value()});
    return true;
}

bool addChunks(LCFingerprint& result, const RandomAccessReader& reader, const Container& container) {
    for (const Chunk& chunk : container.chunks()) {
        if (chunk.role == Chunk::Role::record) continue;
        const auto hash = hashOf(reader, container, chunk);
        if (!hash) return false;
        if (chunk.role == Chunk::Role::audio) {
            result.audioSize += chunk.size;
            result.audioHash = result.audioHash * 31 + *hash;
        }
        result.chunks.push_back({textOfCode(chunk.id), chunk.size, *hash});
    }
    return addTrail(result, reader, container);
}

}  // namespace

std::optional<LCFingerprint> fingerprintOfFile(const URL& url, Error* error) {
    const auto reader = FileReader::open(url.path(), error);
    return reader ? fingerprintOfReader(*reader, url.path(), error) : std::nullopt;
}

std::optional<LCFingerprint> fingerprintOfReader(const RandomAccessReader& reader, std::string_view name,
                                                 Error* error) {
    ReadWindow window(reader);
    const auto container = Container::open(window, name, error);
    LCFingerprint result;
    if (container && addChunks(result, reader, *container)) return result;
    if (container) fail(error, kErrorUnreadable, "became shorter while it was read");
    failIn(name, error);
    return std::nullopt;
}

std::vector<std::string> LCFingerprint::differences(const LCFingerprint& after) const {
    std::vector<std::string> result;
    if (audioSize != after.audioSize || audioHash != after.audioHash) {
        result.push_back(fmt::format("audio of {} bytes, hash {:016x}, became {} bytes, hash {:016x}",
                                     audioSize, audioHash, after.audioSize, after.audioHash));
    }
    const std::size_t common = std::min(chunks.size(), after.chunks.size());
    for (std::size_t i = 0; i < common; ++i) {
        if (chunks[i] == after.chunks[i]) continue;
        result.push_back(fmt::format("chunk {} '{}' of {} bytes became '{}' of {} bytes", i + 1, chunks[i].id,
                                     chunks[i].size, after.chunks[i].id, after.chunks[i].size));
    }
    if (chunks.size() != after.chunks.size()) {
        result.push_back(fmt::format("{} chunks became {}", chunks.size(), after.chunks.size()));
    }
    return result;
}

}  // namespace qvct
