#pragma once

#include <string>

namespace qvct {

struct HeardSound;
class SoundExcerpt;

namespace tool {

/// A picture of a sound as an SVG document: its waveform with the onsets, below that the levels of its bands
/// over time from low to high, below that what was decided. A few thousand elements, whatever the sound.
std::string svgOfSound(const std::string& title, const HeardSound& sound, const SoundExcerpt& excerpt);

}  // namespace tool
}  // namespace qvct
