#pragma once

#include "demo/synthesis/Synthesis.h"

namespace qvct::demo {

enum class Timbre {
    subBass,
    analogBass,
    acidBass,
    pluck,
    pad,
    lead,
    electricPiano,
    clavinet,
    bell,
    marimba,
    koto,
    voice
};

/// One note, held for `seconds` and then released.
///
/// @param key    MIDI note number.
/// @param side   -1 for the left channel, 1 for the right, 0 for mono: the sides differ a little in pitch and
///               phase, which makes a wide stereo picture.
Signal playNote(Timbre timbre, int key, double seconds, int rate, int side);

}  // namespace qvct::demo
