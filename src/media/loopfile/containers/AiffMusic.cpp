#include "media/loopfile/containers/AiffMusic.h"

#include "media/loopfile/containers/AiffFile.h"
#include "media/loopfile/containers/MusicValues.h"

#include <set>

namespace qvct {
namespace {

/// The root note; into `loopMarkers` the numbers of the markers at which the instrument's loops begin and
/// end.
void readInstrument(BoundedCursor instrument, LCAudioFacts& facts, std::set<std::int16_t>& loopMarkers) {
    const std::uint8_t baseNote = instrument.u8();
    instrument.skip(7);  // detune, ranges of notes and velocities, gain
    if (!instrument.failed()) setRootNote(facts, baseNote);
    for (int loop = 0; loop < 2; ++loop) {
        const std::uint16_t playMode = instrument.u16();
        const std::int16_t begin = instrument.i16();
        const std::int16_t end = instrument.i16();
        if (!instrument.failed() && playMode != 0) loopMarkers.insert({begin, end});
    }
}

void readMarkers(BoundedCursor markers, LCAudioFacts& facts, const std::set<std::int16_t>& loopMarkers) {
    const std::uint16_t count = markers.u16();
    std::vector<std::int64_t> frames;
    for (unsigned i = 0; i < count; ++i) {
        const std::int16_t number = markers.i16();
        const std::uint32_t frame = markers.u32();
        const std::uint8_t nameLength = markers.u8();
        if (markers.failed()) break;
        if (!loopMarkers.contains(number)) frames.push_back(frame);
        markers.skip(
            std::min<std::uint64_t>(nameLength + (nameLength % 2 == 0 ? 1U : 0U), markers.remaining()));
    }
    setMarkers(facts, std::move(frames));
}

}  // namespace

void readAiffMusic(const AiffFile& file, LCAudioFacts& facts) {
    const Chunk* markers = nullptr;
    std::set<std::int16_t> loopMarkers;
    for (const Chunk& chunk : file.chunks()) {
        BoundedCursor contents = file.cursor(chunk);
        switch (chunk.id) {
            case fourCC("NAME"):
                if (!facts.displayName.empty()) break;
                facts.displayName = textOfField(contents.text(std::min(contents.remaining(), kLargestText)));
                break;
            case fourCC("INST"):
                readInstrument(contents, facts, loopMarkers);
                break;
            case fourCC("MARK"):
                markers = &chunk;
                break;
            case fourCC("MIDI"):
                if (chunk.size <= kLargestMidi) setMidi(facts, contents.bytes(chunk.size));
                break;
            default:
                break;
        }
    }
    if (markers != nullptr) readMarkers(file.cursor(*markers), facts, loopMarkers);
}

}  // namespace qvct
