#pragma once

#include "media/loopfile/LCFileData.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Bounds of what chunks of other makers may say; anything outside counts as not said.
inline constexpr std::uint64_t kMostMarkers = 100'000;
inline constexpr double kFastestTempo = 1000;
inline constexpr double kLongestSeconds = 1e9;
inline constexpr std::uint64_t kMostBeats = 1'000'000;
inline constexpr unsigned kLargestSignature = 64;
inline constexpr std::uint64_t kLargestText = 4096;
inline constexpr std::uint64_t kLargestMidi = 16ULL << 20U;

/// The text up to its first NUL, without blanks at its ends. Bytes that are not UTF-8 are taken for Latin-1,
/// which is what old writers meant.
std::string textOfField(std::string_view bytes);

/// Each sets its fact when the value makes sense.
void setTempo(LCAudioFacts& facts, double bpm);
void setSignature(LCAudioFacts& facts, unsigned top, unsigned bottom);
void setBeats(LCAudioFacts& facts, std::uint64_t beats);
/// 0 is ignored: writers that set no note leave it there.
void setRootNote(LCAudioFacts& facts, unsigned note);
/// "4/4"
void setSignatureText(LCAudioFacts& facts, std::string_view text);
/// "Am", "F#"
void setKeyText(LCAudioFacts& facts, std::string_view text);
/// Only bytes that begin as a standard MIDI file does; such a file makes a loop.
void setMidi(LCAudioFacts& facts, std::vector<std::uint8_t> bytes);
/// Sorts them, drops doubles and those outside of audio whose length is known.
void setMarkers(LCAudioFacts& facts, std::vector<std::int64_t> frames);

}  // namespace qvct
