#include "media/loopfile/containers/CafMusic.h"

#include "media/loopfile/containers/CafFile.h"
#include "media/loopfile/containers/MusicValues.h"
#include "platform/text/Text.h"

#include <cmath>

namespace qvct {
namespace {

void readInformation(BoundedCursor information, LCAudioFacts& facts) {
    constexpr std::uint64_t kLargestInformation = 65536;
    information.skip(4);  // number of entries
    const std::string text = information.text(std::min(information.remaining(), kLargestInformation));
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t keyEnd = text.find('\0', at);
        const std::size_t valueEnd = keyEnd == std::string::npos ? keyEnd : text.find('\0', keyEnd + 1);
        if (valueEnd == std::string::npos) return;
        const std::string key = text.substr(at, keyEnd - at);
        const std::string value =
            textOfField(std::string_view(text).substr(keyEnd + 1, valueEnd - keyEnd - 1));
        if (key == "title") facts.displayName = value;
        if (key == "tempo") setTempo(facts, leadingNumber(value));
        if (key == "time signature") setSignatureText(facts, value);
        if (key == "key signature") setKeyText(facts, value);
        at = valueEnd + 1;
    }
}

void readInstrument(BoundedCursor instrument, LCAudioFacts& facts) {
    const float baseNote = instrument.f32();
    if (!instrument.failed() && baseNote >= 0 && baseNote < 127.5F) {
        setRootNote(facts, static_cast<unsigned>(std::lround(baseNote)));
    }
}

/// Of the kinds of markers only those that may stand on a transient: plain ones and the sync points of
/// regions.
void readMarkers(BoundedCursor markers, LCAudioFacts& facts) {
    constexpr std::uint64_t kMarkerSize = 28;
    markers.skip(4);  // kind of time code
    const std::uint64_t count = std::min<std::uint64_t>(markers.u32(), kMostMarkers);
    std::vector<std::int64_t> frames;
    for (std::uint64_t i = 0; i < count && markers.remaining() >= kMarkerSize; ++i) {
        const std::uint32_t kind = markers.u32();
        const double frame = markers.f64();
        markers.skip(kMarkerSize - 12);
        constexpr double kLastFrame = 9e15;
        const bool isPlain = kind == 0 || kind == fourCC("indx") || kind == fourCC("rsyc");
        if (isPlain && frame >= 0 && frame <= kLastFrame) frames.push_back(std::llround(frame));
    }
    setMarkers(facts, std::move(frames));
}

}  // namespace

void readCafMusic(const CafFile& file, LCAudioFacts& facts) {
    for (const Chunk& chunk : file.chunks()) {
        BoundedCursor contents = file.cursor(chunk);
        switch (chunk.id) {
            case fourCC("info"):
                readInformation(contents, facts);
                break;
            case fourCC("inst"):
                readInstrument(contents, facts);
                break;
            case fourCC("mark"):
                readMarkers(contents, facts);
                break;
            case fourCC("midi"):
                if (chunk.size <= kLargestMidi) setMidi(facts, contents.bytes(chunk.size));
                break;
            default:
                break;
        }
    }
}

}  // namespace qvct
