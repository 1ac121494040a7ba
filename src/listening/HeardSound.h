#pragma once

#include "listening/likeness/SoundFingerprint.h"
#include "listening/likeness/SoundLikeness.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// What can be heard in a sound. What there is nothing to say of is left out: silence has a length, and no
/// more.
///
/// Confidences are in [0, 1]; of what is said with 0.9, nine of ten are right.
struct HeardSound {
    /// What plays, if it is a single sound.
    struct Instrument {
        std::string label;  ///< Of the taxonomy.
        double confidence = 0;
    };
    /// What a single sound is tuned to.
    struct Note {
        int number = 0;    ///< MIDI, 60 is C4.
        double cents = 0;  ///< Above that note, -50 to 50.
        double confidence = 0;
    };
    struct Key {
        int tonic = 0;  ///< Semitones above C, 0 to 11.
        bool isMinor = false;
        double confidence = 0;
    };
    struct Tempo {
        double bpm = 0;    ///< Beats a minute.
        double beats = 0;  ///< That it is long.
        double confidence = 0;
    };
    /// Where it lies between two poles.
    struct Trait {
        std::string_view scale;    ///< "Bright / Dark", as the taxonomy calls it.
        double level = 0;          ///< 0 is the first pole, 1 the second one.
        std::string_view measure;  ///< What was measured, with its unit.
        double value = 0;
    };

    double seconds = 0;                ///< Of the sound; of its beginning if it is cut.
    bool isCut = false;                ///< Only its beginning was listened to.
    bool isStereo = false;             ///< Its channels differ.
    double sampleRate = 0;             ///< Of the positions of its onsets.
    std::vector<std::int64_t> onsets;  ///< Frames of the file, ascending; of short sounds none.

    std::optional<double> loudness;  ///< Integrated, in LUFS.
    std::optional<double> truePeak;  ///< In dB of full scale.
    std::vector<Trait> traits;
    std::optional<double>
        loopConfidence;  ///< That it is made to be repeated; the rest, that it is a single sound.
    std::vector<Instrument> instruments;  ///< Of a single sound, the likeliest first.
    std::optional<Note> note;
    std::optional<Key> key;
    std::vector<Tempo> tempos;              ///< Of a loop, the likeliest first.
    std::optional<SoundLikeness> likeness;  ///< Where it lies among all sounds.
    SoundFingerprint fingerprint;           ///< What copies of it have in common.
};

}  // namespace qvct
