#pragma once

#include "Kit.h"

namespace qvct::bench {

/// A ride cymbal: a ping above a wash that swells for a while and rings for seconds. Strokes of one cymbal
/// have the same modes, differently loud.
Sound ride(unsigned stroke);
/// A crash cymbal.
Sound crash(unsigned stroke);
/// A note of a synthesized bass.
Sound bassNote(double hertz);

/// Adds chords that swell in and out over two seconds, with a little vibrato: nothing in them is an onset.
void addPad(std::vector<float>& samples);

}  // namespace qvct::bench
