#include "media/loopfile/containers/CafFile.h"

#include "media/loopfile/containers/CafMusic.h"
#include "platform/base/bytes/ByteOrder.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::uint64_t kFileHeader = 8;
constexpr std::uint64_t kChunkHeader = 12;
constexpr std::int64_t kToTheEnd = -1;
constexpr std::uint64_t kEditCount = 4;  // bytes before the audio in its chunk

}  // namespace

CafFile::CafFile(ReadWindow& window) : Container(window, ByteOrder::big) {
    BoundedCursor header(window, order_, 4, 2);
    const std::uint16_t version = header.u16();
    if (version != 1)
        fail(&fault_, kErrorMalformed, fmt::format("version {} is unknown", version), {.offset = 4});
    walk();
}

void CafFile::walk() {
    const std::uint64_t fileEnd = window_.size();
    std::uint64_t at = kFileHeader;
    while (!endsOpen_ && fileEnd >= at + kChunkHeader && chunks_.size() < kMostChunks) {
        BoundedCursor header(window_, order_, at, kChunkHeader);
        Chunk chunk;
        chunk.id = header.fourCC();
        const std::int64_t declared = header.i64();
        if (chunk.id == 0) break;  // zeros fill the rest
        chunk.offset = at;
        chunk.contents = at + kChunkHeader;
        const std::uint64_t left = fileEnd - chunk.contents;
        const bool isAudio = chunk.id == fourCC("data");
        endsOpen_ = isAudio && declared == kToTheEnd;
        chunk.size = declared < 0 ? left : std::min(static_cast<std::uint64_t>(declared), left);
        chunk.end = chunk.contents + chunk.size;
        if (!isPrintableCode(chunk.id)) chunk.fault = "its id is invalid";
        if (chunk.id == fourCC("desc") && !chunks_.empty()) chunk.fault = "a second description of the audio";
        if (declared < 0 && !endsOpen_) chunk.fault = "its size is negative";
        if (declared > 0 && static_cast<std::uint64_t>(declared) > left) {
            chunk.fault = "claims more bytes than there are";
        }
        if (header.failed()) chunk.fault = "cannot be read; the file became shorter";
        if (isAudio) chunk.role = Chunk::Role::audio;
        if (isRecord(chunk)) chunk.becomeRecord(kRecordUuid.size());
        at = chunk.end;
        chunks_.push_back(chunk);
    }
    chunksEnd_ = at;
    if (!fault_.isSet() && at < fileEnd && !areFiller(at, fileEnd)) {
        fail(&fault_, kErrorMalformed, fmt::format("{} bytes belong to no known chunk", fileEnd - at),
             {.offset = at});
    }
}

bool CafFile::isRecord(const Chunk& chunk) const {
    if (chunk.id != fourCC("uuid")) return false;
    const auto start = cursor(chunk).bytes(kRecordUuid.size());
    return std::equal(start.begin(), start.end(), kRecordUuid.begin(), kRecordUuid.end());
}

bool CafFile::readFacts(LCAudioFacts& facts, Error* error) const {
    const Chunk* description = chunks_.empty() ? nullptr : chunks_.data();
    if (description == nullptr || description->id != fourCC("desc")) {
        return fail(error, kErrorMalformed, "the first chunk is not 'desc'", {.offset = 8});
    }
    if (find(Chunk::Role::audio) == nullptr) {
        return fail(error, kErrorMalformed, "has no chunk 'data'", {.offset = 8});
    }
    if (!readFormat(*description, facts, error)) return false;
    readCafMusic(*this, facts);
    return true;
}

bool CafFile::readFormat(const Chunk& description, LCAudioFacts& facts, Error* error) const {
    BoundedCursor header = cursor(description);
    facts.sampleRate = header.f64();
    const std::uint32_t coding = header.fourCC();
    header.skip(4);  // its flags
    std::uint32_t bytesPerPacket = header.u32();
    std::uint32_t framesPerPacket = header.u32();
    facts.channelCount = header.u32();
    facts.bitsPerSample = header.u32();
    if (header.failed()) return failAt(error, description, "is too short");
    if (!checkFormat(facts, description, error)) return false;
    if (coding == fourCC("alaw") || coding == fourCC("ulaw")) {
        bytesPerPacket = facts.channelCount;  // a byte a sample, whatever the header says
        framesPerPacket = 1;
    }
    const Chunk& data = *find(Chunk::Role::audio);
    const std::uint64_t bytes = data.size < kEditCount ? 0 : data.size - kEditCount;
    constexpr std::uint32_t kMostFramesPerPacket = 1U << 20U;
    if (framesPerPacket > kMostFramesPerPacket) {
        return failAt(error, description,
                      fmt::format("{} frames in a packet are out of range", framesPerPacket));
    }
    facts.frameCount = bytesPerPacket == 0 ? packetTableFrames(bytes, framesPerPacket)
                                           : bytes / bytesPerPacket * framesPerPacket;
    return true;
}

/// The number of frames in the table of packets of varying size, if the audio can hold so many packets: each
/// has at least one byte.
std::uint64_t CafFile::packetTableFrames(std::uint64_t bytes, std::uint32_t framesPerPacket) const {
    const Chunk* table = find(fourCC("pakt"));
    if (table == nullptr) return 0;
    BoundedCursor contents = cursor(*table);
    const std::int64_t packets = contents.i64();
    const std::int64_t frames = contents.i64();
    if (contents.failed() || packets < 0 || frames < 0) return 0;
    constexpr std::uint64_t kMost = std::uint64_t{1} << 48U;
    const std::uint64_t held = std::min(static_cast<std::uint64_t>(packets), bytes);
    const std::uint64_t most = framesPerPacket == 0 ? kMost : held * framesPerPacket;
    return std::min(static_cast<std::uint64_t>(frames), most);
}

std::optional<std::vector<FilePiece>> CafFile::piecesWith(const std::string& record, Error* /*error*/) const {
    std::string ours;
    if (!record.empty()) {
        ours = "uuid" + bytesOf(kRecordUuid.size() + record.size(), 8, ByteOrder::big) +
               std::string(kRecordUuid.begin(), kRecordUuid.end()) + record;
    }
    const Chunk* openEnd = endsOpen_ ? &chunks_.back() : nullptr;
    PieceList pieces;
    pieces.addRange(0, kFileHeader);
    for (const Chunk& chunk : chunks_) {
        if (&chunk == openEnd) pieces.addBytes(ours);
        if (chunk.role != Chunk::Role::record) pieces.addRange(chunk.offset, chunk.end);
    }
    if (openEnd == nullptr) pieces.addBytes(ours);
    pieces.addRange(chunksEnd_, window_.size());
    return pieces.take();
}

}  // namespace qvct
