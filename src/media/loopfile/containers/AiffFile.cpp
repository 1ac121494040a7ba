#include "media/loopfile/containers/AiffFile.h"

#include "media/loopfile/containers/AiffMusic.h"

#include <cmath>

namespace qvct {
namespace {

/// An 80-bit float; 0 for what cannot be a sample rate (negative, infinite, no number).
double readExtended(BoundedCursor& cursor) {
    const std::uint16_t signAndExponent = cursor.u16();
    const std::uint64_t mantissa = cursor.u64();
    constexpr int kBias = 16383;
    constexpr int kLargestExponent = 64;  // far above any sample rate
    const int exponent = (signAndExponent & 0x7FFF) - kBias;
    if ((signAndExponent & 0x8000U) != 0 || exponent < 0 || exponent > kLargestExponent) return 0;
    return std::ldexp(static_cast<double>(mantissa), exponent - 63);
}

/// How a coding lays out one channel of the audio.
struct Packing {
    std::uint32_t bytes = 0;   ///< Of a packet; 0 where that varies or is not known.
    std::uint32_t frames = 1;  ///< In a packet.
};

Packing packingOf(std::uint32_t coding, std::uint32_t bits) {
    switch (coding) {
        case fourCC("NONE"):
        case fourCC("twos"):
        case fourCC("sowt"):
            return {(bits + 7U) / 8U};
        case fourCC("fl32"):
        case fourCC("FL32"):
        case fourCC("in32"):
        case fourCC("23ni"):
            return {4};
        case fourCC("fl64"):
        case fourCC("FL64"):
            return {8};
        case fourCC("in24"):
        case fourCC("42ni"):
            return {3};
        case fourCC("alaw"):
        case fourCC("ALAW"):
        case fourCC("ulaw"):
        case fourCC("ULAW"):
        case fourCC("raw "):
            return {1};
        case fourCC("ima4"):
            return {34, 64};
        case fourCC("GSM "):
            return {33, 160};
        default:
            return {};
    }
}

/// Depending on the coding, writers put the number of frames, of packets or of a share of the packets into
/// the header. It is used only where it is known to mean frames.
std::uint64_t framesOf(std::uint32_t coding, const LCAudioFacts& header, std::uint64_t bytes) {
    const Packing packing = packingOf(coding, header.bitsPerSample);
    const std::uint64_t packet = std::uint64_t{packing.bytes} * header.channelCount;
    // At least a bit a sample.
    if (packet == 0) return coding == fourCC("DWVW") ? std::min(header.frameCount, 8 * bytes) : 0;
    const std::uint64_t held = bytes / packet * packing.frames;
    return coding == fourCC("ima4") ? held : std::min(header.frameCount, held);
}

}  // namespace

AiffFile::AiffFile(ReadWindow& window, std::uint32_t form) : IffFile(window, ByteOrder::big), form_(form) {
    BoundedCursor header(window, order_, 4, 4);
    const std::uint32_t formSize = header.u32();
    walk(formSize, formSize == 0 || formSize == 0xFFFFFFFF);
    refuseContradictions(fourCC("COMM"));
}

bool AiffFile::readFacts(LCAudioFacts& facts, Error* error) const {
    const Chunk* common = find(fourCC("COMM"));
    if (common == nullptr) return fail(error, kErrorMalformed, "has no chunk 'COMM'", {.offset = 12});
    BoundedCursor header = cursor(*common);
    facts.channelCount = header.u16();
    facts.frameCount = header.u32();
    facts.bitsPerSample = header.u16();
    facts.sampleRate = readExtended(header);
    if (header.failed()) return failAt(error, *common, "is too short");
    const bool saysCoding = form_ == fourCC("AIFC") && header.remaining() >= 4;
    const std::uint32_t coding = saysCoding ? header.fourCC() : fourCC("NONE");
    if (!checkFormat(facts, *common, error)) return false;
    const Chunk* sound = find(Chunk::Role::audio);
    if (sound == nullptr && facts.frameCount > 0) {
        return fail(error, kErrorMalformed, "has no chunk 'SSND'", {.offset = 12});
    }
    constexpr std::uint64_t kSoundHeader = 8;
    const std::uint64_t bytes =
        sound == nullptr || sound->size < kSoundHeader ? 0 : sound->size - kSoundHeader;
    facts.frameCount = framesOf(coding, facts, bytes);
    readAiffMusic(*this, facts);
    return true;
}

std::optional<std::uint64_t> AiffFile::signatureOf(const Chunk& chunk) const {
    if (chunk.id != fourCC("APPL") || cursor(chunk).fourCC() != kSignature) return std::nullopt;
    return 4;
}

std::string AiffFile::formHeader(std::uint64_t formSize) const {
    return "FORM" + number(formSize, 4) + std::string(formatName());
}

}  // namespace qvct
