#include "media/loopfile/containers/MusicValues.h"

#include "platform/text/Text.h"

#include <algorithm>
#include <bit>
#include <charconv>
#include <cmath>
#include <cstring>

namespace qvct {

std::string textOfField(std::string_view bytes) {
    const std::string_view text = trimBlanksAndLineBreaks(bytes.substr(0, bytes.find('\0')));
    if (isValidUtf8(text)) return std::string(text);
    std::string converted;
    for (const char byte : text) {
        const auto code = static_cast<unsigned char>(byte);
        if (code < 0x80) {
            converted += byte;
        } else {
            converted += static_cast<char>(0xC0U | code >> 6U);
            converted += static_cast<char>(0x80U | (code & 0x3FU));
        }
    }
    return converted;
}

void setTempo(LCAudioFacts& facts, double bpm) {
    if (bpm > 0 && bpm <= kFastestTempo) facts.bpm = static_cast<float>(bpm);
}

void setSignature(LCAudioFacts& facts, unsigned top, unsigned bottom) {
    if (top < 1 || top > kLargestSignature || bottom > kLargestSignature || !std::has_single_bit(bottom))
        return;
    facts.signatureTop = static_cast<int>(top);
    facts.signatureBottom = static_cast<int>(bottom);
}

void setBeats(LCAudioFacts& facts, std::uint64_t beats) {
    if (beats <= kMostBeats) facts.beatCount = static_cast<int>(beats);
}

void setRootNote(LCAudioFacts& facts, unsigned note) {
    if (note >= 1 && note <= 127) facts.midiRootNote = static_cast<int>(note);
}

void setSignatureText(LCAudioFacts& facts, std::string_view text) {
    const std::size_t slash = text.find('/');
    if (slash == std::string_view::npos) return;
    unsigned top = 0;
    unsigned bottom = 0;
    std::from_chars(text.data(), text.data() + slash, top);
    std::from_chars(text.data() + slash + 1, text.data() + text.size(), bottom);
    setSignature(facts, top, bottom);
}

void setKeyText(LCAudioFacts& facts, std::string_view text) {
    constexpr int kMinor = 1;
    constexpr int kMajor = 2;
    if (text.empty() || text.front() < 'A' || text.front() > 'G') return;
    text.remove_prefix(std::min(text.find_first_not_of("#b", 1), text.size()));
    text.remove_prefix(std::min(text.find_first_not_of(" -"), text.size()));
    const auto begins = [text](std::string_view word) {
        return text.size() >= word.size() && std::equal(word.begin(), word.end(), text.begin(),
                                                        [](char a, char b) { return a == (b | 0x20); });
    };
    if (text.empty() || text == "M" || begins("maj")) facts.keyType = kMajor;
    if (text == "m" || begins("min")) facts.keyType = kMinor;
}

void setMidi(LCAudioFacts& facts, std::vector<std::uint8_t> bytes) {
    if (bytes.size() < 14 || std::memcmp(bytes.data(), "MThd", 4) != 0) return;
    facts.midiData = std::move(bytes);
    facts.isLoop = true;
}

void setMarkers(LCAudioFacts& facts, std::vector<std::int64_t> frames) {
    std::sort(frames.begin(), frames.end());
    frames.erase(std::unique(frames.begin(), frames.end()), frames.end());
    std::erase_if(frames, [&](std::int64_t frame) {
        const bool isBehind = facts.frameCount > 0 && static_cast<std::uint64_t>(frame) > facts.frameCount;
        return frame < 0 || isBehind;
    });
    facts.transientMarkers = std::move(frames);
}

}  // namespace qvct
