#pragma once

#include "media/midi/MidiSequence.h"

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace qvct::bench {

inline constexpr int kRate = 44100;

/// What is done to a groove besides playing it, so that a detector is not judged by dry drums alone.
struct Setting {
    const char* name;
    double tempoFactor;  ///< Above 1 is faster.
    double noiseDb;      ///< White noise below full scale; 0 is none.
    double roomSeconds;  ///< Time in which a diffuse tail falls by 60 dB; 0 is none.
    bool bassAndPad;     ///< Sustained chords and a bass note under every kick.
    int kitShift;        ///< Which kit plays which groove.
};

/// Audio and the times at which it truly has onsets, in seconds, ascending. Onsets within 30 ms of the one
/// before count as one.
struct Rendering {
    std::vector<float> samples;  ///< Mono, kRate.
    std::vector<double> onsets;
};

/// One-shots of one drum machine, by the sound they stand for.
class Kit {
  public:
    /// The one-shots of a folder; nothing when a kick, a snare or a hi-hat is missing.
    static std::optional<Kit> load(const std::string& folder);

    /// The one-shot for a note of the General MIDI percussion map.
    const std::vector<float>& soundFor(int pitch) const;

  private:
    enum Sound { kKick, kSnare, kRim, kClosedHat, kOpenHat, kLowTom, kHighTom, kCrash, kRide, kSoundCount };
    std::array<std::vector<float>, kSoundCount> sounds_;
};

/// Plays the first track of a groove with a kit: gain (velocity/127)^1.5, at most `seconds` long.
Rendering render(const MidiSequence& groove, const Kit& kit, const Setting& setting, double seconds);

}  // namespace qvct::bench
