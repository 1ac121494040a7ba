#include "media/loopfile/containers/IffFile.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::uint64_t kFormHeader = 12;
constexpr std::uint64_t kChunkHeader = 8;

bool isOdd(std::uint64_t value) {
    return (value & 1U) != 0;
}

/// Whether the chunk is of odd size and ends without its pad byte.
bool lacksPad(const Chunk& chunk) {
    return isOdd(chunk.size) && chunk.end == chunk.contents + chunk.size;
}

}  // namespace

void IffFile::refuseContradictions(std::uint32_t id) {
    const Chunk* first = find(id);
    for (Chunk& chunk : chunks_) {
        if (chunk.id != id || &chunk == first) continue;
        const bool isSame = chunk.size == first->size && chunk.size <= ReadWindow::kSize &&
                            cursor(chunk).bytes(chunk.size) == cursor(*first).bytes(chunk.size);
        if (!isSame) chunk.fault = "contradicts the one before it";
    }
}

Chunk IffFile::chunkAt(std::uint64_t offset) const {
    const std::uint64_t fileEnd = window_.size();
    BoundedCursor header(window_, order_, offset, formEnd_ - offset);
    Chunk chunk;
    chunk.id = header.fourCC();
    const std::uint64_t declared = sizeOf(chunk.id, header.u32());
    chunk.offset = offset;
    chunk.contents = offset + kChunkHeader;
    if (header.failed()) {
        chunk.fault = "cannot be read; the file became shorter";
        chunk.contents = chunk.end = formEnd_;
        return chunk;
    }
    chunk.size = std::min(declared, fileEnd - chunk.contents);
    const std::uint64_t contentsEnd = chunk.contents + chunk.size;
    chunk.end = std::min(contentsEnd + (chunk.size & 1U), std::max(contentsEnd, formEnd_));
    if (!isPrintableCode(chunk.id)) chunk.fault = "its id is invalid";
    if (chunk.size < declared) chunk.fault = "claims more bytes than there are";
    return chunk;
}

/// Whether the chunk is intact and is followed by another one or by the end.
bool IffFile::leadsOn(const Chunk& chunk) const {
    if (chunk.fault != nullptr) return false;
    if (chunk.end >= formEnd_ || formEnd_ - chunk.end < kChunkHeader) return true;
    const bool mayLackPad = isOdd(chunk.size) && chunkAt(chunk.end - 1).fault == nullptr;
    return mayLackPad || chunkAt(chunk.end).fault == nullptr || areFiller(chunk.end, formEnd_);
}

/// Some writers forget the pad byte; then the next header begins one byte before the place where it belongs.
/// At that place, too, the bytes may look like a header.
bool IffFile::startsOneByteEarlier(const Chunk& chunk) const {
    if (chunks_.empty() || !isOdd(chunks_.back().size) || leadsOn(chunk)) return false;
    return leadsOn(chunkAt(chunk.offset - 1));
}

void IffFile::walk(std::uint64_t formSize, bool isOpenEnded) {
    const std::uint64_t fileEnd = window_.size();
    const std::uint64_t declaredEnd = kChunkHeader + formSize;
    formEnd_ = isOpenEnded ? fileEnd : std::clamp(declaredEnd, std::min(kFormHeader, fileEnd), fileEnd);
    const ErrorPlace sizeOfForm{.part = "form", .offset = 4};
    if (isOpenEnded)
        fail(&fault_, kErrorMalformed, "has no size, as a recording that was cut off", sizeOfForm);
    std::uint64_t at = kFormHeader;
    while (formEnd_ >= at + kChunkHeader && chunks_.size() < kMostChunks) {
        Chunk chunk = chunkAt(at);
        if (startsOneByteEarlier(chunk)) {
            chunk = chunkAt(at - 1);
            chunks_.back().end = at - 1;
        }
        if (chunk.end > formEnd_) {
            // When a chunk contradicts the form's size, that size does not tell where bytes of other programs
            // begin.
            formEnd_ = fileEnd;
            chunk = chunkAt(chunk.offset);
        }
        if (chunk.id == 0) break;  // zeros fill the rest
        const bool holdsTheRest = isOpenEnded && isAudio(chunk.id) && chunk.size == 0;
        if (holdsTheRest) {
            chunk.size = formEnd_ - chunk.contents;
            chunk.end = formEnd_;
        }
        if (isAudio(chunk.id)) chunk.role = Chunk::Role::audio;
        if (const auto signature = signatureOf(chunk)) chunk.becomeRecord(*signature);
        at = chunk.end;
        chunks_.push_back(chunk);
    }
    takeOverPad();
    at = chunks_.empty() ? at : chunks_.back().end;
    if (areFiller(at, formEnd_)) formEnd_ = at;
    if (isOpenEnded) return;
    if (at < formEnd_) {
        fail(&fault_, kErrorMalformed, fmt::format("{} bytes belong to no known chunk", formEnd_ - at),
             {.offset = at});
    }
    // A size that is too large is common, and harmless where all chunks are whole.
    const bool isCutOff = chunks_.empty() || chunks_.back().fault != nullptr || at < formEnd_;
    if (declaredEnd > fileEnd && isCutOff) {
        fail(&fault_, kErrorMalformed, fmt::format("claims {} bytes, the file has {}", declaredEnd, fileEnd),
             sizeOfForm);
    }
}

/// A size that leaves out the last pad byte is common and harmless.
void IffFile::takeOverPad() {
    const bool endsOdd = !chunks_.empty() && chunks_.back().end == formEnd_ && lacksPad(chunks_.back());
    if (!endsOdd || formEnd_ >= window_.size()) return;
    if (areFiller(formEnd_, formEnd_ + 1)) chunks_.back().end = ++formEnd_;
}

std::string IffFile::number(std::uint64_t value, std::size_t width) const {
    return bytesOf(value, width, order_);
}

std::string IffFile::recordChunk(const std::string& record) const {
    if (record.empty()) return {};
    const std::string start = recordStart();
    const std::uint64_t size = start.size() - 4 + record.size();
    std::string chunk = start.substr(0, 4) + number(size, 4) + start.substr(4) + record;
    if (isOdd(size)) chunk += '\0';
    return chunk;
}

void IffFile::addChunk(PieceList& pieces, const Chunk& chunk, std::uint64_t /*formSize*/) const {
    pieces.addRange(chunk.offset, chunk.end);
}

std::optional<std::vector<FilePiece>> IffFile::piecesWith(const std::string& record, Error* error) const {
    const std::string ours = recordChunk(record);
    std::uint64_t formSize = kFormHeader - kChunkHeader + ours.size();
    for (const Chunk& chunk : chunks_) {
        if (chunk.role == Chunk::Role::record) continue;
        formSize += chunk.end - chunk.offset + (lacksPad(chunk) ? 1 : 0);
    }
    if (!canGrowTo(formSize)) {
        fail(error, kErrorTooLarge,
             fmt::format("with the record it would have {} bytes, more than its size can say", formSize),
             {.part = "form", .offset = 4});
        return std::nullopt;
    }
    PieceList pieces;
    pieces.addBytes(formHeader(formSize));
    for (const Chunk& chunk : chunks_) {
        if (chunk.role == Chunk::Role::record) continue;
        addChunk(pieces, chunk, formSize);
        if (lacksPad(chunk)) pieces.addBytes(std::string(1, '\0'));
    }
    pieces.addBytes(ours);
    pieces.addRange(formEnd_, window_.size());
    return pieces.take();
}

}  // namespace qvct
