#include "media/loopfile/containers/WavMusic.h"

#include "media/loopfile/containers/MusicValues.h"
#include "media/loopfile/containers/WavFile.h"

namespace qvct {
namespace {

void readAcid(BoundedCursor acid, LCAudioFacts& facts) {
    constexpr std::uint32_t kOneShot = 1;
    constexpr std::uint32_t kRootNoteIsSet = 2;
    const std::uint32_t flags = acid.u32();
    const std::uint16_t rootNote = acid.u16();
    acid.skip(2 + 4);  // of unknown use
    const std::uint32_t beats = acid.u32();
    const std::uint16_t meterBottom = acid.u16();
    const std::uint16_t meterTop = acid.u16();
    const float tempo = acid.f32();
    if (acid.failed()) return;
    if ((flags & kRootNoteIsSet) != 0) setRootNote(facts, rootNote);
    if ((flags & kOneShot) != 0) return;  // beats and tempo mean nothing then
    facts.isLoop = true;
    facts.isAuthored = true;
    setBeats(facts, beats);
    setSignature(facts, meterTop, meterBottom);
    setTempo(facts, tempo);
}

void readSampler(BoundedCursor sampler, LCAudioFacts& facts) {
    sampler.skip(12);  // maker, product, sample period
    const std::uint32_t unityNote = sampler.u32();
    if (!sampler.failed()) setRootNote(facts, std::min<std::uint32_t>(unityNote, 128));
}

void readInstrument(BoundedCursor instrument, LCAudioFacts& facts) {
    const std::uint8_t unshiftedNote = instrument.u8();
    if (!instrument.failed()) setRootNote(facts, unshiftedNote);
}

void readCuePoints(BoundedCursor cues, LCAudioFacts& facts) {
    constexpr std::uint64_t kPointSize = 24;
    const std::uint64_t count = std::min<std::uint64_t>(cues.u32(), kMostMarkers);
    std::vector<std::int64_t> frames;
    for (std::uint64_t i = 0; i < count && cues.remaining() >= kPointSize; ++i) {
        cues.skip(kPointSize - 4);
        frames.push_back(cues.u32());
    }
    setMarkers(facts, std::move(frames));
}

/// `INFO`: the title.
void readList(BoundedCursor list, LCAudioFacts& facts) {
    if (list.fourCC() != fourCC("INFO")) return;
    while (list.remaining() >= 8) {
        const std::uint32_t id = list.fourCC();
        const std::uint64_t size = list.u32();
        BoundedCursor contents = list.part(size);
        if (contents.failed()) return;
        list.skip(std::min<std::uint64_t>(size & 1U, list.remaining()));
        if (id == fourCC("INAM") && facts.displayName.empty()) {
            facts.displayName = textOfField(contents.text(std::min(contents.remaining(), kLargestText)));
            return;
        }
    }
}

}  // namespace

void readWavMusic(const WavFile& file, LCAudioFacts& facts) {
    const Chunk* acid = nullptr;
    const Chunk* sampler = nullptr;
    for (const Chunk& chunk : file.chunks()) {
        switch (chunk.id) {
            case fourCC("acid"):
                acid = acid == nullptr ? &chunk : acid;
                break;
            case fourCC("smpl"):
                sampler = sampler == nullptr ? &chunk : sampler;
                break;
            case fourCC("inst"):
                readInstrument(file.cursor(chunk), facts);
                break;
            case fourCC("cue "):
                readCuePoints(file.cursor(chunk), facts);
                break;
            case fourCC("LIST"):
                readList(file.cursor(chunk), facts);
                break;
            default:
                break;
        }
    }
    // The most reliable source of the root note comes last.
    if (sampler != nullptr) readSampler(file.cursor(*sampler), facts);
    if (acid != nullptr) readAcid(file.cursor(*acid), facts);
}

}  // namespace qvct
