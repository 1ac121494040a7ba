#pragma once

#include "Kit.h"
#include "media/midi/MidiSequence.h"

#include <vector>

namespace qvct::bench {

/// What is done to a groove besides playing it, so that a detector is not judged by dry drums alone.
struct Setting {
    enum Player { kMachine, kAcousticKit, kMelody };

    const char* name = "";
    Player player = kMachine;
    std::size_t kitShift = 0;  ///< Which machine plays which groove.
    double tempoFactor = 1;    ///< Above 1 is faster.
    bool bassAndPad = false;   ///< Sustained chords and a bass note under every kick.
    bool wash = false;         ///< Rides instead of hi-hats, and a crash every fourth kick.
    double roomSeconds = 0;    ///< Time in which a diffuse tail falls by 60 dB; 0 is none.
    double whiteDb = 0;        ///< White noise below full scale; 0 is none.
    double pinkDb = 0;         ///< Pink noise below full scale; 0 is none.
    double lowPassHertz = 0;   ///< Nothing is heard above; 0 is no limit.
    double cutSeconds = 0;     ///< The sound is cut off this long after the last onset; 0 is a second of end.
};

/// Who plays: a kit, and the notes of pitched instruments that a melody is made of.
struct Band {
    const Kit* kit;
    const std::vector<Sound>* notes;
};

/// Silence before the first beat of a rendering, in seconds.
inline constexpr double kLead = 0.25;

/// Audio and the times at which it truly has onsets, in seconds, ascending. Onsets within 30 ms of the one
/// before count as one.
struct Rendering {
    std::vector<float> samples;  ///< Mono, kRate.
    std::vector<double> onsets;
};

/// Plays the first track of a groove, at most `seconds` long. A melody has a note wherever the groove has a
/// stroke that is not soft and 0.1 s after the last; each ends the one before it.
Rendering render(const MidiSequence& groove, const Band& band, const Setting& setting, double seconds);

/// Where a beat of a groove lies, in seconds.
double beatsToSeconds(const MidiSequence& groove, double beat);

}  // namespace qvct::bench
