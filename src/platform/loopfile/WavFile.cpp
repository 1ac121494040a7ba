#include "platform/loopfile/WavFile.h"

#include "platform/loopfile/WavMusic.h"

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::uint32_t kInLongSizes = 0xFFFFFFFF;  // the size stands in ds64
constexpr std::uint16_t kPcm = 1;
constexpr std::uint16_t kFloat = 3;
constexpr std::uint16_t kExtensible = 0xFFFE;

}  // namespace

bool WavFile::isMagic(std::uint32_t magic) {
    return magic == fourCC("RIFF") || magic == fourCC("RIFX") || magic == fourCC("RF64") ||
           magic == fourCC("BW64");
}

WavFile::WavFile(ReadWindow& window, std::uint32_t magic)
    : IffFile(window, magic == fourCC("RIFX") ? ByteOrder::big : ByteOrder::little), magic_(magic) {
    BoundedCursor header(window, order_, 4, 4);
    shortFormSize_ = header.u32();
    if (isLong()) readLongSizes();
    const bool isInLongSizes = isLong() && shortFormSize_ == kInLongSizes;
    const std::uint64_t formSize = isInLongSizes ? longSizes_.form : shortFormSize_;
    walk(std::min(formSize, std::uint64_t{1} << 62U), formSize == 0 || formSize == kInLongSizes);
    refuseContradictions();
}

/// `ds64` comes first, so that it is known before any size is needed.
void WavFile::readLongSizes() {
    BoundedCursor cursor(window_, order_, 12, window_.size());
    if (cursor.fourCC() != fourCC("ds64")) return;
    BoundedCursor sizes = cursor.part(cursor.u32());
    longSizes_.form = sizes.u64();
    longSizes_.data = sizes.u64();
    longSizes_.frames = sizes.u64();
    const std::uint32_t count = sizes.u32();
    constexpr std::uint32_t kMostEntries = 1024;
    for (std::uint32_t i = 0; i < std::min(count, kMostEntries) && sizes.remaining() >= 12; ++i) {
        const std::uint32_t id = sizes.fourCC();
        longSizes_.others.emplace_back(id, sizes.u64());
    }
}

std::uint64_t WavFile::sizeOf(std::uint32_t id, std::uint32_t size) const {
    if (!isLong() || size != kInLongSizes) return size;
    if (id == fourCC("data")) return longSizes_.data;
    for (const auto& [other, longSize] : longSizes_.others) {
        if (other == id) return longSize;
    }
    return size;
}

/// Two descriptions of the audio that differ: which one its players follow cannot be known.
void WavFile::refuseContradictions() {
    const Chunk* first = find(fourCC("fmt "));
    for (Chunk& chunk : chunks_) {
        if (chunk.id != fourCC("fmt ") || &chunk == first || chunk.size > ReadWindow::kSize) continue;
        if (cursor(chunk).bytes(chunk.size) != cursor(*first).bytes(first->size)) {
            chunk.fault = "contradicts the one before it";
        }
    }
}

std::string_view WavFile::formatName() const {
    switch (magic_) {
        case fourCC("RIFX"):
            return "WAV (RIFX)";
        case fourCC("RF64"):
            return "WAV (RF64)";
        case fourCC("BW64"):
            return "WAV (BW64)";
        default:
            return "WAV (RIFF)";
    }
}

bool WavFile::readFacts(LCAudioFacts& facts, Error* error) const {
    const Chunk* format = find(fourCC("fmt "));
    const Chunk* data = find(fourCC("data"));
    if (format == nullptr) return fail(error, kErrorMalformed, "has no chunk 'fmt ' (bytes 12 to the end)");
    if (data == nullptr) return fail(error, kErrorMalformed, "has no chunk 'data' (bytes 12 to the end)");
    if (!readFormat(*format, *data, facts, error)) return false;
    readWavMusic(*this, facts);
    return true;
}

bool WavFile::readFormat(const Chunk& format, const Chunk& data, LCAudioFacts& facts, Error* error) const {
    BoundedCursor header = cursor(format);
    std::uint16_t coding = header.u16();
    facts.channelCount = header.u16();
    facts.sampleRate = header.u32();
    const std::uint32_t bytesPerSecond = header.u32();
    const std::uint16_t bytesPerFrame = header.u16();
    facts.bitsPerSample = header.u16();
    if (header.failed()) return failAt(error, format, "is too short");
    if (coding == kExtensible) {
        header.skip(8);
        const std::uint16_t inner = header.u16();
        if (!header.failed()) coding = inner;
    }
    if (!checkFormat(facts, format, error)) return false;
    if (coding != kPcm && coding != kFloat) {
        facts.frameCount = codedFrames(data.size, bytesPerSecond, facts.sampleRate);
        return true;
    }
    const std::uint32_t needed = (facts.bitsPerSample + 7U) / 8U * facts.channelCount;
    if (needed == 0 || bytesPerFrame < needed) {
        return failAt(error, format,
                      fmt::format("{} channels of {} bits do not fit into frames of {} bytes",
                                  facts.channelCount, facts.bitsPerSample, bytesPerFrame));
    }
    facts.frameCount = data.size / bytesPerFrame;
    return true;
}

/// For codings whose frames have no fixed size: what the file says, else what its data rate makes likely.
std::uint64_t WavFile::codedFrames(std::uint64_t dataSize, std::uint32_t bytesPerSecond,
                                   double sampleRate) const {
    if (const Chunk* fact = find(fourCC("fact"))) {
        BoundedCursor contents = cursor(*fact);
        const std::uint32_t frames = contents.u32();
        if (isLong() && frames == kInLongSizes) return longSizes_.frames;
        if (!contents.failed() && frames > 0) return frames;
    }
    if (bytesPerSecond == 0) return 0;
    return static_cast<std::uint64_t>(static_cast<double>(dataSize) / bytesPerSecond * sampleRate);
}

std::optional<std::uint64_t> WavFile::signatureOf(const Chunk& chunk) const {
    return chunk.id == kRecordId ? std::optional<std::uint64_t>(0) : std::nullopt;
}

std::string WavFile::recordStart() const {
    return "qvct";
}

bool WavFile::canGrowTo(std::uint64_t formSize) const {
    return (isLong() && shortFormSize_ == kInLongSizes) || formSize < kInLongSizes;
}

std::string WavFile::formHeader(std::uint64_t formSize) const {
    const bool isInLongSizes = isLong() && shortFormSize_ == kInLongSizes;
    const std::uint64_t shown = isInLongSizes ? kInLongSizes : formSize;
    std::string magic;
    for (int shift = 24; shift >= 0; shift -= 8) {
        magic += static_cast<char>(magic_ >> static_cast<unsigned>(shift) & 0xFFU);
    }
    return magic + number(shown, 4) + "WAVE";
}

std::uint64_t WavFile::rewrittenPrefix(const Chunk& chunk) const {
    const bool isLongSizes = isLong() && chunk.id == fourCC("ds64") && chunk.offset == 12;
    return isLongSizes && chunk.size >= 8 ? 8 : 0;
}

void WavFile::addChunk(PieceList& pieces, const Chunk& chunk, std::uint64_t formSize) const {
    const std::uint64_t prefix = rewrittenPrefix(chunk);
    if (prefix == 0) return IffFile::addChunk(pieces, chunk, formSize);
    pieces.addRange(chunk.offset, chunk.contents);
    pieces.addBytes(number(formSize, prefix));
    pieces.addRange(chunk.contents + prefix, chunk.end);
}

}  // namespace qvct
