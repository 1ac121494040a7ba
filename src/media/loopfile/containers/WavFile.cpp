#include "media/loopfile/containers/WavFile.h"

#include "media/loopfile/containers/WavMusic.h"
#include "platform/base/bytes/ByteOrder.h"

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::uint32_t kInLongSizes = 0xFFFFFFFF;  // the size stands in ds64
constexpr std::uint16_t kPcm = 1;
constexpr std::uint16_t kFloat = 3;
constexpr std::uint16_t kMsAdpcm = 2;
constexpr std::uint16_t kALaw = 6;
constexpr std::uint16_t kMuLaw = 7;
constexpr std::uint16_t kImaAdpcm = 0x11;
constexpr std::uint16_t kGsm = 0x31;
constexpr std::uint16_t kExtensible = 0xFFFE;

/// A coding in blocks that each begin with a header; the size of a block says how many frames it holds.
struct BlockCoding {
    std::uint64_t header = 0;  ///< Bytes a channel.
    std::uint64_t framesOfHeader = 0;
    std::uint64_t framesOfByte = 0;  ///< Of one channel.

    std::uint64_t framesOf(std::uint64_t bytes, std::uint64_t channels) const {
        if (bytes < header * channels) return 0;
        return framesOfHeader + (bytes - header * channels) * framesOfByte / channels;
    }
};

constexpr BlockCoding kBlocksOfMsAdpcm{7, 2, 2};
constexpr BlockCoding kBlocksOfImaAdpcm{4, 1, 2};
constexpr std::uint64_t kGsmBlock = 65;
constexpr std::uint64_t kGsmFrames = 320;

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
    refuseContradictions(fourCC("fmt "));
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
    if (format == nullptr) return fail(error, kErrorMalformed, "has no chunk 'fmt '", {.offset = 12});
    if (data == nullptr) return fail(error, kErrorMalformed, "has no chunk 'data'", {.offset = 12});
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
        coding = header.u16();  // 0, which is none, where the header ends before
    }
    if (!checkFormat(facts, format, error)) return false;
    if (coding != kPcm && coding != kFloat) {
        facts.frameCount = codedFrames({coding, bytesPerSecond, bytesPerFrame}, data.size, facts);
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

std::uint64_t WavFile::codedFrames(const Coding& coding, std::uint64_t bytes,
                                   const LCAudioFacts& facts) const {
    const std::uint64_t channels = facts.channelCount;
    switch (coding.number) {
        case kALaw:
        case kMuLaw:
            return bytes / channels;  // a byte a sample, whatever the header says of frames and rate
        case kMsAdpcm:
        case kImaAdpcm: {
            const BlockCoding& blocks = coding.number == kMsAdpcm ? kBlocksOfMsAdpcm : kBlocksOfImaAdpcm;
            const std::uint64_t size = coding.bytesPerBlock == 0 ? bytes + 1 : coding.bytesPerBlock;
            const std::uint64_t framesOfBlock = blocks.framesOf(size, channels);
            const std::uint64_t held = bytes / size * framesOfBlock + blocks.framesOf(bytes % size, channels);
            // Some encoders divide this number by that of the channels once too often.
            const bool isDivided = coding.number == kImaAdpcm && channels > 1;
            return isDivided && factFrames() == held / channels ? held : saidFrames(held, framesOfBlock);
        }
        case kGsm:
            return saidFrames(bytes / kGsmBlock * kGsmFrames, kGsmFrames);
        default:
            return likelyFrames(coding, bytes, facts.sampleRate);
    }
}

/// The number of frames in `fact`; 0 for none.
std::uint64_t WavFile::factFrames() const {
    const Chunk* fact = find(fourCC("fact"));
    if (fact == nullptr) return 0;
    const std::uint32_t frames = cursor(*fact).u32();
    return isLong() && frames == kInLongSizes ? longSizes_.frames : frames;
}

/// Encoders fill up the last blocks. So the number in `fact` is used if it is short of what the blocks hold
/// by less than two blocks.
std::uint64_t WavFile::saidFrames(std::uint64_t held, std::uint64_t framesOfBlock) const {
    const std::uint64_t said = factFrames();
    return said > 0 && said < held && held - said < 2 * framesOfBlock ? said : held;
}

/// For unknown codings: the number of frames that the file states, else the one that its data rate makes
/// likely.
std::uint64_t WavFile::likelyFrames(const Coding& coding, std::uint64_t bytes, double sampleRate) const {
    constexpr std::uint64_t kMostFramesOfByte = 64;  // far above what any coding packs
    const std::uint64_t said = factFrames();
    if (said > 0 && said / kMostFramesOfByte <= bytes) return said;
    if (coding.bytesPerSecond == 0) return 0;
    return static_cast<std::uint64_t>(static_cast<double>(bytes) / coding.bytesPerSecond * sampleRate);
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
    return fourCharacters(magic_) + number(shown, 4) + "WAVE";
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
