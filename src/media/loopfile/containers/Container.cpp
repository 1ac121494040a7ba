#include "media/loopfile/containers/Container.h"

#include "media/loopfile/containers/AiffFile.h"
#include "media/loopfile/containers/CafFile.h"
#include "media/loopfile/containers/LoopDataFile.h"
#include "media/loopfile/containers/WavFile.h"
#include "platform/base/bytes/ByteOrder.h"
#include "platform/text/Text.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::uint64_t kMostFiller = 4096;

}  // namespace

bool isPrintableCode(std::uint32_t code) {
    for (unsigned shift = 0; shift < 32; shift += 8) {
        const std::uint32_t character = code >> shift & 0xFFU;
        if (character < 0x20 || character > 0x7E) return false;
    }
    return true;
}

std::string textOfCode(std::uint32_t code) {
    return printable(fourCharacters(code));
}

void PieceList::addBytes(std::string bytes) {
    if (!bytes.empty()) pieces_.push_back({.bytes = std::move(bytes)});
}

void PieceList::addRange(std::uint64_t begin, std::uint64_t end) {
    if (begin >= end) return;
    const bool joins = !pieces_.empty() && pieces_.back().length > 0 &&
                       pieces_.back().offset + pieces_.back().length == begin;
    if (joins) {
        pieces_.back().length += end - begin;
    } else {
        pieces_.push_back({.bytes = {}, .offset = begin, .length = end - begin});
    }
}

bool failAt(Error* error, const Chunk& chunk, std::string_view reason) {
    return fail(error, kErrorMalformed, std::string(reason),
                {.part = fmt::format("chunk '{}'", fourCharacters(chunk.id)), .offset = chunk.offset});
}

bool checkFormat(const LCAudioFacts& facts, const Chunk& chunk, Error* error) {
    constexpr double kFastestRate = 1e8;
    constexpr std::uint32_t kMostChannels = 65535;
    if (!(facts.sampleRate >= 1 && facts.sampleRate <= kFastestRate)) {
        return failAt(error, chunk, fmt::format("a sample rate of {} is out of range", facts.sampleRate));
    }
    if (facts.channelCount < 1 || facts.channelCount > kMostChannels) {
        return failAt(error, chunk, fmt::format("{} channels are out of range", facts.channelCount));
    }
    return true;
}

std::unique_ptr<Container> Container::open(ReadWindow& window, std::string_view name, Error* error) {
    BoundedCursor start(window, ByteOrder::big, 0, 12);
    const std::uint32_t magic = start.fourCC();
    start.skip(4);
    const std::uint32_t form = start.fourCC();
    if (!start.failed()) {
        if (form == fourCC("WAVE") && WavFile::isMagic(magic))
            return std::make_unique<WavFile>(window, magic);
        if (magic == fourCC("FORM") && (form == fourCC("AIFF") || form == fourCC("AIFC"))) {
            return std::make_unique<AiffFile>(window, form);
        }
        if (magic == fourCC("caff")) return std::make_unique<CafFile>(window);
    }
    if (LoopDataFile::isName(name)) return std::make_unique<LoopDataFile>(window);
    fail(error, kErrorMalformed, "is no WAV, AIFF, AIFC, CAF or loop data file", {.offset = 0});
    return nullptr;
}

const Chunk* Container::find(std::uint32_t id) const {
    const auto found =
        std::find_if(chunks_.begin(), chunks_.end(), [id](const Chunk& c) { return c.id == id; });
    return found == chunks_.end() ? nullptr : &*found;
}

const Chunk* Container::find(Chunk::Role role) const {
    const auto found =
        std::find_if(chunks_.begin(), chunks_.end(), [role](const Chunk& c) { return c.role == role; });
    return found == chunks_.end() ? nullptr : &*found;
}

std::optional<std::vector<std::uint8_t>> Container::recordBytes() const {
    const Chunk* chunk = find(Chunk::Role::record);
    if (chunk == nullptr || chunk->size > kLargestRecord) return std::nullopt;
    BoundedCursor contents = cursor(*chunk);
    auto bytes = contents.bytes(chunk->size);
    if (contents.failed()) return std::nullopt;
    return bytes;
}

bool Container::areFiller(std::uint64_t begin, std::uint64_t end) const {
    if (begin >= end || end - begin > kMostFiller) return false;
    const auto bytes = BoundedCursor(window_, order_, begin, end - begin).bytes(end - begin);
    return std::all_of(bytes.begin(), bytes.end(), [](std::uint8_t byte) { return byte == 0; }) &&
           bytes.size() == end - begin;
}

std::optional<std::vector<FilePiece>> Container::rewritten(const std::string& record, Error* error) const {
    if (fault_.isSet()) {
        if (error != nullptr) *error = fault_;
        return std::nullopt;
    }
    if (record.size() > kLargestRecord) {
        fail(error, kErrorTooLarge, fmt::format("a record of {} bytes is too large", record.size()));
        return std::nullopt;
    }
    const Chunk* ours = nullptr;
    for (const Chunk& chunk : chunks_) {
        const char* reason = chunk.fault;
        if (chunk.role == Chunk::Role::record && std::exchange(ours, &chunk) != nullptr) {
            reason = "is a second record of ours; it is unclear which one counts";
        }
        if (reason == nullptr) continue;
        failAt(error, chunk, reason);
        return std::nullopt;
    }
    return piecesWith(record, error);
}

}  // namespace qvct
