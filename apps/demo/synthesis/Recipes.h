#pragma once

#include "demo/Sound.h"
#include "demo/synthesis/Drums.h"
#include "demo/synthesis/Timbres.h"

#include <string_view>
#include <variant>

namespace qvct::demo {

struct DrumHit {
    Drum drum;
    Kit kit;
    bool reversed = false;
};

struct DrumLoop {
    std::string_view groove;
    Kit kit;
    double tempo;
    int bars;
};

/// One note or, where a mode is given, the chord on it.
struct SynthNote {
    Timbre timbre;
    int key;
    double seconds;
    Mode chord = Mode::none;
};

struct SynthLoop {
    Timbre timbre;
    std::string_view phrase;
    int key;
    Mode mode;
    double tempo;
    int bars;
};

/// Noise and a tone that climb for so many beats.
struct Riser {
    double tempo;
    int beats;
};

using Recipe = std::variant<DrumHit, DrumLoop, SynthNote, SynthLoop, Riser>;

struct AudioFormat {
    int rate = 44100;
    int channels = 1;
    int bits = 16;
};

/// The sound, without a name, its peak just below full scale. Loops last exactly their beats, rounded to a
/// whole frame, and what rings on past the end comes in again at the start, so that they repeat without a
/// seam.
Sound render(const Recipe& recipe, const AudioFormat& format);

}  // namespace qvct::demo
